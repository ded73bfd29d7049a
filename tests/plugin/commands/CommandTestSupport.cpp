#include "CommandTestSupport.h"
#include "AnvilCore/commands/CommandScript.h"
#include "plugin/AnvilFileExporterCommandsPlugin.h"

void OptionCommandTest::SetUp() {
  g_db->getFileExporterMgr()->clear();
  AnvilFileExporterCommandsPlugin* pPlugin = AnvilFileExporterCommandsPlugin::createInstance();
  m_registry.addFromPlugin(*pPlugin);
  pPlugin->deleteThis();
  g_db->setLogSink([this](HLogLevel i_level, const std::string& i_rText) {
    if (i_level != HLogLevel::EInfo)
      m_log.push_back((i_level == HLogLevel::EError ? "error: " : "warning: ") + i_rText);
  });
}

void OptionCommandTest::TearDown() {
  g_db->setLogSink(nullptr);
  m_registry.clear();
  g_db->getFileExporterMgr()->clear();
}

void OptionCommandTest::addExporter(FileExporter* i_pExporter) {
  g_db->getFileExporterMgr()->registerExporter(i_pExporter);
}

void OptionCommandTest::expectDeclaration(
    const char* i_pName, const char* i_pDescription,
    const std::vector<std::pair<const char*, Variable::VarType>>& i_options) {
  const Command* pCommand = m_registry.find(i_pName);
  ASSERT_NE(pCommand, nullptr) << i_pName;
  EXPECT_EQ(pCommand->getDescription(), i_pDescription);
  EXPECT_EQ(pCommand->getHelp(), "");
  EXPECT_EQ(pCommand->getCategory(), "File Handling");
  EXPECT_EQ(pCommand->getSubCategory(), "");
  EXPECT_EQ(pCommand->getRuntimeClass(), &Command::s_classCommand);
  ASSERT_EQ(pCommand->getNumOptions(), int(i_options.size()));
  for (int i = 0; i < pCommand->getNumOptions(); ++i) {
    const CommandOption* pOption = pCommand->getOption(i);
    EXPECT_EQ(pOption->getName(), i_options[size_t(i)].first);
    EXPECT_EQ(pOption->getType(), i_options[size_t(i)].second) << pOption->getName().GetStr();
    EXPECT_EQ(pOption->getArity(), 1);
    EXPECT_FALSE(pOption->isRequired());
  }
}

bool OptionCommandTest::run(const std::string& i_line) {
  AnvilCore::ScriptError error;
  const bool ok = AnvilCore::executeScript(i_line, "test", m_registry, error);
  if (!ok && error.message.find("failed") == std::string::npos)
    ADD_FAILURE() << "does not parse: " << error.toString();
  return ok;
}
