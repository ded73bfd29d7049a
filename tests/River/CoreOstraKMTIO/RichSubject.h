#pragma once
// A subject that uses every part of the language: all joint and target kinds, a rigid body,
// rotation observations, a skin and a dynamic subspace. Names are XML names and unique, so that
// written files validate against the schema.

#include "River/CoreOstraTypes/NameHash.h"
#include "River/CoreOstraTypes/VSubjectApplicationData.h"
#include "River/CoreOstraTypes/VSubjectDynamicSubspace.h"
#include "River/CoreOstraTypes/VSubjectParametrised.h"
#include "River/CoreOstraTypesUtils/JointAxes.h"

#include <string>

struct VRichSubject {
  CoreOstraTypes::VSubjectParametrised m_Subject;
  CoreOstraTypes::VSubjectApplicationData m_AppData;
  CoreOstraTypes::VSubjectDynamicSubspace m_Subspace;
};

inline VRichSubject MakeRichSubject() {
  using namespace CoreOstraTypes;
  using P = VSubjectParametrised;
  VRichSubject rich;
  auto& s = rich.m_Subject;
  auto& a = rich.m_AppData;
  s.m_Name = "Rich";
  s.m_SubjectId = NameHash("Rich");
  a.m_SubjectId = s.m_SubjectId;
  s.m_Model = "Template.kmt";
  s.m_ModelVersion = "7";
  s.m_MarkerSetName = "Markers";
  a.m_Colour = {10, 20, 30, 255};
  a.m_Skin = "SkinA";
  a.m_SkinColourA = {1, 2, 3, 255};
  a.m_SkinColourB = {4, 5, 6, 255};
  a.m_RetargetSourceTemplate = "SourceT";
  a.m_RetargetSourceSubject = "SourceS";

  P::VStaticParameter height;
  height.m_Name = "Height";
  height.m_UserValue = 1800.0;
  height.m_Quantity = P::VStaticParameter::EQuantityLength;
  height.m_Advanced = true;
  P::VStaticParameter leg;
  leg.m_Name = "LegLength";
  leg.m_DefaultExpression = "Height/2";
  leg.m_Prior = 850.0;
  leg.m_Visible = false;
  leg.m_ReadOnly = true;
  leg.m_Required = true;
  s.m_StaticParameters = {height, leg};
  s.m_DynamicParameters = {{"ThighLength", 380.0, 10.0, 400.0, true},
                           {"HipWidth", 90.0, {}, 100.0, false}};

  auto addSegment = [&](const std::string& name, ZMT::IOptional<std::uint32_t> parent,
                        std::uint32_t depth, VJointTypeBase::EJointType type,
                        const std::string& joint) -> P::VSegment& {
    P::VSegment segment;
    segment.m_Name = name;
    segment.m_SegmentIndex = static_cast<std::uint32_t>(s.m_Segments.size());
    segment.m_ParentSegmentIndex = parent;
    segment.m_TreeDepth = depth;
    segment.m_Joint.m_Name = joint;
    segment.m_Joint.m_JointType = type;
    segment.m_PreRotation = {"0", "0", "0"};
    segment.m_PreTranslation = {"0", "0", "0"};
    const std::size_t n = JointParameterCount(type);
    for (std::size_t i = 0; i < n; ++i)
      segment.m_Joint.m_Mean.push_back(0.1 * double(i + 1));
    segment.m_Joint.m_Covariance.assign(n * n, 0.0);
    for (std::size_t i = 0; i < n; ++i)
      segment.m_Joint.m_Covariance[i * n + i] = 0.5;
    s.m_Segments.push_back(segment);
    VSubjectApplicationData::VSegment appSegment;
    appSegment.m_Colour = {50, 60, 70, 200};
    a.m_Segments.push_back(appSegment);
    return s.m_Segments.back();
  };
  auto& pelvis = addSegment("Pelvis", {}, 0, VJointTypeBase::EFree, "WorldPelvis");
  pelvis.m_MassExpression = "0.2";
  pelvis.m_MassCentreExpressions = {"0", "0", "10"};
  pelvis.m_RadiusOfGyrationExpressions = {"1", "2", "3"};
  pelvis.m_Bounds = {"-HipWidth", "-50", "-50", "HipWidth", "50", "50"};
  pelvis.m_Joint.m_BindPose = {0, 0, 0, 0, 0, 1000};
  pelvis.m_Joint.m_TPoseMean = {0, 0, 0, 0, 0, 950};
  pelvis.m_Joint.m_TPoseCovariance.assign(36, 0.25);
  pelvis.m_Joint.m_TemplateMean = {0, 0, 0, 0, 0, 900};
  pelvis.m_Joint.m_TemplateCovariance.assign(36, 0.125);
  pelvis.m_Joint.m_RangeCentringState = {0, 0, 0, 1, 2, 3};
  pelvis.m_Joint.m_RangeMatrix.assign(36, 2.0);
  pelvis.m_Joint.m_TemplateRangeCentringState = {0, 0, 0, 4, 5, 6};
  pelvis.m_Joint.m_TemplateRangeMatrix.assign(36, 3.0);
  auto& thigh = addSegment("Thigh", 0u, 1, VJointTypeBase::EBall, "Hip");
  thigh.m_PreTranslation = {"HipWidth", "0", "-10"};
  thigh.m_PreRotation = {"0.1", "0", "-0.25"};
  thigh.m_InversePostRotation = {0.2, 0.1, -0.3};
  thigh.m_InversePostTranslation = {1.5, -2.0, 3.25};
  auto& shank = addSegment("Shank", 1u, 2, VJointTypeBase::EHinge, "Knee");
  shank.m_PreTranslation = {"0", "0", "-ThighLength"};
  CoreOstraTypesUtils::JointOrientationFromAxis({0, 1, 0}, shank.m_Joint.m_JointOrientation);
  auto& foot = addSegment("Foot", 2u, 3, VJointTypeBase::EHardySpicer, "Ankle");
  CoreOstraTypesUtils::JointOrientationFromAxisPair({1, 0, 0, 0, 0, 1},
                                                    foot.m_Joint.m_JointOrientation);
  auto& rail = addSegment("Rail", 0u, 1, VJointTypeBase::ESlider, "Track");
  CoreOstraTypesUtils::JointOrientationFromAxis({1, 0, 0}, rail.m_Joint.m_JointOrientation);
  addSegment("Head", 0u, 1, VJointTypeBase::EDummy, "Neck");
  a.m_Segments[0].m_Context = "Centre";
  a.m_Segments[0].m_Part = "Pelvis";
  a.m_Segments[0].m_DrawStyle = VSubjectApplicationData::VSegment::EDrawStyleCylinder;
  a.m_Segments[0].m_DrawShading = VSubjectApplicationData::VSegment::EDrawShadingShadedFlat;
  a.m_Segments[0].m_DrawEndRatio = 0.75;
  a.m_Segments[0].m_DrawTwist = 0.5;
  a.m_Segments[1].m_Visible = false;
  a.m_Segments[0].m_Joint = {VSubjectApplicationData::VJoint::EZYX, "rx ry rz tx ty tz",
                             "+ + + - - -"};
  s.m_TPoseConstraints.assign(6 + 3 + 1 + 2 + 1, {});
  s.m_TPoseConstraints[7] = 0.5;

  for (const char* name :
       {"PelvisA", "PelvisB", "ThighM", "ShankM", "FootM", "RB1", "RB2", "RB3"}) {
    P::VMarker marker;
    marker.m_Name = name;
    marker.m_MarkerId = NameHash(name);
    marker.m_Radius = 12.5;
    s.m_Markers.push_back(marker);
    a.m_Markers.push_back({{200, 100, 0, 255}});
  }
  s.m_Markers[1].m_Status = P::VMarker::EOptional;
  s.m_Markers[1].m_Missing = true;
  s.m_Markers[2].m_Status = P::VMarker::ECalibrationOnly;
  s.m_Markers[0].m_ViewAngle = 0.75;
  a.m_Sticks = {{0, {1, 1, 1, 255}, 1, {2, 2, 2, 255}}, {2, {3, 3, 3, 255}, 3, {4, 4, 4, 255}}};

  auto addTarget = [&](VTargetTypeBase::ETargetType type, std::vector<std::uint32_t> markers,
                       std::uint32_t segment, std::vector<std::string> state) -> P::VTarget& {
    P::VTarget target;
    target.m_Type = type;
    target.m_MarkerIndices = std::move(markers);
    target.m_SegmentIndices = {segment};
    target.m_StateExpressions = std::move(state);
    target.m_ViewNormals.assign(target.m_MarkerIndices.size(), {0, 0, 0});
    s.m_Targets.push_back(target);
    VSubjectApplicationData::VTarget appTarget;
    appTarget.m_Name = "T" + std::to_string(s.m_Targets.size());
    appTarget.m_Colour = {9, 8, 7, 128};
    a.m_Targets.push_back(appTarget);
    return s.m_Targets.back();
  };
  auto& line =
      addTarget(VTargetTypeBase::ELocalLineToWorldPoint, {3}, 2, {"0", "0", "-100", "0", "0", "1"});
  line.m_Weight = 2.0;
  auto& plane = addTarget(VTargetTypeBase::ELocalPlaneToWorldPointGaussian, {4}, 3,
                          {"0", "10", "0", "0", "1", "0"});
  plane.m_Covariance = {4.0};
  plane.m_TemplateCovariance = {5.0};
  auto& pelvisA =
      addTarget(VTargetTypeBase::ELocalPointToWorldPointGaussian, {0}, 0, {"HipWidth", "20", "30"});
  pelvisA.m_Covariance = {1, 0, 0, 0, 1, 0, 0, 0, 1};
  pelvisA.m_TemplateCovariance = {2, 0, 0, 0, 2, 0, 0, 0, 2};
  pelvisA.m_ViewNormals = {{0, 0, 1}};
  auto& thighM = addTarget(VTargetTypeBase::ELocalPointToWorldPointGaussian, {2}, 1,
                           {"10", "0", "-ThighLength/2"});
  thighM.m_Covariance = {3, 0, 0, 0, 3, 0, 0, 0, 3};
  auto& pelvisB = addTarget(VTargetTypeBase::ELocalPointToWorldPoint, {1}, 0, {"-20", "0", "5"});
  pelvisB.m_PlacementCovariance = {1, 0, 0, 0, 1, 0, 0, 0, 1};
  pelvisB.m_CalibrationWeight = 0.5;
  a.m_Targets.back().m_FillGaps = true;
  a.m_Targets.back().m_DrawStyle = VSubjectApplicationData::VTarget::EDrawStyleBoneLines;
  auto& body = addTarget(
      VTargetTypeBase::ERigidBody, {5, 6, 7}, 5,
      {"0.1", "0.2", "0.3", "1", "2", "3", "10", "0", "0", "0", "10", "0", "0", "0", "10"});
  body.m_Covariance.assign(63, 0.0);
  for (std::size_t i = 0; i < 36; ++i)
    body.m_Covariance[i] = 0.01 * double(i);
  for (std::size_t m = 0; m < 3; ++m)
    for (std::size_t k = 0; k < 3; ++k)
      body.m_Covariance[36 + 9 * m + 4 * k] = 5.0;
  body.m_ViewNormals[1] = {1, 0, 0};
  s.m_Rotations = {{"ImuThigh", NameHash("ImuThigh")},
                   {"ImuShank", NameHash("ImuShank")},
                   {"ImuFoot", NameHash("ImuFoot")}};
  auto& hingeLike =
      addTarget(VTargetTypeBase::ELocalRotationToWorldRotation, {}, 1, {"0.1", "0", "0"});
  hingeLike.m_RotationObservationIndices = {0};
  hingeLike.m_Weight = 3.0;
  hingeLike.m_CalibrationWeight = 0.25;
  hingeLike.m_RotationCalibrationBehaviour = VTargetTypeBase::EHingeLike;
  hingeLike.m_RotationTargetOrientation = {0, 0, 1};
  auto& ball = addTarget(VTargetTypeBase::ELocalRotationToWorldRotation, {}, 2, {"0", "0.2", "0"});
  ball.m_RotationObservationIndices = {1};
  auto& direction =
      addTarget(VTargetTypeBase::ELocalDirectionToWorldDirection, {}, 3, {"0", "0", "1"});
  direction.m_RotationObservationIndices = {2};
  direction.m_Weight = 4.0;

  // One chunk over the hip (3 parameters) and the knee (1), with two orthonormal components.
  VSubjectDynamicSubspace::VPcaControlledParams chunk;
  chunk.m_Name = "Leg";
  chunk.m_Version = "1";
  chunk.m_JointParametersIndices = {6, 7, 8, 9};
  chunk.m_JointParametersMean = {0.1, 0.2, 0.3, 0.4};
  chunk.m_NumEffectivePrincipalComponents = 2;
  chunk.m_PrincipalComponents = {{"Bend", {1, 0, 0, 0}, 0.5, -1, 1, 0.1},
                                 {"Twist", {0, 0, 0, 1}, 0.25, -2, 2, 0.2}};
  rich.m_Subspace.m_PcaControlledParams = {chunk};
  rich.m_Subspace.m_NumJointParameters = 13;
  rich.m_Subspace.m_SubjectId = s.m_SubjectId;
  return rich;
}
