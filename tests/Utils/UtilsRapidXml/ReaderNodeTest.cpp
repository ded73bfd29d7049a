#include "LibraryGrammar.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <cmath>

using namespace LibraryGrammar;
using testing::ElementsAre;
using testing::IsEmpty;

TEST(ReaderNode, ReadsAValidDocumentInDocumentOrder) {
  const auto r = Read(R"(<Library VERSION="2.0" NAME="City" MOTTO="Read">
      <Section><Section/></Section>
      <Shelf ID="s1"><Magazine TITLE="M" PRICE=" 2.5	"/><Magazine TITLE="N" SHELF="s1"/></Shelf>
      <Catalogue/>
    </Library>)");
  EXPECT_THAT(r.m_Errors, IsEmpty());
  EXPECT_THAT(r.m_Warnings, IsEmpty());
  EXPECT_EQ(r.m_Library.m_Name, "City");
  EXPECT_EQ(r.m_Library.m_Motto, "Read");
  EXPECT_THAT(r.m_Library.m_ShelfIds, ElementsAre("s1"));
  ASSERT_EQ(r.m_Library.m_Books.size(), 2u);
  EXPECT_EQ(r.m_Library.m_Books[0].m_Title, "M");
  EXPECT_EQ(r.m_Library.m_Books[0].m_Price, 2.5);
  EXPECT_EQ(r.m_Library.m_Catalogues, 1);
  EXPECT_EQ(r.m_Library.m_Sections, 2);
}

TEST(ReaderNode, OccurrenceLimitsAndRequiredAttributes) {
  const auto r =
      Read(R"(<Library VERSION="1.0"><Shelf ID="a"/><Shelf ID="b"/><Shelf ID="c"/></Library>)");
  EXPECT_THAT(r.m_Errors,
              ElementsAre("Library element missing required attribute NAME",
                          "/Library element must have a maximum of 2 Shelf child elements",
                          "/Library/Shelf element must have a one of the following child "
                          "elements: Book Magazine",
                          "/Library/Shelf element must have a one of the following child "
                          "elements: Book Magazine"));
  // The third shelf is dropped; the first two are read.
  EXPECT_THAT(r.m_Library.m_ShelfIds, ElementsAre("a", "b"));
  EXPECT_EQ(r.m_Library.m_Name, "default");

  const auto none = Read(R"(<Library VERSION="1.0" NAME="x"/>)");
  EXPECT_THAT(none.m_Errors,
              ElementsAre("/Library element must have a minimum of 1 Shelf child elements"));
}

TEST(ReaderNode, ChoiceRefusesASecondKind) {
  const auto r = Read(R"(<Library VERSION="1.0" NAME="x"><Shelf ID="a">
      <Book TITLE="B"/><Magazine TITLE="M"/><Book TITLE="C"/></Shelf></Library>)");
  EXPECT_THAT(r.m_Errors, ElementsAre("/Library/Shelf element cannot have both a Book and a "
                                      "Magazine child element"));
  ASSERT_EQ(r.m_Library.m_Books.size(), 2u);
  EXPECT_EQ(r.m_Library.m_Books[1].m_Title, "C");
}

TEST(ReaderNode, VersionLimitsIgnoreContentWithWarnings) {
  const auto r = Read(R"(<Library VERSION="1.5" NAME="x" MOTTO="m"><Catalogue/>
      <Shelf ID="a"><Book TITLE="B" SIGNED="true"/></Shelf></Library>)");
  EXPECT_THAT(r.m_Errors, IsEmpty());
  EXPECT_THAT(r.m_Warnings,
              ElementsAre("Ignoring MOTTO attribute in Library element. Not supported in files "
                          "with version 1.5",
                          "Ignoring Catalogue element. Not supported in files with version 1.5"));
  EXPECT_EQ(r.m_Library.m_Motto, "none"); // required, but out of range: default kept
  EXPECT_EQ(r.m_Library.m_Catalogues, 0);
  ASSERT_EQ(r.m_Library.m_Books.size(), 1u);
  EXPECT_TRUE(r.m_Library.m_Books[0].m_Signed);

  const auto newer = Read(R"(<Library VERSION="2.0" NAME="x" MOTTO="m">
      <Shelf ID="a"><Book TITLE="B" SIGNED="1"/></Shelf></Library>)");
  EXPECT_THAT(newer.m_Warnings, ElementsAre("Ignoring SIGNED attribute in Book element. Not "
                                            "supported in files with version 2.0"));
  EXPECT_FALSE(newer.m_Library.m_Books[0].m_Signed);
}

