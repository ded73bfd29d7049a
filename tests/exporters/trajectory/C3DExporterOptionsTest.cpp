// Options, user setup, refusals, key filters, progress and the up-axis rotation of C3D export.
#include "C3DExportFixture.h"
#include "plugin/host/HInterface.h"
#include "plugin/host/OperationStack.h"
#include <cstring>

TEST_F(C3DExportTest, OptionsDefaultsCopyAndUpAxisText) {
  C3DExporter& e = *m_pExporter;
  EXPECT_TRUE(e.getPreserveGaps() && e.getCollapseToSubjects() && e.getRealFormat() &&
              e.getWriteTimeCode() && e.getWriteUnlabelled() && e.getDecFormat());
  EXPECT_FALSE(e.getRemoveLeadingUnderscores() || e.getFilterMinKeys() || e.getFilterMaxKeys() ||
               e.getOverrideHeaderRate());
  EXPECT_EQ(e.getMinKeys(), -1);
  EXPECT_EQ(e.getMaxKeys(), 2147483647);
  EXPECT_EQ(e.getHeaderRate(), 0.0);
  EXPECT_EQ(e.getDesiredUpAxisAsString(), "Scene");
  EXPECT_EQ(e.getDataType(), 21);
  EXPECT_EQ(e.getDescription(), "Binary Motion File");
  EXPECT_TRUE(e.recognize("take.c3d"));
  EXPECT_FALSE(e.recognize("take.C3D"));

  EXPECT_TRUE(e.setDesiredUpAxis(HString("sCeNe")));
  EXPECT_TRUE(e.setDesiredUpAxis(HString("Y")));
  EXPECT_FALSE(e.setDesiredUpAxis(HString("x")));
  EXPECT_EQ(e.getDesiredUpAxis(), C3dExportOptions::EUpAxisY);
  EXPECT_TRUE(e.setDesiredUpAxis(HString("z")));
  EXPECT_EQ(e.getDesiredUpAxisAsString(), "Z");

  C3dExportOptions options;
  ASSERT_TRUE(e.getOptions(&options));
  EXPECT_EQ(options.m_desiredUpAxis, C3dExportOptions::EUpAxisZ);
  options.m_minKeys = 12;
  options.m_desiredUpAxis = C3dExportOptions::EUpAxis(7);
  ASSERT_TRUE(e.setOptions(&options));
  EXPECT_EQ(e.getMinKeys(), 12);
  EXPECT_EQ(e.getDesiredUpAxisAsString(), "");
}

TEST_F(C3DExportTest, UserSetupKeepsEveryOptionButTheDecFlag) {
  g_interface.clear();
  C3DExporter& e = *m_pExporter;
  e.loadUserSetup(); // an empty store keeps the defaults
  EXPECT_TRUE(e.getPreserveGaps());
  EXPECT_EQ(e.getMaxKeys(), 2147483647);

  e.setPreserveGaps(false);
  e.setCollapseToSubjects(false);
  e.setRealFormat(false);
  e.setWriteTimeCode(false);
  e.setWriteUnlabelled(false);
  e.setRemoveLeadingUnderscores(true);
  e.setFilterMinKeys(true);
  e.setFilterMaxKeys(true);
  e.setMinKeys(3);
  e.setMaxKeys(40);
  e.setOverrideHeaderRate(true);
  e.setHeaderRate(59.94);
  e.setDesiredUpAxis(C3dExportOptions::EUpAxisY);
  e.setDecFormat(false);
  e.saveUserSetup();
  for (const char* pKey :
       {"PreserveGaps", "Collapse", "RealFormat", "WriteTimeCode", "WriteUnlabelled",
        "RemoveLeadingUnderscores", "FilterMinKeys", "FilterMaxKeys", "MinKeys", "MaxKeys",
        "OverrideHeaderRate", "HeaderRate", "DesiredUpAxis"})
    EXPECT_NE(g_interface.find("C3DExporter", pKey), nullptr) << pKey;
  EXPECT_EQ(*g_interface.find("C3DExporter", "DesiredUpAxis"), "Y");

  std::unique_ptr<C3DExporter, void (*)(C3DExporter*)> pOther(
      C3DExporter::createInstance(), [](C3DExporter* p) { p->deleteThis(); });
  pOther->loadUserSetup();
  EXPECT_FALSE(pOther->getPreserveGaps() || pOther->getCollapseToSubjects() ||
               pOther->getRealFormat() || pOther->getWriteTimeCode() ||
               pOther->getWriteUnlabelled());
  EXPECT_TRUE(pOther->getRemoveLeadingUnderscores() && pOther->getFilterMinKeys() &&
              pOther->getFilterMaxKeys() && pOther->getOverrideHeaderRate());
  EXPECT_EQ(pOther->getMinKeys(), 3);
  EXPECT_EQ(pOther->getMaxKeys(), 40);
  EXPECT_DOUBLE_EQ(pOther->getHeaderRate(), 59.94);
  EXPECT_EQ(pOther->getDesiredUpAxis(), C3dExportOptions::EUpAxisY);
  EXPECT_TRUE(pOther->getDecFormat());
  g_interface.clear();
}

