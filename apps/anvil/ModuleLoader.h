#pragma once
#include "AnvilCore/commands/CommandRegistry.h"
#include <string>

class CommandPluginBase;
class ExporterPluginBase;

namespace anvil {

/// The export module, loaded with dlopen, with both plug-ins taken, their exporters handed to the
/// host's `FileExporterMgr` and their commands to a registry. The host owns what the plug-ins
/// hand it, and releases all of it before the module's code could go.
class LoadedModule {
public:
  LoadedModule() = default;
  LoadedModule(const LoadedModule&) = delete;
  LoadedModule& operator=(const LoadedModule&) = delete;
  /// Releases the exporters and both plug-ins while the module's code is still loaded.
  ~LoadedModule();

  /// Loads the module at `i_path` (empty: next to the program). On failure returns false with a
  /// message in `o_rError`.
  bool load(const std::string& i_path, std::string& o_rError);
  ExporterPluginBase* exporterPlugin() const { return m_pExporters; }
  CommandPluginBase* commandPlugin() const { return m_pCommands; }
  /// The module's commands, owned here.
  AnvilCore::CommandRegistry& commands() { return m_commands; }
  const std::string& path() const { return m_path; }

  /// Where the module is looked for when no path is given.
  static std::string defaultPath();

private:
  void* m_pHandle = nullptr;
  ExporterPluginBase* m_pExporters = nullptr;
  CommandPluginBase* m_pCommands = nullptr;
  AnvilCore::CommandRegistry m_commands;
  std::string m_path;
};

} // namespace anvil
