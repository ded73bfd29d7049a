#pragma once
// A small parametrised subject that passes every check: a free root, ball, hinge and dummy
// joints, every target kind that carries markers or rotations, and expressions over static and
// dynamic parameters.

#include "River/CoreOstraTypes/NameHash.h"
#include "River/CoreOstraTypes/VSubjectApplicationData.h"
#include "River/CoreOstraTypes/VSubjectParametrised.h"

#include <string>
#include <vector>

struct VValidSubject {
  CoreOstraTypes::VSubjectParametrised m_Subject;
  CoreOstraTypes::VSubjectApplicationData m_AppData;
};

inline std::vector<double> Identity(std::size_t n, double scale = 1.0) {
  std::vector<double> m(n * n, 0.0);
  for (std::size_t i = 0; i < n; ++i)
    m[i * n + i] = scale;
  return m;
}

inline VValidSubject MakeValidSubject() {
  using namespace CoreOstraTypes;
  using P = VSubjectParametrised;
  VValidSubject valid;
  auto& s = valid.m_Subject;
  auto& a = valid.m_AppData;
  s.m_Name = "Walker";
  s.m_SubjectId = NameHash("Walker");

  P::VStaticParameter height;
  height.m_Name = "Height";
  height.m_UserValue = 1800.0;
  P::VStaticParameter leg;
  leg.m_Name = "Leg Length";
  leg.m_DefaultExpression = "Height*0.5";
  s.m_StaticParameters = {height, leg};
  s.m_DynamicParameters = {{"ThighLength", 380.0, {}, 400.0, true},
                           {"HipWidth", 90.0, {}, 100.0, true}};

  auto addSegment = [&](const std::string& name, ZMT::IOptional<std::uint32_t> parent,
                        std::uint32_t depth, VJointTypeBase::EJointType type) -> P::VSegment& {
    P::VSegment segment;
    segment.m_Name = name;
    segment.m_SegmentIndex = static_cast<std::uint32_t>(s.m_Segments.size());
    segment.m_ParentSegmentIndex = parent;
    segment.m_TreeDepth = depth;
    segment.m_Joint.m_Name = name + "Joint";
    segment.m_Joint.m_JointType = type;
    segment.m_PreRotation = {"0", "0", "0"};
    segment.m_PreTranslation = {"0", "0", "0"};
    segment.m_Bounds = {"-10", "-10", "-10", "10", "10", "10"};
    const std::size_t n = JointParameterCount(type);
    segment.m_Joint.m_Mean.assign(n, 0.0);
    segment.m_Joint.m_Covariance = n ? Identity(n, 0.5) : std::vector<double>{};
    s.m_Segments.push_back(segment);
    a.m_Segments.emplace_back();
    return s.m_Segments.back();
  };
  auto& pelvis = addSegment("Pelvis", {}, 0, VJointTypeBase::EFree);
  pelvis.m_Bounds = {"-HipWidth", "-50", "-50", "HipWidth", "50", "'Leg Length'/10"};
  auto& thigh = addSegment("Thigh", 0u, 1, VJointTypeBase::EBall);
  thigh.m_PreTranslation = {"HipWidth/2", "0", "-'Leg Length'*0.1"};
  thigh.m_PreRotation = {"0.1", "0", "-0.25"};
  thigh.m_Joint.m_RangeCentringState = {0, 0, 0};
  thigh.m_Joint.m_RangeMatrix = Identity(3, 2.0);
  thigh.m_Joint.m_TemplateMean = {0, 0, 0};
  thigh.m_Joint.m_TemplateCovariance = Identity(3);
  auto& shank = addSegment("Shank", 1u, 2, VJointTypeBase::EHinge);
  shank.m_PreTranslation = {"0", "0", "-ThighLength"};
  shank.m_Joint.m_JointOrientation = {1.5707963267948966, 0, 0};
  addSegment("Head", 0u, 1, VJointTypeBase::EDummy);

  for (const char* name : {"LASI", "RASI", "KNE", "RB1", "RB2", "RB3"}) {
    P::VMarker marker;
    marker.m_Name = name;
    marker.m_MarkerId = NameHash(name);
    marker.m_Radius = 7.0;
    s.m_Markers.push_back(marker);
    a.m_Markers.emplace_back();
  }
  s.m_Rotations = {{"ImuThigh", NameHash("ImuThigh")}, {"ImuShank", NameHash("ImuShank")}};

  auto addTarget = [&](VTargetTypeBase::ETargetType type, std::vector<std::uint32_t> markers,
                       std::uint32_t segment, std::vector<std::string> state) -> P::VTarget& {
    P::VTarget target;
    target.m_Type = type;
    target.m_MarkerIndices = std::move(markers);
    target.m_SegmentIndices = {segment};
    target.m_StateExpressions = std::move(state);
    s.m_Targets.push_back(target);
    a.m_Targets.emplace_back();
    a.m_Targets.back().m_Name = "T" + std::to_string(s.m_Targets.size() - 1);
    return s.m_Targets.back();
  };
  addTarget(VTargetTypeBase::ELocalPointToWorldPoint, {0}, 0, {"HipWidth", "20", "30"})
      .m_TemplateCovariance = Identity(3);
  auto& gaussian = addTarget(VTargetTypeBase::ELocalPointToWorldPointGaussian, {1}, 0,
                             {"-HipWidth", "20", "30"});
  gaussian.m_Covariance = Identity(3, 2.0);
  gaussian.m_ViewNormals = {{0, 0, 1}};
  addTarget(VTargetTypeBase::ELocalLineToWorldPointGaussian, {2}, 2,
            {"0", "0", "-ThighLength/2", "0", "0", "1"})
      .m_Covariance = Identity(2);
  auto& body = addTarget(
      VTargetTypeBase::ERigidBody, {3, 4, 5}, 3,
      {"0.1", "0.2", "0.3", "1", "2", "3", "10", "0", "0", "0", "10", "0", "0", "0", "10"});
  body.m_Covariance.assign(63, 0.0);
  for (std::size_t m = 0; m < 3; ++m)
    for (std::size_t k = 0; k < 3; ++k)
      body.m_Covariance[36 + 9 * m + 4 * k] = 5.0;
  auto& rotation =
      addTarget(VTargetTypeBase::ELocalRotationToWorldRotation, {}, 1, {"0.1", "0", "0"});
  rotation.m_RotationObservationIndices = {0};
  rotation.m_RotationCalibrationBehaviour = VTargetTypeBase::EHingeLike;
  rotation.m_RotationTargetOrientation = {0, 0, 1};
  auto& direction =
      addTarget(VTargetTypeBase::ELocalDirectionToWorldDirection, {}, 2, {"0", "0.6", "0.8"});
  direction.m_RotationObservationIndices = {1};
  return valid;
}
