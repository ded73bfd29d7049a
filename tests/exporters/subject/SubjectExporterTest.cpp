#include "SubjectExporterFixture.h"
#include "plugin/host/HInterface.h"
#include "plugin/host/LabelingBone.h"
#include "plugin/host/LabelingSetup.h"
#include "plugin/host/RetargetingBone.h"
#include "plugin/host/RetargetingSetup.h"
#include "plugin/host/SolvingBone.h"
#include "plugin/host/SolvingSetup.h"
#include "plugin/host/SubjectConstraint.h"
#include <cmath>

namespace SubjectTest {
namespace {

const char* const kRootNotFound = "Export failed: Root node could not be determined.";

TEST_F(SubjectExporterTest, DescribesItselfAsTheHostExpects) {
  struct Row {
    FileExporter* p;
    const char* ext;
    const char* description;
  } rows[] = {{m_kmf.get(), "kmf", "Ostra Labeling Setup File"},
              {m_kmt.get(), "kmt", "Ostra Labeling Setup File"},
              {m_kms.get(), "kms", "Ostra Solving Setup File"},
              {m_kmr.get(), "kmr", "Ostra Retargeting Setup File"}};
  for (const Row& row : rows) {
    EXPECT_EQ(row.p->getExtension(), row.ext);
    EXPECT_FALSE(row.p->isBinary());
    EXPECT_TRUE(row.p->getSecondFlag());
    EXPECT_EQ(row.p->getDataType(), 4);
    EXPECT_EQ(row.p->getDescription(), row.description);
    EXPECT_FALSE(row.p->hasEditableOptions());
    EXPECT_EQ(row.p->openFile("/nonexistent/x", false), nullptr);
    EXPECT_TRUE(row.p->recognize(HString("dir.kmf/Bob.") + row.ext));
    EXPECT_FALSE(row.p->recognize(HString("Bob.") + HString(row.ext).Left(2)));
    EXPECT_FALSE(row.p->recognize("Bob.KMF"));
  }
}

TEST_F(SubjectExporterTest, NothingToExportIsInformationNotAnError) {
  HostTest::LogCapture log;
  const std::string path = ExportTest::tempPath("empty.kmf");
  EXPECT_FALSE(exportTo(*m_kmf, path));
  // A subject whose only child is a plain node has no setup either.
  auto* pBob = new Character("Bob");
  g_db->addToScene(pBob, false, nullptr, false, false);
  g_db->addChild(pBob, new Node("Hips"));
  EXPECT_FALSE(exportTo(*m_kms, path));
  EXPECT_EQ(log.texts(HLogLevel::EInfo), std::vector<std::string>(2, kRootNotFound));
  EXPECT_TRUE(log.errors().empty());
  EXPECT_FALSE(std::filesystem::exists(path));
}

TEST_F(SubjectExporterTest, RefusesAmbiguousSetupsWithTheirNames) {
  Character* pBob = addBob();
  const std::string path = ExportTest::tempPath("refused.kmf");
  {
    // A second labeling setup on the subject.
    g_db->addChild(pBob, new LabelingSetup("Spare"));
    HostTest::LogCapture log;
    EXPECT_FALSE(exportTo(*m_kmf, path));
    EXPECT_EQ(log.errors(),
              std::vector<std::string>{"Bob must have a single LabelingSetup module."});
    g_db->removeFromScene(pBob->getChild(pBob->getNumChildren() - 1), false, false, false);
  }
  {
    // Two bones at the top of the labeling setup; a KMS only needs a first one.
    LabelingSetup* pSetup = pBob->getLabelingSetup(false);
    pSetup->setName("BobLabeling");
    g_db->addChild(pSetup, new LabelingBone("Extra"));
    HostTest::LogCapture log;
    EXPECT_FALSE(exportTo(*m_kmt, path));
    EXPECT_EQ(log.errors(),
              std::vector<std::string>{"BobLabeling must have a single LabelingBone child."});
  }
  {
    // Setups without bones.
    SolvingSetup* pSolving = pBob->getSolvingSetup(false);
    g_db->removeFromScene(pSolving->getRootBone(), false, false, false);
    RetargetingSetup* pRetargeting = pBob->getRetargetingSetup(false);
    g_db->removeFromScene(pRetargeting->getRootBone(), false, false, false);
    HostTest::LogCapture log;
    EXPECT_FALSE(exportTo(*m_kms, path));
    EXPECT_FALSE(exportTo(*m_kmr, path));
    EXPECT_EQ(log.errors(),
              (std::vector<std::string>{"Bob must have a single SolvingBone child.",
                                        "Bob must have a single RetargetingBone child."}));
  }
  EXPECT_FALSE(std::filesystem::exists(path));
}

TEST_F(SubjectExporterTest, RefusesASetupOutsideAnyCharacterAndUnconvertibleSubjects) {
  // A top-level plain node holding a labeling setup: the root bone has no character above it.
  auto* pRig = new Node("Rig");
  g_db->addToScene(pRig, false, nullptr, false, false);
  auto* pSetup = new LabelingSetup("RigSetup");
  g_db->addChild(pRig, pSetup);
  g_db->addChild(pSetup, new LabelingBone("Root"));
  m_kmf->moduleList().add(pRig);
  m_kmf->setFilePath(ExportTest::tempPath("rig.kmf").c_str());
  {
    HostTest::LogCapture log;
    EXPECT_FALSE(m_kmf->write());
    EXPECT_EQ(log.errors(),
              std::vector<std::string>{"Export failed: Character does not exist or "
                                       "root node is not a decedent of the character."});
  }
  // A solving setup with two root bones passes the search but not the conversion; a KMT
  // reports in KMF terms.
  Character* pBob = addBob();
  g_db->addChild(pBob->getSolvingSetup(false), new SolvingBone("Extra"));
  g_db->addChild(pBob->getLabelingSetup(false)->getRootBone(), new LabelingBone("Loose"));
  TSimpleArray<Module*> found;
  pBob->getLabelingSetup(false)->getDescendantsWithName("PEL", found);
  ASSERT_EQ(found.getCount(), 1);
  static_cast<SubjectConstraint*>(found[0])->extraBoneNames().push_back("Nowhere");
  HostTest::LogCapture log;
  EXPECT_FALSE(exportTo(*m_kms, ExportTest::tempPath("two.kms")));
  EXPECT_FALSE(exportTo(*m_kmt, ExportTest::tempPath("bad.kmt")));
  const std::vector<std::string> errors = log.errors();
  ASSERT_EQ(errors.size(), 4u);
  EXPECT_EQ(errors[0], "The solving setup of Bob must have exactly one root bone.");
  EXPECT_EQ(errors[1], "Bob can not be exported as a KMS file.");
  EXPECT_EQ(errors[2], "Constraint PEL of Bob names unknown bone Nowhere.");
  EXPECT_EQ(errors[3], "Bob can not be exported as a KMF file.");
}

TEST_F(SubjectExporterTest, KmsOfAPropIsWrittenAfterAWarning) {
  addBob()->setProp(true);
  HostTest::LogCapture log;
  EXPECT_TRUE(exportTo(*m_kms, ExportTest::tempPath("prop.kms")));
  EXPECT_TRUE(exportTo(*m_kmf, ExportTest::tempPath("prop.kmf")));
  EXPECT_EQ(log.warnings(),
            std::vector<std::string>{"Harrow no longer uses KMS files for props. Please export the "
                                     "prop as a KMF instead."});
  EXPECT_TRUE(log.errors().empty());
}

TEST_F(SubjectExporterTest, RetargetPoseNamesTheSourceAndFillsTheBindPose) {
  Character* pBob = addBob();
  const int64_t tpf = g_db->getTimeManager()->getTicksPerFrame();
  g_db->getTimeManager()->setCurrentTime(7 * tpf);
  // The hinge turns 0.3 rad about its axis at frame 7 in the retargeting setup.
  TSimpleArray<RetargetingBone*> bones;
  pBob->getRetargetingSetup(false)->getBones(bones, true);
  ASSERT_EQ(bones.getCount(), 3);
  RetargetingBone* pThorax = bones[1];
  pThorax->m_rotationTrack.setKey(7 * tpf, AnvilRotation(Vec3(0, 0, 1), 0.3 * 180.0 / M_PI));

  const std::string plain = ExportTest::tempPath("plain.kmr");
  ASSERT_TRUE(exportTo(*m_kmr, plain));
  EXPECT_EQ(readBack(plain).application.m_RetargetSourceSubject, "");

  m_kmr->setExportAsRetargetPose(true);
  const std::string posed = ExportTest::tempPath("posed.kmr");
  ASSERT_TRUE(exportTo(*m_kmr, posed));
  const AnvilCore::SubjectRecords records = readBack(posed);
  EXPECT_EQ(records.application.m_RetargetSourceSubject, "Bob_7");
  ASSERT_EQ(records.subject.m_Segments[1].m_Joint.m_BindPose.size(), 1u);
  EXPECT_NEAR(records.subject.m_Segments[1].m_Joint.m_BindPose[0], 0.3, 1e-12);
  EXPECT_EQ(records.subject.m_Segments[0].m_Joint.m_BindPose.size(), 6u);
  EXPECT_EQ(records.subject.m_Segments[2].m_Joint.m_BindPose, std::vector<double>(3, 0.0));
  // A KMS takes the bind pose from the solving setup, unchanged there.
  m_kms->setExportAsRetargetPose(true);
  const std::string solved = ExportTest::tempPath("posed.kms");
  ASSERT_TRUE(exportTo(*m_kms, solved));
  const AnvilCore::SubjectRecords solving = readBack(solved);
  EXPECT_EQ(solving.subject.m_Segments[1].m_Joint.m_BindPose, std::vector<double>{0.0});
  EXPECT_EQ(solving.application.m_RetargetSourceSubject, "");
}

TEST_F(SubjectExporterTest, VersionTableKeepsTheTwoPointThreeReadBack) {
  const std::pair<const char*, const char*> table[] = {
      {"1.0", "1.0"}, {"1.5", "1.5"}, {"2.0", "2.0"}, {"2.5", "2.3"}, {"3.0", "3.0"},
      {"3.2", "3.2"}, {"3.3", "3.3"}, {"3.4", "3.4"}, {"3.5", "3.5"}};
  const int codes[] = {0, 1, 3, 8, 11, 13, 14, 15, 16};
  EXPECT_EQ(m_kmt->getVersionToExport(), "3.5");
  for (size_t i = 0; i < std::size(table); ++i) {
    m_kmt->setVersionToExport(table[i].first);
    EXPECT_EQ(m_kmt->getVersionToExport(), table[i].second);
    EXPECT_EQ(m_kmt->getVersionCode(), codes[i]);
  }
  HostTest::LogCapture log;
  m_kmr->setVersionToExport("2.5");
  m_kmr->saveUserSetup();
  EXPECT_EQ(*g_interface.find("KMRExporter", "VersionToExport"), "2.3");
  ExporterPtr<KmrExporter> pNext(KmrExporter::createInstance());
  pNext->setVersionToExport("1.0");
  pNext->loadUserSetup();
  EXPECT_EQ(pNext->getVersionToExport(), "3.5");
  const std::string refused = "Unsupported KMF export version. Supported versions are 1.0, 1.5, "
                              "2.0, 2.5, 3.0, 3.2, 3.3, 3.4, 3.5";
  EXPECT_EQ(log.errors(), std::vector<std::string>{refused});
  // An absent key keeps the current version.
  m_kms->setVersionToExport("3.2");
  m_kms->loadUserSetup();
  EXPECT_EQ(m_kms->getVersionToExport(), "3.2");
}

TEST_F(SubjectExporterTest, OptionsBlocksAreFourOrEightBytes) {
  m_kms->setVersionToExport("3.0");
  m_kms->setExportAsRetargetPose(true);
  KmsExportOptions kms;
  ASSERT_TRUE(m_kms->getOptions(&kms));
  EXPECT_EQ(kms.m_versionToExport, 11);
  EXPECT_TRUE(kms.m_exportAsRetargetPose);
  kms = KmsExportOptions{13, false};
  m_kmr->setOptions(&kms);
  EXPECT_EQ(m_kmr->getVersionToExport(), "3.2");
  EXPECT_FALSE(m_kmr->getExportAsRetargetPose());
  // The KMF block is the version alone: the byte after it is left as it was.
  unsigned char block[8] = {0, 0, 0, 0, 0xAB, 0xAB, 0xAB, 0xAB};
  m_kmf->setVersionToExport("2.0");
  ASSERT_TRUE(m_kmf->getOptions(block));
  EXPECT_EQ(block[0], 3);
  EXPECT_EQ(block[4], 0xAB);
}

TEST_F(SubjectExporterTest, VersionTwoPointFiveIsWrittenAsTwoPointFive) {
  addBob();
  m_kmf->setVersionToExport("2.5");
  const std::string path = ExportTest::tempPath("v25.kmf");
  ASSERT_TRUE(exportTo(*m_kmf, path));
  EXPECT_NE(ExportTest::readText(path).find("VERSION=\"2.5\""), std::string::npos);
  EXPECT_EQ(m_kmf->getVersionToExport(), "2.3");
}

} // namespace
} // namespace SubjectTest
