#include "CommandTestSupport.h"
#include "exporters/subject/KmfExporter.h"
#include "exporters/subject/KmrExporter.h"
#include "exporters/subject/KmsExporter.h"
#include "exporters/subject/KmtExporter.h"
#include "plugin/AnvilFileExporterCommandsPlugin.h"

namespace {

const char* const kUnsupported = "error: Unsupported KMF export version. Supported versions are "
                                 "1.0, 1.5, 2.0, 2.5, 3.0, 3.2, 3.3, 3.4, 3.5";

class SubjectExportOptionsCmdTest : public OptionCommandTest {
protected:
  void SetUp() override {
    OptionCommandTest::SetUp();
    addExporter(m_pKmf = KmfExporter::createInstance());
    addExporter(m_pKmt = KmtExporter::createInstance());
    addExporter(m_pKms = KmsExporter::createInstance());
    addExporter(m_pKmr = KmrExporter::createInstance());
  }
  KmfExporter* m_pKmf = nullptr;
  KmtExporter* m_pKmt = nullptr;
  KmsExporter* m_pKms = nullptr;
  KmrExporter* m_pKmr = nullptr;
};

TEST_F(SubjectExportOptionsCmdTest, DeclaresTheirOptions) {
  expectDeclaration("kmtExportOptions", "Set Kmt Export Options", {{"version", Variable::EString}});
  expectDeclaration("kmfExportOptions", "Set Kmf Export Options", {{"version", Variable::EString}});
  expectDeclaration("kmsExportOptions", "Set Kms Export Options",
                    {{"version", Variable::EString}, {"retargetPose", Variable::EBool}});
  expectDeclaration("kmrExportOptions", "Set Kmr Export Options",
                    {{"version", Variable::EString}, {"retargetPose", Variable::EBool}});
}

TEST_F(SubjectExportOptionsCmdTest, VersionsGoThroughTheExportersSetter) {
  EXPECT_TRUE(run("kmfExportOptions -version 2.5"));
  EXPECT_EQ(m_pKmf->getVersionCode(), 8);
  EXPECT_EQ(m_pKmf->getVersionToExport(), "2.3");
  EXPECT_TRUE(run("kmtExportOptions -version 1.5"));
  EXPECT_EQ(m_pKmt->getVersionToExport(), "1.5");
  EXPECT_TRUE(log().empty());
  // An unknown version is the setter's error, and the command still succeeds.
  EXPECT_TRUE(run("kmsExportOptions -version 3.1"));
  EXPECT_EQ(m_pKms->getVersionToExport(), "3.5");
  EXPECT_EQ(log(), std::vector<std::string>{kUnsupported});
  // Only its own exporter changes.
  EXPECT_EQ(m_pKmr->getVersionToExport(), "3.5");
  EXPECT_EQ(m_pKmf->getVersionToExport(), "2.3");
}

TEST_F(SubjectExportOptionsCmdTest, RetargetPoseSetsAndToggles) {
  EXPECT_TRUE(run("kmsExportOptions -retargetPose true -version 3.2"));
  EXPECT_TRUE(m_pKms->getExportAsRetargetPose());
  EXPECT_EQ(m_pKms->getVersionToExport(), "3.2");
  EXPECT_TRUE(run("kmrExportOptions -retargetPose toggle"));
  EXPECT_TRUE(m_pKmr->getExportAsRetargetPose());
  EXPECT_TRUE(run("kmrExportOptions -retargetPose toggle -retargetPose toggle"));
  EXPECT_TRUE(m_pKmr->getExportAsRetargetPose());
  EXPECT_TRUE(run("kmsExportOptions -retargetPose off"));
  EXPECT_FALSE(m_pKms->getExportAsRetargetPose());
  EXPECT_TRUE(log().empty());
}

TEST_F(SubjectExportOptionsCmdTest, AllFourReportAMissingExporterAsKmf) {
  EXPECT_TRUE(run("kmrExportOptions"));
  EXPECT_EQ(log().back(), "warning: No options specified. Command has no effect.");
  g_db->getFileExporterMgr()->clear();
  for (const char* name :
       {"kmtExportOptions", "kmfExportOptions", "kmsExportOptions", "kmrExportOptions"}) {
    EXPECT_FALSE(run(std::string(name) + " -version 3.0"));
    EXPECT_EQ(log().back(), "error: Could not find KMF exporter.") << name;
  }
}

} // namespace
