#include "LibraryGrammar.h"

#include "Utils/UtilsRapidXml/ReadAttributes.h"
#include "Utils/UtilsRapidXml/VReaderNode.h"

using namespace UtilsRapidXml;

namespace LibraryGrammar {

namespace {

const VEnum<EBinding>& BindingEnum() {
  static const VEnum<EBinding> e("TYPE_BINDING",
                                 {{"SOFT", EBinding::Soft}, {"HARD", EBinding::Hard}});
  return e;
}

void DeclareSection(INode& node, VLibrary& library) {
  ++library.m_Sections;
  node.Child("Section", "A nested section", 0, -1);
  node.Children([&](INode& child) { DeclareSection(child, library); });
}

void DeclareItem(INode& node, VLibrary& library) {
  VBook book;
  book.m_Kind = node.Name();
  const auto errorsBefore = node.ErrorCount();
  ReadString(node, "TITLE", book.m_Title, "Title of the item", "xsd:string", true);
  ReadDouble(node, "PRICE", book.m_Price, "Price", "xsd:double", false);
  ReadOptionalDouble(node, "DISCOUNT", book.m_Discount, "Discount or *", "xsd:string", false);
  ReadBool(node, "SIGNED", book.m_Signed, "Signed by the author", "xsd:boolean", false, {},
           IVersion(1, 9));
  ReadEnum(node, "BINDING", book.m_Binding, BindingEnum(), "Binding", false);
  ReadDoubleList(node, "SIZE", book.m_Size, 3, 0, "Width, height, depth", "xsd:string", false);
  ReadExpressionList(node, "FORMULA", book.m_Formula, 2, 0, "Two expressions", "xsd:string", false);
  std::string shelf;
  ReadString(node, "SHELF", shelf, "Shelf it belongs to", "xsd:IDREF", false);
  if (node.ErrorCount() == errorsBefore) library.m_Books.push_back(book);
}

void DeclareShelf(INode& node, VLibrary& library) {
  std::string id;
  if (ReadString(node, "ID", id, "Shelf identifier", "xsd:ID", true)) {
    library.m_ShelfIds.push_back(id);
  }
  node.Child("Book", "A book", 0, -1);
  node.Child("Magazine", "A magazine", 0, -1);
  node.Children([&](INode& child) { DeclareItem(child, library); }, true);
}

void DeclareLibrary(INode& node, VLibrary& library) {
  IVersion version(1, 0);
  ReadVersion(node, "VERSION", version, "File version", "xsd:string", true);
  node.SetVersion(version);
  ReadString(node, "NAME", library.m_Name, "Library name", "xsd:string", true);
  ReadString(node, "MOTTO", library.m_Motto, "Motto, since 2.0", "xsd:string", true,
             IVersion(2, 0));
  node.Child("Shelf", "A shelf", 1, 2);
  node.Children([&](INode& child) { DeclareShelf(child, library); });
  node.Child("Catalogue", "Catalogue, since 2.0", 0, 1, IVersion(2, 0));
  node.Children([&](INode&) { ++library.m_Catalogues; });
  node.Child("Section", "A section", 0, -1);
  node.Children([&](INode& child) { DeclareSection(child, library); });
}

} // namespace

void DeclareRoot(INode& node, VLibrary& library) {
  node.Child("Library", "A library", 1, 1);
  node.Children([&](INode& child) { DeclareLibrary(child, library); });
}

VReadResult Read(const std::string& text, bool strictSequence) {
  std::vector<char> buffer(text.begin(), text.end());
  buffer.push_back('\0');
  rapidxml::xml_document<> document;
  document.parse<0>(buffer.data());
  VReadResult result;
  std::shared_ptr<VReaderNode::VGlobalInfo> info;
  {
    VReaderNode root(document, strictSequence);
    info = root.Info();
    DeclareRoot(root, result.m_Library);
  }
  result.m_Errors = info->m_Errors;
  result.m_Warnings = info->m_Warnings;
  return result;
}

} // namespace LibraryGrammar
