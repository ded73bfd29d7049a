#include "OstraAlgo/KinematicAlgo/SubjectCalibratedFromRecord.h"

#include "OstraAlgo/KinematicAlgo/VCalibratedTargets.h"

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

using Target = VSubject::VTarget;

Eigen::Vector3d Triple(const std::vector<double>& state, size_t first) {
  return Eigen::Vector3d(state[first], state[first + 1], state[first + 2]);
}

Eigen::MatrixXd SquareCovariance(const std::vector<double>& values, Eigen::Index n) {
  if (Eigen::Index(values.size()) != n * n) return Eigen::MatrixXd();
  return Eigen::Map<const Eigen::Matrix<double, Eigen::Dynamic, Eigen::Dynamic, Eigen::RowMajor>>(
      values.data(), n, n);
}

// State sizes of the kinds with a calibrated form; 0 for the rest. A rigid body's depends on
// its markers.
size_t StateSize(const Target& record) {
  switch (record.m_Type) {
  case Target::ELocalPointToWorldPoint:
  case Target::ELocalPointToWorldPointGaussian:
  case Target::ELocalRotationToWorldRotation:
  case Target::ELocalDirectionToWorldDirection:
    return 3;
  case Target::ELocalPlaneToWorldPoint:
  case Target::ELocalPlaneToWorldPointGaussian:
  case Target::ELocalLineToWorldPoint:
  case Target::ELocalLineToWorldPointGaussian:
    return 6;
  case Target::ERigidBody:
    return 3 * (record.m_MarkerIndices.size() + 2);
  default:
    return 0;
  }
}

// The model target of record `t`: null with `o_rError` empty when the kind has no calibrated
// form, null with `o_rError` set when the record is malformed.
std::shared_ptr<VTargetPosition> TargetFromRecord(const VSubject& subject, size_t t,
                                                  std::string& o_rError) {
  const Target& record = subject.m_Targets[t];
  const size_t size = StateSize(record);
  if (size == 0) return nullptr;
  const std::string which = "Target " + std::to_string(t);
  if (record.m_SegmentIndices.size() != 1 ||
      record.m_SegmentIndices[0] >= subject.m_Segments.size()) {
    o_rError = which + " needs exactly one segment of the subject";
    return nullptr;
  }
  if (record.m_State.size() != size) {
    o_rError = which + " needs " + std::to_string(size) + " state values, not " +
               std::to_string(record.m_State.size());
    return nullptr;
  }
  const std::vector<double>& state = record.m_State;
  std::shared_ptr<VTargetPosition> target;
  switch (record.m_Type) {
  case Target::ELocalPointToWorldPoint:
    target = std::make_shared<VTargetPosition>();
    target->SetPositionInParent(Triple(state, 0));
    break;
  case Target::ELocalPointToWorldPointGaussian: {
    auto point = std::make_shared<VTargetPositionWithCovariance>();
    if (record.m_Covariance.size() == 9)
      point->SetCovariance(SquareCovariance(record.m_Covariance, 3));
    point->SetPositionInParent(Triple(state, 0));
    target = point;
    break;
  }
  case Target::ELocalPlaneToWorldPoint:
  case Target::ELocalPlaneToWorldPointGaussian:
  case Target::ELocalLineToWorldPoint:
  case Target::ELocalLineToWorldPointGaussian:
  case Target::ELocalDirectionToWorldDirection: {
    const bool plane = record.m_Type == Target::ELocalPlaneToWorldPoint ||
                       record.m_Type == Target::ELocalPlaneToWorldPointGaussian;
    const bool direction = record.m_Type == Target::ELocalDirectionToWorldDirection;
    std::shared_ptr<VTargetPointDirection> shaped;
    if (plane)
      shaped = std::make_shared<VTargetSegmentPlane>();
    else if (direction)
      shaped = std::make_shared<VTargetDirection>();
    else
      shaped = std::make_shared<VTargetSegmentRay>();
    const Eigen::Vector3d d = Triple(state, direction ? 0 : 3);
    if (!(d.norm() > 1e-12) || !d.allFinite()) {
      o_rError = which + " has a zero or non-finite " + (plane ? "normal" : "direction");
      return nullptr;
    }
    shaped->SetDirectionInParent(d.normalized());
    if (!direction) shaped->SetPositionInParent(Triple(state, 0));
    const Eigen::Index n = record.m_Type == Target::ELocalPlaneToWorldPointGaussian  ? 1
                           : record.m_Type == Target::ELocalLineToWorldPointGaussian ? 2
                                                                                     : 0;
    if (n > 0) {
      Eigen::MatrixXd c = SquareCovariance(record.m_Covariance, n);
      if (c.size() == 0) {
        o_rError = which + " needs a " + std::to_string(n) + " by " + std::to_string(n) +
                   " residual covariance";
        return nullptr;
      }
      shaped->SetResidualCovariance(c);
    }
    target = shaped;
    break;
  }
  case Target::ELocalRotationToWorldRotation: {
    auto orientation = std::make_shared<VTargetOrientation>();
    orientation->SetOrientationInParent(Exp(Triple(state, 0)));
    target = orientation;
    break;
  }
  case Target::ERigidBody: {
    auto body = std::make_shared<VTargetRigidBody>();
    body->SetBodyPoseInParent(Pose({state[0], state[1], state[2]}, {state[3], state[4], state[5]}));
    for (size_t m = 0; m < record.m_MarkerIndices.size(); ++m) {
      const std::uint32_t marker = record.m_MarkerIndices[m];
      if (marker >= subject.m_Markers.size()) {
        o_rError = which + " refers to marker " + std::to_string(marker) + ", which is not there";
        return nullptr;
      }
      auto member = std::make_shared<VTargetPosition>(record.m_SegmentIndices[0]);
      member->SetPositionInParent(Triple(state, 3 * (m + 2)));
      member->SetName(subject.m_Markers[marker].m_Name);
      member->SetIdentifier(std::int32_t(marker));
      body->AddMember(member);
    }
    target = body;
    break;
  }
  default:
    return nullptr;
  }
  target->SetParentIdentifier(record.m_SegmentIndices[0]);
  target->SetIdentifier(std::int32_t(t));
  return target;
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
    std::string error;
    auto target = TargetFromRecord(subject, t, error);
    if (!error.empty()) {
      o_rErrors.push_back(error);
      continue;
    }
    if (!target) {
      o_rNotes.push_back("Target " + std::to_string(t) + " of type " +
                         std::to_string(subject.m_Targets[t].m_Type) +
                         " has no calibrated form here");
      continue;
    }
    const VSubject::VTarget& record = subject.m_Targets[t];
    // Points, planes and lines observe one marker; a rigid body's markers are its members, and
    // rotations and directions observe rotations.
    const bool isMarker = record.m_Type <= VSubject::VTarget::ELocalLineToWorldPointGaussian &&
                          !record.m_MarkerIndices.empty() &&
                          record.m_MarkerIndices[0] < subject.m_Markers.size();
    target->SetName(isMarker ? subject.m_Markers[record.m_MarkerIndices[0]].m_Name
                             : "Target_" + std::to_string(t));
    result->AddTarget(target, isMarker);
  }
  if (o_rErrors.size() != errorsBefore) return nullptr;
  return result;
}

} // namespace KinematicAlgo
