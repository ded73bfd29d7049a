#pragma once
// Reading a subject file (.kmt, .kmf, .kms, .kmr) and printing what it holds: name, version and
// counts by kind, with every message of the read.

#include "River/CoreOstraTypes/VSubjectParametrised.h"
#include "Utils/UtilsRapidXml/IVersion.h"

#include <ostream>
#include <string>
#include <vector>

namespace anvil {

/// Whether the path names a subject file, by its extension (any case).
bool isSubjectFile(const std::string& i_rPath);

/// Prints the summary lines of a subject read from a file of `i_version`.
void describeSubject(const CoreOstraTypes::VSubjectParametrised& i_rSubject,
                     const UtilsRapidXml::IVersion& i_version, std::ostream& o_rOut);

/// Prints messages as "error: ..." and "warning: ..." lines.
void describeMessages(const std::vector<std::string>& i_rErrors,
                      const std::vector<std::string>& i_rWarnings, std::ostream& o_rOut);

/// Reads a subject file and prints its summary and messages on `o_rOut`. Returns EExitOk, or
/// EExitWriteFailed when the read failed (its messages are printed all the same).
int runSubjectInfo(const std::string& i_rPath, std::ostream& o_rOut);

} // namespace anvil
