// Reads arbitrary documents with VReaderNode over a small grammar that uses every typed attribute
// reader, choices, version limits, IDs and recursion.

#include "Utils/UtilsRapidXml/ReadAttributes.h"
#include "Utils/UtilsRapidXml/VReaderNode.h"

#include <rapidxml/rapidxml.hpp>

#include <cstddef>
#include <cstdint>
#include <string>
#include <vector>

using namespace UtilsRapidXml;

namespace {

enum class EKind { A, B };

const VEnum<EKind>& KindEnum() {
  static const VEnum<EKind> e("TYPE_KIND", {{"A", EKind::A}, {"B", EKind::B}});
  return e;
}

void DeclareItem(INode& node, int depth) {
  std::string s;
  double d = 0;
  double optional = UnsetDouble;
  bool b = false;
  std::uint32_t u = 0;
  ColourBytes colour{};
  EKind kind = EKind::A;
  std::vector<double> list;
  std::vector<std::string> expressions;
  ReadString(node, "ID", s, "id", "xsd:ID", false);
  ReadString(node, "REF", s, "ref", "xsd:IDREF", false);
  ReadDouble(node, "D", d, "double", "xsd:double", true);
  ReadOptionalDouble(node, "O", optional, "optional", "xsd:string", false, IVersion(1, 1));
  ReadBool(node, "B", b, "bool", "xsd:boolean", false, {}, IVersion(2, 0));
  ReadUnsigned(node, "U", u, "unsigned", "xsd:unsignedInt", false);
  ReadColour(node, "RGB", colour, "colour", "xsd:string", false);
  ReadEnum(node, "KIND", kind, KindEnum(), "kind", false);
  ReadDoubleList(node, "L", list, 3, 1, "list", "xsd:string", false);
  ReadOptionalDoubleList(node, "OL", list, AnyCount, 0, "list", "xsd:string", false);
  ReadExpressionList(node, "E", expressions, 2, 0, "expressions", "xsd:string", false);
  if (depth > 64) return;
  node.Child("Item", "nested item", 0, 3);
  node.Children([depth](INode& child) { DeclareItem(child, depth + 1); });
  node.Child("Left", "one side", 0, 1);
  node.Child("Right", "other side", 0, 1, IVersion(1, 5));
  node.Children([depth](INode& child) { DeclareItem(child, depth + 1); }, true);
}

void DeclareRoot(INode& node) {
  node.Child("Doc", "document", 1, 1);
  node.Children([](INode& doc) {
    IVersion version(1, 0);
    ReadVersion(doc, "VERSION", version, "version", "xsd:string", true);
    doc.SetVersion(version);
    doc.Child("Item", "item", 1, -1);
    doc.Children([](INode& item) { DeclareItem(item, 0); });
  });
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  if (size == 0) return 0;
  const bool strict = data[0] & 1;
  std::vector<char> buffer(data + 1, data + size);
  buffer.push_back('\0');
  rapidxml::xml_document<> document;
  try {
    document.parse<0>(buffer.data());
  } catch (const rapidxml::parse_error&) {
    return 0;
  }
  VReaderNode root(document, strict);
  DeclareRoot(root);
  return 0;
}
