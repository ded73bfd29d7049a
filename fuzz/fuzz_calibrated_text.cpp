// Reads arbitrary bytes as a calibrated model's text. A model that reads must write text that
// reads back and writes the same text again.

#include "OstraAlgo/KinematicAlgo/VCalibrated.h"

#include <cstddef>
#include <cstdint>
#include <cstdlib>
#include <sstream>
#include <string_view>

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  KinematicAlgo::VSubjectCalibrated subject;
  std::string error;
  if (!subject.ReadText(std::string_view(reinterpret_cast<const char*>(data), size), &error)) {
    if (error.empty()) std::abort(); // every refusal says why
    return 0;
  }
  std::ostringstream first;
  subject.Write(first);
  KinematicAlgo::VSubjectCalibrated again;
  if (!again.ReadText(first.str(), &error)) std::abort();
  std::ostringstream second;
  again.Write(second);
  if (first.str() != second.str()) std::abort();
  return 0;
}
