#include "LibraryGrammar.h"

#include "Utils/UtilsRapidXml/ReadAttributes.h"
#include "Utils/UtilsRapidXml/WriteAttributes.h"

#include <rapidxml/rapidxml_print.hpp>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <cmath>
#include <sstream>

using namespace UtilsRapidXml;
using testing::ElementsAre;
using testing::IsEmpty;

namespace {

struct VWritten {
  std::string m_Text;
  std::vector<std::string> m_Errors;
};

template <class F> VWritten Write(const IVersion& version, F fill) {
  rapidxml::xml_document<> document;
  VWriterNode root(document, version);
  fill(root);
  std::ostringstream out;
  rapidxml::print(std::ostream_iterator<char>(out), document, 0);
  return {out.str(), root.Errors()};
}

const VEnum<LibraryGrammar::EBinding>& Binding() {
  static const VEnum<LibraryGrammar::EBinding> e("TYPE_BINDING",
                                                 {{"HARD", LibraryGrammar::EBinding::Hard}});
  return e;
}

} // namespace

TEST(WriterNode, ValueTextFormsAndVersionLimits) {
  const auto w = Write(IVersion(1, 5), [](VWriterNode& root) {
    root.Child("Item", [](VWriterNode& n) {
      WriteDouble(n, "D", 0.1);
      WriteOptionalDouble(n, "U", UnsetDouble);
      WriteOptionalDouble(n, "S", -2.0);
      WriteBool(n, "B", true);
      WriteColour(n, "C", {1, 2, 255, 7});
      const std::vector<double> list{1.5, UnsetDouble, -INFINITY};
      WriteOptionalDoubleList(n, "L", list);
      WriteVersion(n, "V", IVersion(3, 5));
      WriteEnum(n, "E", LibraryGrammar::EBinding::Hard, Binding());
      EXPECT_FALSE(WriteString(n, "NEW", "x", IVersion(2, 0)));
      EXPECT_FALSE(WriteString(n, "OLD", "x", {}, IVersion(1, 4)));
      EXPECT_TRUE(WriteString(n, "IN", "a&b", IVersion(1, 5), IVersion(1, 5)));
    });
    EXPECT_FALSE(root.Child("Later", nullptr, IVersion(2, 0)));
  });
  EXPECT_THAT(w.m_Errors, IsEmpty());
  EXPECT_EQ(w.m_Text, "<Item D=\"0.10000000000000001\" U=\"*\" S=\"-2\" B=\"true\" C=\"1 2 255\" "
                      "L=\"1.5 * -inf\" V=\"3.5\" E=\"HARD\" IN=\"a&amp;b\"/>\n\n");
}

TEST(WriterNode, RefusedValuesAreErrors) {
  const auto w = Write(IVersion(3, 5), [](VWriterNode& root) {
    root.Child("Segment", [](VWriterNode& n) {
      const std::vector<std::string> ok{"'Left Width'/2", "-'a b'*c"};
      const std::vector<std::string> spaced{"a", "b + c"};
      EXPECT_TRUE(WriteExpressionList(n, "POSITION", ok));
      EXPECT_FALSE(WriteExpressionList(n, "ORIENTATION", spaced));
      EXPECT_FALSE(WriteEnum(n, "BINDING", LibraryGrammar::EBinding::Soft, Binding()));
    });
  });
  EXPECT_THAT(w.m_Errors,
              ElementsAre("Node ORIENTATION attribute value b + c contains spaces.",
                          "Could not stringify Segment node's BINDING attribute value."));
  EXPECT_EQ(w.m_Text, "<Segment POSITION=\"'Left Width'/2 -'a b'*c\"/>\n\n");
}

TEST(WriterNode, ChildrenLoopAndRoundTripThroughTheReader) {
  std::vector<LibraryGrammar::VBook> books(3);
  books[0].m_Title = "A";
  books[0].m_Price = 1.0 / 3.0;
  books[0].m_Formula = {"x", "'y z'"};
  books[1].m_Title = "B";
  books[1].m_Price = -0.0;
  books[1].m_Formula = {"1", "2"};
  books[2].m_Title = "C";
  books[2].m_Price = std::nextafter(1.0, 2.0);
  books[2].m_Formula = {"-1", "'q'"};
  const auto w = Write(IVersion(2, 0), [&](VWriterNode& root) {
    root.Child("Library", [&](VWriterNode& lib) {
      WriteVersion(lib, "VERSION", lib.Version());
      WriteString(lib, "NAME", "Round");
      WriteString(lib, "MOTTO", "Trip");
      lib.Child("Shelf", [&](VWriterNode& shelf) {
        WriteString(shelf, "ID", "s");
        shelf.Children("Book", books, [](VWriterNode& n, const LibraryGrammar::VBook& b) {
          WriteString(n, "TITLE", b.m_Title);
          WriteDouble(n, "PRICE", b.m_Price);
          WriteExpressionList(n, "FORMULA", b.m_Formula);
        });
        shelf.Children("Magazine", std::vector<int>{}, [](VWriterNode&, int) {});
      });
    });
  });
  ASSERT_THAT(w.m_Errors, IsEmpty());
  EXPECT_NE(w.m_Text.find("\n\t<Shelf ID=\"s\">\n\t\t<Book "), std::string::npos); // tab indent
  const auto r = LibraryGrammar::Read(w.m_Text);
  EXPECT_THAT(r.m_Errors, IsEmpty());
  EXPECT_THAT(r.m_Warnings, IsEmpty());
  ASSERT_EQ(r.m_Library.m_Books.size(), 3u);
  for (std::size_t i = 0; i < 3; ++i) {
    EXPECT_EQ(r.m_Library.m_Books[i].m_Title, books[i].m_Title);
    EXPECT_EQ(r.m_Library.m_Books[i].m_Price, books[i].m_Price); // %.17g round-trips exactly
    EXPECT_EQ(r.m_Library.m_Books[i].m_Formula, books[i].m_Formula);
  }
  // Zero is written without a sign: "-0" is arithmetic noise, not a value.
  EXPECT_FALSE(std::signbit(r.m_Library.m_Books[1].m_Price));
  EXPECT_EQ(w.m_Text.find("\"-0\""), std::string::npos);
}
