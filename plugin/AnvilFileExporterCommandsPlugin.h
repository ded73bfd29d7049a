#pragma once
#include "plugin/host/Plugin.h"
#include "plugin/host/TSimpleArray.h"

class Command;

/// Contributes the exporters' option commands. The commands belong to the host once loaded.
class AnvilFileExporterCommandsPlugin : public CommandPluginBase {
public:
  static AnvilFileExporterCommandsPlugin* createInstance();

  HString getPluginVendor() const override { return "Ostra"; }
  HString getPluginAuthor() const override { return "Ostra"; }
  HString getPluginDate() const override { return "Jun 30 2020"; }
  HString getPluginVersion() const override { return "1.0"; }
  HString getPluginName() const override { return "File Exporter Commands"; }
  HString getPluginApiText() const override { return "2.00"; }
  /// Creates every command in order; a command that cannot be made is appended as null.
  bool loadCommands() override;
  bool unloadCommands() override { return true; }
  int getNumCommands() const override { return m_commands.getCount(); }
  Command* getCommand(int i_index) const override { return m_commands[i_index]; }

private:
  AnvilFileExporterCommandsPlugin() : m_commands(16) {}
  TSimpleArray<Command*> m_commands;
};
