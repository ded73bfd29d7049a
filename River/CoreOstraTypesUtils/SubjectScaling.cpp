#include "River/CoreOstraTypesUtils/SubjectScaling.h"

#include "DebugServices/GlobalLog.h"
#include "River/CoreOstraTypesUtils/SubjectEvaluation.h"

#include <cmath>
#include <vector>

namespace CoreOstraTypesUtils {

using CoreOstraTypes::VJointTypeBase;
using CoreOstraTypes::VSubject;
using CoreOstraTypes::VTargetTypeBase;

#define SCALE_LOG(...) ZMT_LOG(SubjectUtilsChannel, ZMT::ELogError, __VA_ARGS__)

namespace {

/// Power of the factor of each parameter: 1 for lengths, 0 for angles and unit vectors.
using Units = std::vector<int>;

/// Scales a vector of parameters with units `units`; entries beyond them stay.
void ScaleVector(std::vector<double>& v, const Units& units, double factor) {
  for (std::size_t i = 0; i < v.size() && i < units.size(); ++i)
    if (units[i]) v[i] *= factor;
}

/// Scales an n by n matrix at `offset` of covariance-like entries (factor^(ui + uj)).
void ScaleCovariance(std::vector<double>& m, std::size_t offset, const Units& units,
                     double factor) {
  const std::size_t n = units.size();
  if (m.size() < offset + n * n) return;
  for (std::size_t i = 0; i < n; ++i)
    for (std::size_t j = 0; j < n; ++j)
      m[offset + i * n + j] *= std::pow(factor, units[i] + units[j]);
}

bool JointUnits(VJointTypeBase::EJointType type, Units& o_rUnits) {
  switch (type) {
  case VJointTypeBase::EFree:
    o_rUnits = {0, 0, 0, 1, 1, 1};
    return true;
  case VJointTypeBase::EBall:
    o_rUnits = {0, 0, 0};
    return true;
  case VJointTypeBase::EHardySpicer:
    o_rUnits = {0, 0};
    return true;
  case VJointTypeBase::EHinge:
    o_rUnits = {0};
    return true;
  case VJointTypeBase::ESlider:
    o_rUnits = {1};
    return true;
  case VJointTypeBase::EDummy:
    o_rUnits = {};
    return true;
  case VJointTypeBase::EBadJointType:
    SCALE_LOG("Cannot scale bad joint");
    return false;
  default:
    SCALE_LOG("Cannot scale unknown joint");
    return false;
  }
}

} // namespace

bool ScaleJoint(VSubject::VJoint& io_rJoint, double factor) {
  Units units;
  if (!JointUnits(io_rJoint.m_JointType, units)) return false;
  ScaleVector(io_rJoint.m_Mean, units, factor);
  ScaleCovariance(io_rJoint.m_Covariance, 0, units, factor);
  ScaleVector(io_rJoint.m_RangeCentringState, units, factor);
  // |M (x - c)| <= 1 with x' = S x gives M' = M S^-1: translational columns shrink.
  const std::size_t n = units.size();
  if (io_rJoint.m_RangeMatrix.size() == n * n) {
    for (std::size_t i = 0; i < n; ++i)
      for (std::size_t j = 0; j < n; ++j)
        if (units[j]) io_rJoint.m_RangeMatrix[i * n + j] /= factor;
  }
  return true;
}

bool ScaleTarget(VSubject::VTarget& io_rTarget, double factor) {
  auto& state = io_rTarget.m_State;
  auto& covariance = io_rTarget.m_Covariance;
  switch (io_rTarget.m_Type) {
  case VTargetTypeBase::ELocalPointToWorldPoint:
  case VTargetTypeBase::ELocalPointToWorldPointGaussian:
    ScaleVector(state, {1, 1, 1}, factor);
    ScaleCovariance(covariance, 0, {1, 1, 1}, factor);
    return true;
  case VTargetTypeBase::ELocalPlaneToWorldPoint:
  case VTargetTypeBase::ELocalPlaneToWorldPointGaussian:
    ScaleVector(state, {1, 1, 1, 0, 0, 0}, factor); // origin, then the normal
    ScaleCovariance(covariance, 0, {1}, factor);    // distance to the plane
    return true;
  case VTargetTypeBase::ELocalLineToWorldPoint:
  case VTargetTypeBase::ELocalLineToWorldPointGaussian:
    ScaleVector(state, {1, 1, 1, 0, 0, 0}, factor); // origin, then the direction
    ScaleCovariance(covariance, 0, {1, 1}, factor); // offsets across the line
    return true;
  case VTargetTypeBase::ERigidBody: {
    Units units = {0, 0, 0, 1, 1, 1}; // orientation, position, then marker positions
    units.resize(state.size(), 1);
    ScaleVector(state, units, factor);
    ScaleCovariance(covariance, 0, {0, 0, 0, 1, 1, 1}, factor);
    for (std::size_t offset = 36; offset + 9 <= covariance.size(); offset += 9)
      ScaleCovariance(covariance, offset, {1, 1, 1}, factor);
    return true;
  }
  case VTargetTypeBase::ELocalRotationToWorldRotation:
  case VTargetTypeBase::ELocalDirectionToWorldDirection:
    return true; // angles and unit vectors
  case VTargetTypeBase::EBadTargetType:
    SCALE_LOG("Cannot scale bad target");
    return false;
  default:
    SCALE_LOG("Unknown target type");
    return false;
  }
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
