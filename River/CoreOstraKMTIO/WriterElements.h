#pragma once
// The writer's element functions, in the order of the language's declaration, over VWriterNode.

#include "River/CoreOstraKMTIO/KMTLanguage.h"
#include "River/CoreOstraKMTIO/SubjectKMTExtras.h"
#include "River/CoreOstraTypes/VSubjectApplicationData.h"
#include "River/CoreOstraTypes/VSubjectDynamicSubspace.h"
#include "River/CoreOstraTypes/VSubjectParametrised.h"
#include "Utils/UtilsRapidXml/VWriterNode.h"
#include "Utils/UtilsRapidXml/WriteAttributes.h"

#include <array>
#include <string>
#include <string_view>
#include <vector>

namespace CoreOstraKMTIO::Detail {

using UtilsRapidXml::VWriterNode;

struct VWriteContext {
  const CoreOstraTypes::VSubjectParametrised& m_rSubject;
  const CoreOstraTypes::VSubjectApplicationData& m_rAppData;
  const CoreOstraTypes::VSubjectDynamicSubspace& m_rSubspace;
  const VSubjectKMTExtras& m_rExtras;
  std::string m_XmlnsXsi;
  std::string m_SchemaLocation;
};

void WriteKinematicModel(VWriterNode& node, const VWriteContext& context);
void WriteSkeleton(VWriterNode& node, const VWriteContext& context);
void WriteMarkerSet(VWriterNode& node, const VWriteContext& context);
void WriteTargetSet(VWriterNode& node, const VWriteContext& context);

/// A text attribute; skipped when blank unless `required`.
bool WriteText(VWriterNode& node, std::string_view name, const std::string& value, bool required,
               const IVersion& lower = Versions::None, const IVersion& upper = Versions::None);

/// An expression list; skipped when every entry is empty.
template <std::size_t N>
bool WriteExpressions(VWriterNode& node, std::string_view name,
                      const std::array<std::string, N>& values,
                      const IVersion& lower = Versions::None,
                      const IVersion& upper = Versions::None) {
  bool any = false;
  for (const auto& value : values)
    any = any || !value.empty();
  if (!any) return false;
  return UtilsRapidXml::WriteExpressionList(node, name, values, lower, upper);
}

/// A number list; skipped when empty.
bool WriteNumbers(VWriterNode& node, std::string_view name, std::span<const double> values,
                  const IVersion& lower = Versions::None, const IVersion& upper = Versions::None);

/// Whether a direction is (0, 0, 0).
bool IsZero(const std::array<double, 3>& direction);

} // namespace CoreOstraKMTIO::Detail
