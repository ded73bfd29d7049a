#include "River/CoreOstraTypesUtils/CalibrationChecks.h"

#include "DebugServices/GlobalLog.h"
#include "River/CoreOstraTypesUtils/ExpressionParsers.h"

#include <set>
#include <string>
#include <vector>

namespace CoreOstraTypesUtils {

using CoreOstraTypes::VSubject;
using CoreOstraTypes::VSubjectParametrised;
using CoreOstraTypes::VTargetTypeBase;

#define CALIBRATION_LOG(...) ZMT_LOG(SubjectParametrisedUtilsChannel, ZMT::ELogError, __VA_ARGS__)

namespace {

bool IsPoint(VTargetTypeBase::ETargetType type) {
  return type == VTargetTypeBase::ELocalPointToWorldPoint ||
         type == VTargetTypeBase::ELocalPointToWorldPointGaussian;
}

/// The dynamic parameters of `text` and its value; false when it doesn't parse.
bool Dependencies(VDynamicExpressionParserSimple& parser, const std::string& text,
                  std::set<std::string>& o_rParameters, double& o_rValue) {
  VMathNodeSimple node({}, 0.0);
  std::string message;
  if (text.empty()) {
    o_rParameters.clear();
    o_rValue = 0.0;
    return true;
  }
  if (!parser.EvaluateLinear(text, node, message)) return false;
  o_rParameters = node.m_Parameters;
  o_rValue = node.m_Value;
  return true;
}

} // namespace

bool CheckParametersForCalibration(const VSubjectParametrised& subject) {
  VDynamicExpressionParserSimple parser;
  std::vector<std::string> errors;
  if (!parser.SetParameters(subject, errors)) {
    CALIBRATION_LOG("Error parsing subject static parameter expressions");
    return false;
  }
  bool ok = true;
  std::set<std::string> rotation, translation, marker, used;
  double value = 0.0;
  auto collect = [&](const std::string& text, std::set<std::string>& into,
                     const char* constantMessage) {
    if (!Dependencies(parser, text, used, value)) {
      CALIBRATION_LOG("Cannot parse expression %1%", text);
      ok = false;
      return;
    }
    if (constantMessage && used.empty() && value != 0.0) {
      CALIBRATION_LOG(constantMessage);
      ok = false;
    }
    into.insert(used.begin(), used.end());
  };
  for (const auto& segment : subject.m_Segments) {
    for (const auto& text : segment.m_PreRotation)
      collect(text, rotation, nullptr);
    for (const auto& text : segment.m_PreTranslation)
      collect(text, translation, "Non zero translation constant");
  }
  for (const auto& target : subject.m_Targets) {
    if (!IsPoint(target.m_Type)) continue;
    for (const auto& text : target.m_StateExpressions)
      collect(text, marker, "Non zero marker constant");
  }
  for (const auto& name : rotation) {
    if (marker.count(name)) {
      CALIBRATION_LOG("Shared rotation and marker parameter");
      ok = false;
    }
    if (translation.count(name)) {
      CALIBRATION_LOG("Shared rotation and translation parameter");
      ok = false;
    }
  }
  return ok;
}

bool CheckTargetsForCalibration(const VSubject& subject) {
  bool ok = true;
  std::vector<int> targetsOfMarker(subject.m_Markers.size(), 0);
  for (const auto& target : subject.m_Targets) {
    const bool rotationKind = target.m_Type == VTargetTypeBase::ELocalRotationToWorldRotation ||
                              target.m_Type == VTargetTypeBase::ELocalDirectionToWorldDirection;
    if (!IsPoint(target.m_Type) && !rotationKind) {
      CALIBRATION_LOG("Cannot calibrate target type");
      ok = false;
      continue;
    }
    if (IsPoint(target.m_Type) && target.m_MarkerIndices.size() != 1) {
      CALIBRATION_LOG("The calibrator can only use subjects with one target per marker.");
      ok = false;
    }
    for (auto index : target.m_MarkerIndices)
      if (index < targetsOfMarker.size()) ++targetsOfMarker[index];
  }
  bool missing = false, repeated = false;
  for (int count : targetsOfMarker) {
    missing = missing || count == 0;
    repeated = repeated || count > 1;
  }
  if (missing) {
    CALIBRATION_LOG("Cannot calibrate all the markers, some markers have no associated target");
    ok = false;
  }
  if (repeated) {
    CALIBRATION_LOG("There cannot be more than one target per marker");
    ok = false;
  }
  return ok;
}

} // namespace CoreOstraTypesUtils
