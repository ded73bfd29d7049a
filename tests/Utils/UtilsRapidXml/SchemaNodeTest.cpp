#include "LibraryGrammar.h"

#include "Utils/UtilsRapidXml/VSchemaNode.h"

#include <rapidxml/rapidxml_print.hpp>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <sstream>

using namespace UtilsRapidXml;
using testing::HasSubstr;

namespace {

std::string EmitSchema(const std::string& stylesheet, const std::string& uri = "urn:anvil:test") {
  rapidxml::xml_document<> document;
  LibraryGrammar::VLibrary library;
  {
    VSchemaNode root(document, true, uri, stylesheet);
    LibraryGrammar::DeclareRoot(root, library);
    EXPECT_EQ(library.m_Sections, 1); // the element set ends the recursion
    for (const auto& book : library.m_Books)
      EXPECT_TRUE(book.m_Title.empty()); // nothing read
  }
  std::ostringstream out;
  out << document;
  return out.str();
}

std::size_t Count(const std::string& text, const std::string& what) {
  std::size_t n = 0;
  for (auto pos = text.find(what); pos != std::string::npos; pos = text.find(what, pos + 1))
    ++n;
  return n;
}

} // namespace

TEST(SchemaNode, HeaderStylesheetAndNamespaces) {
  const std::string xsd = EmitSchema("kmt.xsl");
  EXPECT_EQ(xsd.rfind("<?xml version=\"1.0\" encoding=\"UTF-8\" standalone=\"no\"?>", 0), 0u);
  EXPECT_THAT(xsd, HasSubstr("<?xml-stylesheet type=\"text/xsl\" href=\"kmt.xsl\"?>"));
  EXPECT_THAT(xsd, HasSubstr("<xsd:schema xmlns:ostra=\"urn:anvil:test\" "
                             "xmlns:xml=\"http://www.w3.org/XML/1998/namespace\" "
                             "xmlns:xsd=\"http://www.w3.org/2001/XMLSchema\">"));
  const std::string plain = EmitSchema("", "");
  EXPECT_EQ(Count(plain, "xml-stylesheet"), 0u);
  EXPECT_EQ(Count(plain, "xmlns:ostra"), 0u);
}

TEST(SchemaNode, EachElementOnceEvenWhenRecursive) {
  const std::string xsd = EmitSchema("");
  for (const char* name : {"Library", "Shelf", "Book", "Magazine", "Catalogue", "Section"}) {
    EXPECT_EQ(Count(xsd, std::string("<xsd:element name=\"") + name + "\""), 1u) << name;
  }
  // Section is referenced from Library and from itself.
  EXPECT_EQ(Count(xsd, "<xsd:element ref=\"Section\" maxOccurs=\"unbounded\" minOccurs=\"0\"/>"),
            2u);
  EXPECT_EQ(Count(xsd, "<xsd:simpleType name=\"TYPE_BINDING\">"), 1u);
  EXPECT_THAT(xsd, HasSubstr("<xsd:restriction base=\"xsd:string\">\n"
                             "\t\t\t<xsd:enumeration value=\"HARD\"/>\n"
                             "\t\t\t<xsd:enumeration value=\"SOFT\"/>"));
}

TEST(SchemaNode, OccurrencesChoicesAnnotationsAndAttributeOrder) {
  const std::string xsd = EmitSchema("");
  EXPECT_THAT(xsd, HasSubstr("<xsd:element ref=\"Shelf\" maxOccurs=\"2\"/>"));
  EXPECT_THAT(xsd, HasSubstr("<xsd:element ref=\"Catalogue\" minOccurs=\"0\"/>"));
  // Choice references carry no occurrence limits.
  EXPECT_THAT(xsd, HasSubstr("<xsd:sequence>\n\t\t\t\t<xsd:choice>\n"
                             "\t\t\t\t\t<xsd:element ref=\"Book\"/>\n"
                             "\t\t\t\t\t<xsd:element ref=\"Magazine\"/>"));
  EXPECT_THAT(xsd, HasSubstr("<xsd:annotation ostra:minVersion=\"2.0\">\n"
                             "\t\t\t<xsd:documentation xml:lang=\"en\">Catalogue, since 2.0"));
  EXPECT_THAT(xsd, HasSubstr("<xsd:attribute name=\"SIGNED\" type=\"xsd:boolean\">\n"
                             "\t\t\t\t<xsd:annotation ostra:maxVersion=\"1.9\">"));
  EXPECT_THAT(xsd, HasSubstr("<xsd:attribute name=\"ID\" type=\"xsd:ID\" use=\"required\">"));
  EXPECT_THAT(xsd, HasSubstr("<xsd:attribute name=\"BINDING\" type=\"TYPE_BINDING\">"));
  // Attributes follow the model group inside the complex type.
  const auto library = xsd.find("<xsd:element name=\"Library\"");
  const auto sequenceEnd = xsd.find("</xsd:sequence>", library);
  const auto firstAttribute = xsd.find("<xsd:attribute name=\"VERSION\"", library);
  EXPECT_LT(sequenceEnd, firstAttribute);
}
