// Inputs that once made a reader fail under the fuzzers (tests/data/fuzz/<target>/), replayed
// through the parsers: each must end in a result or a printable message, never a crash.
#include "AnvilCore/io/C3DReader.h"
#include "AnvilCore/io/TrcReader.h"
#include "exporters/trajectory/c3d/PrintableText.h"
#include <filesystem>
#include <fstream>
#include <gtest/gtest.h>
#include <iterator>

namespace {

std::vector<std::string> corpus(const char* i_pTarget) {
  std::vector<std::string> inputs;
  const std::filesystem::path dir = std::filesystem::path(ANVIL_TEST_DATA) / "fuzz" / i_pTarget;
  if (!std::filesystem::exists(dir)) return inputs;
  for (const auto& entry : std::filesystem::directory_iterator(dir)) {
    if (!entry.is_regular_file() || entry.path().filename() == "README.md") continue;
    std::ifstream in(entry.path(), std::ios::binary);
    inputs.emplace_back(std::istreambuf_iterator<char>(in), std::istreambuf_iterator<char>());
  }
  return inputs;
}

void expectPrintableOutcome(bool i_ok, const std::string& i_error,
                            const std::vector<std::string>& i_labels) {
  if (!i_ok) {
    EXPECT_FALSE(i_error.empty());
    EXPECT_EQ(C3D::printableText(i_error), i_error);
  }
  for (const std::string& label : i_labels)
    EXPECT_EQ(C3D::printableText(label), label);
}

TEST(FuzzCorpusReplay, C3DInputs) {
  for (const std::string& input : corpus("c3d_reader")) {
    AnvilCore::C3DContent content;
    std::string error;
    const bool ok = AnvilCore::parseC3D(reinterpret_cast<const uint8_t*>(input.data()),
                                        input.size(), content, error);
    expectPrintableOutcome(ok, error, content.labels);
  }
}

TEST(FuzzCorpusReplay, TrcInputs) {
  for (const std::string& input : corpus("trc_reader")) {
    AnvilCore::TrcContent content;
    std::string error;
    const bool ok = AnvilCore::parseTrc(input.data(), input.size(), content, error);
    expectPrintableOutcome(ok, error, content.labels);
  }
}

} // namespace
