#include "CommandTestSupport.h"
#include "exporters/trajectory/TrcExporter.h"

namespace {

using TrcExportOptionsCmdTest = ExporterCommandTest<TrcExporter>;

TEST_F(TrcExportOptionsCmdTest, DeclaresItsOptionsInOrder) {
  expectDeclaration("trcExportOptions", "Set TRC Export Options",
                    {{"writeSubjectNames", Variable::EBool},
                     {"removeLeadingUnderscore", Variable::EBool},
                     {"writeUnlabeled", Variable::EBool},
                     {"collapseSubjects", Variable::EBool}});
}

TEST_F(TrcExportOptionsCmdTest, SetsAndTogglesTheLiveExporter) {
  EXPECT_TRUE(run("trcExportOptions -writeSubjectNames true -removeLeadingUnderscore on "
                  "-writeUnlabeled 0 -collapseSubjects toggle"));
  EXPECT_TRUE(m_pExporter->getWriteSubjects());
  EXPECT_TRUE(m_pExporter->getRemoveLeadingUnderscores());
  EXPECT_FALSE(m_pExporter->getWriteUnlabelled());
  EXPECT_TRUE(m_pExporter->getCollapseSubjects());
  // Twice toggled is unchanged; options apply in call order.
  EXPECT_TRUE(run("trcExportOptions -writeUnlabeled toggle -writeUnlabeled toggle"));
  EXPECT_FALSE(m_pExporter->getWriteUnlabelled());
  EXPECT_TRUE(run("trcExportOptions -collapseSubjects off -collapseSubjects toggle"));
  EXPECT_TRUE(m_pExporter->getCollapseSubjects());
  EXPECT_TRUE(log().empty());
}

TEST_F(TrcExportOptionsCmdTest, WarnsWithoutOptionsAndFailsWithoutExporter) {
  EXPECT_TRUE(run("trcExportOptions"));
  ASSERT_EQ(log().size(), 1u);
  EXPECT_EQ(log()[0], "warning: No options specified. Command has no effect.");
  g_db->getFileExporterMgr()->clear();
  EXPECT_FALSE(run("trcExportOptions -writeUnlabeled true"));
  ASSERT_EQ(log().size(), 2u);
  EXPECT_EQ(log()[1], "error: Could not find TRC exporter.");
}

} // namespace
