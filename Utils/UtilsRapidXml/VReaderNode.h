#pragma once
// INode that reads a parsed document. Each Attribute call fetches and checks one attribute; each
// group of Child calls closed by Children walks the matching child elements and runs their
// declarations. Problems are collected, never thrown: the walk always goes to the end.

#include "Utils/UtilsRapidXml/INode.h"

#include <rapidxml/rapidxml.hpp>

#include <memory>
#include <set>
#include <string>
#include <vector>

namespace UtilsRapidXml {

class VReaderNode final : public INode {
public:
  /// Shared by every node of one read.
  struct VGlobalInfo {
    IVersion m_Version; ///< (-1, -1) until the root declaration sets it
    std::vector<std::string> m_Errors;
    std::vector<std::string> m_Warnings;
    bool m_StrictSequence = false; ///< children must follow declaration order
    std::set<std::string> m_Ids;   ///< values of "xsd:ID" attributes read so far
  };

  /// Root node over a parsed document, with fresh global information.
  VReaderNode(rapidxml::xml_document<>& document, bool strictSequence);
  /// Node for one element; its path is `parentPath` + "/" + the element name.
  VReaderNode(rapidxml::xml_node<>* node, std::shared_ptr<VGlobalInfo> info,
              const std::string& parentPath);
  /// Adds a warning for every attribute and child element that no declaration visited, unless
  /// the declaration abandoned the element.
  ~VReaderNode() override;

  VReaderNode(const VReaderNode&) = delete;
  VReaderNode& operator=(const VReaderNode&) = delete;

  /// The global information; keep it to read the warnings the destructors add.
  std::shared_ptr<VGlobalInfo> Info() const { return m_pInfo; }
  const std::string& Path() const { return m_Path; }

  std::string Name() const override;
  void SetVersion(const IVersion& version) override { m_pInfo->m_Version = version; }
  IVersion Version() const override { return m_pInfo->m_Version; }
  void Enum(const IEnum&) override {}
  void Child(const std::string& name, const std::string& documentation, std::int32_t minOccurs,
             std::int32_t maxOccurs, const IVersion& lower = IVersion::None(),
             const IVersion& upper = IVersion::None()) override;
  void Children(Handler handler, bool choice = false) override;
  bool Attribute(const std::string& name, std::string& o_rValue, const std::string& documentation,
                 const std::string& type, bool required, const IVersion& lower = IVersion::None(),
                 const IVersion& upper = IVersion::None()) override;
  void Error(const std::string& message) override { m_pInfo->m_Errors.push_back(message); }
  void Warning(const std::string& message) override { m_pInfo->m_Warnings.push_back(message); }
  std::uint64_t ErrorCount() const override { return m_pInfo->m_Errors.size(); }
  void Abandon() override { m_Abandoned = true; }

private:
  struct VDeclaration {
    std::string m_Name;
    std::int32_t m_MinOccurs;
    std::int32_t m_MaxOccurs;
    IVersion m_Lower;
    IVersion m_Upper;
  };
  struct VAccepted {
    std::size_t m_Position;
    rapidxml::xml_node<>* m_pNode;
  };

  /// Applies one declaration to the XML children; accepted ones are appended to `io_rAccepted`.
  void MatchDeclaration(const VDeclaration& declaration, bool choice, std::string& io_rChoiceName,
                        std::vector<VAccepted>& io_rAccepted);
  void ReportUnvisited();

  rapidxml::xml_node<>* m_pNode;
  std::shared_ptr<VGlobalInfo> m_pInfo;
  std::string m_Path;
  std::set<std::string> m_VisitedAttributes;
  std::set<std::string> m_VisitedElements;
  std::vector<VDeclaration> m_Declarations;
  std::size_t m_LastPosition = 0; ///< position of the last accepted child, for strict order
  bool m_Abandoned = false;
};

} // namespace UtilsRapidXml
