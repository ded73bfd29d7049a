// A prop in the demo scene: a box on a table, a rigid cluster of four markers on one free bone.
// It has setups but no captured trajectories, so the scene's marker counts stay those of the
// walker and the unlabelled markers.
#include "AnvilCore/SubjectSetupBuilder.h"
#include "DemoScene.h"
#include "River/CoreOstraTypesUtils/ExpressionNumber.h"
#include "plugin/host/Character.h"
#include "plugin/host/Database.h"
#include "plugin/host/ParameterizedSetup.h"
#include "plugin/host/SubjectBone.h"

namespace AnvilCore {

namespace {
using namespace CoreOstraTypes;

SubjectRecords boxRecords() {
  SubjectRecords records;
  VSubjectParametrised& subject = records.subject;
  subject.m_Name = "Box";
  subject.m_SubjectId = NameHash(subject.m_Name);
  records.application.m_SubjectId = subject.m_SubjectId;
  VSubjectParametrised::VSegment root;
  root.m_Name = "Box";
  root.m_Joint.m_Name = "World_Box";
  root.m_Joint.m_JointType = VJointTypeBase::EFree;
  root.m_PreTranslation = {"0", "0", "0"};
  root.m_PreRotation = {"0", "0", "0"};
  // Standing on a table beside the walkway, turned a little.
  root.m_Joint.m_BindPose = {0.0, 0.0, 0.35, 1200.0, 900.0, 750.0};
  subject.m_Segments.push_back(root);
  records.application.m_Segments.emplace_back();

  VSubjectParametrised::VTarget body;
  body.m_Type = VTargetTypeBase::ERigidBody;
  body.m_SegmentIndices = {0};
  for (int i = 0; i < 6; ++i)
    body.m_StateExpressions.push_back("0");
  const double corners[4][3] = {{-150, -100, 80}, {150, -100, 80}, {150, 100, 80}, {-120, 100, 80}};
  for (int m = 0; m < 4; ++m) {
    VSubjectParametrised::VMarker marker;
    marker.m_Name = "Box" + std::to_string(m + 1);
    marker.m_MarkerId = NameHash(marker.m_Name);
    marker.m_Radius = 9.5;
    subject.m_Markers.push_back(marker);
    records.application.m_Markers.emplace_back();
    body.m_MarkerIndices.push_back(static_cast<uint32_t>(m));
    body.m_ViewNormals.push_back({0.0, 0.0, 0.0});
    for (double c : corners[m])
      body.m_StateExpressions.push_back(CoreOstraTypesUtils::FormatExpressionNumber(c));
  }
  body.m_Covariance.assign(36 + 9 * 4, 0.0);
  for (int m = 0; m < 4; ++m)
    for (int d = 0; d < 3; ++d)
      body.m_Covariance[size_t(36 + 9 * m + 4 * d)] = 5.0;
  subject.m_Targets.push_back(body);
  VSubjectApplicationData::VTarget appBody;
  appBody.m_Name = "BoxBody";
  records.application.m_Targets.push_back(appBody);
  return records;
}

void addBox() {
  std::vector<std::string> errors;
  if (Character* pBox = addSubjectToScene(boxRecords(), errors)) pBox->setProp(true);
}
} // namespace

ANVIL_REGISTER_DEMO_PART(40, addBox)

} // namespace AnvilCore
