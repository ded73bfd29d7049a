// TRC text, byte for byte: header lines, names, column numbering, gaps and ranges.
#include "exporters/trajectory/TrcExporter.h"
#include "../../support/HostFixture.h"
#include "../RunExport.h"
#include "AnvilCore/io/TrcReader.h"
#include "plugin/host/HInterface.h"
#include "plugin/host/OperationStack.h"
#include <algorithm>
#include <cmath>
#include <gtest/gtest.h>
#include <limits>
#include <memory>
#include <sstream>

using namespace HostTest;

namespace {
class TrcExport : public ::testing::Test {
protected:
  void SetUp() override {
    resetScene(100.0, 3);
    m_pExporter.reset(TrcExporter::createInstance());
    m_path = ExportTest::tempPath("take.trc");
  }
  std::string run() { return ExportTest::exportText(*m_pExporter, m_path); }
  ExportTest::Owned<TrcExporter> m_pExporter;
  std::string m_path;
};
} // namespace

TEST_F(TrcExport, WholeFileForTwoMarkersWithAGap) {
  Character* pBob = addSubject("Bob");
  addMarker("LFHD", {Vec3(1, 2, 3), std::nullopt, Vec3(7.5, -8.25, 9)}, pBob);
  addMarker("_stray", {Vec3(0, 0, 0), Vec3(0.1, 0.2, 0.3), Vec3(-1, -2, -3)});
  const std::string expected =
      "PathFileType\t4\t(X/Y/Z)\t" + m_path +
      "\n"
      "DataRate\tCameraRate\tNumFrames\tNumMarkers\tUnits\tOrigDataRate\tOrigDataStartFrame\tOrigNu"
      "mFrames\n"
      "100.000000\t100.000000\t3\t2\tmm\t100.000000\t1\t3\n"
      "Frame#\tTime\tLFHD\t\t\t_stray\t\t\t\n"
      "\t\tX0\tY0\tZ0\tX1\tY1\tZ1\t\n"
      "0\t0.000000\t1.000000\t2.000000\t3.000000\t0.000000\t0.000000\t0.000000\n"
      "1\t0.010000\t\t\t\t0.100000\t0.200000\t0.300000\n"
      "2\t0.020000\t7.500000\t-8.250000\t9.000000\t-1.000000\t-2.000000\t-3.000000\n";
  EXPECT_EQ(run(), expected);
}

TEST_F(TrcExport, NamesUnderEachFlagCombination) {
  Character* pBob = addSubject("_Bob");
  Marker* pInSubject = addMarker("_LFHD", {Vec3()}, pBob);
  Marker* pLoose = addMarker("_loose", {Vec3()});
  Character* pAl = addSubject("Al");
  Marker* pAlMarker = addMarker("_RFHD", {Vec3()}, pAl);
  TrcExporter& e = *m_pExporter;

  EXPECT_EQ(e.displayName(pInSubject), "_LFHD"); // no subject names: bare, no stripping
  e.setRemoveLeadingUnderscores(true);
  EXPECT_EQ(e.displayName(pInSubject), "_LFHD");
  e.setWriteSubjects(true);
  EXPECT_EQ(e.displayName(pInSubject), "Bob:_LFHD"); // path form, one "_" removed
  EXPECT_EQ(e.displayName(pLoose), "_loose");        // no character parent: bare
  e.setCollapseSubjects(true);
  EXPECT_EQ(e.displayName(pInSubject), "Bob__LFHD");
  EXPECT_EQ(e.displayName(pAlMarker), "Al__RFHD"); // only the whole name's first character counts
  e.setRemoveLeadingUnderscores(false);
  EXPECT_EQ(e.displayName(pInSubject), "_Bob__LFHD");
  e.setCollapseSubjects(false);
  EXPECT_EQ(e.displayName(pAlMarker), "Al:_RFHD");
}

TEST_F(TrcExport, NoMarkersAndBackwardRange) {
  g_db->addToScene(new Node("notAMarker"), false, nullptr, false, false);
  std::vector<std::string> text = ExportTest::lines(run());
  ASSERT_EQ(text.size(), 8u);
  EXPECT_EQ(text[3], "Frame#\tTime\t");
  EXPECT_EQ(text[4], "\t\t");
  EXPECT_EQ(text[7], "2\t0.020000");

  // A range whose end lies before its start prints the range's frame count and no frame line.
  AnvilCore::ExportRequest request;
  request.path = m_path;
  const int64_t tpf = g_db->getTimeManager()->getTicksPerFrame();
  request.range = HTimeRange(5 * tpf, 2 * tpf);
  std::string error;
  ASSERT_EQ(AnvilCore::runExport(*m_pExporter, request, error), AnvilCore::EExportStatus::EOk);
  text = ExportTest::lines(ExportTest::readText(m_path));
  ASSERT_EQ(text.size(), 5u);
  EXPECT_EQ(text[2], "100.000000\t100.000000\t-2\t0\tmm\t100.000000\t1\t-2");
}

