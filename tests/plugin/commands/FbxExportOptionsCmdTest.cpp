// fbxExportOptions: declaration, place in the host's order and handling of each option kind.
#include "CommandTestSupport.h"
#include "exporters/scene/AnvilFbxExporter.h"
#include "plugin/AnvilFileExporterCommandsPlugin.h"

namespace {

using FbxExportOptionsCmdTest = ExporterCommandTest<AnvilFbxExporter>;

TEST_F(FbxExportOptionsCmdTest, DeclaresItsOptionsAndFollowsC3d) {
  expectDeclaration("fbxExportOptions", "Set Fbx Export Options",
                    {{"collapseSubjects", Variable::EBool},
                     {"exportActiveClipOnly", Variable::EBool},
                     {"upAxis", Variable::EString},
                     {"rotateToFacePositive", Variable::EBool},
                     {"exportLabelingSetups", Variable::EBool},
                     {"namespaceMode", Variable::EString},
                     {"unrollAnimationCurves", Variable::EBool},
                     {"exportPlayRangeOnly", Variable::EBool},
                     {"unscaleRetargeting", Variable::EBool},
                     {"version", Variable::EString}});
  AnvilFileExporterCommandsPlugin* pPlugin = AnvilFileExporterCommandsPlugin::createInstance();
  ASSERT_TRUE(pPlugin->loadCommands());
  std::vector<std::string> names;
  for (int i = 0; i < pPlugin->getNumCommands(); ++i) {
    names.push_back(pPlugin->getCommand(i)->getName().GetStr());
    pPlugin->getCommand(i)->unref();
  }
  pPlugin->deleteThis();
  ASSERT_GE(names.size(), 3u);
  EXPECT_EQ(names[0], "c3dExportOptions");
  EXPECT_EQ(names[1], "fbxExportOptions");
  EXPECT_EQ(names[2], "mcpExportOptions");
}

TEST_F(FbxExportOptionsCmdTest, SetsEveryOptionKind) {
  ASSERT_TRUE(run("fbxExportOptions -collapseSubjects true -exportActiveClipOnly toggle "
                  "-unrollAnimationCurves true -exportPlayRangeOnly true -unscaleRetargeting false "
                  "-exportLabelingSetups true -rotateToFacePositive false"));
  EXPECT_TRUE(m_pExporter->getCollapseSubjects());
  EXPECT_FALSE(m_pExporter->getExportActiveClipOnly());
  EXPECT_TRUE(m_pExporter->getUnrollAnimationCurves());
  EXPECT_TRUE(m_pExporter->getExportPlayRangeOnly());
  EXPECT_FALSE(m_pExporter->getUnscaleRetargetingSubjects());
  EXPECT_TRUE(m_pExporter->getExportLabelingSetups());
  EXPECT_FALSE(m_pExporter->getRotateToFacePostive());

  // Namespace mode is lower-cased by the command; unknown texts change nothing.
  ASSERT_TRUE(run("fbxExportOptions -namespaceMode UseName"));
  EXPECT_EQ(m_pExporter->getNamespaceMode(), FbxExportOptions::ENamespaceUseName);
  ASSERT_TRUE(run("fbxExportOptions -namespaceMode sideways"));
  EXPECT_EQ(m_pExporter->getNamespaceMode(), FbxExportOptions::ENamespaceUseName);
  // Versions are compared as given; unknown ones are ignored here (the setter maps them).
  ASSERT_TRUE(run("fbxExportOptions -version 2014"));
  EXPECT_EQ(m_pExporter->getFBXVersion(), FbxExportOptions::E2014);
  ASSERT_TRUE(run("fbxExportOptions -version 2099"));
  EXPECT_EQ(m_pExporter->getFBXVersion(), FbxExportOptions::E2014);
  // An unknown up axis logs and keeps the field; the command still succeeds.
  ASSERT_TRUE(run("fbxExportOptions -upAxis y -upAxis sideways"));
  EXPECT_EQ(m_pExporter->getDesiredUpAxis(), FbxExportOptions::EUpAxisY);
  EXPECT_EQ(log().back(), "error: Valid upAxis arguments are \"Scene\", \"Y\" or \"Z\".");
  ASSERT_TRUE(run("fbxExportOptions"));
  EXPECT_EQ(log().back(), "warning: No options specified. Command has no effect.");
}

class FbxExportOptionsCmdMissing : public OptionCommandTest {};

TEST_F(FbxExportOptionsCmdMissing, FailsWithoutTheExporter) {
  EXPECT_FALSE(run("fbxExportOptions -collapseSubjects true"));
  EXPECT_EQ(log().back(), "error: Could not find FBX exporter.");
}

} // namespace
