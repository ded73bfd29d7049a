#include "AnvilFileExporterCommandsPlugin.h"
#include "commands/C3dExportOptionsCmd.h"
#include "commands/FbxExportOptionsCmd.h"
#include "commands/KmfExportOptionsCmd.h"
#include "commands/KmrExportOptionsCmd.h"
#include "commands/KmsExportOptionsCmd.h"
#include "commands/KmtExportOptionsCmd.h"
#include "commands/McpExportOptionsCmd.h"
#include "commands/TrcExportOptionsCmd.h"
#include "commands/UsdExportOptionsCmd.h"
#include <new>

AnvilFileExporterCommandsPlugin* AnvilFileExporterCommandsPlugin::createInstance() {
  return new AnvilFileExporterCommandsPlugin();
}

bool AnvilFileExporterCommandsPlugin::loadCommands() {
  // The host's order.
  m_commands.add(new (std::nothrow) C3dExportOptionsCmd());
  m_commands.add(new (std::nothrow) FbxExportOptionsCmd());
  m_commands.add(new (std::nothrow) McpExportOptionsCmd());
  m_commands.add(new (std::nothrow) TrcExportOptionsCmd());
  m_commands.add(new (std::nothrow) KmtExportOptionsCmd());
  m_commands.add(new (std::nothrow) KmfExportOptionsCmd());
  m_commands.add(new (std::nothrow) KmsExportOptionsCmd());
  m_commands.add(new (std::nothrow) KmrExportOptionsCmd());
  m_commands.add(new (std::nothrow) UsdExportOptionsCmd());
  return true;
}
