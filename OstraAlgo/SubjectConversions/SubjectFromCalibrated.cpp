#include "OstraAlgo/SubjectConversions/SubjectFromCalibrated.h"

#include "DebugServices/GlobalLog.h"
#include "OstraAlgo/KinematicAlgo/VCalibratedTargets.h"
#include "River/CoreOstraTypes/NameHash.h"
#include "River/CoreOstraTypesUtils/AngleAxis.h"
#include "River/CoreOstraTypesUtils/RigidBodyUtils.h"

#include <cstring>
#include <map>

namespace SubjectConversions {

using CoreOstraTypes::VSubject;
using CoreOstraTypes::VSubjectApplicationData;
using namespace KinematicAlgo;

#define CONVERSION_LOG(level, ...) ZMT_LOG(SubjectConversionChannel, level, __VA_ARGS__)

namespace {

using Triple = std::array<double, 3>;

Triple ToTriple(const Eigen::Vector3d& v) {
  return {v.x(), v.y(), v.z()};
}

void Append(std::vector<double>& out, const Eigen::Vector3d& v) {
  out.insert(out.end(), {v.x(), v.y(), v.z()});
}

/// Row-major entries of `m`.
std::vector<double> RowMajor(const Eigen::MatrixXd& m) {
  std::vector<double> out;
  out.reserve(std::size_t(m.size()));
  for (Eigen::Index i = 0; i < m.rows(); ++i)
    for (Eigen::Index j = 0; j < m.cols(); ++j)
      out.push_back(m(i, j));
  return out;
}

bool JointFromModel(const IJointCalibrated& joint, const std::string& segmentName,
                    VSubject::VJoint& o_rJoint) {
  if (joint.Type() < 0 || joint.Type() > std::int32_t(VSubject::VJoint::EDummy)) {
    CONVERSION_LOG(ZMT::ELogError, "Segment %1% has an invalid joint type %2%", segmentName,
                   joint.Type());
    return false;
  }
  o_rJoint.m_JointType = VSubject::VJoint::EJointType(joint.Type());
  o_rJoint.m_Name = joint.Name().empty() ? segmentName : joint.Name();
  o_rJoint.m_JointOrientation = ToTriple(joint.Rotation());
  if (joint.NumDynamicParams() == 0) return true; // a dummy holds no statistics
  const Eigen::VectorXd& mean = joint.MeanDynamic();
  o_rJoint.m_Mean.assign(mean.data(), mean.data() + mean.size());
  o_rJoint.m_Covariance = RowMajor(joint.CovDynamic());
  // The model keeps a zero range for "no range"; the record keeps nothing.
  if (joint.RangeDynamic().size() > 0 && !joint.RangeDynamic().isZero(0.0)) {
    const Eigen::VectorXd& centre = joint.CentreDynamic();
    o_rJoint.m_RangeCentringState.assign(centre.data(), centre.data() + centre.size());
    o_rJoint.m_RangeMatrix = RowMajor(joint.RangeDynamic());
  }
  return true;
}

/// The record being built, with the lookups of the conversion.
struct VBuild {
  const ISubjectCalibrated& m_rModel;
  VSubject m_Subject;
  std::vector<std::string> m_TargetNames;
  std::map<std::int32_t, std::uint32_t> m_SegmentIndex; ///< segment identifier to index

  /// Marker of the model that `target` is: the same object, or one with its identifier and name.
  bool FindMarker(const ITargetCalibrated& target, std::uint32_t& o_rIndex,
                  std::shared_ptr<ITargetCalibrated>& o_rMarker) const {
    for (std::uint32_t i = 0; i < m_rModel.NumMarkers(); ++i) {
      const auto marker = m_rModel.Marker(i);
      if (marker.get() == &target ||
          (marker && marker->Identifier() == target.Identifier() && target.Identifier() >= 0 &&
           marker->Name() == target.Name())) {
        o_rIndex = i;
        o_rMarker = marker;
        return true;
      }
    }
    return false;
  }

  /// Marker index of a rigid body member: a marker of that name, else a new one.
  std::uint32_t MemberMarker(const ITargetCalibrated& member) {
    for (std::uint32_t i = 0; i < m_Subject.m_Markers.size(); ++i)
      if (m_Subject.m_Markers[i].m_Name == member.Name()) return i;
    m_Subject.m_Markers.push_back(
        {member.Name(), CoreOstraTypes::NameHash(member.Name()), 10.0, false, 0.0});
    return std::uint32_t(m_Subject.m_Markers.size() - 1);
  }

  std::uint32_t AddRotationObservation(const std::string& name) {
    m_Subject.m_Rotations.push_back({name, CoreOstraTypes::NameHash(name)});
    return std::uint32_t(m_Subject.m_Rotations.size() - 1);
  }

