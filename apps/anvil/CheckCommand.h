#pragma once
// `anvil check FILE...`: runs the subject checks on subject files and on the subjects of scene
// inputs, and reports every message with the file, subject and the check that gave it.

#include <ostream>
#include <string>
#include <vector>

namespace anvil {

/// One message of a check.
struct CheckMessage {
  std::string file;
  std::string subject; ///< empty when the input could not be read
  std::string rule;    ///< the check that reported: its log channel, or "Input"
  std::string level;   ///< "error" or "warning"
  std::string message;
};

/// Checks every input and prints the messages on `o_rOut`, one line each, or as a JSON array
/// with `i_json`. Returns EExitOk when every subject passes, EExitWriteFailed (1) when a check
/// failed, EExitUsage (2) when an input could not be read (the others are still checked).
int runCheck(const std::vector<std::string>& i_rInputs, bool i_json, std::ostream& o_rOut);

} // namespace anvil
