#pragma once
// Builds a document element by element. Every attribute and child call is told its version
// limits; whatever lies outside the version being written is simply left out.

#include "Utils/UtilsRapidXml/IVersion.h"

#include <rapidxml/rapidxml.hpp>

#include <functional>
#include <memory>
#include <string>
#include <string_view>
#include <vector>

namespace UtilsRapidXml {

class VWriterNode {
public:
  /// Shared by every node of one write.
  struct VGlobalInfo {
    IVersion m_Version; ///< the version being written
    std::vector<std::string> m_Errors;
  };
  using Handler = std::function<void(VWriterNode&)>;

  /// Root node: children are appended to the document itself.
  VWriterNode(rapidxml::xml_document<>& document, const IVersion& version);
  /// Node for an element of `document`.
  VWriterNode(rapidxml::xml_document<>& document, rapidxml::xml_node<>* node,
              std::shared_ptr<VGlobalInfo> info);

  std::string Name() const;
  IVersion Version() const { return m_pInfo->m_Version; }
  bool IsOutOfRange(const IVersion& lower, const IVersion& upper) const {
    return UtilsRapidXml::IsOutOfRange(m_pInfo->m_Version, lower, upper);
  }

  /// Adds the attribute unless the version is outside the limits; returns whether it did.
  bool Attribute(std::string_view name, std::string_view value,
                 const IVersion& lower = IVersion::None(),
                 const IVersion& upper = IVersion::None());

  /// Inside the limits: appends the element `name` and runs `handler` on it. Returns whether the
  /// element was written.
  bool Child(std::string_view name, const Handler& handler,
             const IVersion& lower = IVersion::None(), const IVersion& upper = IVersion::None());

  /// One element `name` per item, `handler(node, item)` filling each; nothing for no items.
  template <class T, class F>
  void Children(std::string_view name, const std::vector<T>& items, F&& handler,
                const IVersion& lower = IVersion::None(),
                const IVersion& upper = IVersion::None()) {
    if (IsOutOfRange(lower, upper)) return;
    for (const T& item : items) {
      Child(
          name, [&](VWriterNode& node) { handler(node, item); }, lower, upper);
    }
  }

  void Error(const std::string& message) { m_pInfo->m_Errors.push_back(message); }
  const std::vector<std::string>& Errors() const { return m_pInfo->m_Errors; }
  std::shared_ptr<VGlobalInfo> Info() const { return m_pInfo; }
  rapidxml::xml_node<>* XmlNode() const { return m_pNode; }

private:
  rapidxml::xml_document<>& m_rDocument;
  rapidxml::xml_node<>* m_pNode;
  std::shared_ptr<VGlobalInfo> m_pInfo;
};

} // namespace UtilsRapidXml
