#include "Utils/UtilsRapidXml/VReaderNode.h"

#include "DebugServices/GlobalLog.h"
#include "Utils/UtilsRapidXml/XmlBuild.h"

#include <algorithm>

namespace UtilsRapidXml {

namespace {

std::uint32_t NameKey(std::string_view name) {
  if (name.empty()) return 0;
  return static_cast<std::uint32_t>(name.size() << 16) ^
         (static_cast<std::uint32_t>(static_cast<unsigned char>(name.front())) << 8) ^
         static_cast<unsigned char>(name.back());
}

/// The home slot of a key, one of 64.
unsigned KeySlot(std::uint32_t key) {
  return (key * 0x9E3779B1u) >> 26;
}

} // namespace

VReaderNode::VReaderNode(rapidxml::xml_document<>& document, bool strictSequence)
    : m_pNode(&document), m_pInfo(std::make_shared<VGlobalInfo>()) {
  m_pInfo->m_StrictSequence = strictSequence;
  // Room for the IDs of a sizeable document at once, rather than a rehash at every doubling.
  m_pInfo->m_Ids.reserve(256);
}

VReaderNode::VReaderNode(rapidxml::xml_node<>* node, std::shared_ptr<VGlobalInfo> info,
                         const std::string& parentPath)
    : m_pNode(node), m_pInfo(std::move(info)),
      m_Path(parentPath + "/" + std::string(NodeName(node))) {}

VReaderNode::VReaderNode(rapidxml::xml_node<>* node, const VReaderNode& parent)
    : m_pNode(node), m_pInfo(parent.m_pInfo), m_pParent(&parent) {}

VReaderNode::~VReaderNode() {
  try {
    ReportUnvisited();
  } catch (...) {
    // Out of memory while building a warning: nothing sensible left to report.
  }
}

const std::string& VReaderNode::Path() const {
  // A child node lives inside its parent's Children call, so the parent is still there.
  if (m_pParent) {
    const std::string& parentPath = m_pParent->Path();
    const std::string_view name = NodeName(m_pNode);
    m_Path.reserve(parentPath.size() + 1 + name.size());
    m_Path.append(parentPath).append(1, '/').append(name);
    m_pParent = nullptr;
  }
  return m_Path;
}

void VReaderNode::ReportUnvisited() {
  if (m_Abandoned) return;
  // Nearly always every attribute was declared: then there is nothing to walk.
  const bool allVisited = m_AttributesListed && m_VisitedAttributes.AllBelow(m_Attributes.size());
  std::size_t index = 0;
  for (auto* attribute = allVisited ? nullptr : m_pNode->first_attribute(); attribute;
       attribute = attribute->next_attribute(), ++index) {
    if (!m_VisitedAttributes.Test(index)) {
      const std::string key = Path() + "/" + std::string(NodeName(attribute));
      Warning(ZMT::FormatOrRaw("Ignoring unrecognised attribute: %1%", key));
    }
  }
  index = 0;
  for (auto* child = m_pNode->first_node(); child; child = child->next_sibling(), ++index) {
    if (child->type() != rapidxml::node_element) continue;
    if (!m_VisitedElements.Test(index)) {
      const std::string key = Path() + "/" + std::string(NodeName(child));
      Warning(ZMT::FormatOrRaw("Ignoring unrecognised element type: %1%", key));
    }
  }
}

std::string VReaderNode::Name() const {
  return std::string(NodeName(m_pNode));
}

bool VReaderNode::Attribute(std::string_view name, std::string& o_rValue,
                            std::string_view documentation, std::string_view type, bool required,
                            const IVersion& lower, const IVersion& upper) {
  std::string_view value;
  if (!AttributeText(name, value, documentation, type, required, lower, upper)) return false;
  o_rValue.assign(value);
  return true;
}

inline std::size_t VReaderNode::FindAttribute(std::string_view name) {
  // Declaring a name visits every attribute of that name; the first one is the value.
  if (!m_AttributesListed) ListAttributes();
  const std::uint32_t key = NameKey(name);
  unsigned slot = KeySlot(key);
  if (!((m_KeyBits >> slot) & 1u)) return NoAttribute;
  std::size_t found = NoAttribute;
  if (!m_SlotsFull) {
    // Attributes of one name share a home slot, so they all lie on the probe from it.
    for (; m_Slots[slot] != EmptySlot; slot = (slot + 1) % SlotCount) {
      const std::size_t index = m_Slots[slot];
      const auto& listed = m_Attributes[index];
      if (listed.m_Key != key || NodeName(listed.m_pAttribute) != name) continue;
      m_VisitedAttributes.Set(index);
      found = std::min(found, index);
    }
    return found;
  }
  for (std::size_t index = 0; index < m_Attributes.size(); ++index) {
    const auto& listed = m_Attributes[index];
    if (listed.m_Key != key || NodeName(listed.m_pAttribute) != name) continue;
    m_VisitedAttributes.Set(index);
    if (found == NoAttribute) found = index;
  }
  return found;
}

bool VReaderNode::AttributeText(std::string_view name, std::string_view& o_rValue, std::string_view,
                                std::string_view type, bool required, const IVersion& lower,
                                const IVersion& upper) {
  const std::size_t index = FindAttribute(name);
  if (IsOutOfRange(m_pInfo->m_Version, lower, upper)) {
    if (index != NoAttribute) ReportOutOfVersion(name);
    return false;
  }
  if (index == NoAttribute) {
    if (required) ReportMissing(name);
    return false;
  }
  const std::string_view value = NodeValue(m_Attributes[index].m_pAttribute);
  if (type.starts_with("xsd:ID")) CheckId(type, value);
  o_rValue = value;
  return true;
}

void VReaderNode::ReportOutOfVersion(std::string_view name) {
  Warning(ZMT::FormatOrRaw(
      "Ignoring %1% attribute in %2% element. Not supported in files with version %3%",
      std::string(name), Name(), m_pInfo->m_Version.ToString()));
}

void VReaderNode::ReportMissing(std::string_view name) {
  Error(ZMT::FormatOrRaw("%1% element missing required attribute %2%", Name(), std::string(name)));
}

void VReaderNode::CheckId(std::string_view type, std::string_view value) {
  if (type == "xsd:ID") {
    if (!m_pInfo->m_Ids.emplace(value).second) {
      Warning(ZMT::FormatOrRaw("File contains duplicate ID : %1% ", std::string(value)));
    }
  } else if (type == "xsd:IDREF") {
    if (m_pInfo->m_Ids.find(value) == m_pInfo->m_Ids.end()) {
      Warning(ZMT::FormatOrRaw("File contains unknown IDREF : %1% ", std::string(value)));
    }
  }
}

void VReaderNode::ListAttributes() {
  m_Slots.fill(EmptySlot);
  for (auto* attribute = m_pNode->first_attribute(); attribute;
       attribute = attribute->next_attribute()) {
    const std::uint32_t key = NameKey(NodeName(attribute));
    unsigned slot = KeySlot(key);
    m_KeyBits |= std::uint64_t{1} << slot;
    if (m_Attributes.size() < MaxSlotted) {
      while (m_Slots[slot] != EmptySlot)
        slot = (slot + 1) % SlotCount;
      m_Slots[slot] = static_cast<std::uint8_t>(m_Attributes.size());
    } else {
      m_SlotsFull = true; // the rest are found by scanning the list
    }
    m_Attributes.push_back({key, attribute});
  }
  m_AttributesListed = true;
}

void VReaderNode::Child(std::string_view name, std::string_view, std::int32_t minOccurs,
                        std::int32_t maxOccurs, const IVersion& lower, const IVersion& upper) {
  m_Declarations.push_back({{name.begin(), name.end()}, minOccurs, maxOccurs, lower, upper});
}

void VReaderNode::MatchDeclaration(const VDeclaration& declaration, bool choice,
                                   std::string& io_rChoiceName, VAcceptedList& io_rAccepted) {
  std::int64_t count = 0;
  std::size_t position = 0;
  for (auto* child = m_pNode->first_node(); child; child = child->next_sibling(), ++position) {
    if (child->type() != rapidxml::node_element || NodeName(child) != declaration.Name()) continue;
    m_VisitedElements.Set(position);
    if (IsOutOfRange(m_pInfo->m_Version, declaration.m_Lower, declaration.m_Upper)) {
      Warning(ZMT::FormatOrRaw("Ignoring %1% element. Not supported in files with version %2%",
                               std::string(declaration.Name()), m_pInfo->m_Version.ToString()));
      continue;
    }
    if (m_pInfo->m_StrictSequence && position < m_LastPosition) {
      Error(ZMT::FormatOrRaw("%1% element did not appear in correct element sequence",
                             std::string(declaration.Name())));
      continue;
    }
    m_LastPosition = position;
    if (!choice) {
      ++count;
      if (declaration.m_MaxOccurs >= 1 && count > declaration.m_MaxOccurs) {
        Error(ZMT::FormatOrRaw("%1% element must have a maximum of %2% %3% child elements", Path(),
                               declaration.m_MaxOccurs, std::string(declaration.Name())));
        continue;
      }
    } else {
      if (!io_rChoiceName.empty() && io_rChoiceName != declaration.Name()) {
        Error(ZMT::FormatOrRaw("%1% element cannot have both a %2% and a %3% child element", Path(),
                               io_rChoiceName, std::string(declaration.Name())));
        continue;
      }
      io_rChoiceName = declaration.Name();
    }
    io_rAccepted.push_back({position, child});
  }
  if (!choice && count < declaration.m_MinOccurs) {
    Error(ZMT::FormatOrRaw("%1% element must have a minimum of %2% %3% child elements", Path(),
                           declaration.m_MinOccurs, std::string(declaration.Name())));
  }
}

void VReaderNode::Children(Handler handler, bool choice) {
  if (m_Declarations.empty()) return;
  // Take the declarations now: a handler may declare on this node again.
  VDeclarations declarations;
  declarations.swap(m_Declarations);

  VAcceptedList accepted;
  std::string choiceName;
  for (const auto& declaration : declarations) {
    MatchDeclaration(declaration, choice, choiceName, accepted);
  }
  if (choice && accepted.empty()) {
    std::string message =
        ZMT::FormatOrRaw("%1% element must have a one of the following child elements:", Path());
    for (const auto& declaration : declarations)
      message.append(1, ' ').append(declaration.Name());
    Error(message);
  }
  // One declaration's children come in document order already; only several need the sort.
  if (declarations.size() > 1) {
    std::stable_sort(accepted.begin(), accepted.end(), [](const VAccepted& a, const VAccepted& b) {
      return a.m_Position < b.m_Position;
    });
  }
  for (const auto& child : accepted) {
    VReaderNode node(child.m_pNode, *this);
    if (handler) handler(node);
  }
}

} // namespace UtilsRapidXml
