#include "River/CoreOstraTypesUtils/SubjectScaling.h"

#include "DebugServices/GlobalLog.h"
#include "River/CoreOstraTypesUtils/ScalingUnits.h"
#include "River/CoreOstraTypesUtils/SubjectEvaluation.h"

#include <cmath>
#include <vector>

namespace CoreOstraTypesUtils {

using CoreOstraTypes::VSubject;

#define SCALE_LOG(...) ZMT_LOG(SubjectUtilsChannel, ZMT::ELogError, __VA_ARGS__)

using namespace ScalingDetail;

bool ScaleJoint(VSubject::VJoint& io_rJoint, double factor) {
  Units units;
  switch (JointUnits(io_rJoint.m_JointType, units)) {
  case EUnitsResult::EBad:
    SCALE_LOG("Cannot scale bad joint");
    return false;
  case EUnitsResult::EUnknown:
    SCALE_LOG("Cannot scale unknown joint");
    return false;
  case EUnitsResult::EKnown:
    break;
  }
  ScaleJointStatistics(io_rJoint.m_Mean, io_rJoint.m_Covariance, io_rJoint.m_RangeCentringState,
                       io_rJoint.m_RangeMatrix, units, factor);
  return true;
}

bool ScaleTarget(VSubject::VTarget& io_rTarget, double factor) {
  Units state, covariance, repeat;
  std::size_t repeatOffset = 0;
  switch (TargetUnits(io_rTarget.m_Type, io_rTarget.m_State.size(), state, covariance, repeat,
                      repeatOffset)) {
  case EUnitsResult::EBad:
    SCALE_LOG("Cannot scale bad target");
    return false;
  case EUnitsResult::EUnknown:
    SCALE_LOG("Unknown target type");
    return false;
  case EUnitsResult::EKnown:
    break;
  }
  ScaleVector(io_rTarget.m_State, state, factor);
  ScaleTargetCovariance(io_rTarget.m_Covariance, covariance, repeat, repeatOffset, factor);
  return true;
}

bool ScaleSubject(VSubject& io_rSubject, double factor) {
  if (!(factor > 0.0) || !std::isfinite(factor)) {
    SCALE_LOG("Cannot scale subject %1% by %2%", io_rSubject.m_Name, factor);
    return false;
  }
  VSubject scaled = io_rSubject;
  for (auto& segment : scaled.m_Segments) {
    for (auto& v : segment.m_PreTranslation)
      v *= factor;
    for (auto& v : segment.m_InversePostTranslation)
      v *= factor;
    for (auto& v : segment.m_Bounds)
      v *= factor;
    if (!ScaleJoint(segment.m_Joint, factor)) return false;
  }
  for (auto& marker : scaled.m_Markers)
    marker.m_Radius *= factor;
  for (auto& target : scaled.m_Targets)
    if (!ScaleTarget(target, factor)) return false;
  io_rSubject = std::move(scaled);
  return true;
}

} // namespace CoreOstraTypesUtils
