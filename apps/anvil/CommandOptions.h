#pragma once
#include <string>
#include <vector>

namespace anvil {

class LoadedModule;

/// The script commands of `anvil export`: the script files (--script) first, then the -c lines,
/// each in the order given. Everything is parsed first, then run in order on the live
/// exporters. On a parse error nothing runs; on a parse error or a failing command the message
/// (with its position) is printed and the result is the usage exit code. `EExitOk` otherwise.
int runExportCommands(LoadedModule& i_rModule, const std::vector<std::string>& i_rScripts,
                      const std::vector<std::string>& i_rLines);

/// `anvil commands`: every command with its options and their types.
int runCommandsListing(const std::string& i_rModulePath);

} // namespace anvil
