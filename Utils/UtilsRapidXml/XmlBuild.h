#pragma once
// Small helpers for building rapidxml trees whose strings live in the document's memory pool.

#include <rapidxml/rapidxml.hpp>

#include <string_view>

namespace UtilsRapidXml {

/// Copies `text` into the document's pool; the result is zero-terminated.
inline char* PoolString(rapidxml::xml_document<>& doc, std::string_view text) {
  char* copy = doc.allocate_string(nullptr, text.size() + 1);
  if (!text.empty()) text.copy(copy, text.size());
  copy[text.size()] = '\0';
  return copy;
}

/// Appends a new element named `name` to `parent` and returns it.
inline rapidxml::xml_node<>* AppendElement(rapidxml::xml_document<>& doc,
                                           rapidxml::xml_node<>* parent, std::string_view name) {
  auto* node =
      doc.allocate_node(rapidxml::node_element, PoolString(doc, name), nullptr, name.size(), 0);
  parent->append_node(node);
  return node;
}

/// Appends an attribute to `node`.
inline void AppendAttribute(rapidxml::xml_document<>& doc, rapidxml::xml_node<>* node,
                            std::string_view name, std::string_view value) {
  node->append_attribute(doc.allocate_attribute(PoolString(doc, name), PoolString(doc, value),
                                                name.size(), value.size()));
}

inline std::string_view NodeName(const rapidxml::xml_base<>* node) {
  return {node->name(), node->name_size()};
}

inline std::string_view NodeValue(const rapidxml::xml_base<>* node) {
  return {node->value(), node->value_size()};
}

} // namespace UtilsRapidXml
