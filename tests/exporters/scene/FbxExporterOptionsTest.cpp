// The FBX exporter's options: user setup, versions, rates it can carry.
#include "FbxExportFixture.h"
#include "plugin/host/HInterface.h"
#include <gtest/gtest.h>

using namespace FbxExportTest;
using ExportTest::Owned;

namespace {

TEST(FbxExporterOptions, UserSetupKeepsEveryOptionAndDefaultsStand) {
  g_interface.clear();
  Owned<AnvilFbxExporter> exporter(AnvilFbxExporter::createInstance());
  FbxExportOptions defaults;
  exporter->getOptions(&defaults);
  EXPECT_FALSE(defaults.m_collapseSubjects);
  EXPECT_TRUE(defaults.m_exportActiveClipOnly);
  EXPECT_EQ(defaults.m_namespaceMode, FbxExportOptions::ENamespaceShort);
  EXPECT_EQ(defaults.m_fbxVersion, FbxExportOptions::E2020);
  exporter->loadUserSetup(); // an empty store keeps the defaults
  FbxExportOptions loaded;
  exporter->getOptions(&loaded);
  EXPECT_EQ(std::memcmp(&loaded, &defaults, sizeof loaded), 0);

  exporter->setCollapseSubjects(true);
  exporter->setDesiredUpAxis(FbxExportOptions::EUpAxisZ);
  exporter->setNamespaceMode(FbxExportOptions::ENamespaceUseName);
  exporter->setFBXVersion(FbxExportOptions::E2013);
  exporter->setUnrollAnimationCurves(true);
  exporter->saveUserSetup();
  EXPECT_EQ(*g_interface.find("FBXExporter", "NamespaceMode"), "useName");
  EXPECT_EQ(*g_interface.find("FBXExporter", "Version"), "2013");
  EXPECT_EQ(*g_interface.find("FBXExporter", "CollapseSubjects"), "1");
  Owned<AnvilFbxExporter> other(AnvilFbxExporter::createInstance());
  other->loadUserSetup();
  EXPECT_TRUE(other->getCollapseSubjects());
  EXPECT_EQ(other->getDesiredUpAxis(), FbxExportOptions::EUpAxisZ);
  EXPECT_EQ(other->getNamespaceMode(), FbxExportOptions::ENamespaceUseName);
  EXPECT_EQ(other->getFBXVersion(), FbxExportOptions::E2013);
  EXPECT_TRUE(other->getUnrollAnimationCurves());
  g_interface.clear();
}

TEST(FbxExporterOptions, VersionTextsAndValues) {
  Owned<AnvilFbxExporter> exporter(AnvilFbxExporter::createInstance());
  exporter->setFBXVersion(HString("2018"));
  EXPECT_EQ(exporter->getFBXVersionString(), std::string("FBX201800"));
  exporter->setFBXVersion(HString("2021")); // unknown text: 2016
  EXPECT_EQ(exporter->getFBXVersion(), FbxExportOptions::E2016);
  exporter->setFBXVersion(FbxExportOptions::EFBXVersion(9)); // out of range
  EXPECT_TRUE(exporter->getFBXVersionAsString().IsEmpty());
  EXPECT_EQ(exporter->getFBXVersionString(), std::string("FBX202000"));
  // The out-of-range value still saves, as 2020 (7700).
  buildScene();
  EXPECT_EQ(exportFbx(*exporter, "range.fbx").version, 7700u);
  exporter->setFBXVersion(HString("2021"));
  exporter->reset();
  EXPECT_EQ(exportFbx(*exporter, "2016.fbx").version, 7500u);
  // Namespace mode texts are exact.
  EXPECT_FALSE(exporter->setNamespaceMode(HString("Full")));
  EXPECT_TRUE(exporter->setNamespaceMode(HString("full")));
  EXPECT_TRUE(exporter->recognize("a.fbx"));
  EXPECT_FALSE(exporter->recognize("a.FBX"));
  EXPECT_EQ(exporter->getDataType(), 13);
}

TEST(FbxExporterOptions, CompatibleRatesFollowTheClock) {
  struct Case {
    int mode;
    double rate;
    std::vector<double> rates;
  };
  Owned<AnvilFbxExporter> exporter(AnvilFbxExporter::createInstance());
  for (const Case& c :
       {Case{0, 120.0, {30, 60, 120}}, Case{3, 50.0, {25, 50, 100}}, Case{4, 96.0, {24, 48, 96}},
        Case{6, 240.0, {24, 48, 96, 30, 60, 120}}, Case{6, 72.0, {24, 72}}, Case{6, 100.0, {}},
        Case{6, 120.0, {24}}, Case{6, 300.0, {30, 60, 25, 50, 100}}, Case{6, 33.0, {}}}) {
    HostTest::resetScene(c.rate, 2);
    g_db->getTimeManager()->setTimecodeMode(c.mode);
    EXPECT_EQ(exporter->getCompatibleFrameRates(), c.rates) << c.rate;
    EXPECT_EQ(exporter->getNumCompatibleFrameRates(), c.rates.size());
  }
}

} // namespace
