#include "River/CoreOstraTypesUtils/SubjectEvaluation.h"

#include "DebugServices/GlobalLog.h"

namespace CoreOstraTypesUtils {

using CoreOstraTypes::VJointTypeBase;
using CoreOstraTypes::VSubject;
using CoreOstraTypes::VSubjectParametrised;

#define UTILS_LOG(...) ZMT_LOG(SubjectUtilsChannel, ZMT::ELogError, __VA_ARGS__)

namespace {

/// Covariance size of the Gaussian target types; 0 for the others.
std::size_t GaussianCovarianceSize(CoreOstraTypes::VTargetTypeBase::ETargetType type) {
  switch (type) {
  case CoreOstraTypes::VTargetTypeBase::ELocalPointToWorldPointGaussian:
    return 9;
  case CoreOstraTypes::VTargetTypeBase::ELocalPlaneToWorldPointGaussian:
    return 1;
  case CoreOstraTypes::VTargetTypeBase::ELocalLineToWorldPointGaussian:
    return 4;
  default:
    return 0;
  }
}

} // namespace

bool VSubjectEvaluator::SetSubject(const VSubjectParametrised& subject, EParameterValues start) {
  m_Subject = subject;
  if (start == EParameterValues::EPrior) {
    for (auto& parameter : m_Subject.m_DynamicParameters)
      parameter.m_Value = parameter.m_Prior;
  }
  m_DynamicNames.clear();
  for (const auto& parameter : m_Subject.m_DynamicParameters)
    m_DynamicNames.push_back(parameter.m_Name);
  std::vector<std::string> errors;
  m_Ready = m_Parser.SetParameters(m_Subject, errors);
  if (!m_Ready) UTILS_LOG("Error parsing subject static parameter expressions");
  return m_Ready;
}

bool VSubjectEvaluator::SetParameter(const std::string& name, double value) {
  if (m_Parser.SetDynamicValue(name, value)) return true;
  UTILS_LOG("Missing parameter %1%", name);
  return false;
}

bool VSubjectEvaluator::SetParameters(const std::vector<std::pair<std::string, double>>& values) {
  bool ok = true;
  for (const auto& [name, value] : values)
    ok = SetParameter(name, value) && ok;
  return ok;
}

bool VSubjectEvaluator::SetParameter(std::size_t index, double value) {
  if (index >= m_DynamicNames.size()) return false;
  return m_Parser.SetDynamicValue(m_DynamicNames[index], value);
}

bool VSubjectEvaluator::Value(const std::string& text, double& o_rValue) {
  if (text.empty()) {
    o_rValue = 0.0;
    return true;
  }
  return m_Parser.Evaluate(text, o_rValue);
}

bool VSubjectEvaluator::EvaluateSegment(const VSubjectParametrised::VSegment& in,
                                        VSubject::VSegment& out) {
  out.m_Name = in.m_Name;
  out.m_SegmentIndex = in.m_SegmentIndex;
  out.m_ParentSegmentIndex = in.m_ParentSegmentIndex;
  out.m_TreeDepth = in.m_TreeDepth;
  out.m_InversePostRotation = in.m_InversePostRotation;
  out.m_InversePostTranslation = in.m_InversePostTranslation;

  bool ok = true;
  const auto& joint = in.m_Joint;
  if (joint.m_JointType > VJointTypeBase::EDummy) {
    UTILS_LOG("Could not generate joint for segment '%1%'", in.m_Name);
    ok = false;
  }
  out.m_Joint.m_Name = joint.m_Name;
  out.m_Joint.m_JointType = joint.m_JointType;
  out.m_Joint.m_JointOrientation = joint.m_JointOrientation;
  // No statistics on the record means no information: a zero mean and an all-zero covariance
  // of the joint's size.
  const std::size_t n = CoreOstraTypes::JointParameterCount(joint.m_JointType);
  if (joint.m_Covariance.empty()) {
    out.m_Joint.m_Covariance.assign(n * n, 0.0);
  } else {
    out.m_Joint.m_Covariance = joint.m_Covariance;
  }
  if (joint.m_Mean.empty()) {
    out.m_Joint.m_Mean.assign(n, 0.0);
  } else {
    out.m_Joint.m_Mean = joint.m_Mean;
  }
  out.m_Joint.m_RangeCentringState = joint.m_RangeCentringState;
  out.m_Joint.m_RangeMatrix = joint.m_RangeMatrix;

  auto group = [&](const auto& texts, auto& values, const char* message) {
    bool groupOk = true;
    for (std::size_t i = 0; i < texts.size(); ++i)
      groupOk = Value(texts[i], values[i]) && groupOk;
    if (!groupOk) UTILS_LOG(message, in.m_Name);
    ok = ok && groupOk;
  };
  group(in.m_PreTranslation, out.m_PreTranslation,
        "Could not evaluate m_PreTranslation expressions in segment '%1%'");
  group(in.m_PreRotation, out.m_PreRotation,
        "Could not evaluate m_PreRotation expressions in segment '%1%'");
  group(in.m_Bounds, out.m_Bounds, "Could not evaluate m_Bounds expressions in segment '%1%'");
  return ok;
}

bool VSubjectEvaluator::EvaluateTarget(const VSubjectParametrised::VTarget& in,
                                       VSubject::VTarget& out) {
  out.m_Type = in.m_Type;
  out.m_Weight = in.m_Weight;
  out.m_RotationCalibrationBehaviour = in.m_RotationCalibrationBehaviour;
  out.m_RotationTargetOrientation = in.m_RotationTargetOrientation;
  out.m_NumberOfDegreesOfFreedom = in.m_NumberOfDegreesOfFreedom;
  out.m_MarkerIndices = in.m_MarkerIndices;
  out.m_RotationObservationIndices = in.m_RotationObservationIndices;
  out.m_SegmentIndices = in.m_SegmentIndices;
  out.m_Covariance = in.m_Covariance;
  if (out.m_Covariance.empty()) out.m_Covariance.assign(GaussianCovarianceSize(in.m_Type), 0.0);
  out.m_ViewNormals = in.m_ViewNormals;

  bool ok = true;
  out.m_State.resize(in.m_StateExpressions.size());
  for (std::size_t i = 0; i < in.m_StateExpressions.size(); ++i)
    ok = Value(in.m_StateExpressions[i], out.m_State[i]) && ok;
  if (!ok) {
    UTILS_LOG("Could not evaluate state expressions in target");
    return false;
  }
  // A target with parameters of its own ties each state entry to at most one of them.
  if (in.m_NumberOfDegreesOfFreedom > 0) {
    for (const auto& text : in.m_StateExpressions) {
      VMathNodeSimple node({}, 0.0);
      std::string message;
      if (text.empty() || !m_Parser.EvaluateLinear(text, node, message)) continue;
      if (node.m_Parameters.size() > 1) {
        UTILS_LOG("Multiple parameters in target not handled.");
        return false;
      }
    }
  }
  return true;
}

bool VSubjectEvaluator::Evaluate(VSubject& o_rSubject) {
  if (!m_Ready) return false;
  const auto& in = m_Subject;
  o_rSubject.m_Name = in.m_Name;
  o_rSubject.m_SubjectId = in.m_SubjectId;

  bool ok = true;
  o_rSubject.m_Segments.resize(in.m_Segments.size());
  for (std::size_t i = 0; i < in.m_Segments.size(); ++i)
    ok = EvaluateSegment(in.m_Segments[i], o_rSubject.m_Segments[i]) && ok;

  o_rSubject.m_Markers.resize(in.m_Markers.size());
  for (std::size_t i = 0; i < in.m_Markers.size(); ++i) {
    const auto& marker = in.m_Markers[i];
    auto& out = o_rSubject.m_Markers[i];
    out.m_Name = marker.m_Name;
    out.m_MarkerId = marker.m_MarkerId;
    out.m_Radius = marker.m_Radius;
    out.m_Missing = marker.m_Missing;
    out.m_ViewAngle = marker.m_ViewAngle;
  }
  o_rSubject.m_Rotations = in.m_Rotations;

  o_rSubject.m_Targets.resize(in.m_Targets.size());
  for (std::size_t i = 0; i < in.m_Targets.size(); ++i)
    ok = EvaluateTarget(in.m_Targets[i], o_rSubject.m_Targets[i]) && ok;
  return ok;
}

bool SubjectFromParametrised(const VSubjectParametrised& subject, VSubject& o_rSubject,
                             EParameterValues values) {
  VSubjectEvaluator evaluator;
  return evaluator.SetSubject(subject, values) && evaluator.Evaluate(o_rSubject);
}

bool SubjectFromParametrised(const VSubjectParametrised& subject,
                             const std::vector<std::pair<std::string, double>>& values,
                             VSubject& o_rSubject) {
  VSubjectEvaluator evaluator;
  if (!evaluator.SetSubject(subject)) return false;
  if (!evaluator.SetParameters(values)) return false;
  return evaluator.Evaluate(o_rSubject);
}

} // namespace CoreOstraTypesUtils
