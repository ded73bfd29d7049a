#pragma once
// A small subject for tests of the host's subjects and the subject file exporters: a free pelvis,
// a hinge and a ball joint, three markers on point targets, a static parameter used by an
// expression, a stick and a subspace over the ball joint. Axes lie along Z so that files carry
// them exactly.
#include "AnvilCore/SubjectSetupBuilder.h"

namespace SubjectTest {

inline AnvilCore::SubjectRecords bobRecords() {
  using namespace CoreOstraTypes;
  AnvilCore::SubjectRecords r;
  VSubjectParametrised& s = r.subject;
  s.m_Name = "Bob";
  s.m_SubjectId = NameHash("Bob");
  s.m_Model = "TestModel";
  s.m_MarkerSetName = "TestMarkers";
  VSubjectParametrised::VStaticParameter height;
  height.m_Name = "Height";
  height.m_DefaultExpression = "1800";
  height.m_Quantity = VSubjectParametrised::VStaticParameter::EQuantityLength;
  s.m_StaticParameters.push_back(height);
  VSubjectParametrised::VDynamicParameter arm;
  arm.m_Name = "ArmLength";
  arm.m_Prior = 300.0;
  arm.m_Value = 310.0;
  s.m_DynamicParameters.push_back(arm);

  auto segment = [&](const char* i_pName, int i_parent, VJointTypeBase::EJointType i_type,
                     std::array<std::string, 3> i_translation) {
    VSubjectParametrised::VSegment seg;
    seg.m_Name = i_pName;
    seg.m_SegmentIndex = uint32_t(s.m_Segments.size());
    if (i_parent >= 0) {
      seg.m_ParentSegmentIndex = uint32_t(i_parent);
      seg.m_TreeDepth = s.m_Segments[size_t(i_parent)].m_TreeDepth + 1;
    }
    seg.m_Joint.m_Name =
        std::string(i_parent >= 0 ? s.m_Segments[size_t(i_parent)].m_Name : "World") + "_" +
        i_pName;
    seg.m_Joint.m_JointType = i_type;
    seg.m_PreTranslation = i_translation;
    seg.m_PreRotation = {"0", "0", "0.25"};
    s.m_Segments.push_back(seg);
    r.application.m_Segments.emplace_back();
  };
  segment("Pelvis", -1, VJointTypeBase::EFree, {"0", "0", "0"});
  segment("Thorax", 0, VJointTypeBase::EHinge, {"0", "0", "Height*0.25"});
  segment("Arm", 1, VJointTypeBase::EBall, {"0", "180", "ArmLength"});
  r.application.m_Segments[2].m_Context = "Left";

  const char* names[] = {"PEL", "STRN", "ELB"};
  const char* states[][3] = {{"100", "0", "0"}, {"95", "0", "Height/10"}, {"0", "30", "-250"}};
  for (uint32_t m = 0; m < 3; ++m) {
    VSubjectParametrised::VMarker marker;
    marker.m_Name = names[m];
    marker.m_MarkerId = NameHash(names[m]);
    marker.m_Radius = 7.0;
    s.m_Markers.push_back(marker);
    r.application.m_Markers.emplace_back();
    VSubjectParametrised::VTarget target;
    target.m_Type = VTargetTypeBase::ELocalPointToWorldPoint;
    target.m_MarkerIndices = {m};
    target.m_SegmentIndices = {m};
    target.m_StateExpressions = {states[m][0], states[m][1], states[m][2]};
    target.m_ViewNormals = {{0.0, 0.0, 0.0}};
    target.m_Weight = 2.0;
    s.m_Targets.push_back(target);
    VSubjectApplicationData::VTarget app;
    app.m_Name = names[m];
    r.application.m_Targets.push_back(app);
  }
  r.application.m_SubjectId = s.m_SubjectId;
  r.application.m_Sticks.push_back({0, DefaultColour, 1, DefaultColour});

  VSubjectDynamicSubspace::VPcaControlledParams chunk;
  chunk.m_Name = "ArmChunk";
  chunk.m_Version = "1";
  chunk.m_NumEffectivePrincipalComponents = 1;
  chunk.m_JointParametersIndices = {7, 8, 9};
  chunk.m_JointParametersMean = {0.0, 0.0, 0.0};
  VSubjectDynamicSubspace::VPcaControlledParams::VPrincipalComponent pc;
  pc.m_Name = "Swing";
  pc.m_JointParams = {1.0, 0.0, 0.0};
  pc.m_SqrtEigenvalue = 0.5;
  pc.m_LowerBound = -1.0;
  pc.m_UpperBound = 1.0;
  pc.m_TemporalDerivativeStddev = 0.1;
  chunk.m_PrincipalComponents.push_back(pc);
  r.subspace.m_PcaControlledParams.push_back(chunk);
  r.subspace.m_NumJointParameters = 10;
  r.subspace.m_SubjectId = s.m_SubjectId;
  return r;
}

} // namespace SubjectTest
