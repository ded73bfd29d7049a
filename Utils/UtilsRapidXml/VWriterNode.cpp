#include "Utils/UtilsRapidXml/VWriterNode.h"

#include "Utils/UtilsRapidXml/XmlBuild.h"

namespace UtilsRapidXml {

VWriterNode::VWriterNode(rapidxml::xml_document<>& document, const IVersion& version)
    : m_rDocument(document), m_pNode(&document), m_pInfo(std::make_shared<VGlobalInfo>()) {
  m_pInfo->m_Version = version;
}

VWriterNode::VWriterNode(rapidxml::xml_document<>& document, rapidxml::xml_node<>* node,
                         std::shared_ptr<VGlobalInfo> info)
    : m_rDocument(document), m_pNode(node), m_pInfo(std::move(info)) {}

std::string VWriterNode::Name() const {
  return std::string(NodeName(m_pNode));
}

bool VWriterNode::Attribute(std::string_view name, std::string_view value, const IVersion& lower,
                            const IVersion& upper) {
  if (IsOutOfRange(lower, upper)) return false;
  AppendAttribute(m_rDocument, m_pNode, name, value);
  return true;
}

bool VWriterNode::Child(std::string_view name, const Handler& handler, const IVersion& lower,
                        const IVersion& upper) {
  if (IsOutOfRange(lower, upper)) return false;
  VWriterNode child(m_rDocument, AppendElement(m_rDocument, m_pNode, name), m_pInfo);
  if (handler) handler(child);
  return true;
}

} // namespace UtilsRapidXml
