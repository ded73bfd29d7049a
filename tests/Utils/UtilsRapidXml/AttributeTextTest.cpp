#include "Utils/UtilsRapidXml/AttributeText.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <cmath>

using namespace UtilsRapidXml;
using testing::ElementsAre;

TEST(AttributeText, DoublesAcceptWholeTextsAndTheLegacyNonFiniteForms) {
  double v = 7.0;
  EXPECT_TRUE(ParseDouble(" \t-1.25e2\t ", v));
  EXPECT_EQ(v, -125.0);
  for (const char* bad : {"12abc", "", "   ", "1 2", "1.#INFx", "--1"}) {
    v = 7.0;
    EXPECT_FALSE(ParseDouble(bad, v)) << bad;
    EXPECT_EQ(v, 7.0) << bad;
  }
  ASSERT_TRUE(ParseDouble("-1.#INF", v));
  EXPECT_TRUE(std::isinf(v) && v < 0);
  ASSERT_TRUE(ParseDouble(" 1.#QNAN ", v));
  EXPECT_TRUE(std::isnan(v) && !std::signbit(v));
  for (const char* negativeNan : {"-1.#QNAN", "1.#IND", "-1.#IND"}) {
    ASSERT_TRUE(ParseDouble(negativeNan, v)) << negativeNan;
    EXPECT_TRUE(std::isnan(v) && std::signbit(v)) << negativeNan;
  }
  EXPECT_EQ(FormatDouble(0.1), "0.10000000000000001");
  EXPECT_EQ(FormatDouble(-INFINITY), "-inf");
  EXPECT_EQ(FormatDouble(1e300), "1.0000000000000001e+300");
}

TEST(AttributeText, FlagsVersionsAndIntegers) {
  bool b = false;
  EXPECT_TRUE(ParseBool(" 1 ", b) && b);
  EXPECT_TRUE(ParseBool("FALSE", b) && !b);
  EXPECT_TRUE(ParseBool("True", b) && b);
  EXPECT_FALSE(ParseBool("2", b));
  EXPECT_FALSE(ParseBool("yes", b));
  IVersion version;
  EXPECT_TRUE(ParseVersion("3.5", version));
  EXPECT_EQ(version, IVersion(3, 5));
  for (const char* bad : {"3", "3.", ".5", "-3.5", "3.5.1", "a.b"}) {
    EXPECT_FALSE(ParseVersion(bad, version)) << bad;
  }
  EXPECT_LT(IVersion(3, 4), IVersion(3, 10));
  EXPECT_FALSE(IsOutOfRange(IVersion(), IVersion(9, 0), IVersion(9, 9)));
  EXPECT_TRUE(IsOutOfRange(IVersion(2, 0), IVersion(2, 1), IVersion()));
  EXPECT_FALSE(IsOutOfRange(IVersion(2, 1), IVersion(2, 1), IVersion(2, 1)));
  std::uint32_t u = 0;
  EXPECT_TRUE(ParseUnsigned("4294967295", u));
  EXPECT_FALSE(ParseUnsigned("4294967296", u));
  EXPECT_FALSE(ParseUnsigned("-1", u));
}

TEST(AttributeText, ExpressionListsKeepQuotedNamesWhereverTheyStand) {
  std::vector<std::string> t;
  ASSERT_TRUE(SplitExpressionList("  a   'b c'/2 -'d e'  f*'g h' ", t));
  EXPECT_THAT(t, ElementsAre("a", "'b c'/2", "-'d e'", "f*'g h'"));
  ASSERT_TRUE(SplitExpressionList("(1+'a b')*2 x^'c  d' sin('e f')", t));
  EXPECT_THAT(t, ElementsAre("(1+'a b')*2", "x^'c  d'", "sin('e f')"));
  // A backslash takes the next character, a quote or a blank, into the name.
  ASSERT_TRUE(SplitExpressionList(R"('it\'s x'*2 'back\\' 3)", t));
  EXPECT_THAT(t, ElementsAre(R"('it\'s x'*2)", R"('back\\')", "3"));
  // A tab is white space inside one expression, as it always was.
  ASSERT_TRUE(SplitExpressionList("a\t+\tb c", t));
  EXPECT_THAT(t, ElementsAre("a\t+\tb", "c"));
  ASSERT_TRUE(SplitExpressionList("", t));
  EXPECT_TRUE(t.empty());
  t = {"kept"};
  EXPECT_FALSE(SplitExpressionList("'unterminated x", t));
  EXPECT_FALSE(SplitExpressionList(R"('a\' b)", t));
  EXPECT_THAT(t, ElementsAre("kept"));

  EXPECT_TRUE(HasUnquotedBlank("a + b"));
  EXPECT_TRUE(HasUnquotedBlank("a\t+b"));
  EXPECT_FALSE(HasUnquotedBlank("'a b'*c"));
  EXPECT_FALSE(HasUnquotedBlank(R"(2*'it\'s x')"));
  EXPECT_TRUE(HasUnquotedBlank(R"('a\\' b)"));
}

TEST(AttributeText, ZeroPrintsWithoutASign) {
  EXPECT_EQ(FormatDouble(-0.0), "0");
  EXPECT_EQ(FormatDouble(0.0), "0");
  EXPECT_EQ(FormatDouble(-0.1), "-0.10000000000000001");
}
