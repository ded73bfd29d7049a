#pragma once
#include <string>
#include <vector>

class Command;
class CommandPluginBase;

namespace AnvilCore {

/// The script commands known to the host, by name, in order of registration. The registry owns
/// the commands it accepted and releases them (`unref`) in `clear`, which must run before the
/// module that made them is unloaded.
class CommandRegistry {
public:
  static CommandRegistry& instance();
  CommandRegistry() = default;
  ~CommandRegistry();
  CommandRegistry(const CommandRegistry&) = delete;
  CommandRegistry& operator=(const CommandRegistry&) = delete;

  /// Takes a command. A null command is ignored; one whose name is already taken is released
  /// and refused. Returns whether it was added.
  bool add(Command* i_pCommand);
  /// Loads a command plug-in (`loadCommands`) and adds each of its commands in its order.
  /// Returns the number added.
  int addFromPlugin(CommandPluginBase& i_rPlugin);
  /// Adds the commands of a plug-in whose `loadCommands` has already run.
  int addLoaded(const CommandPluginBase& i_rPlugin);
  /// The command of a script name (exact match), or null.
  Command* find(const std::string& i_rName) const;
  const std::vector<Command*>& commands() const { return m_commands; }
  /// Releases every command.
  void clear();

private:
  std::vector<Command*> m_commands;
};

} // namespace AnvilCore
