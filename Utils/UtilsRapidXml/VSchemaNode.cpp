#include "Utils/UtilsRapidXml/VSchemaNode.h"

#include "DebugServices/GlobalLog.h"
#include "Utils/UtilsRapidXml/XmlBuild.h"

#include <string_view>

namespace UtilsRapidXml {

namespace {

constexpr std::string_view XmlNamespace = "http://www.w3.org/XML/1998/namespace";
constexpr std::string_view XsdNamespace = "http://www.w3.org/2001/XMLSchema";

} // namespace

VSchemaNode::VSchemaNode(rapidxml::xml_document<>& document, bool useSequence,
                         const std::string& namespaceUri, const std::string& stylesheetName)
    : m_pInfo(std::make_shared<VSchemaInfo>()) {
  m_pInfo->m_UseSequence = useSequence;
  m_pInfo->m_pDocument = &document;

  auto* declaration = document.allocate_node(rapidxml::node_declaration);
  AppendAttribute(document, declaration, "version", "1.0");
  AppendAttribute(document, declaration, "encoding", "UTF-8");
  AppendAttribute(document, declaration, "standalone", "no");
  document.append_node(declaration);

  if (!stylesheetName.empty()) {
    const std::string value = ZMT::FormatOrRaw("type=\"text/xsl\" href=\"%1%\"", stylesheetName);
    document.append_node(document.allocate_node(rapidxml::node_pi, "xml-stylesheet",
                                                PoolString(document, value), 0, value.size()));
  }

  auto* schema = AppendElement(document, &document, "xsd:schema");
  if (!namespaceUri.empty()) AppendAttribute(document, schema, "xmlns:ostra", namespaceUri);
  AppendAttribute(document, schema, "xmlns:xml", XmlNamespace);
  AppendAttribute(document, schema, "xmlns:xsd", XsdNamespace);
  m_pInfo->m_pSchema = schema;
}

VSchemaNode::VSchemaNode(std::shared_ptr<VSchemaInfo> info, const VDeclaration& declaration)
    : m_pInfo(std::move(info)), m_Name(declaration.m_Name) {
  auto& doc = Document();
  auto* element = AppendElement(doc, m_pInfo->m_pSchema, "xsd:element");
  AppendAttribute(doc, element, "name", declaration.m_Name);
  AppendAnnotation(element, declaration.m_Documentation, declaration.m_Lower, declaration.m_Upper);
  m_pComplexType = AppendElement(doc, element, "xsd:complexType");
  m_pContainer = m_pComplexType;
}

VSchemaNode::~VSchemaNode() {
  if (!m_pComplexType) return;
  m_pContainer = m_pComplexType;
  for (auto* attribute : m_Attributes)
    m_pComplexType->append_node(attribute);
}

void VSchemaNode::AppendAnnotation(rapidxml::xml_node<>* parent, std::string_view documentation,
                                   const IVersion& lower, const IVersion& upper) {
  auto& doc = Document();
  auto* annotation = AppendElement(doc, parent, "xsd:annotation");
  if (upper.IsValid()) AppendAttribute(doc, annotation, "ostra:maxVersion", upper.ToString());
  if (lower.IsValid()) AppendAttribute(doc, annotation, "ostra:minVersion", lower.ToString());
  auto* text = AppendElement(doc, annotation, "xsd:documentation");
  AppendAttribute(doc, text, "xml:lang", "en");
  text->value(PoolString(doc, documentation), documentation.size());
}

void VSchemaNode::Enum(const IEnum& enumeration) {
  const std::string name = enumeration.Name();
  if (!m_pInfo->m_EnumNames.insert(name).second) return;
  auto& doc = Document();
  auto* type = AppendElement(doc, m_pInfo->m_pSchema, "xsd:simpleType");
  AppendAttribute(doc, type, "name", name);
  auto* restriction = AppendElement(doc, type, "xsd:restriction");
  AppendAttribute(doc, restriction, "base", "xsd:string");
  for (const auto& keyword : enumeration.Names()) {
    AppendAttribute(doc, AppendElement(doc, restriction, "xsd:enumeration"), "value", keyword);
  }
}

bool VSchemaNode::AttributeText(std::string_view name, std::string_view&,
                                std::string_view documentation, std::string_view type,
                                bool required, const IVersion& lower, const IVersion& upper) {
  std::string unused;
  return Attribute(name, unused, documentation, type, required, lower, upper);
}

bool VSchemaNode::Attribute(std::string_view name, std::string&, std::string_view documentation,
                            std::string_view type, bool required, const IVersion& lower,
                            const IVersion& upper) {
  auto& doc = Document();
  auto* attribute = doc.allocate_node(rapidxml::node_element, "xsd:attribute");
  AppendAttribute(doc, attribute, "name", name);
  AppendAttribute(doc, attribute, "type", type);
  // One schema serves every version: an attribute required only within version limits can't be
  // required of files outside them, so only an unlimited one is marked.
  if (required && !lower.IsValid() && !upper.IsValid()) {
    AppendAttribute(doc, attribute, "use", "required");
  }
  AppendAnnotation(attribute, documentation, lower, upper);
  m_Attributes.push_back(attribute);
  return false;
}

void VSchemaNode::Child(std::string_view name, std::string_view documentation,
                        std::int32_t minOccurs, std::int32_t maxOccurs, const IVersion& lower,
                        const IVersion& upper) {
  m_Declarations.push_back(
      {std::string(name), std::string(documentation), minOccurs, maxOccurs, lower, upper});
}

void VSchemaNode::Children(Handler handler, bool choice) {
  std::vector<VDeclaration> declarations;
  declarations.swap(m_Declarations);
  if (declarations.empty()) return;
  auto& doc = Document();

  rapidxml::xml_node<>* group = nullptr;
  if (m_pComplexType) {
    if (m_pInfo->m_UseSequence && NodeName(m_pContainer) != "xsd:sequence") {
      m_pContainer = AppendElement(doc, m_pContainer, "xsd:sequence");
    }
    group = choice ? AppendElement(doc, m_pContainer, "xsd:choice") : m_pContainer;
  }

  for (const auto& declaration : declarations) {
    if (group) {
      auto* reference = AppendElement(doc, group, "xsd:element");
      AppendAttribute(doc, reference, "ref", declaration.m_Name);
      if (!choice) {
        if (declaration.m_MaxOccurs < 0) {
          AppendAttribute(doc, reference, "maxOccurs", "unbounded");
        } else if (declaration.m_MaxOccurs != 1) {
          AppendAttribute(doc, reference, "maxOccurs", std::to_string(declaration.m_MaxOccurs));
        }
        if (declaration.m_MinOccurs != 1) {
          AppendAttribute(doc, reference, "minOccurs", std::to_string(declaration.m_MinOccurs));
        }
      }
    }
    if (m_pInfo->m_ElementNames.insert(declaration.m_Name).second) {
      VSchemaNode child(m_pInfo, declaration);
      if (handler) handler(child);
    }
  }
}

} // namespace UtilsRapidXml
