#pragma once
#include <optional>
#include <string>
#include <vector>

namespace anvil {

/// Exit codes of the program.
enum ExitCode : int { EExitOk = 0, EExitWriteFailed = 1, EExitUsage = 2 };

struct CommonArgs {
  std::string modulePath;    ///< --module; empty: next to the program
  std::string userSetupPath; ///< --user-setup; empty: the default location
  bool verbose = false;      ///< show info lines of the log
};

struct ExportArgs {
  std::vector<std::string> inputs;
  std::vector<std::string> outputs;
  std::string range; ///< "FIRST:LAST" in frames, or empty for the animation range
  bool selectedOnly = false;
  bool saveSetup = false;                ///< --save-setup: options of this run persist
  std::vector<std::string> scripts;      ///< --script files of option commands
  std::vector<std::string> commandLines; ///< -c option command lines
};

int runExport(const CommonArgs& i_rCommon, const ExportArgs& i_rArgs);
int runFormats(const CommonArgs& i_rCommon, bool i_extensionsOnly);
int runInfo(const CommonArgs& i_rCommon, const std::vector<std::string>& i_inputs);

/// Prints "anvil: <text>" on stderr.
void printError(const std::string& i_rText);
/// Sends the host log to stderr (info lines only when verbose).
void installLogSink(bool i_verbose);

} // namespace anvil
