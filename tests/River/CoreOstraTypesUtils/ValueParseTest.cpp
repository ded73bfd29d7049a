// The value-only evaluation against a parse through VMathFactorySimple: the same value to the bit
// and the same message, for good and bad texts alike.

#include "../../support/RandomDecimalText.h"
#include "River/CoreOstraTypesUtils/MathParser.h"
#include "River/CoreOstraTypesUtils/VMathFactorySimple.h"

#include <gtest/gtest.h>

#include <cmath>
#include <cstdio>
#include <cstring>
#include <random>
#include <string>
#include <vector>

using namespace CoreOstraTypesUtils;

namespace {

struct VOutcome {
  bool m_Ok = false;
  double m_Value = 0.0;
  std::string m_Message;
};

VOutcome ThroughNodes(VMathFactorySimple& factory, const std::string& text, char delimiter) {
  VOutcome outcome;
  MathNodePtr node;
  outcome.m_Ok = Parse(factory, text, node, outcome.m_Message, delimiter);
  if (outcome.m_Ok) outcome.m_Value = static_cast<const VMathNodeSimple&>(*node).m_Value;
  return outcome;
}

VOutcome ThroughValues(VMathFactorySimple& factory, const std::string& text, char delimiter) {
  VOutcome outcome;
  outcome.m_Ok = ParseValue(factory, text, outcome.m_Value, outcome.m_Message, delimiter);
  return outcome;
}

void ExpectSame(VMathFactorySimple& factory, const std::string& text, char delimiter = ',') {
  const VOutcome nodes = ThroughNodes(factory, text, delimiter);
  const VOutcome values = ThroughValues(factory, text, delimiter);
  ASSERT_EQ(values.m_Ok, nodes.m_Ok) << text;
  EXPECT_EQ(values.m_Message, nodes.m_Message) << text;
  if (!nodes.m_Ok) return;
  if (std::isnan(nodes.m_Value)) {
    EXPECT_TRUE(std::isnan(values.m_Value)) << text;
  } else {
    EXPECT_EQ(std::memcmp(&values.m_Value, &nodes.m_Value, sizeof(double)), 0) << text;
  }
}

} // namespace

TEST(ValueParse, GivesTheNodeParsesValueAndMessage) {
  const double length = 412.5, width = -3.25, empty = 0.0;
  VMathFactorySimple factory;
  factory.AddVariable("Length", {&length, 1});
  factory.AddVariable("Left Width", {&width, 1});
  factory.AddConstant("Width", {&width, 1});
  factory.AddConstant("Empty", {&empty, 0});
  const std::vector<std::string> texts = {"10",          "-20",
                                          "-0",          "0.1",
                                          "1.",          ".5",
                                          "00.5",        "1e3",
                                          "1.#INF",      "-1.#IND",
                                          "1.2.3",       "..",
                                          "Length/2",    "-'Left Width'*cos(Length)",
                                          "2^3^2",       "-2^2",
                                          "+5",          "1 - -2",
                                          "Width+Empty", "sin(1)+COS(2)*tan(0.5)",
                                          "1/0",         "-1/0",
                                          "0/0",         "(1+2)*3",
                                          " 7 ",         "",
                                          "   ",         "(",
                                          ")",           "1+",
                                          "Unknown*2",   "fn(1)",
                                          "sin()",       "sin(1,2)",
                                          "sin(1",       "'unterminated",
                                          "1 2",         "3 $",
                                          "1e",          "Length--Length",
                                          "((((1))))",   "'Left Width' / Width",
                                          "sin",         "Length(2)"};
  for (const auto& text : texts)
    ExpectSame(factory, text);
  // A blank as delimiter is refused; a minus as delimiter makes a leading minus a delimiter.
  ExpectSame(factory, "12", ' ');
  ExpectSame(factory, "-12", '-');
  ExpectSame(factory, "sin(1;2)", ';');
}

TEST(ValueParse, PlainNumbersReadAsTheGrammarReadsThem) {
  VMathFactorySimple factory;
  std::mt19937_64 random(5);
  for (int i = 0; i < 20000; ++i) {
    const double value =
        std::ldexp(static_cast<double>(random() >> 11), -static_cast<int>(random() % 80));
    char buffer[64];
    if (i % 2) {
      std::snprintf(buffer, sizeof buffer, "%.17g", value);
    } else {
      std::snprintf(buffer, sizeof buffer, "-%.*f", static_cast<int>(random() % 20), value);
    }
    ExpectSame(factory, buffer);
  }
  // Short decimals, as files hold them, convert without strtod, alone and as the grammar's
  // numbers: at most 15 digits anywhere around the point, the limit and just past it, and the
  // forms of zero, to strtod's value bit for bit.
  auto expectStrtod = [&factory](const std::string& text) {
    ExpectSame(factory, text);
    const bool negative = text[0] == '-';
    char* end = nullptr;
    const double digits = std::strtod(text.c_str() + (negative ? 1 : 0), &end);
    if (*end != '\0') return; // not a number: ExpectSame has checked the refusal
    const double expected = negative ? -digits : digits;
    double alone = 0.0, inSum = 0.0, number = 0.0;
    std::string message;
    ASSERT_TRUE(ParseValue(factory, text, alone, message, ',')) << text;
    ASSERT_TRUE(ParseValue(factory, "0+" + text, inSum, message, ',')) << text;
    ASSERT_TRUE(ReadNumberText(text.substr(negative ? 1 : 0), number)) << text;
    EXPECT_EQ(std::memcmp(&alone, &expected, sizeof(double)), 0) << text;
    EXPECT_EQ(inSum, 0.0 + expected) << text;
    EXPECT_EQ(std::memcmp(&number, &digits, sizeof(double)), 0) << text;
  };
  for (int i = 0; i < 20000; ++i) {
    std::string text = TestSupport::randomDecimalText(random, 16);
    if (random() % 4 == 0) text += '.';
    expectStrtod(text);
  }
  for (const char* text : {"0", "-0", "-0.0", ".5", "-.5", "5.", "999999999999999",
                           "0.000000000000001", "-99999999999999.9", "1234567890123456"})
    expectStrtod(text);
}
