#include "CommandOptions.h"
#include "AnvilCore/commands/CommandRegistry.h"
#include "AnvilCore/commands/CommandScript.h"
#include "ModuleLoader.h"
#include "Subcommands.h"
#include "plugin/host/Command.h"
#include "plugin/host/Plugin.h"
#include <cstdio>
#include <fstream>
#include <sstream>

namespace anvil {

namespace {
bool readText(const std::string& i_path, std::string& o_rText) {
  std::ifstream in(i_path, std::ios::binary);
  if (!in) return false;
  std::ostringstream buffer;
  buffer << in.rdbuf();
  o_rText = buffer.str();
  return !in.bad();
}

struct ParsedSource {
  std::string name;
  std::vector<AnvilCore::ScriptCall> calls;
};
} // namespace

int runExportCommands(LoadedModule& i_rModule, const std::vector<std::string>& i_rScripts,
                      const std::vector<std::string>& i_rLines) {
  if (i_rScripts.empty() && i_rLines.empty()) return EExitOk;
  const AnvilCore::CommandRegistry& registry = i_rModule.commands();

  std::vector<ParsedSource> sources;
  AnvilCore::ScriptError error;
  auto parse = [&](const std::string& i_text, const std::string& i_name) {
    sources.push_back({i_name, {}});
    return AnvilCore::parseScript(i_text, i_name, registry, sources.back().calls, error);
  };
  for (const std::string& path : i_rScripts) {
    std::string text;
    if (!readText(path, text)) {
      printError("--script " + path + ": cannot read the file");
      return EExitUsage;
    }
    if (!parse(text, path)) {
      printError(error.toString());
      return EExitUsage;
    }
  }
  for (size_t i = 0; i < i_rLines.size(); ++i) {
    // A -c value is one line: a newline inside it would hide a second command.
    if (i_rLines[i].find('\n') != std::string::npos) {
      printError("-c " + std::to_string(i + 1) +
                 ": one command per -c (the value holds a newline)");
      return EExitUsage;
    }
    if (!parse(i_rLines[i], "-c " + std::to_string(i + 1))) {
      printError(error.source + ", column " + std::to_string(error.position.column) + ": " +
                 error.message);
      return EExitUsage;
    }
  }
  for (const ParsedSource& source : sources) {
    if (!AnvilCore::runScript(source.calls, source.name, error)) {
      const bool line = source.name.rfind("-c ", 0) == 0;
      printError((line ? source.name + ": " + error.message : error.toString()) +
                 "; nothing exported");
      return EExitUsage;
    }
  }
  return EExitOk;
}

int runCommandsListing(const std::string& i_rModulePath) {
  LoadedModule module;
  std::string message;
  if (!module.load(i_rModulePath, message)) {
    printError(message);
    return EExitUsage;
  }
  for (const Command* pCommand : module.commands().commands()) {
    std::printf("%s\t%s\n", pCommand->getName().GetStr(), pCommand->getDescription().GetStr());
    for (int id = 0; id < pCommand->getNumOptions(); ++id) {
      if (pCommand->isOptionHidden(id)) continue;
      const CommandOption* pOption = pCommand->getOption(id);
      std::printf("  -%s\t%s%s\n", pOption->getName().GetStr(),
                  Variable::typeName(pOption->getType()),
                  pOption->isRequired() ? " (required)" : "");
    }
  }
  return EExitOk;
}

} // namespace anvil
