// A recording read back into the scene and recorded again gives the same items, frame by frame;
// and the trajectories it gives back export as the demo's own.
#include "AnvilCore/demo/DemoScene.h"
#include "AnvilCore/io/ISceneReader.h"
#include "McpFile.h"
#include "Utils/UtilsFileSystem/MemoryStreams.h"
#include "exporters/mcp/AnvilMCPExporter.h"
#include "exporters/trajectory/TrcExporter.h"
#include "plugin/host/Database.h"
#include "plugin/host/HTimeManager.h"
#include <filesystem>

namespace {

using McpTest::McpFile;

// Each item of a state as (type id, bytes), in the state's order.
std::vector<std::pair<std::uint32_t, std::vector<std::uint8_t>>>
itemsOf(const ZMT::IFlowState& i_rState) {
  std::vector<std::pair<std::uint32_t, std::vector<std::uint8_t>>> items;
  for (ZMT::VRecordPosition p = i_rState.Begin(); p != i_rState.End(); ++p) {
    const ZMT::VFlowStateRecord& record = i_rState.GetRecord(p);
    UtilsFileSystem::VMemoryOutputStream bytes;
    EXPECT_TRUE(record.m_Item->Write(bytes));
    items.emplace_back(record.m_Token.m_TypeId, bytes.Bytes());
  }
  return items;
}

std::string readBack(const std::string& i_rPath) {
  g_db->clearScene();
  AnvilCore::ISceneReader* pReader = AnvilCore::SceneReaderRegistry::instance().find(i_rPath);
  EXPECT_NE(pReader, nullptr);
  std::string error;
  EXPECT_TRUE(pReader && pReader->read(i_rPath, error)) << error;
  return error;
}

TEST(McpRoundTrip, ARecordingReadBackAndRecordedAgainHoldsTheSameItems) {
  AnvilCore::buildDemoScene();
  ExportTest::Owned<AnvilMCPExporter> exporter(AnvilMCPExporter::createInstance());
  const std::string first = ExportTest::tempPath("first.mcp");
  const std::string second = ExportTest::tempPath("second.mcp");
  ExportTest::exportText(*exporter, first);
  readBack(first);
  ExportTest::exportText(*exporter, second);

  McpFile a(first), b(second);
  ASSERT_EQ(a.openResult(), ZMT::IResult(ZMT::IResult::Ok)) << a.problems();
  ASSERT_EQ(b.openResult(), ZMT::IResult(ZMT::IResult::Ok)) << b.problems();
  EXPECT_EQ(a.staticCounts(), b.staticCounts());
  ASSERT_EQ(a.stateCount(), b.stateCount());
  ASSERT_GT(a.stateCount(), 0u);
  for (std::size_t i = 0; i < a.stateCount(); i += 97) {
    SCOPED_TRACE(i);
    EXPECT_EQ(a.reader().GetIndex()[i].m_Tick, b.reader().GetIndex()[i].m_Tick);
    const auto left = itemsOf(*a.state(i));
    const auto right = itemsOf(*b.state(i));
    ASSERT_EQ(left.size(), right.size());
    for (std::size_t k = 0; k < left.size(); ++k) {
      EXPECT_EQ(left[k].first, right[k].first);
      EXPECT_TRUE(left[k].second == right[k].second) << "item of type " << left[k].first;
    }
  }
}

TEST(McpRoundTrip, TrajectoriesComeBackAsTheDemoExportsThem) {
  AnvilCore::buildDemoScene();
  ExportTest::Owned<AnvilMCPExporter> mcp(AnvilMCPExporter::createInstance());
  ExportTest::Owned<TrcExporter> trc(TrcExporter::createInstance());
  const std::string recording = ExportTest::tempPath("take.mcp");
  ExportTest::exportText(*mcp, recording);
  // The recording holds the play range: the demo's TRC of the same frames is the reference.
  AnvilCore::ExportRequest request;
  request.path = ExportTest::tempPath("take.trc");
  request.range = g_db->getTimeManager()->getPlayRange();
  std::string error;
  ASSERT_EQ(AnvilCore::runExport(*trc, request, error), AnvilCore::EExportStatus::EOk) << error;
  const std::string expected = ExportTest::readText(request.path);

  readBack(recording);
  EXPECT_EQ(ExportTest::exportText(*trc, request.path), expected);
}

} // namespace
