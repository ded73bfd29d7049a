// Reads arbitrary bytes as a subject file; every result must come back as messages.

#include "River/CoreOstraKMTIO/Reader.h"

#include <cstddef>
#include <cstdint>
#include <string_view>

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  CoreOstraKMTIO::VReader reader;
  CoreOstraTypes::VSubjectParametrised subject;
  CoreOstraTypes::VSubjectApplicationData appData;
  CoreOstraTypes::VSubjectDynamicSubspace subspace;
  std::vector<std::string> errors, warnings;
  reader.ReadText(std::string_view(reinterpret_cast<const char*>(data), size), subject, appData,
                  subspace, errors, warnings, "Fuzz");
  return 0;
}
