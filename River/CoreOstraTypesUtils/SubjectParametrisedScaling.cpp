#include "DebugServices/AssertFail.h"
#include "DebugServices/GlobalLog.h"
#include "River/CoreOstraTypesUtils/ExpressionNumber.h"
#include "River/CoreOstraTypesUtils/ScalingUnits.h"
#include "River/CoreOstraTypesUtils/SubjectEvaluation.h"
#include "River/CoreOstraTypesUtils/SubjectScaling.h"
#include "River/CoreOstraTypesUtils/VMathFactorySimple.h"

#include <cmath>

namespace CoreOstraTypesUtils {

using CoreOstraTypes::VSubjectParametrised;
using namespace ScalingDetail;

#define SCALE_LOG(level, ...) ZMT_LOG(SubjectUtilsChannel, level, __VA_ARGS__)

namespace {

/// Whether `text` is a plain decimal number (not a name such as "nan" that strtod would take).
bool IsPlainNumber(const std::string& text, double& o_rValue) {
  if (text.empty()) return false;
  for (char c : text)
    if (!((c >= '0' && c <= '9') || c == '.' || c == 'e' || c == 'E' || c == '+' || c == '-'))
      return false;
  return ReadNumberText(text, o_rValue) && std::isfinite(o_rValue);
}

template <std::size_t N>
void ScaleExpressions(std::array<std::string, N>& expressions, double factor) {
  for (auto& e : expressions)
    e = ScaleExpression(e, factor);
}

} // namespace

std::string ScaleExpression(const std::string& expression, double factor) {
  if (factor == 1.0) return expression;
  const auto first = expression.find_first_not_of(" \t\r\n");
  if (first == std::string::npos) return expression; // empty: worth 0 either way
  const auto last = expression.find_last_not_of(" \t\r\n");
  const std::string text = expression.substr(first, last - first + 1);
  double value = 0.0;
  if (IsPlainNumber(text, value)) return FormatExpressionNumber(value * factor);
  return "(" + text + ")*" + FormatExpressionNumber(factor);
}

bool ScaleJoint(VSubjectParametrised::VJoint& io_rJoint, double factor) {
  Units units;
  switch (JointUnits(io_rJoint.m_JointType, units)) {
  case EUnitsResult::EBad:
    SCALE_LOG(ZMT::ELogError, "Cannot scale bad joint");
    return false;
  case EUnitsResult::EUnknown:
    SCALE_LOG(ZMT::ELogError, "Cannot scale unknown joint");
    return false;
  case EUnitsResult::EKnown:
    break;
  }
  ANVIL_ASSERT(io_rJoint.m_TPoseCovariance.empty() && io_rJoint.m_TPoseMean.empty());
  ScaleJointStatistics(io_rJoint.m_Mean, io_rJoint.m_Covariance, io_rJoint.m_RangeCentringState,
                       io_rJoint.m_RangeMatrix, units, factor);
  ScaleJointStatistics(io_rJoint.m_TemplateMean, io_rJoint.m_TemplateCovariance,
                       io_rJoint.m_TemplateRangeCentringState, io_rJoint.m_TemplateRangeMatrix,
                       units, factor);
  ScaleVector(io_rJoint.m_BindPose, units, factor);
  ScaleVector(io_rJoint.m_TPoseMean, units, factor);
  ScaleCovariance(io_rJoint.m_TPoseCovariance, 0, units, factor);
  return true;
}

bool ScaleTarget(VSubjectParametrised::VTarget& io_rTarget, double factor) {
  Units state, covariance, repeat;
  std::size_t repeatOffset = 0;
  switch (TargetUnits(io_rTarget.m_Type, io_rTarget.m_StateExpressions.size(), state, covariance,
                      repeat, repeatOffset)) {
  case EUnitsResult::EBad:
    SCALE_LOG(ZMT::ELogError, "Cannot scale bad target");
    return false;
  case EUnitsResult::EUnknown:
    SCALE_LOG(ZMT::ELogWarning, "Target type not implemented yet. Scaling may be incorrect");
    return true;
  case EUnitsResult::EKnown:
    break;
  }
  auto& expressions = io_rTarget.m_StateExpressions;
  for (std::size_t i = 0; i < expressions.size() && i < state.size(); ++i)
    if (state[i]) expressions[i] = ScaleExpression(expressions[i], factor);
  ScaleTargetCovariance(io_rTarget.m_Covariance, covariance, repeat, repeatOffset, factor);
  ScaleTargetCovariance(io_rTarget.m_TemplateCovariance, covariance, repeat, repeatOffset, factor);
  ScaleCovariance(io_rTarget.m_PlacementCovariance, 0, {1, 1, 1}, factor);
  return true;
}

bool ScaleSubject(VSubjectParametrised& io_rSubject, double factor) {
  if (!(factor > 0.0) || !std::isfinite(factor)) {
    SCALE_LOG(ZMT::ELogError, "Cannot scale subject %1% by %2%", io_rSubject.m_Name, factor);
    return false;
  }
  VSubjectParametrised scaled = io_rSubject;
  std::size_t parameter = 0; // first joint parameter of the segment, for the T-pose constraints
  for (auto& segment : scaled.m_Segments) {
    ScaleExpressions(segment.m_PreTranslation, factor);
    ScaleExpressions(segment.m_Bounds, factor);
    ScaleExpressions(segment.m_MassCentreExpressions, factor);
    ScaleExpressions(segment.m_RadiusOfGyrationExpressions, factor);
    for (auto& v : segment.m_InversePostTranslation)
      v *= factor;
    if (!ScaleJoint(segment.m_Joint, factor)) return false;
    Units units;
    JointUnits(segment.m_Joint.m_JointType, units);
    for (std::size_t k = 0; k < units.size(); ++k, ++parameter) {
      if (parameter >= scaled.m_TPoseConstraints.size()) continue;
      auto& constraint = scaled.m_TPoseConstraints[parameter];
      if (units[k] && constraint.IsSet()) constraint = constraint.Value() * factor;
    }
  }
  for (auto& marker : scaled.m_Markers)
    marker.m_Radius *= factor;
  for (auto& target : scaled.m_Targets)
    if (!ScaleTarget(target, factor)) return false;
  io_rSubject = std::move(scaled);
  return true;
}

} // namespace CoreOstraTypesUtils
