#include "CommandTestSupport.h"
#include "exporters/trajectory/C3DExporter.h"
#include "plugin/AnvilFileExporterCommandsPlugin.h"

namespace {

using C3dExportOptionsCmdTest = ExporterCommandTest<C3DExporter>;

TEST_F(C3dExportOptionsCmdTest, DeclaresItsOptionsInOrder) {
  expectDeclaration("c3dExportOptions", "Set C3D Export Options",
                    {{"preserveGaps", Variable::EBool},
                     {"collapseSubjects", Variable::EBool},
                     {"real", Variable::EBool},
                     {"writeTimeCode", Variable::EBool},
                     {"writeUnlabeled", Variable::EBool},
                     {"removeLeadingUnderscore", Variable::EBool},
                     {"decFormat", Variable::EBool},
                     {"filterMin", Variable::EBool},
                     {"filterMax", Variable::EBool},
                     {"minKeys", Variable::EInteger},
                     {"maxKeys", Variable::EInteger},
                     {"overrideHeaderRate", Variable::EBool},
                     {"headerRate", Variable::EFloat},
                     {"upAxis", Variable::EString}});
}

TEST_F(C3dExportOptionsCmdTest, SetsEveryOption) {
  EXPECT_TRUE(run("c3dExportOptions -preserveGaps false -collapseSubjects off -real 0 "
                  "-writeTimeCode false -writeUnlabeled false -removeLeadingUnderscore true "
                  "-decFormat false -filterMin true -filterMax on -minKeys 10 -maxKeys 500 "
                  "-overrideHeaderRate 1 -headerRate -3.5 -upAxis z"));
  EXPECT_FALSE(m_pExporter->getPreserveGaps());
  EXPECT_FALSE(m_pExporter->getCollapseToSubjects());
  EXPECT_FALSE(m_pExporter->getRealFormat());
  EXPECT_FALSE(m_pExporter->getWriteTimeCode());
  EXPECT_FALSE(m_pExporter->getWriteUnlabelled());
  EXPECT_TRUE(m_pExporter->getRemoveLeadingUnderscores());
  EXPECT_FALSE(m_pExporter->getDecFormat());
  EXPECT_TRUE(m_pExporter->getFilterMinKeys());
  EXPECT_TRUE(m_pExporter->getFilterMaxKeys());
  EXPECT_EQ(m_pExporter->getMinKeys(), 10);
  EXPECT_EQ(m_pExporter->getMaxKeys(), 500);
  EXPECT_TRUE(m_pExporter->getOverrideHeaderRate());
  EXPECT_DOUBLE_EQ(m_pExporter->getHeaderRate(), -3.5); // checked only when writing
  EXPECT_EQ(m_pExporter->getDesiredUpAxis(), C3DExporter::EUpAxis::EUpAxisZ);
  EXPECT_TRUE(log().empty());
  EXPECT_TRUE(run("c3dExportOptions -upAxis Y -minKeys 0"));
  EXPECT_EQ(m_pExporter->getDesiredUpAxis(), C3DExporter::EUpAxis::EUpAxisY);
  EXPECT_EQ(m_pExporter->getMinKeys(), 0);
  EXPECT_TRUE(run("c3dExportOptions -upAxis SCENE"));
  EXPECT_EQ(m_pExporter->getDesiredUpAxis(), C3DExporter::EUpAxis::EUpAxisScene);
}

TEST_F(C3dExportOptionsCmdTest, ToggleFlipsAndTwiceRestores) {
  const bool dec = m_pExporter->getDecFormat();
  const bool gaps = m_pExporter->getPreserveGaps();
  EXPECT_TRUE(run("c3dExportOptions -decFormat toggle -preserveGaps toggle"));
  EXPECT_EQ(m_pExporter->getDecFormat(), !dec);
  EXPECT_EQ(m_pExporter->getPreserveGaps(), !gaps);
  EXPECT_TRUE(run("c3dExportOptions -decFormat toggle -preserveGaps toggle -preserveGaps toggle"));
  EXPECT_EQ(m_pExporter->getDecFormat(), dec);
  EXPECT_EQ(m_pExporter->getPreserveGaps(), !gaps);
}

TEST_F(C3dExportOptionsCmdTest, NegativeKeyCountStopsWithEarlierOptionsKept) {
  EXPECT_FALSE(run("c3dExportOptions -real false -minKeys -1 -maxKeys 5"));
  ASSERT_EQ(log().size(), 1u);
  EXPECT_EQ(log()[0], "error: minKeys value must be positive");
  EXPECT_FALSE(m_pExporter->getRealFormat());
  EXPECT_EQ(m_pExporter->getMinKeys(), -1); // the exporter's default, untouched
  EXPECT_EQ(m_pExporter->getMaxKeys(), 2147483647);
  EXPECT_FALSE(run("c3dExportOptions -maxKeys -7"));
  EXPECT_EQ(log().back(), "error: maxKeys value must be positive");
}

TEST_F(C3dExportOptionsCmdTest, UnknownUpAxisIsLoggedAndTheCommandGoesOn) {
  EXPECT_TRUE(run("c3dExportOptions -upAxis Z"));
  EXPECT_TRUE(run("c3dExportOptions -upAxis X -real false"));
  ASSERT_EQ(log().size(), 1u);
  EXPECT_EQ(log()[0], "error: Valid upAxis arguments are \"Scene\", \"Y\" or \"Z\".");
  EXPECT_EQ(m_pExporter->getDesiredUpAxis(), C3DExporter::EUpAxis::EUpAxisZ);
  EXPECT_FALSE(m_pExporter->getRealFormat());
}

TEST_F(C3dExportOptionsCmdTest, WithoutAnExporterNothingHappens) {
  g_db->getFileExporterMgr()->clear();
  EXPECT_FALSE(run("c3dExportOptions -real false"));
  EXPECT_EQ(log(), (std::vector<std::string>{"error: Could not find C3D exporter."}));
  EXPECT_FALSE(run("c3dExportOptions"));
  EXPECT_EQ(log().back(), "error: Could not find C3D exporter.");
}

} // namespace
