#include "CommandRegistry.h"
#include "plugin/host/Command.h"
#include "plugin/host/Plugin.h"

namespace AnvilCore {

CommandRegistry& CommandRegistry::instance() {
  static CommandRegistry s_registry;
  return s_registry;
}

CommandRegistry::~CommandRegistry() {
  clear();
}

bool CommandRegistry::add(Command* i_pCommand) {
  if (!i_pCommand) return false;
  if (find(i_pCommand->getName().GetString())) {
    i_pCommand->unref();
    return false;
  }
  m_commands.push_back(i_pCommand);
  return true;
}

int CommandRegistry::addFromPlugin(CommandPluginBase& i_rPlugin) {
  return i_rPlugin.loadCommands() ? addLoaded(i_rPlugin) : 0;
}

int CommandRegistry::addLoaded(const CommandPluginBase& i_rPlugin) {
  int added = 0;
  for (int i = 0; i < i_rPlugin.getNumCommands(); ++i)
    if (add(i_rPlugin.getCommand(i))) ++added;
  return added;
}

Command* CommandRegistry::find(const std::string& i_rName) const {
  for (Command* pCommand : m_commands)
    if (pCommand->getName().GetString() == i_rName) return pCommand;
  return nullptr;
}

void CommandRegistry::clear() {
  for (Command* pCommand : m_commands)
    pCommand->unref();
  m_commands.clear();
}

} // namespace AnvilCore
