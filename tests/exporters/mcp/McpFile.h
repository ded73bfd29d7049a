#pragma once
// Reads an MCP file back item by item for the exporter's tests.
#include "Flow2/Flow2File/VReader.h"
#include "Flow2/Flow2Store/VFlowStoreFactory.h"
#include "Flow2/Flow2Types/FlowCatalogue.h"
#include "Utils/UtilsFileSystem/MemoryStreams.h"
#include "tests/exporters/RunExport.h"
#include <gtest/gtest.h>
#include <map>
#include <memory>

namespace McpTest {

class McpFile {
public:
  explicit McpFile(const std::string& i_rPath) {
    const std::string text = ExportTest::readText(i_rPath);
    m_bytes.assign(text.begin(), text.end());
    Flow2Store::VFlowStoreFactory& factory = Flow2Store::GetFlowStoreFactory();
    EXPECT_TRUE(factory.CreateStore(m_store, ZMT::GetFlowCatalogueFactories(), 2).IsSuccess());
    EXPECT_TRUE(factory.CreateBufferFactory(m_buffers, nullptr).IsSuccess());
    EXPECT_TRUE(factory.CreateStateFactory(m_states).IsSuccess());
    m_pReader = std::make_unique<Flow2File::VReader>(m_store, m_buffers, m_states);
    m_pStream = std::make_unique<UtilsFileSystem::VMemoryInputStream>(m_bytes);
    m_open = m_pReader->Open(m_pStream.get());
  }

  ZMT::IResult openResult() const { return m_open; }
  /// What the reader found wrong, one line each.
  std::string problems() const {
    std::string text;
    for (const std::string& problem : m_pReader->GetProblems())
      text += problem + "\n";
    return text;
  }
  Flow2File::VReader& reader() { return *m_pReader; }
  std::size_t stateCount() const { return m_pReader->GetStateCount(); }

  ZMT::IFlowStateHandle state(std::size_t i_index) {
    ZMT::IFlowStateHandle state;
    EXPECT_EQ(m_pReader->ReadState(i_index, state), ZMT::IResult(ZMT::IResult::Ok));
    return state;
  }
  /// Number of static items of each type id.
  std::map<std::uint32_t, int> staticCounts() {
    std::vector<ZMT::IFlowItemHandle> items;
    EXPECT_TRUE(m_pReader->ReadStaticItems(items).IsSuccess());
    std::map<std::uint32_t, int> counts;
    for (const auto& item : items)
      ++counts[item.GetToken().m_TypeId];
    return counts;
  }
  /// Number of items of each type id in a state.
  std::map<std::uint32_t, int> stateCounts(std::size_t i_index) {
    std::map<std::uint32_t, int> counts;
    ZMT::IFlowStateHandle s = state(i_index);
    if (!s) return counts;
    for (ZMT::VRecordPosition p = s->Begin(); p != s->End(); ++p)
      ++counts[s->GetRecord(p).m_Token.m_TypeId];
    return counts;
  }
  template <class T>
  T* first(const ZMT::IFlowStateHandle& i_rState, ZMT::IFlowItemHandle& o_rItem) {
    if (!i_rState->GetItem(o_rItem, T::FlowTypeId, ZMT::EMatch::Equal, i_rState->GetTime()))
      return nullptr;
    return o_rItem.As<ZMT::Detail::VFlowItem<T>>();
  }

private:
  std::vector<std::uint8_t> m_bytes;
  ZMT::IFlowStoreHandle m_store;
  ZMT::IFlowBufferFactoryHandle m_buffers;
  ZMT::IFlowStateFactoryHandle m_states;
  std::unique_ptr<Flow2File::VReader> m_pReader;
  std::unique_ptr<UtilsFileSystem::VMemoryInputStream> m_pStream;
  ZMT::IResult m_open;
};

} // namespace McpTest
