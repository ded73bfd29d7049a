#pragma once
#include <string>

namespace anvil {

/// `anvil schema LANGUAGE -o FILE`: writes the XSD of a file language ("kmt"). Returns an exit
/// code: usage for an unknown language, write failure when the file can't be written.
int runSchema(const std::string& i_rLanguage, const std::string& i_rOutput);

} // namespace anvil
