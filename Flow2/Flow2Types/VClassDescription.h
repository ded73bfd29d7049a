#pragma once
// The description of a data class, built once: class name and text, and per member its name, text
// and a schema builder. The class's schema node is derived from it.

#include "Flow2/Flow2Types/ISchema.h"

#include <functional>
#include <string>
#include <type_traits>
#include <utility>
#include <vector>

namespace ZMT {

template <class T, class> struct TFlowField;

struct VClassDescription {
  using VSchemaBuilder = std::function<void(ISchema&, bool)>;
  struct VMember {
    std::string m_Name;
    std::string m_Text;
    VSchemaBuilder m_Builder;
  };

  std::string m_ClassName;
  std::string m_ClassText;
  std::vector<VMember> m_Members;
  /// Member renames, oldest first: (from, to).
  std::vector<std::pair<std::string, std::string>> m_Renames;

  /// Sets the node to a NamedTuple of the members, with documentation if asked.
  void BuildSchema(ISchema& o_rSchema, bool withDocs) const {
    o_rSchema.m_Type = ISchema::NamedTuple;
    o_rSchema.m_HasName = 1;
    o_rSchema.m_Name = m_ClassName;
    if (withDocs) o_rSchema.m_Docs.push_back(m_ClassText);
    o_rSchema.m_Renames = m_Renames;
    o_rSchema.m_Members.resize(m_Members.size());
    for (std::size_t i = 0; i < m_Members.size(); ++i) {
      o_rSchema.m_Members[i].m_Name = m_Members[i].m_Name;
      m_Members[i].m_Builder(o_rSchema.m_Members[i].m_Schema, withDocs);
      if (withDocs) o_rSchema.m_Docs.push_back(m_Members[i].m_Text);
    }
  }

  /// The description of a described class, built on first use.
  template <class T> static const VClassDescription& Of() {
    static const VClassDescription s_Description = Build<T>();
    return s_Description;
  }

private:
  template <class T> static VClassDescription Build() {
    VClassDescription description;
    description.m_ClassName = T::FlowClassName;
    if constexpr (requires { T::FlowClassDoc; }) description.m_ClassText = T::FlowClassDoc;
    // A class whose members were renamed lists the renames, oldest first, as
    //   static constexpr std::pair<const char*, const char*> FlowRenames[] = {{"Old", "New"}};
    if constexpr (requires { T::FlowRenames; })
      for (const auto& [from, to] : T::FlowRenames)
        description.m_Renames.emplace_back(from, to);
    const T probe{};
    T::FlowFields(probe, [&](const char* name, const char* text, const auto& field) {
      using F = std::decay_t<decltype(field)>;
      description.m_Members.push_back({name, text, [](ISchema& o_rSchema, bool docs) {
                                         TFlowField<F, void>::Schema(o_rSchema, docs);
                                       }});
    });
    return description;
  }
};

} // namespace ZMT
