#pragma once
// The store of a Flow instance: every item of every registered type, recycled.

#include "Flow2/Flow2Types/IFlowBuffer.h"
#include "Flow2/Flow2Types/IFlowHandles.h"
#include "Flow2/Flow2Types/IFlowItemFactory.h"
#include "Flow2/Flow2Types/IFlowItemTypeInfo.h"
#include "Utils/UtilsFileSystem/IResult.h"

#include <cstdint>
#include <functional>
#include <memory_resource>
#include <string>
#include <vector>

namespace ZMT {

/// The counters of one type store.
struct IFlowItemCounts {
  std::string m_Name;
  std::uint32_t m_TypeId = 0;
  std::uint64_t m_Live = 0;
  std::uint64_t m_Peak = 0;
  std::uint64_t m_Created = 0;
};

/// Makes the item of a token from its serialised bytes, in the store the function came from; the
/// store takes the bytes over in every case.
using IFlowItemFromBytes =
    std::function<IResult(const IFlowItemToken&, IFlowBufferConst*, IFlowItemHandle&)>;

class IFlowStore {
public:
  virtual IResult GetFlowStoreId(std::uint64_t& o_rId) const = 0;
  /// Known type ids, ascending.
  virtual IResult GetTypeIds(std::vector<std::uint32_t>& o_rIds) const = 0;
  virtual IResult GetTypeInfo(std::uint32_t typeId, IFlowItemTypeInfo& o_rInfo) const = 0;
  virtual IResult GetTypeInfo(const std::string& name, IFlowItemTypeInfo& o_rInfo) const = 0;
  /// All type records, ascending type id.
  virtual IResult GetTypeInfos(std::vector<IFlowItemTypeInfo>& o_rInfos) const = 0;
  virtual IResult CreateItem(const IFlowItemTypeInfo& type, IFlowItemHandle& o_rItem) = 0;
  /// Replaces the handles in the vector by `count` new items; all or none.
  virtual IResult CreateItems(const IFlowItemTypeInfo& type, std::uint32_t count,
                              std::vector<IFlowItemHandle>& io_rItems) = 0;
  /// The item of a token, live or cached; a cached item becomes live again.
  virtual IResult FindItem(const IFlowItemToken& token, IFlowItemHandle& o_rItem) = 0;
  /// The item of a token, read from the bytes if the store doesn't hold it yet. The store takes
  /// the bytes over in every case.
  virtual IResult GetOrCreateItem(const IFlowItemToken& token, IFlowBufferConst* i_pBytes,
                                  IFlowItemHandle& o_rItem) = 0;
  /// How to make items of a type as a file describes it: the file's type record and schema.
  virtual IResult GetReader(const IFlowItemTypeInfo& fileType, const ISchema& fileSchema,
                            IFlowItemFromBytes& o_rReader) = 0;
  /// The item's serialised bytes, made at most once and kept on its entry; owned by the store.
  virtual IResult GetItemBuffer(const IFlowItemHandle& item, IFlowItemWriter& writer,
                                const IFlowBufferConst*& o_rpBytes) = 0;
  virtual IResult CompareItems(const IFlowItemHandle& a, const IFlowItemHandle& b,
                               IFlowItemWriter& writer, bool& o_rEqual) = 0;
  virtual IResult GetAllCounts(std::vector<IFlowItemCounts>& o_rCounts) const = 0;
  virtual IResult GetItemCounts(const IFlowItemTypeInfo& type, std::uint64_t& o_rLive,
                                std::uint64_t& o_rPeak, std::uint64_t& o_rCreated) const = 0;
  /// Registers a type this process doesn't know; gives its local id (top bit set).
  virtual IResult RegisterUnknownType(const IFlowItemTypeInfo& type, const ISchema& schema,
                                      std::uint32_t& o_rTypeId) = 0;
  virtual void AddReference() = 0;
  virtual void DropReference() = 0;
  virtual ~IFlowStore() = default;
};

class IFlowStateFactory;
using IFlowStateFactoryHandle = IIntrusiveHandle<IFlowStateFactory>;

class IFlowStoreFactory {
public:
  /// A store of the given types. A store id of 0 asks for a new random id.
  virtual IResult CreateStore(IFlowStoreHandle& o_rStore, const IFlowItemFactories& factories,
                              std::uint64_t flowStoreId) = 0;
  virtual IResult CreateStateFactory(IFlowStateFactoryHandle& o_rFactory) = 0;
  /// A buffer factory; a null allocator means the heap.
  virtual IResult CreateBufferFactory(IFlowBufferFactoryHandle& o_rFactory,
                                      std::pmr::memory_resource* i_pAllocator) = 0;
  virtual ~IFlowStoreFactory() = default;
};

} // namespace ZMT
