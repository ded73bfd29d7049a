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

bool OptionCommandTest::run(const std::string& i_line) {
  AnvilCore::ScriptError error;
  const bool ok = AnvilCore::executeScript(i_line, "test", m_registry, error);
  if (!ok && error.message.find("failed") == std::string::npos)
    ADD_FAILURE() << "does not parse: " << error.toString();
  return ok;
}
