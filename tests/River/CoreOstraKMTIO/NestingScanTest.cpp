// The nesting pre-scan: it counts elements, never what sits inside quoted values or markup.

#include "River/CoreOstraKMTIO/ReaderPasses.h"

#include <gtest/gtest.h>

#include <string>

using CoreOstraKMTIO::Detail::NestsDeeperThan;

namespace {

std::string Nested(std::size_t depth, const std::string& attributes = "") {
  std::string text;
  for (std::size_t i = 0; i < depth; ++i)
    text += "<E" + attributes + ">";
  for (std::size_t i = 0; i < depth; ++i)
    text += "</E>";
  return text;
}

TEST(NestingScan, CountsOpenElementsOnly) {
  EXPECT_FALSE(NestsDeeperThan(Nested(3).c_str(), 3));
  EXPECT_TRUE(NestsDeeperThan(Nested(4).c_str(), 3));
  // Closed and empty elements give their level back; declarations and comments take none.
  EXPECT_FALSE(NestsDeeperThan("<?xml version=\"1.0\"?><!-- c --><A><B/><B/><B/></A>", 2));
  EXPECT_TRUE(NestsDeeperThan("<A><B><C/></B></A>", 2));
  EXPECT_FALSE(NestsDeeperThan("<A></A><A></A><A></A>", 1));
}

TEST(NestingScan, QuotedValuesHideMarkup) {
  // '<', '>' and the other quote inside a value are text, whichever quote encloses it.
  const std::string hidden = Nested(3, " V=\"<a><b><c>' \" W='\"<d>>' X=\"/\"");
  EXPECT_FALSE(NestsDeeperThan(hidden.c_str(), 3));
  EXPECT_TRUE(NestsDeeperThan(hidden.c_str(), 2));
  // A '/' at the end of a value does not close the element.
  EXPECT_TRUE(NestsDeeperThan("<A V=\"x/\"><B V='/'><C/></B></A>", 2));
  // Long values, as a real file's lists are, beside short ones.
  const std::string longValue = Nested(5, " V=\"" + std::string(5000, '1') + " <\" S=''");
  EXPECT_FALSE(NestsDeeperThan(longValue.c_str(), 5));
  EXPECT_TRUE(NestsDeeperThan(longValue.c_str(), 4));
}

TEST(NestingScan, FindsQuotesAndEndsAnywhereInALongTag) {
  // Tags scanned in blocks: the quote, the '>' and the '/' before it fall at every offset.
  for (std::size_t pad = 0; pad < 40; ++pad) {
    const std::string blanks(pad, ' ');
    const std::string text = "<A" + blanks + " V='<X><Y><Z>'" + blanks + " W=\"<P><Q>\"" + blanks +
                             "><B" + blanks + "/><C" + blanks + "/></A>";
    EXPECT_FALSE(NestsDeeperThan(text.c_str(), 2)) << pad;
    EXPECT_TRUE(NestsDeeperThan(text.c_str(), 1)) << pad;
  }
}

TEST(NestingScan, TruncatedTextEndsTheScan) {
  // An open quote or tag at the end stops the scan without reading past the text.
  EXPECT_FALSE(NestsDeeperThan("<A><B V=\"<C><D><E>", 2));
  EXPECT_FALSE(NestsDeeperThan("<A><B V='x' ", 2));
  EXPECT_FALSE(NestsDeeperThan("", 0));
  EXPECT_TRUE(NestsDeeperThan("<A><B V=\"x\"><C", 2));
}

} // namespace
