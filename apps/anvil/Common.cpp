#include "Subcommands.h"
#include "plugin/host/Database.h"
#include <cstdio>

namespace anvil {

void printError(const std::string& i_rText) {
  std::fprintf(stderr, "anvil: %s\n", i_rText.c_str());
}

void installLogSink(bool i_verbose) {
  g_db->setLogSink([i_verbose](HLogLevel i_level, const std::string& i_rText) {
    switch (i_level) {
    case HLogLevel::EError:
      std::fprintf(stderr, "error: %s\n", i_rText.c_str());
      break;
    case HLogLevel::EWarning:
      std::fprintf(stderr, "warning: %s\n", i_rText.c_str());
      break;
    case HLogLevel::EInfo:
      if (i_verbose) std::fprintf(stderr, "info: %s\n", i_rText.c_str());
      break;
    }
  });
}

} // namespace anvil
