#pragma once

#include <map>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

namespace UtilsRapidXml {

/// An enumeration as the schema layer sees it: a simple type name and its keywords.
class IEnum {
public:
  virtual ~IEnum() = default;
  /// The simple type name, such as "TYPE_STATUS".
  virtual std::string Name() const = 0;
  /// Every keyword, in sorted order.
  virtual std::vector<std::string> Names() const = 0;
};

/// An enumeration of values of T with a keyword each. Build once and share read-only.
template <class T> class VEnum final : public IEnum {
public:
  VEnum(std::string name, std::initializer_list<std::pair<const std::string, T>> keywords)
      : m_Name(std::move(name)), m_ToValue(keywords) {
    for (const auto& [keyword, value] : m_ToValue)
      m_ToKeyword.emplace(value, keyword);
  }

  std::string Name() const override { return m_Name; }
  /// Name without a copy.
  const std::string& TypeName() const { return m_Name; }
  std::vector<std::string> Names() const override {
    std::vector<std::string> names;
    names.reserve(m_ToValue.size());
    for (const auto& entry : m_ToValue)
      names.push_back(entry.first);
    return names;
  }

  /// Looks a keyword up; false when it is unknown.
  bool ToValue(std::string_view keyword, T& o_rValue) const {
    auto it = m_ToValue.find(keyword);
    if (it == m_ToValue.end()) return false;
    o_rValue = it->second;
    return true;
  }
  /// Looks a value up; false when it has no keyword.
  bool ToKeyword(const T& value, std::string& o_rKeyword) const {
    auto it = m_ToKeyword.find(value);
    if (it == m_ToKeyword.end()) return false;
    o_rKeyword = it->second;
    return true;
  }

private:
  std::string m_Name;
  std::map<std::string, T, std::less<>> m_ToValue;
  std::map<T, std::string> m_ToKeyword;
};

} // namespace UtilsRapidXml