TEST_F(C3DExportTest, RefusalsLogTheirExactMessages) {
  // An empty module list fails without a message.
  EXPECT_FALSE(exportRange(0, 3));
  EXPECT_TRUE(m_log.empty());
  EXPECT_TRUE(m_bytes.empty());

  addMarker("A");
  m_pExporter->setOverrideHeaderRate(true);
  for (double rate : {0.0, 10000.0, -5.0}) {
    m_log.clear();
    EXPECT_FALSE(exportRange(0, 3));
    ASSERT_EQ(m_log.size(), 1u);
    EXPECT_EQ(m_log[0], "E: Invalid c3d header override rate: " + std::to_string(rate));
    m_pExporter->setHeaderRate(rate == 0.0 ? 10000.0 : -5.0);
  }
  EXPECT_TRUE(m_bytes.empty());

  m_log.clear();
  m_pExporter->setHeaderRate(250.0);
  ASSERT_TRUE(exportRange(0, 3));
  EXPECT_TRUE(m_log.empty());
  EXPECT_DOUBLE_EQ(file().real(20), 250.0);
  EXPECT_DOUBLE_EQ(file().paramReal("POINT", "RATE"), 250.0);

  // A range before frame 0 fails after the rotation, and the rotation stays.
  m_pExporter->setOverrideHeaderRate(false);
  m_pExporter->setDesiredUpAxis(C3dExportOptions::EUpAxisY);
  ASSERT_TRUE(g_db->isZUp());
  EXPECT_FALSE(exportRange(-1, 3));
  ASSERT_EQ(m_log.size(), 1u);
  EXPECT_EQ(m_log[0], "E: C3D format does no allow for negative frame numbers");
  EXPECT_FALSE(g_db->isZUp());
  EXPECT_TRUE(g_db->isSceneRotated());
}

TEST_F(C3DExportTest, UpAxisRotatesForTheWriteAndLeavesTheSceneBitIdentical) {
  Marker* pMarker = addMarker("A", nullptr, {0, 1}, Vec3(1.25, 2.5, 3.75));
  std::vector<Vec3> before;
  for (int f = 0; f < 2; ++f)
    before.push_back(pMarker->getWSPos(frame(f)));

  m_pExporter->setDesiredUpAxis(C3dExportOptions::EUpAxisY);
  ASSERT_TRUE(exportRange(0, 1));
  C3DTest::File f = file();
  // -90 degrees about X: (x, y, z) becomes (x, z, -y).
  EXPECT_DOUBLE_EQ(f.real(dataStart(f)), 1.25);
  EXPECT_DOUBLE_EQ(f.real(dataStart(f) + 4), 3.75);
  EXPECT_DOUBLE_EQ(f.real(dataStart(f) + 8), -2.5);
  EXPECT_EQ(f.paramInt("TRIAL", "X_DIRECTION"), 4);
  EXPECT_EQ(f.paramInt("TRIAL", "Y_DIRECTION"), 5);
  EXPECT_EQ(f.paramInt("TRIAL", "Z_DIRECTION"), 1);
  EXPECT_TRUE(g_db->isZUp());
  EXPECT_FALSE(g_db->isSceneRotated());
  for (int fr = 0; fr < 2; ++fr) {
    const Vec3 after = pMarker->getWSPos(frame(fr));
    EXPECT_EQ(std::memcmp(&after, &before[size_t(fr)], sizeof after), 0);
  }

  // Z up from a Y-up scene: +90 degrees, (x, y, z) becomes (x, -z, y).
  g_db->setZUp(false);
  m_pExporter->setDesiredUpAxis(C3dExportOptions::EUpAxisZ);
  ASSERT_TRUE(exportRange(0, 0));
  f = file();
  EXPECT_DOUBLE_EQ(f.real(dataStart(f) + 4), -3.75);
  EXPECT_DOUBLE_EQ(f.real(dataStart(f) + 8), 2.5);
  EXPECT_EQ(f.paramInt("TRIAL", "X_DIRECTION"), 1);
  EXPECT_FALSE(g_db->isZUp());
  EXPECT_FALSE(g_db->isSceneRotated());

  // An axis the scene already has rotates nothing.
  m_pExporter->setDesiredUpAxis(C3dExportOptions::EUpAxisY);
  ASSERT_TRUE(exportRange(0, 0));
  EXPECT_DOUBLE_EQ(file().real(dataStart(file()) + 4), 2.5);
}

TEST_F(C3DExportTest, KeyFiltersAreInclusive) {
  addMarker("Nine", nullptr, {0, 1, 2, 3, 4, 5, 6, 7, 8});
  addMarker("Ten", nullptr, {0, 1, 2, 3, 4, 5, 6, 7, 8, 9});
  addMarker("Eleven", nullptr, {0, 1, 2, 3, 4, 5, 6, 7, 8, 9, 10});
  m_pExporter->setFilterMinKeys(true);
  m_pExporter->setMinKeys(10);
  ASSERT_TRUE(exportRange(0, 2));
  EXPECT_EQ(file().paramStrings("POINT", "LABELS"), (std::vector<std::string>{"Ten", "Eleven"}));
  m_pExporter->setFilterMaxKeys(true);
  m_pExporter->setMaxKeys(10);
  ASSERT_TRUE(exportRange(0, 2));
  EXPECT_EQ(file().paramStrings("POINT", "LABELS"), std::vector<std::string>{"Ten"});
  // Limits without their flags change nothing.
  m_pExporter->setFilterMinKeys(false);
  m_pExporter->setFilterMaxKeys(false);
  ASSERT_TRUE(exportRange(0, 2));
  EXPECT_EQ(file().paramInt("POINT", "USED"), 3);
}

TEST_F(C3DExportTest, ProgressStepsAfterEveryTenthFrame) {
  addMarker("A");
  FileExporter::s_doProgress = true;
  ASSERT_TRUE(exportRange(0, 24));
  FileExporter::s_doProgress = false;
  EXPECT_EQ(g_theOperationStack.getLow(), 1);
  EXPECT_EQ(g_theOperationStack.getHigh(), 2);
  EXPECT_EQ(g_theOperationStack.getSteps(), 2);
}
