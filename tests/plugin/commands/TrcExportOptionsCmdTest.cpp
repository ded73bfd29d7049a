#include "plugin/commands/TrcExportOptionsCmd.h"
#include "CommandTestSupport.h"
#include "exporters/trajectory/TrcExporter.h"

namespace {

class TrcExportOptionsCmdTest : public OptionCommandTest {
protected:
  void SetUp() override {
    OptionCommandTest::SetUp();
    m_pExporter = TrcExporter::createInstance();
    addExporter(m_pExporter);
  }
  TrcExporter* m_pExporter = nullptr;
};

TEST_F(TrcExportOptionsCmdTest, DeclaresItsOptionsInOrder) {
  Command* pCommand = m_registry.find("trcExportOptions");
  ASSERT_NE(pCommand, nullptr);
  EXPECT_EQ(pCommand->getDescription(), "Set TRC Export Options");
  EXPECT_EQ(pCommand->getHelp(), "");
  EXPECT_EQ(pCommand->getCategory(), "File Handling");
  EXPECT_EQ(pCommand->getRuntimeClass(), &Command::s_classCommand);
  const char* names[] = {"writeSubjectNames", "removeLeadingUnderscore", "writeUnlabeled",
                         "collapseSubjects"};
  ASSERT_EQ(pCommand->getNumOptions(), 4);
  for (int i = 0; i < 4; ++i) {
    EXPECT_EQ(pCommand->getOption(i)->getName(), names[i]);
    EXPECT_EQ(pCommand->getOption(i)->getType(), Variable::EBool);
    EXPECT_EQ(pCommand->getOption(i)->getArity(), 1);
    EXPECT_FALSE(pCommand->getOption(i)->isRequired());
  }
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
