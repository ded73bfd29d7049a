// Feeds arbitrary texts to the expression parser with both evaluating factories, and to the
// expression-list splitter that reads them from files.

#include "River/CoreOstraTypesUtils/MathParser.h"
#include "River/CoreOstraTypesUtils/VMathFactorySimple.h"
#include "Utils/UtilsRapidXml/AttributeText.h"

#include <cstddef>
#include <cstdint>
#include <string>

using namespace CoreOstraTypesUtils;

namespace {

template <class TFactory> void ParseWith(const std::string& text) {
  static const double values[] = {1.5, -2.0, 0.0};
  TFactory factory;
  factory.AddVariable("x", std::span<const double>(values, 1));
  factory.AddVariable("Left Width", std::span<const double>(values + 1, 1));
  factory.AddConstant("k", std::span<const double>(values + 2, 1));
  factory.AddConstant("empty", std::span<const double>());
  MathNodePtr node;
  std::string message;
  const bool ok = Parse(factory, text, node, message, ',');
  if (ok != (node != nullptr)) __builtin_trap();
  if (ok && node->Text().empty()) __builtin_trap();
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  const std::string text(reinterpret_cast<const char*>(data), size);
  ParseWith<VMathFactorySimple>(text);
  ParseWith<VMathFactorySimpleLinear>(text);
  std::vector<std::string> tokens;
  UtilsRapidXml::SplitExpressionList(text, tokens);
  double value = 0.0;
  UtilsRapidXml::ParseDouble(text, value);
  return 0;
}
