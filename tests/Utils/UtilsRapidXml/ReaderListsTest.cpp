// The reader's list and lookup roads against their plain definitions: number lists and colours
// against ParseDouble of each blank-separated token, expression lists against
// SplitExpressionList, and attribute lookup on elements with many attributes, shared keys and
// repeated names.

#include "Utils/UtilsRapidXml/AttributeText.h"
#include "Utils/UtilsRapidXml/ReadAttributes.h"
#include "Utils/UtilsRapidXml/VReaderNode.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <cstring>
#include <functional>
#include <random>

using namespace UtilsRapidXml;

namespace {

struct VRun {
  std::vector<std::string> m_Errors;
  std::vector<std::string> m_Warnings;
};

/// Runs `declare` on the one element `E` of `xml`.
VRun ReadElement(const std::string& xml, const std::function<void(INode&)>& declare) {
  std::vector<char> buffer(xml.begin(), xml.end());
  buffer.push_back('\0');
  rapidxml::xml_document<> document;
  document.parse<0>(buffer.data());
  std::shared_ptr<VReaderNode::VGlobalInfo> info;
  {
    VReaderNode root(document, false);
    root.Child("E", "", 1, 1);
    root.Children(declare);
    info = root.Info();
  }
  return {info->m_Errors, info->m_Warnings};
}

std::string Attribute(std::string_view value) {
  return "<E L=\"" + std::string(value) + "\"/>";
}

/// ParseDouble (or the unset marks) of each token, as a list reader reads it.
bool ReferenceList(std::string_view text, bool optional, std::vector<double>& o_rValues) {
  bool ok = true;
  for (const auto token : SplitBlanks(text)) {
    double value = 0.0;
    if (optional && (token == "*" || token == "?")) {
      value = UnsetDouble;
    } else if (!ParseDouble(token, value)) {
      ok = false;
    }
    o_rValues.push_back(value);
  }
  return ok;
}

bool SameBits(double a, double b) {
  return std::memcmp(&a, &b, sizeof a) == 0;
}

} // namespace

TEST(ReaderLists, NumberListsAndColoursReadEachTokenAsParseDouble) {
  const char* const tokens[] = {"0",
                                "-0",
                                "1",
                                "-20",
                                "0.01",
                                "0.10000000000000001",
                                "123456789012345",
                                "1234567890123456",
                                ".5",
                                "-.5",
                                "5.",
                                "-",
                                ".",
                                "1.2.3",
                                "1e3",
                                "+1",
                                "0x1p3",
                                "inf",
                                "nan",
                                "*",
                                "?",
                                "1-2",
                                "99999999999999999999999",
                                "0.000000000000001",
                                "255",
                                "300",
                                "1.#INF"};
  std::mt19937 random(12);
  for (int trial = 0; trial < 4000; ++trial) {
    std::string text;
    const int count = static_cast<int>(random() % 7);
    for (int k = 0; k < count; ++k) {
      text += random() % 4 == 0 ? "\t " : " ";
      text += tokens[random() % std::size(tokens)];
    }
    if (random() % 2) text += "\t";
    for (const bool optional : {false, true}) {
      std::vector<double> expected;
      const bool expectedOk = ReferenceList(text, optional, expected);
      std::vector<double> read{42.0};
      bool ok = false;
      const auto run = ReadElement(Attribute(text), [&](INode& node) {
        ok = optional ? ReadOptionalDoubleList(node, "L", read, AnyCount, 1, "", "", false)
                      : ReadDoubleList(node, "L", read, AnyCount, 1, "", "", false);
      });
      ASSERT_EQ(ok, expectedOk) << text;
      ASSERT_EQ(run.m_Errors.empty(), expectedOk) << text;
      if (!ok) {
        EXPECT_THAT(run.m_Errors, testing::ElementsAre("E node's L attribute could not be "
                                                       "interpreted"));
        EXPECT_EQ(read, std::vector<double>{42.0}) << text;
        continue;
      }
      ASSERT_EQ(read.size(), expected.size() + 1) << text;
      for (std::size_t k = 0; k < expected.size(); ++k)
        ASSERT_TRUE(SameBits(read[k + 1], expected[k])) << text << " at " << k;
    }

    // A colour is three such numbers, clamped; NaN and any other count are refused.
    std::vector<double> expected;
    bool expectedOk = ReferenceList(text, false, expected) && expected.size() == 3;
    for (const double component : expected)
      expectedOk = expectedOk && !std::isnan(component);
    ColourBytes colour{1, 2, 3, 4};
    bool ok = false;
    ReadElement(Attribute(text),
                [&](INode& node) { ok = ReadColour(node, "L", colour, "", "", false); });
    ASSERT_EQ(ok, expectedOk) << text;
    if (ok) {
      for (std::size_t k = 0; k < 3; ++k)
        EXPECT_EQ(colour[k], static_cast<std::uint8_t>(std::clamp(expected[k], 0.0, 255.0)));
      EXPECT_EQ(colour[3], 255);
    } else {
      EXPECT_EQ(colour, (ColourBytes{1, 2, 3, 4}));
    }
  }
}

