#include "exporters/trajectory/CsmExporter.h"
#include "plugin/host/Character.h"
#include "plugin/host/Database.h"
#include "plugin/host/HInterface.h"
#include "plugin/host/HTimeManager.h"
#include "plugin/host/Marker.h"
#include "tests/exporters/RunExport.h"
#include <gtest/gtest.h>
#include <memory>
#include <sstream>
#include <vector>

namespace {

class CsmExporterTest : public ::testing::Test {
protected:
  void SetUp() override {
    g_db->clearScene();
    g_db->getFileExporterMgr()->setExportSelectedOnly(false);
    HTimeManager* pTime = g_db->getTimeManager();
    pTime->setFrameRate(100.0);
    m_tpf = pTime->getTicksPerFrame();
    pTime->setAnimRange(HTimeRange(0, 9 * m_tpf));
    pTime->setPlayRange(HTimeRange(2 * m_tpf, 4 * m_tpf));
    m_pExporter.reset(CsmExporter::createInstance());
  }

  Character* addSubject(const char* i_pName, bool i_selected = false) {
    auto* pSubject = new Character(i_pName);
    pSubject->setSelected(i_selected);
    g_db->addToScene(pSubject, false, nullptr, false, false);
    return pSubject;
  }

  // A marker at (frame, 10 * frame, 100 * frame) + offset on frames 0..9.
  Marker* addMarker(const char* i_pName, Character* i_pSubject, double i_offset) {
    auto* pMarker = new Marker(i_pName);
    for (int f = 0; f < 10; ++f)
      pMarker->m_track.setKey(f * m_tpf, Vec3(f + i_offset, 10.0 * f, 100.0 * f));
    g_db->addToScene(pMarker, false, i_pSubject, false, false);
    return pMarker;
  }

  std::vector<std::string> exportLines() {
    return ExportTest::lines(
        ExportTest::exportText(*m_pExporter, ExportTest::tempPath("take.csm")));
  }

  int64_t m_tpf = 0;
  ExportTest::Owned<CsmExporter> m_pExporter;
};

TEST_F(CsmExporterTest, WritesHeaderOrderAndPointsOfThePlayRange) {
  Character* pBob = addSubject("Bob");
  addMarker("A B", pBob, 0.5);
  addMarker("C\tD", pBob, 0.25);
  const std::vector<std::string> text = exportLines();
  ASSERT_EQ(text.size(), 20u);
  EXPECT_EQ(text[0].rfind("$Date ", 0), 0u);
  EXPECT_EQ(text[1], ""); // ctime's own newline
  EXPECT_EQ(text[2], "$Time 12:00:00");
  // Only a backslash separates: a path with slashes is written whole.
  EXPECT_EQ(text[3], "$Filename " + ExportTest::tempPath("take.csm"));
  const std::vector<std::string> expected = {"$Actor Bob",
                                             "",
                                             "$Comments",
                                             "Motion capture produced by Harrow",
                                             "",
                                             "$FirstFrame 2",
                                             "$LastFrame 4",
                                             "$Rate 100.000000",
                                             "",
                                             "$Order",
                                             "A_B C_D ",
                                             "",
                                             "$Points",
                                             "2  2.500 20.000 200.000  2.250 20.000 200.000",
                                             "3  3.500 30.000 300.000  3.250 30.000 300.000",
                                             "4  4.500 40.000 400.000  4.250 40.000 400.000"};
  EXPECT_EQ(std::vector<std::string>(text.begin() + 4, text.end()), expected);
}

TEST_F(CsmExporterTest, PlayRangeEndingBeforeItsStartGivesNoPoints) {
  addMarker("M", addSubject("Bob"), 0.0);
  g_db->getTimeManager()->setPlayRange(HTimeRange(6 * m_tpf, 3 * m_tpf));
  const std::vector<std::string> text = exportLines();
  ASSERT_EQ(text.size(), 17u);
  EXPECT_EQ(text[9], "$FirstFrame 6");
  EXPECT_EQ(text[10], "$LastFrame 3");
  EXPECT_EQ(text[14], "M ");
  EXPECT_EQ(text.back(), "$Points");
}

TEST_F(CsmExporterTest, ActorFollowsTheSubjectsOrTheSelection) {
  EXPECT_EQ(exportLines()[4], "$Actor None");
  addSubject("Bob");
  addSubject("Ann", true);
  EXPECT_EQ(exportLines()[4], "$Actor MultipleSubjects");
  g_db->getFileExporterMgr()->setExportSelectedOnly(true);
  EXPECT_EQ(exportLines()[4], "$Actor Ann");
}

TEST_F(CsmExporterTest, UpAxisZTurnsAZUpSceneAndYLeavesIt) {
  addMarker("M", addSubject("Bob"), 1.0);
  g_db->getTimeManager()->setPlayRange(HTimeRange(1 * m_tpf, 1 * m_tpf));
  EXPECT_EQ(exportLines().back(), "1  2.000 10.000 100.000");

  ASSERT_TRUE(m_pExporter->setDesiredUpAxis("Z"));
  EXPECT_EQ(exportLines().back(), "1  2.000 100.000 -10.000");
  EXPECT_FALSE(g_db->isSceneRotated());

  // "Z" on a Y-up scene does not turn it either.
  g_db->setZUp(false);
  EXPECT_EQ(exportLines().back(), "1  2.000 10.000 100.000");
}

TEST(CsmExporterOptions, UpAxisTextAndUserSetup) {
  ExportTest::Owned<CsmExporter> pExporter(CsmExporter::createInstance());
  EXPECT_EQ(pExporter->getDesiredUpAxisAsString(), "Y");
  EXPECT_FALSE(pExporter->setDesiredUpAxis("x"));
  EXPECT_EQ(pExporter->getDesiredUpAxis(), EUpAxisY);
  EXPECT_TRUE(pExporter->setDesiredUpAxis("z"));
  EXPECT_EQ(pExporter->getDesiredUpAxisAsString(), "Z");

  CSMExportOptions options;
  options.m_desiredUpAxis = 7;
  pExporter->setOptions(&options);
  EXPECT_EQ(pExporter->getDesiredUpAxisAsString(), "");

  g_interface.clear();
  EXPECT_TRUE(pExporter->setDesiredUpAxis("Z"));
  pExporter->saveUserSetup();
  EXPECT_EQ(*g_interface.find("CSMExporter", "DesiredUpAxis"), "Z");
  pExporter->setDesiredUpAxis("Y");
  pExporter->loadUserSetup();
  EXPECT_EQ(pExporter->getDesiredUpAxis(), EUpAxisZ);
  g_interface.clear();
}

TEST(CsmExporterFileName, OnlyABackslashAfterTheFirstCharacterSeparates) {
  EXPECT_EQ(CsmExporter::fileNameOf("C:\\takes\\walk.csm"), "walk.csm");
  EXPECT_EQ(CsmExporter::fileNameOf("/data/takes/walk.csm"), "/data/takes/walk.csm");
  EXPECT_EQ(CsmExporter::fileNameOf("\\walk.csm"), "\\walk.csm");
  EXPECT_EQ(CsmExporter::fileNameOf("a\\"), "");
}

} // namespace
