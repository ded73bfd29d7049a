#include "OstraAlgo/SubjectConversions/SkeletonParameterRecords.h"

#include "DebugServices/GlobalLog.h"
#include "OstraAlgo/SubjectConversions/SubjectFromCalibrated.h"

#include <set>

namespace SubjectConversions {

using CoreOstraTypes::VSubjectParametrised;
using KinematicAlgo::VSkeletonParameter;

bool RecordParametersFromSkeleton(const std::vector<VSkeletonParameter>& parameters,
                                  VSubjectParametrised& io_rSubject) {
  bool ok = true;
  std::set<std::string> names;
  std::vector<VSubjectParametrised::VStaticParameter> statics;
  std::vector<VSubjectParametrised::VDynamicParameter> dynamics;
  for (const VSkeletonParameter& p : parameters) {
    if (p.m_Name.empty() || !names.insert(p.m_Name).second) {
      ZMT_LOG(SubjectConversionChannel, ZMT::ELogError,
              "Skeleton parameter name '%1%' is empty or used twice", p.m_Name);
      ok = false;
      continue;
    }
    if (p.m_Static) {
      VSubjectParametrised::VStaticParameter s;
      s.m_Name = p.m_Name;
      s.m_DefaultExpression = p.m_Expression;
      // The value is what the skeleton was calibrated with, whatever the expression gives now.
      s.m_UserValue = p.m_Value;
      s.m_Prior = p.m_Prior;
      s.m_Advanced = p.m_Advanced;
      s.m_ReadOnly = p.m_ReadOnly;
      s.m_Visible = p.m_Used;
      statics.push_back(std::move(s));
      continue;
    }
    if (!p.m_Expression.empty()) {
      ZMT_LOG(SubjectConversionChannel, ZMT::ELogError,
              "Skeleton parameter %1% is not static and has an expression", p.m_Name);
      ok = false;
      continue;
    }
    VSubjectParametrised::VDynamicParameter d;
    d.m_Name = p.m_Name;
    d.m_Prior = p.m_Prior;
    d.m_Value = p.m_Value;
    if (p.m_StandardDeviation != 0.0) d.m_StandardDeviation = p.m_StandardDeviation;
    d.m_Visible = p.m_Used;
    dynamics.push_back(std::move(d));
  }
  if (!ok) return false;
  io_rSubject.m_StaticParameters = std::move(statics);
  io_rSubject.m_DynamicParameters = std::move(dynamics);
  return true;
}

std::vector<VSkeletonParameter> SkeletonParametersFromRecord(const VSubjectParametrised& subject) {
  CoreOstraTypesUtils::VStaticExpressionParser parser;
  std::vector<std::string> errors;
  parser.SetParameters(subject, errors); // a static that fails keeps the value 0

  std::vector<VSkeletonParameter> parameters;
  for (const auto& s : subject.m_StaticParameters) {
    VSkeletonParameter p;
    p.m_Name = s.m_Name;
    p.m_Expression = s.m_DefaultExpression;
    if (!parser.StaticValue(s.m_Name, p.m_Value)) p.m_Value = 0.0;
    p.m_Prior = s.m_Prior.IsSet() ? s.m_Prior.Value() : 0.0;
    p.m_Advanced = s.m_Advanced;
    p.m_ReadOnly = s.m_ReadOnly;
    p.m_Used = s.m_Visible;
    p.m_Static = true;
    parameters.push_back(std::move(p));
  }
  for (const auto& d : subject.m_DynamicParameters) {
    VSkeletonParameter p;
    p.m_Name = d.m_Name;
    p.m_Value = d.m_Value;
    p.m_Prior = d.m_Prior;
    p.m_StandardDeviation = d.m_StandardDeviation.IsSet() ? d.m_StandardDeviation.Value() : 0.0;
    p.m_Used = d.m_Visible;
    p.m_Static = false;
    parameters.push_back(std::move(p));
  }
  return parameters;
}

bool NamesParameter(CoreOstraTypesUtils::VDynamicExpressionParserSimple& parser,
                    const std::string& text) {
  if (text.empty()) return false;
  CoreOstraTypesUtils::VMathNodeSimple node({}, 0.0);
  std::string message;
  if (!parser.EvaluateLinear(text, node, message)) return false;
  return !node.m_Parameters.empty() || !node.m_Constants.empty();
}

std::vector<std::pair<std::size_t, std::size_t>> MarkerPlaces(const VSubjectParametrised& subject,
                                                              std::uint32_t marker) {
  std::vector<std::pair<std::size_t, std::size_t>> places;
  for (std::size_t t = 0; t < subject.m_Targets.size(); ++t) {
    const auto& target = subject.m_Targets[t];
    for (std::size_t k = 0; k < target.m_MarkerIndices.size(); ++k) {
      if (target.m_MarkerIndices[k] != marker) continue;
      const bool body = target.m_Type == VSubjectParametrised::VTarget::ERigidBody;
      if (!body && target.m_MarkerIndices.size() != 1) continue;
      const std::size_t first = body ? 6 + 3 * k : 0;
      if (first + 3 <= target.m_StateExpressions.size()) places.emplace_back(t, first);
    }
  }
  return places;
}

} // namespace SubjectConversions