TEST(ReaderLists, FixedCountsReportTheCountBeforeTheTexts) {
  std::array<double, 3> numbers{7, 7, 7};
  const auto wrong = ReadElement(Attribute("1 x"), [&](INode& node) {
    EXPECT_FALSE(ReadDoubleArray(node, "L", numbers, "", "", false));
  });
  EXPECT_THAT(wrong.m_Errors,
              testing::ElementsAre("E node's L attribute had incorrect number of components"));
  EXPECT_EQ(numbers, (std::array<double, 3>{7, 7, 7}));
  ReadElement(Attribute(" 1\t-2.5  3e1 "), [&](INode& node) {
    EXPECT_TRUE(ReadDoubleArray(node, "L", numbers, "", "", false));
  });
  EXPECT_EQ(numbers, (std::array<double, 3>{1, -2.5, 30}));

  std::array<std::string, 3> expressions{"a", "b", "c"};
  const auto short_ = ReadElement(Attribute("x y"), [&](INode& node) {
    EXPECT_FALSE(ReadExpressionArray(node, "L", expressions, "", "", false));
  });
  EXPECT_THAT(short_.m_Errors,
              testing::ElementsAre("E node's L attribute could not be interpreted"));
  EXPECT_EQ(expressions, (std::array<std::string, 3>{"a", "b", "c"}));
}

TEST(ReaderLists, ExpressionListsSplitAsSplitExpressionList) {
  const char alphabet[] = {'a', '1', ' ', ' ', '\t', '\'', '\\', '*', '-'};
  std::mt19937 random(5);
  for (int trial = 0; trial < 20000; ++trial) {
    std::string text;
    const int length = static_cast<int>(random() % 12);
    for (int k = 0; k < length; ++k)
      text += alphabet[random() % sizeof alphabet];
    std::vector<std::string> expected;
    const bool expectedOk = SplitExpressionList(text, expected);
    // Stored from offset 1 over longer strings than the tokens, which must be replaced whole.
    std::vector<std::string> read{"keep", "a long text that is to be replaced"};
    bool ok = false;
    std::string xml = "<E L='";
    for (const char c : text)
      xml += c == '\'' ? std::string("&apos;") : std::string(1, c);
    xml += "'/>";
    ReadElement(xml, [&](INode& node) {
      ok = ReadExpressionList(node, "L", read, AnyCount, 1, "", "", false);
    });
    ASSERT_EQ(ok, expectedOk) << text;
    if (!ok) continue;
    ASSERT_GE(read.size(), expected.size() + 1) << text;
    EXPECT_EQ(read[0], "keep");
    for (std::size_t k = 0; k < expected.size(); ++k)
      ASSERT_EQ(read[k + 1], expected[k]) << text;
  }
}

TEST(ReaderLists, ManyAttributesWithSharedKeysAndRepeatedNames) {
  for (const int count : {40, 70}) {
    // Names of one length with the same first and last character share their lookup key; at 70
    // there are more than the lookup table places; one name is given twice.
    std::string xml = "<E";
    for (int i = 0; i < count; ++i)
      xml += " A" + std::to_string(10 + i) + "Z=\"" + std::to_string(i) + "\"";
    xml += " A13Z=\"second\" B=\"b\"/>";
    std::vector<std::string> values;
    const auto run = ReadElement(xml, [&](INode& node) {
      for (int i = 0; i < count; i += 3) {
        std::string value;
        EXPECT_TRUE(node.Attribute("A" + std::to_string(10 + i) + "Z", value, "", "", true));
        values.push_back(value);
      }
      std::string absent;
      EXPECT_FALSE(node.Attribute("A99Z", absent, "", "", false));
      EXPECT_FALSE(node.Attribute("C", absent, "", "", true));
    });
    ASSERT_EQ(values.size(), static_cast<std::size_t>((count + 2) / 3));
    for (std::size_t k = 0; k < values.size(); ++k)
      EXPECT_EQ(values[k], std::to_string(3 * k));
    EXPECT_THAT(run.m_Errors, testing::ElementsAre("E element missing required attribute C"));
    // Every attribute not declared is reported once; both A13Z were declared.
    std::vector<std::string> expected;
    for (int i = 0; i < count; ++i)
      if (i % 3 != 0)
        expected.push_back("Ignoring unrecognised attribute: /E/A" + std::to_string(10 + i) + "Z");
    expected.push_back("Ignoring unrecognised attribute: /E/B");
    EXPECT_EQ(run.m_Warnings, expected);
  }

  // Every attribute declared but one, which lies past the first word of marks or in it: only
  // that one is reported; every one declared: nothing is.
  for (const int count : {64, 65, 70}) {
    std::string xml = "<E";
    for (int i = 0; i < count; ++i)
      xml += " A" + std::to_string(i) + "=\"\"";
    xml += "/>";
    for (const int skipped : {count - 1, 3, -1}) {
      const auto run = ReadElement(xml, [&](INode& node) {
        std::string value;
        for (int i = 0; i < count; ++i)
          if (i != skipped) node.Attribute("A" + std::to_string(i), value, "", "", true);
      });
      std::vector<std::string> expected;
      if (skipped >= 0)
        expected.push_back("Ignoring unrecognised attribute: /E/A" + std::to_string(skipped));
      EXPECT_EQ(run.m_Warnings, expected) << count << " " << skipped;
    }
  }

  // A short element takes the table: a repeated name is visited twice, and its first value read.
  std::string first;
  const auto twice = ReadElement(R"(<E N="1" M="x" N="2"/>)",
                                 [&](INode& node) { node.Attribute("N", first, "", "", true); });
  EXPECT_EQ(first, "1");
  EXPECT_THAT(twice.m_Warnings, testing::ElementsAre("Ignoring unrecognised attribute: /E/M"));
}