TEST(ReaderNode, UnrecognisedContentAndIdsGiveWarningsOnly) {
  const auto r = Read(R"(<Other/><Library VERSION="1.0" NAME="x" COLOUR="red">
      <Shelf ID="a" EXTRA="1"><Book TITLE="B" SHELF="zz"><Note/></Book></Shelf>
      <Shelf ID="a"><Book TITLE="C" SHELF="a"/></Shelf></Library>)");
  EXPECT_THAT(r.m_Errors, IsEmpty());
  EXPECT_THAT(r.m_Warnings,
              ElementsAre("File contains unknown IDREF : zz ",
                          "Ignoring unrecognised element type: /Library/Shelf/Book/Note",
                          "Ignoring unrecognised attribute: /Library/Shelf/EXTRA",
                          "File contains duplicate ID : a ",
                          "Ignoring unrecognised attribute: /Library/COLOUR",
                          "Ignoring unrecognised element type: /Other"));
  EXPECT_EQ(r.m_Library.m_Books.size(), 2u);
}

TEST(ReaderNode, StrictSequenceFollowsDeclarationOrder) {
  const std::string text = R"(<Library VERSION="2.0" NAME="x" MOTTO="m"><Catalogue/>
      <Shelf ID="a"><Book TITLE="B"/></Shelf></Library>)";
  EXPECT_THAT(Read(text, false).m_Errors, IsEmpty());
  const auto strict = Read(text, true);
  EXPECT_THAT(strict.m_Errors,
              ElementsAre("Catalogue element did not appear in correct element sequence"));
  EXPECT_EQ(strict.m_Library.m_Catalogues, 0);
}

TEST(ReaderNode, TypedAttributesReportUninterpretableTexts) {
  const auto r = Read(R"(<Library VERSION="1.0" NAME="x"><Shelf ID="a">
      <Book TITLE="ok" PRICE="1.#INF" DISCOUNT="?" BINDING="SOFT" SIZE="1 2	3" FORMULA="-'a b'*2  c"/>
      <Book TITLE="bad" PRICE="12abc"/>
      <Book TITLE="bad" BINDING="Soft"/>
      <Book TITLE="bad" SIZE="1 2"/>
      <Book TITLE="bad" SIZE="1 x 2"/>
      <Book TITLE="bad" FORMULA="a b c"/>
      <Book TITLE="bad" SIGNED="yes"/>
    </Shelf></Library>)");
  EXPECT_THAT(r.m_Errors,
              ElementsAre("Book node's PRICE attribute could not be interpreted",
                          "Book node's BINDING attribute could not be interpreted",
                          "Book node's SIZE attribute had incorrect number of components",
                          "Book node's SIZE attribute could not be interpreted",
                          "Book node's FORMULA attribute could not be interpreted",
                          "Book node's SIGNED attribute could not be interpreted"));
  ASSERT_EQ(r.m_Library.m_Books.size(), 1u);
  const auto& b = r.m_Library.m_Books[0];
  EXPECT_TRUE(std::isinf(b.m_Price) && b.m_Price > 0);
  EXPECT_EQ(b.m_Discount, std::numeric_limits<double>::max());
  EXPECT_EQ(b.m_Binding, EBinding::Soft);
  EXPECT_THAT(b.m_Size, ElementsAre(1, 2, 3));
  EXPECT_THAT(b.m_Formula, ElementsAre("-'a b'*2", "c"));
}
