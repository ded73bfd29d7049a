#include "SchemaCommand.h"

#include "Subcommands.h"

#include "River/CoreOstraKMTIO/Reader.h"

namespace anvil {

int runSchema(const std::string& i_rLanguage, const std::string& i_rOutput) {
  if (i_rLanguage != "kmt") {
    printError("unknown schema '" + i_rLanguage + "' (known: kmt)");
    return EExitUsage;
  }
  if (!CoreOstraKMTIO::VReader().WriteSchema(i_rOutput)) {
    printError("cannot write '" + i_rOutput + "'");
    return EExitWriteFailed;
  }
  return EExitOk;
}

} // namespace anvil
