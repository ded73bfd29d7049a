#include "Utils/UtilsRapidXml/VReaderNode.h"

#include "DebugServices/GlobalLog.h"
#include "Utils/UtilsRapidXml/XmlBuild.h"

#include <algorithm>

namespace UtilsRapidXml {

VReaderNode::VReaderNode(rapidxml::xml_document<>& document, bool strictSequence)
    : m_pNode(&document), m_pInfo(std::make_shared<VGlobalInfo>()) {
  m_pInfo->m_StrictSequence = strictSequence;
}

VReaderNode::VReaderNode(rapidxml::xml_node<>* node, std::shared_ptr<VGlobalInfo> info,
                         const std::string& parentPath)
    : m_pNode(node), m_pInfo(std::move(info)),
      m_Path(parentPath + "/" + std::string(NodeName(node))) {}

VReaderNode::~VReaderNode() {
  try {
    ReportUnvisited();
  } catch (...) {
    // Out of memory while building a warning: nothing sensible left to report.
  }
}

void VReaderNode::ReportUnvisited() {
  if (m_Abandoned) return;
  for (auto* attribute = m_pNode->first_attribute(); attribute;
       attribute = attribute->next_attribute()) {
    const std::string key = m_Path + "/" + std::string(NodeName(attribute));
    if (!m_VisitedAttributes.count(key)) {
      Warning(ZMT::FormatOrRaw("Ignoring unrecognised attribute: %1%", key));
    }
  }
  for (auto* child = m_pNode->first_node(); child; child = child->next_sibling()) {
    if (child->type() != rapidxml::node_element) continue;
    const std::string key = m_Path + "/" + std::string(NodeName(child));
    if (!m_VisitedElements.count(key)) {
      Warning(ZMT::FormatOrRaw("Ignoring unrecognised element type: %1%", key));
    }
  }
}

std::string VReaderNode::Name() const {
  return std::string(NodeName(m_pNode));
}

bool VReaderNode::Attribute(const std::string& name, std::string& o_rValue, const std::string&,
                            const std::string& type, bool required, const IVersion& lower,
                            const IVersion& upper) {
  m_VisitedAttributes.insert(m_Path + "/" + name);
  auto* attribute = m_pNode->first_attribute(name.c_str(), name.size());
  if (IsOutOfRange(m_pInfo->m_Version, lower, upper)) {
    if (attribute) {
      Warning(ZMT::FormatOrRaw(
          "Ignoring %1% attribute in %2% element. Not supported in files with version %3%", name,
          Name(), m_pInfo->m_Version.ToString()));
    }
    return false;
  }
  if (!attribute) {
    if (required) {
      Error(ZMT::FormatOrRaw("%1% element missing required attribute %2%", Name(), name));
    }
    return false;
  }
  o_rValue.assign(NodeValue(attribute));
  if (type == "xsd:ID") {
    if (!m_pInfo->m_Ids.insert(o_rValue).second) {
      Warning(ZMT::FormatOrRaw("File contains duplicate ID : %1% ", o_rValue));
    }
  } else if (type == "xsd:IDREF") {
    if (!m_pInfo->m_Ids.count(o_rValue)) {
      Warning(ZMT::FormatOrRaw("File contains unknown IDREF : %1% ", o_rValue));
    }
  }
  return true;
}

void VReaderNode::Child(const std::string& name, const std::string&, std::int32_t minOccurs,
                        std::int32_t maxOccurs, const IVersion& lower, const IVersion& upper) {
  m_Declarations.push_back({name, minOccurs, maxOccurs, lower, upper});
}

void VReaderNode::MatchDeclaration(const VDeclaration& declaration, bool choice,
                                   std::string& io_rChoiceName,
                                   std::vector<VAccepted>& io_rAccepted) {
  m_VisitedElements.insert(m_Path + "/" + declaration.m_Name);
  std::int64_t count = 0;
  std::size_t position = 0;
  for (auto* child = m_pNode->first_node(); child; child = child->next_sibling(), ++position) {
    if (child->type() != rapidxml::node_element || NodeName(child) != declaration.m_Name) continue;
    if (IsOutOfRange(m_pInfo->m_Version, declaration.m_Lower, declaration.m_Upper)) {
      Warning(ZMT::FormatOrRaw("Ignoring %1% element. Not supported in files with version %2%",
                               declaration.m_Name, m_pInfo->m_Version.ToString()));
      continue;
    }
    if (m_pInfo->m_StrictSequence && position < m_LastPosition) {
      Error(ZMT::FormatOrRaw("%1% element did not appear in correct element sequence",
                             declaration.m_Name));
      continue;
    }
    m_LastPosition = position;
    if (!choice) {
      ++count;
      if (declaration.m_MaxOccurs >= 1 && count > declaration.m_MaxOccurs) {
        Error(ZMT::FormatOrRaw("%1% element must have a maximum of %2% %3% child elements", m_Path,
                               declaration.m_MaxOccurs, declaration.m_Name));
        continue;
      }
    } else {
      if (!io_rChoiceName.empty() && io_rChoiceName != declaration.m_Name) {
        Error(ZMT::FormatOrRaw("%1% element cannot have both a %2% and a %3% child element", m_Path,
                               io_rChoiceName, declaration.m_Name));
        continue;
      }
      io_rChoiceName = declaration.m_Name;
    }
    io_rAccepted.push_back({position, child});
  }
  if (!choice && count < declaration.m_MinOccurs) {
    Error(ZMT::FormatOrRaw("%1% element must have a minimum of %2% %3% child elements", m_Path,
                           declaration.m_MinOccurs, declaration.m_Name));
  }
}

void VReaderNode::Children(Handler handler, bool choice) {
  if (m_Declarations.empty()) return;
  // Take the declarations now: a handler may declare on this node again.
  std::vector<VDeclaration> declarations;
  declarations.swap(m_Declarations);

  std::vector<VAccepted> accepted;
  std::string choiceName;
  for (const auto& declaration : declarations) {
    MatchDeclaration(declaration, choice, choiceName, accepted);
  }
  if (choice && accepted.empty()) {
    std::string message =
        ZMT::FormatOrRaw("%1% element must have a one of the following child elements:", m_Path);
    for (const auto& declaration : declarations)
      message += " " + declaration.m_Name;
    Error(message);
  }
  std::stable_sort(accepted.begin(), accepted.end(), [](const VAccepted& a, const VAccepted& b) {
    return a.m_Position < b.m_Position;
  });
  for (const auto& child : accepted) {
    VReaderNode node(child.m_pNode, m_pInfo, m_Path);
    if (handler) handler(node);
  }
}

} // namespace UtilsRapidXml
