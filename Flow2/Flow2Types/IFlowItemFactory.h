#pragma once
// One factory per item type: its statics, new default items, and readers.

#include "Flow2/Flow2Types/IFlowItem.h"

#include <functional>
#include <memory>
#include <vector>

namespace ZMT {

using IFlowItemReadFunction = std::function<bool(IInputStream&, IFlowItem&)>;

class IFlowItemFactory {
public:
  virtual const IFlowItemStaticInfo& GetInfo() const = 0;
  /// A new item with the default value.
  virtual IFlowItem* Create() const = 0;
  /// With a null schema the native reader; otherwise a reader for data written with the given
  /// schema, empty if that schema can't be reconciled with the type's own.
  virtual IFlowItemReadFunction GetReader(const ISchema* i_pFileSchema) const = 0;
  virtual ~IFlowItemFactory() = default;
};

using IFlowItemFactories = std::vector<std::shared_ptr<IFlowItemFactory>>;

} // namespace ZMT