  bool AddSegments();
  bool AddTarget(std::uint32_t t);
};

bool VBuild::AddSegments() {
  const SegmentTree& tree = m_rModel.Segments();
  if (tree.Empty()) {
    CONVERSION_LOG(ZMT::ELogError, "Subject %1% has no segments", m_rModel.Name());
    return false;
  }
  bool ok = true;
  for (std::int32_t i = 0; i < tree.Size(); ++i) {
    const auto& node = tree[i];
    const ISegmentCalibrated& segment = *node.m_Value;
    VSubject::VSegment record;
    record.m_Name = segment.Name();
    record.m_SegmentIndex = std::uint32_t(i);
    if (node.m_Parent != SegmentTree::NoParent)
      record.m_ParentSegmentIndex = std::uint32_t(node.m_Parent);
    record.m_TreeDepth = std::uint32_t(tree.Depth(i));
    record.m_PreRotation =
        CoreOstraTypesUtils::RotationToAngleAxis(segment.PoseInParent().m_Rotation);
    record.m_PreTranslation = ToTriple(segment.PoseInParent().m_Translation);
    const VPose inversePost = segment.PoseInThis().Inverse();
    record.m_InversePostRotation = CoreOstraTypesUtils::RotationToAngleAxis(inversePost.m_Rotation);
    record.m_InversePostTranslation = ToTriple(inversePost.m_Translation);
    record.m_Bounds = segment.BoundingBox();
    if (!segment.Joint() || !JointFromModel(*segment.Joint(), segment.Name(), record.m_Joint)) {
      if (!segment.Joint())
        CONVERSION_LOG(ZMT::ELogError, "Segment %1% has no joint", segment.Name());
      ok = false;
    }
    m_SegmentIndex[segment.Identifier()] = std::uint32_t(i);
    m_Subject.m_Segments.push_back(std::move(record));
  }
  return ok;
}

bool VBuild::AddTarget(std::uint32_t t) {
  const auto pTarget = m_rModel.Target(t);
  const ITargetCalibrated& target = *pTarget;
  const std::string name = target.Name().empty() ? "Target_" + std::to_string(t) : target.Name();
  const char* key = target.Key();
  const auto is = [key](const char* k) { return std::strcmp(key, k) == 0; };

  const auto* single = dynamic_cast<const ITargetSingleParent*>(&target);
  if (!single) {
    CONVERSION_LOG(ZMT::ELogError, "Target %1% of class %2% has no record form", name, key);
    return false;
  }
  const auto segment = m_SegmentIndex.find(std::int32_t(single->ParentIdentifier()));
  if (segment == m_SegmentIndex.end()) {
    CONVERSION_LOG(ZMT::ELogError, "Target %1% is on segment %2%, which the subject does not hold",
                   name, single->ParentIdentifier());
    return false;
  }

  VSubject::VTarget record;
  record.m_SegmentIndices = {segment->second};
  const Eigen::Vector3d& position = single->PositionInParent();
  const bool point = is("TargetPosition") || is("TargetPositionWithCovariance");
  const bool plane = is("TargetSegmentPlane"), ray = is("TargetSegmentRay");

  std::shared_ptr<ITargetCalibrated> markerObject; // the marker a point, plane or ray observes
  if (point || plane || ray) {
    std::uint32_t marker = 0;
    if (!FindMarker(target, marker, markerObject)) {
      CONVERSION_LOG(ZMT::ELogError, "Target %1% observes no marker of the subject", name);
      return false;
    }
    record.m_MarkerIndices = {marker};
    Append(record.m_State, position);
  }
  if (point) {
    const auto* own = dynamic_cast<const ITargetCovariance3*>(&target);
    record.m_Type = own ? VSubject::VTarget::ELocalPointToWorldPointGaussian
                        : VSubject::VTarget::ELocalPointToWorldPoint;
    const auto* fromMarker = markerObject.get() != &target
                                 ? dynamic_cast<const ITargetCovariance3*>(markerObject.get())
                                 : nullptr;
    if (own && fromMarker && !fromMarker->Covariance().isZero(0.0)) {
      if (!own->Covariance().isZero(0.0))
        CONVERSION_LOG(ZMT::ELogWarning,
                       "Overriding target covariance value with marker covariance");
      own = fromMarker;
    } else if (!own && fromMarker) {
      record.m_Type = VSubject::VTarget::ELocalPointToWorldPointGaussian;
      own = fromMarker;
    }
    if (own) record.m_Covariance = RowMajor(own->Covariance());
  } else if (plane || ray) {
    const auto& shaped = dynamic_cast<const VTargetPointDirection&>(target);
    Append(record.m_State, shaped.DirectionInParent());
    const Eigen::MatrixXd& residual = shaped.ResidualCovariance();
    const bool gaussian = residual.size() > 0;
    record.m_Type = plane ? (gaussian ? VSubject::VTarget::ELocalPlaneToWorldPointGaussian
                                      : VSubject::VTarget::ELocalPlaneToWorldPoint)
                          : (gaussian ? VSubject::VTarget::ELocalLineToWorldPointGaussian
                                      : VSubject::VTarget::ELocalLineToWorldPoint);
    if (gaussian) record.m_Covariance = RowMajor(residual);
  } else if (is("TargetRigidBody")) {
    const auto& body = dynamic_cast<const VTargetRigidBody&>(target);
    if (body.NumMembers() < 3) {
      CONVERSION_LOG(ZMT::ELogError, "Rigid body %1% has %2% markers, at least 3 are needed", name,
                     body.NumMembers());
      return false;
    }
    record.m_Type = VSubject::VTarget::ERigidBody;
    std::vector<CoreOstraTypesUtils::RigidVector> positions;
    std::vector<CoreOstraTypesUtils::RigidCovariance> covariances;
    for (std::uint32_t m = 0; m < body.NumMembers(); ++m) {
      const VTargetPosition& member = body.Member(m);
      record.m_MarkerIndices.push_back(MemberMarker(member));
      positions.push_back(ToTriple(member.PositionInParent()));
      CoreOstraTypesUtils::RigidCovariance c{};
      if (const auto* withCovariance = dynamic_cast<const ITargetCovariance3*>(&member)) {
        const auto entries = RowMajor(withCovariance->Covariance());
        std::copy(entries.begin(), entries.end(), c.begin());
      }
      covariances.push_back(c);
    }
    const VPose& pose = body.BodyPoseInParent();
    if (!CoreOstraTypesUtils::WriteRigidBodyInformation(
            record, CoreOstraTypesUtils::RotationToAngleAxis(pose.m_Rotation),
            ToTriple(pose.m_Translation), positions, covariances, {}))
      return false;
  } else if (is("TargetOrientation")) {
    const auto& orientation = dynamic_cast<const VTargetOrientation&>(target);
    record.m_Type = VSubject::VTarget::ELocalRotationToWorldRotation;
    const Triple state =
        CoreOstraTypesUtils::RotationToAngleAxis(orientation.OrientationInParent());
    record.m_State.assign(state.begin(), state.end());
    record.m_RotationObservationIndices = {AddRotationObservation(name)};
  } else if (is("TargetDirection")) {
    const auto& direction = dynamic_cast<const VTargetPointDirection&>(target);
    record.m_Type = VSubject::VTarget::ELocalDirectionToWorldDirection;
    Append(record.m_State, direction.DirectionInParent().normalized());
    record.m_RotationObservationIndices = {AddRotationObservation(name)};
  } else {
    CONVERSION_LOG(ZMT::ELogError, "Target %1% of class %2% has no record form", name, key);
    return false;
  }
  m_Subject.m_Targets.push_back(std::move(record));
  m_TargetNames.push_back(name);
  return true;
}

} // namespace

bool SubjectFromCalibrated(const ISubjectCalibrated& model, VSubject& o_rSubject,
                           VSubjectApplicationData* o_pAppData) {
  VBuild build{model, {}, {}, {}};
  VSubject& subject = build.m_Subject;
  subject.m_Name = model.Name();
  subject.m_SubjectId = model.Identifier() >= 0 ? std::uint32_t(model.Identifier())
                                                : CoreOstraTypes::NameHash(model.Name());
  bool ok = build.AddSegments();
  for (std::uint32_t i = 0; i < model.NumMarkers(); ++i) {
    const std::string& name = model.Marker(i)->Name();
    subject.m_Markers.push_back({name, CoreOstraTypes::NameHash(name), 10.0, false, 0.0});
  }
  for (std::uint32_t t = 0; t < model.NumTargets() && ok; ++t)
    ok = build.AddTarget(t);
  if (!ok) {
    CONVERSION_LOG(ZMT::ELogError, "Cannot convert the model of subject %1% to a record",
                   model.Name());
    return false;
  }
  if (o_pAppData) {
    VSubjectApplicationData appData;
    appData.m_SubjectId = subject.m_SubjectId;
    appData.m_Segments.resize(subject.m_Segments.size());
    appData.m_Markers.resize(subject.m_Markers.size());
    appData.m_Targets.resize(subject.m_Targets.size());
    for (std::size_t t = 0; t < build.m_TargetNames.size(); ++t)
      appData.m_Targets[t].m_Name = build.m_TargetNames[t];
    *o_pAppData = std::move(appData);
  }
  o_rSubject = std::move(subject);
  return true;
}

} // namespace SubjectConversions
