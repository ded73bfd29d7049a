#include "ExportOptionsCommand.h"

namespace ExportOptionsCommand {

void declareOptions(Command& io_rCommand, std::initializer_list<OptionSpec> i_options) {
  io_rCommand.setCommandCategory("File Handling", "");
  for (const OptionSpec& option : i_options)
    io_rCommand.addOption(CommandOption::createInstance(option.m_pName, 1, option.m_type, false), 0,
                          false);
}

FileExporter* findExporter(const char* i_pExtension) {
  FileExporterMgr* pManager = g_db->getFileExporterMgr();
  return pManager ? pManager->getExporter(i_pExtension) : nullptr;
}

bool boolValue(const Variable& i_rValue, bool i_current) {
  const Variable::BoolType value = i_rValue.getBoolValue(-1);
  return value == Variable::EToggle ? !i_current : value == Variable::ETrue;
}

bool keyCountValue(const Variable& i_rValue, const char* i_pName, int& o_rCount) {
  const int count = i_rValue.getIntValue(-1);
  if (count < 0) {
    Command::logError("%s value must be positive", i_pName);
    return false;
  }
  o_rCount = count;
  return true;
}

double rateValue(const Variable& i_rValue) {
  return i_rValue.getFloatValue(-1);
}

bool upAxisValue(const Variable& i_rValue, int& o_rAxis) {
  HString text = i_rValue.getStringValue(-1);
  text.MakeLower();
  if (text == "scene")
    o_rAxis = 0;
  else if (text == "y")
    o_rAxis = 1;
  else if (text == "z")
    o_rAxis = 2;
  else {
    g_db->logError("Valid upAxis arguments are \"Scene\", \"Y\" or \"Z\".");
    return false;
  }
  return true;
}

} // namespace ExportOptionsCommand