TEST_F(TrcExport, TimeColumnIsAbsoluteAndReset) {
  resetScene(100.0, 40);
  addMarker("m", Positions(40, Vec3(1, 1, 1)));
  AnvilCore::ExportRequest request;
  request.path = m_path;
  const int64_t tpf = g_db->getTimeManager()->getTicksPerFrame();
  request.range = HTimeRange(30 * tpf, 31 * tpf);
  std::string error;
  ASSERT_EQ(AnvilCore::runExport(*m_pExporter, request, error), AnvilCore::EExportStatus::EOk);
  // A second export through the same object must not repeat the first one's markers.
  ASSERT_EQ(AnvilCore::runExport(*m_pExporter, request, error), AnvilCore::EExportStatus::EOk);
  const std::vector<std::string> text = ExportTest::lines(ExportTest::readText(m_path));
  ASSERT_EQ(text.size(), 7u);
  EXPECT_EQ(text[4], "\t\tX0\tY0\tZ0\t");
  EXPECT_EQ(text[5], "30\t0.300000\t1.000000\t1.000000\t1.000000");
}

TEST_F(TrcExport, ProgressStepsEveryTenthFrameFromZero) {
  resetScene(100.0, 25);
  addMarker("m", Positions(25, Vec3()));
  g_theOperationStack.setStream(nullptr, false);
  run();
  EXPECT_EQ(g_theOperationStack.getLow(), 0);
  EXPECT_EQ(g_theOperationStack.getHigh(), 2);
  EXPECT_EQ(g_theOperationStack.getSteps(), 3); // frames 0, 10 and 20
}

TEST_F(TrcExport, UserSetupKeysAndTheUnlabelledDefault) {
  TrcExporter& e = *m_pExporter;
  HInterface store;
  const HString& scope = HString::EMPTY_STRING;
  std::string error;
  ASSERT_TRUE(store.load(ExportTest::tempPath("none.ini"), error));
  g_interface = store;
  // An empty store turns write-unlabelled off, since it defaults to the write-subjects flag.
  e.loadUserSetup();
  EXPECT_FALSE(e.getWriteUnlabelled());
  e.setWriteSubjects(true);
  e.setCollapseSubjects(true);
  e.saveUserSetup();
  EXPECT_EQ(*g_interface.find("TRCExporter", "ExportSubjectNames"), "1");
  EXPECT_EQ(*g_interface.find("TRCExporter", "WriteUnlabelled"), "0");
  g_interface.clear();
  g_interface.setUserSetupInt("TRCExporter", "ExportSubjectNames", 0, scope);
  e.loadUserSetup(); // WriteUnlabelled absent: default is write subjects, still true here
  EXPECT_TRUE(e.getWriteUnlabelled());
  EXPECT_FALSE(e.getWriteSubjects());
  EXPECT_TRUE(e.getCollapseSubjects());

  TrcExportOptions options;
  ASSERT_TRUE(e.getOptions(&options));
  EXPECT_TRUE(options.m_collapseSubjects);
  options.m_removeLeadingUnderscores = true;
  ASSERT_TRUE(e.setOptions(&options));
  EXPECT_TRUE(e.getRemoveLeadingUnderscores());
  g_interface.clear();
}

TEST_F(TrcExport, ExtremeValuesAreWrittenWholeAndReadBack) {
  const double tiny = std::numeric_limits<double>::denorm_min();
  const double inf = std::numeric_limits<double>::infinity();
  addMarker("big", {Vec3(1e300, -1e300, tiny), Vec3(inf, 1, 1), Vec3(1, std::nan(""), 1)});
  addMarker("next", {Vec3(1, 2, 3), Vec3(4, 5, 6), Vec3(7, 8, 9)});
  const std::string text = run();
  const std::vector<std::string> rows = ExportTest::lines(text);
  ASSERT_EQ(rows.size(), 8u);
  // Every frame line keeps all of its columns: frame, time, three per marker.
  for (size_t i = 5; i < rows.size(); ++i)
    EXPECT_EQ(std::count(rows[i].begin(), rows[i].end(), '\t'), 7) << rows[i].substr(0, 80);

  AnvilCore::TrcContent content;
  std::string error;
  ASSERT_TRUE(AnvilCore::parseTrc(text.data(), text.size(), content, error)) << error;
  // Frame 0 of both markers, frame 1 and 2 of "next" only: non-finite positions are gaps.
  ASSERT_EQ(content.samples.size(), 4u);
  EXPECT_EQ(content.samples[0].x, 1e300);
  EXPECT_EQ(content.samples[0].y, -1e300);
  EXPECT_EQ(content.samples[0].z, 0.0); // six decimals, as every value of the format
  EXPECT_EQ(content.samples[1].marker, 1);
  EXPECT_EQ(content.samples[2].marker, 1);
  EXPECT_EQ(content.samples[3].z, 9.0);
}

TEST_F(TrcExport, UnprintableNamesAreReplacedWithAWarning) {
  addMarker("L\tFH\xff\x07", {Vec3(), Vec3(), Vec3()});
  LogCapture log;
  const std::vector<std::string> rows = ExportTest::lines(run());
  ASSERT_GE(rows.size(), 4u);
  EXPECT_EQ(rows[3], "Frame#\tTime\tL?FH??\t\t\t");
  ASSERT_EQ(log.warnings().size(), 1u);
  EXPECT_NE(log.warnings()[0].find("\"L?FH??\""), std::string::npos);
}
