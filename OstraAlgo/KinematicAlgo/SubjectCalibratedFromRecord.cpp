#include "OstraAlgo/KinematicAlgo/SubjectCalibratedFromRecord.h"

#include "River/CoreOstraTypesUtils/AngleAxis.h"

namespace KinematicAlgo {

using CoreOstraTypes::VSubject;

namespace {
VPose Pose(const std::array<double, 3>& rotation, const std::array<double, 3>& translation) {
  return CoreOstraTypesUtils::PoseFromAngleAxis(rotation, translation);
}

std::shared_ptr<VJointCalibrated> Joint(const VSubject::VJoint& record, const std::string& name) {
  auto joint = std::make_shared<VJointCalibrated>();
  joint->SetType(std::int32_t(record.m_JointType));
  joint->SetName(name);
  joint->SetRotation(Eigen::Vector3d(record.m_JointOrientation[0], record.m_JointOrientation[1],
                                     record.m_JointOrientation[2]));
  const Eigen::Index n = joint->NumDynamicParams();
  using RowMajor = Eigen::Matrix<double, Eigen::Dynamic, Eigen::Dynamic, Eigen::RowMajor>;
  if (Eigen::Index(record.m_Mean.size()) == n)
    joint->SetMeanDynamic(Eigen::Map<const Eigen::VectorXd>(record.m_Mean.data(), n));
  if (Eigen::Index(record.m_Covariance.size()) == n * n && n > 0)
    joint->SetCovDynamic(Eigen::Map<const RowMajor>(record.m_Covariance.data(), n, n));
  if (Eigen::Index(record.m_RangeCentringState.size()) == n)
    joint->SetCentreDynamic(
        Eigen::Map<const Eigen::VectorXd>(record.m_RangeCentringState.data(), n));
  if (Eigen::Index(record.m_RangeMatrix.size()) == n * n && n > 0)
    joint->SetRangeDynamic(Eigen::Map<const RowMajor>(record.m_RangeMatrix.data(), n, n));
  return joint;
}
} // namespace

std::shared_ptr<VSubjectCalibrated>
SubjectCalibratedFromRecord(const VSubject& subject, std::vector<std::string>& o_rErrors,
                            std::vector<std::string>& o_rNotes) {
  auto result = std::make_shared<VSubjectCalibrated>();
  result->SetName(subject.m_Name);
  result->SetIdentifier(std::int32_t(subject.m_SubjectId));
  result->ClearSegments();
  const size_t errorsBefore = o_rErrors.size();
  std::vector<std::int32_t> treePosition(subject.m_Segments.size(), -1);
  for (size_t i = 0; i < subject.m_Segments.size(); ++i) {
    const VSubject::VSegment& record = subject.m_Segments[i];
    if (record.m_Joint.m_JointType > VSubject::VJoint::EDummy) {
      o_rErrors.push_back("Segment " + record.m_Name + " has an invalid joint type");
      continue;
    }
    auto segment = std::make_shared<VSegmentCalibrated>();
    segment->SetName(record.m_Name);
    segment->SetIdentifier(std::int32_t(i));
    segment->SetPoseInParent(Pose(record.m_PreRotation, record.m_PreTranslation));
    segment->SetPoseInThis(
        Pose(record.m_InversePostRotation, record.m_InversePostTranslation).Inverse());
    segment->SetBoundingBox(record.m_Bounds);
    segment->SetJoint(Joint(record.m_Joint, record.m_Name));
    std::int32_t parent = SegmentTree::NoParent;
    if (record.m_ParentSegmentIndex.IsSet()) {
      const std::uint32_t p = record.m_ParentSegmentIndex.Value();
      if (p >= i || treePosition[p] < 0) {
        o_rErrors.push_back("Segment " + record.m_Name + " has no earlier parent segment");
        continue;
      }
      parent = treePosition[p];
    } else if (!result->Segments().Empty()) {
      o_rErrors.push_back("Segment " + record.m_Name + " is a second root");
      continue;
    }
    treePosition[i] = result->Segments().Add(parent, segment);
  }
  if (result->Segments().Empty()) o_rErrors.push_back("The subject has no segments");

  for (size_t t = 0; t < subject.m_Targets.size(); ++t) {
    const VSubject::VTarget& record = subject.m_Targets[t];
    const bool gaussian = record.m_Type == VSubject::VTarget::ELocalPointToWorldPointGaussian;
    if (record.m_Type != VSubject::VTarget::ELocalPointToWorldPoint && !gaussian) {
      o_rNotes.push_back("Target " + std::to_string(t) + " of type " +
                         std::to_string(record.m_Type) + " has no calibrated form here");
      continue;
    }
    if (record.m_SegmentIndices.size() != 1 ||
        record.m_SegmentIndices[0] >= subject.m_Segments.size() || record.m_State.size() < 3) {
      o_rErrors.push_back("Point target " + std::to_string(t) +
                          " needs one segment and three state values");
      continue;
    }
    std::shared_ptr<VTargetPosition> target;
    if (gaussian) {
      auto withCovariance = std::make_shared<VTargetPositionWithCovariance>();
      if (record.m_Covariance.size() == 9)
        withCovariance->SetCovariance(
            Eigen::Map<const Eigen::Matrix<double, 3, 3, Eigen::RowMajor>>(
                record.m_Covariance.data()));
      target = withCovariance;
    } else {
      target = std::make_shared<VTargetPosition>();
    }
    target->SetParentIdentifier(record.m_SegmentIndices[0]);
    target->SetPositionInParent(
        Eigen::Vector3d(record.m_State[0], record.m_State[1], record.m_State[2]));
    target->SetIdentifier(std::int32_t(t));
    const bool isMarker =
        !record.m_MarkerIndices.empty() && record.m_MarkerIndices[0] < subject.m_Markers.size();
    target->SetName(isMarker ? subject.m_Markers[record.m_MarkerIndices[0]].m_Name
                             : "Target_" + std::to_string(t));
    result->AddTarget(target, isMarker);
  }
  if (o_rErrors.size() != errorsBefore) return nullptr;
  return result;
}

} // namespace KinematicAlgo
