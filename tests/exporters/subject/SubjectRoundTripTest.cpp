// A subject file read into the host and written again gives the records it was read as.
#include "AnvilCore/demo/DemoScene.h"
#include "AnvilCore/io/ISceneReader.h"
#include "River/CoreOstraKMTIO/Writer.h"
#include "SubjectExporterFixture.h"
#include "plugin/host/AnvilSubjectCoreTypesConversion.h"
#include <cstdio>

namespace SubjectTest {
namespace {

class SubjectRoundTripTest : public SubjectExporterTest {
protected:
  /// Writes the test subject as a KMF, reads it back as the reference, and imports the file.
  void SetUp() override {
    SubjectExporterTest::SetUp();
    m_source = ExportTest::tempPath("Bob.kmf");
    const AnvilCore::SubjectRecords records = bobRecords();
    ASSERT_EQ(CoreOstraKMTIO::Write(m_source, records.subject, records.application,
                                    records.subspace, nullptr, 16),
              0u);
    m_reference = readBack(m_source);
    std::string error;
    AnvilCore::ISceneReader* pReader = AnvilCore::SceneReaderRegistry::instance().find(m_source);
    ASSERT_NE(pReader, nullptr);
    ASSERT_TRUE(pReader->read(m_source, error)) << error;
  }
  std::string m_source;
  AnvilCore::SubjectRecords m_reference;
};

TEST_F(SubjectRoundTripTest, ConversionGivesTheRecordsTheFileWasReadAs) {
  Character* pBob = g_db->getSubjectManager()->getSubject(0);
  ASSERT_NE(pBob, nullptr);
  for (int mode : {0, 1}) {
    AnvilSubjectCoreTypesConversion conversion(mode);
    ASSERT_TRUE(conversion.characterToVSubject2(pBob, false));
    EXPECT_EQ(conversion.getSubjectParametrised(), m_reference.subject) << mode;
    EXPECT_EQ(conversion.getSubjectApplicationData(), m_reference.application) << mode;
    EXPECT_EQ(conversion.getCharacterInScene(), pBob);
  }
  // The retargeting setup keeps the skeleton only.
  AnvilSubjectCoreTypesConversion retargeting(2);
  ASSERT_TRUE(retargeting.characterToVSubject2(pBob, false));
  EXPECT_EQ(retargeting.getSubjectParametrised().m_Segments, m_reference.subject.m_Segments);
  EXPECT_TRUE(retargeting.getSubjectParametrised().m_Markers.empty());
  EXPECT_TRUE(retargeting.getSubjectParametrised().m_Targets.empty());
  EXPECT_TRUE(retargeting.getSubjectApplicationData().m_Sticks.empty());
}

TEST_F(SubjectRoundTripTest, EachExporterWritesTheImportedSubjectAgain) {
  const std::string kmf = ExportTest::tempPath("again.kmf"),
                    kmt = ExportTest::tempPath("again.kmt"),
                    kms = ExportTest::tempPath("again.kms"),
                    kmr = ExportTest::tempPath("again.kmr");
  ASSERT_TRUE(exportTo(*m_kmf, kmf));
  ASSERT_TRUE(exportTo(*m_kmt, kmt));
  ASSERT_TRUE(exportTo(*m_kms, kms));
  ASSERT_TRUE(exportTo(*m_kmr, kmr));
  EXPECT_EQ(ExportTest::readText(kmf), ExportTest::readText(m_source));
  EXPECT_EQ(ExportTest::readText(kms), ExportTest::readText(m_source));

  const AnvilCore::SubjectRecords fromKmt = readBack(kmt);
  EXPECT_EQ(fromKmt.subject, m_reference.subject);
  EXPECT_TRUE(fromKmt.subspace.m_PcaControlledParams.empty());
  EXPECT_EQ(ExportTest::readText(kmt).find("SubjectDynamicSubspace"), std::string::npos);
  const AnvilCore::SubjectRecords fromKmr = readBack(kmr);
  EXPECT_EQ(fromKmr.subject.m_Segments, m_reference.subject.m_Segments);
  EXPECT_EQ(fromKmr.subject.m_StaticParameters, m_reference.subject.m_StaticParameters);
  EXPECT_EQ(fromKmr.subspace, m_reference.subspace);
  EXPECT_TRUE(fromKmr.subject.m_Markers.empty());
}

TEST_F(SubjectRoundTripTest, ImportEvaluatesPreTransformsAtTheSubjectsParameters) {
  Character* pBob = g_db->getSubjectManager()->getSubject(0);
  TSimpleArray<LabelingBone*> bones;
  pBob->getLabelingSetup(false)->getBones(bones);
  ASSERT_EQ(bones.getCount(), 3);
  EXPECT_EQ(bones[1]->getPreTranslation(), Vec3(0, 0, 450));   // Height * 0.25
  EXPECT_EQ(bones[2]->getPreTranslation(), Vec3(0, 180, 310)); // ArmLength at its value
  EXPECT_EQ(g_db->getNumLabelingBones(), 3);
  EXPECT_EQ(g_db->getNumLabelingConstraints(), 3);
  EXPECT_EQ(g_db->getLabelingConstraint(1)->getStaticPos(), Vec3(95, 0, 180));
  EXPECT_EQ(g_db->getLabelingConstraint(3), nullptr);
  EXPECT_EQ(g_db->getNumLabelingClusters(), 0);
}

TEST_F(SubjectRoundTripTest, ProgramWritesTheFourFilesFromOneImportedSubject) {
  const std::string anvil = std::string(ANVIL_BIN_DIR) + "/anvil";
  if (!std::filesystem::exists(anvil)) GTEST_SKIP() << "the program is not built";
  const std::string dir = std::filesystem::path(m_source).parent_path().string();
  const std::string command = "cd '" + dir + "' && '" + anvil +
                              "' export Bob.kmf -o Bob.kmt -o Bob.kms -o Bob.kmr --user-setup "
                              "us.ini -c 'kmsExportOptions -version 3.0' 2>&1";
  FILE* pPipe = ::popen(command.c_str(), "r");
  ASSERT_NE(pPipe, nullptr);
  char buffer[4096];
  std::string output;
  for (size_t n; (n = std::fread(buffer, 1, sizeof buffer, pPipe)) > 0;)
    output.append(buffer, n);
  EXPECT_EQ(::pclose(pPipe), 0) << output;
  EXPECT_NE(ExportTest::readText(dir + "/Bob.kms").find("VERSION=\"3.0\""), std::string::npos);
  EXPECT_EQ(readBack(dir + "/Bob.kmt").subject, m_reference.subject);
  EXPECT_EQ(readBack(dir + "/Bob.kmr").subject.m_Segments, m_reference.subject.m_Segments);
}

TEST(SubjectDemoExport, TheDemoSceneExportsToAllFour) {
  AnvilCore::buildDemoScene();
  ExporterPtr<FileExporter> exporters[] = {
      ExporterPtr<FileExporter>(KmfExporter::createInstance()),
      ExporterPtr<FileExporter>(KmtExporter::createInstance()),
      ExporterPtr<FileExporter>(KmsExporter::createInstance()),
      ExporterPtr<FileExporter>(KmrExporter::createInstance())};
  for (auto& pExporter : exporters) {
    const std::string path =
        ExportTest::tempPath("demo." + std::string(pExporter->getExtension().GetStr()));
    const std::string text = ExportTest::exportText(*pExporter, path);
    EXPECT_NE(text.find("<Segment NAME=\"LToes\""), std::string::npos) << path;
  }
  g_db->clearScene();
}

} // namespace
} // namespace SubjectTest
