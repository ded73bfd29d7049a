#pragma once
// INode that emits an XML Schema (XSD) from a declaration: one global element per element name,
// with documentation and version annotations, enumerations as simple types, and sequences or
// choices of element references carrying each reference's occurrence limits.

#include "Utils/UtilsRapidXml/INode.h"

#include <rapidxml/rapidxml.hpp>

#include <memory>
#include <set>
#include <string>
#include <string_view>
#include <vector>

namespace UtilsRapidXml {

class VSchemaNode final : public INode {
public:
  /// Shared by every node of one emission.
  struct VSchemaInfo {
    IVersion m_Version; ///< recorded only: the schema documents every version
    std::set<std::string> m_EnumNames;
    std::set<std::string> m_ElementNames;
    bool m_UseSequence = true;
    std::vector<std::string> m_Errors;
    std::vector<std::string> m_Warnings;
    rapidxml::xml_document<>* m_pDocument = nullptr;
    rapidxml::xml_node<>* m_pSchema = nullptr; ///< the "xsd:schema" element
  };

  /// Root of an emission into `document`: XML declaration, optional stylesheet instruction and
  /// the "xsd:schema" element. `namespaceUri` becomes "xmlns:ostra" when non-empty.
  VSchemaNode(rapidxml::xml_document<>& document, bool useSequence, const std::string& namespaceUri,
              const std::string& stylesheetName);
  /// Attaches the collected attribute declarations after the element's model group.
  ~VSchemaNode() override;

  VSchemaNode(const VSchemaNode&) = delete;
  VSchemaNode& operator=(const VSchemaNode&) = delete;

  std::shared_ptr<VSchemaInfo> Info() const { return m_pInfo; }

  std::string Name() const override { return m_Name; }
  void SetVersion(const IVersion& version) override { m_pInfo->m_Version = version; }
  IVersion Version() const override { return m_pInfo->m_Version; }
  void Enum(const IEnum& enumeration) override;
  void Child(std::string_view name, std::string_view documentation, std::int32_t minOccurs,
             std::int32_t maxOccurs, const IVersion& lower = IVersion::None(),
             const IVersion& upper = IVersion::None()) override;
  void Children(Handler handler, bool choice = false) override;
  /// Records the attribute's declaration; always returns false (nothing is read).
  bool Attribute(std::string_view name, std::string& o_rValue, std::string_view documentation,
                 std::string_view type, bool required, const IVersion& lower = IVersion::None(),
                 const IVersion& upper = IVersion::None()) override;
  /// As Attribute: records the declaration and returns false.
  bool AttributeText(std::string_view name, std::string_view& o_rValue,
                     std::string_view documentation, std::string_view type, bool required,
                     const IVersion& lower = IVersion::None(),
                     const IVersion& upper = IVersion::None()) override;
  void Error(const std::string& message) override { m_pInfo->m_Errors.push_back(message); }
  void Warning(const std::string& message) override { m_pInfo->m_Warnings.push_back(message); }
  std::uint64_t ErrorCount() const override { return m_pInfo->m_Errors.size(); }

private:
  struct VDeclaration {
    std::string m_Name;
    std::string m_Documentation;
    std::int32_t m_MinOccurs;
    std::int32_t m_MaxOccurs;
    IVersion m_Lower;
    IVersion m_Upper;
  };

  /// A node for a newly seen element: appends its global "xsd:element" to the schema.
  VSchemaNode(std::shared_ptr<VSchemaInfo> info, const VDeclaration& declaration);

  rapidxml::xml_document<>& Document() const { return *m_pInfo->m_pDocument; }
  /// Appends "xsd:annotation" with version limits and documentation under `parent`.
  void AppendAnnotation(rapidxml::xml_node<>* parent, std::string_view documentation,
                        const IVersion& lower, const IVersion& upper);

  std::shared_ptr<VSchemaInfo> m_pInfo;
  std::string m_Name;
  rapidxml::xml_node<>* m_pComplexType = nullptr; ///< null for the root
  rapidxml::xml_node<>* m_pContainer = nullptr;   ///< where element references go
  std::vector<rapidxml::xml_node<>*> m_Attributes;
  std::vector<VDeclaration> m_Declarations;
};

} // namespace UtilsRapidXml
