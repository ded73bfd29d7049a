#pragma once
// The calibrated subject model: a tree of segments, each with a joint and its statistics, and a
// list of typed targets, some of which are markers. Plain description, no evaluation state;
// ComputeSubjectFK builds its evaluable form from it.

#include "OstraAlgo/KinematicAlgo/RotationMath.h"
#include "OstraAlgo/KinematicAlgo/VTree.h"

#include <Eigen/Core>

#include <array>
#include <cstdint>
#include <iosfwd>
#include <memory>
#include <string>
#include <vector>

namespace KinematicAlgo {

class VTextReader;

class IJointCalibrated {
public:
  virtual ~IJointCalibrated() = default;
  /// Joint type code (EJointKind); a new joint is Free.
  virtual std::int32_t Type() const = 0;
  /// Sets the code, resizes every dynamic field to its parameter count, empties the static
  /// ones and zero-fills all of them.
  virtual void SetType(std::int32_t code) = 0;
  /// "Free", "Ball", "HardySpicer", "Hinge", "Slider", "Dummy" or "InvalidJointType".
  virtual std::string TypeName() const = 0;
  virtual std::uint32_t NumDynamicParams() const = 0;
  virtual std::uint32_t NumStaticParams() const = 0;
  /// Name of the owning segment.
  virtual const std::string& Name() const = 0;
  virtual void SetName(const std::string& name) = 0;
  /// The joint's fixed rotation as a rotation vector: its axes in the parent's frame.
  virtual const Eigen::Vector3d& Rotation() const = 0;
  virtual void SetRotation(const Eigen::Vector3d& rotation) = 0;
  virtual const Eigen::VectorXd& MeanDynamic() const = 0;
  virtual void SetMeanDynamic(const Eigen::VectorXd& mean) = 0;
  virtual const Eigen::MatrixXd& CovDynamic() const = 0;
  virtual void SetCovDynamic(const Eigen::MatrixXd& covariance) = 0;
  virtual const Eigen::VectorXd& CentreDynamic() const = 0;
  virtual void SetCentreDynamic(const Eigen::VectorXd& centre) = 0;
  virtual const Eigen::MatrixXd& RangeDynamic() const = 0;
  virtual void SetRangeDynamic(const Eigen::MatrixXd& range) = 0;
  virtual const Eigen::VectorXd& MeanStatic() const = 0;
  virtual const Eigen::MatrixXd& CovStatic() const = 0;
  virtual std::shared_ptr<IJointCalibrated> Clone() const = 0;
  /// Every field exactly.
  virtual bool Equals(const IJointCalibrated& other) const = 0;
  /// The line-oriented text form (see CalibratedText.h) and its reading; a failed read leaves
  /// the reader's error set and this object in an unspecified but valid state.
  virtual void Write(std::ostream& o_rStream) const = 0;
  virtual bool Read(VTextReader& io_rReader) = 0;
};

class ISegmentCalibrated {
public:
  virtual ~ISegmentCalibrated() = default;
  virtual std::int32_t Identifier() const = 0;
  virtual void SetIdentifier(std::int32_t id) = 0;
  virtual const std::string& Name() const = 0;
  virtual void SetName(const std::string& name) = 0;
  /// P: where the joint sits in the parent's frame.
  virtual const VPose& PoseInParent() const = 0;
  virtual void SetPoseInParent(const VPose& pose) = 0;
  /// Q: where the joint sits in this segment's frame. The segment's pose in its parent is
  /// P A J A⁻¹ Q⁻¹, A the joint's fixed rotation and J the joint transform.
  virtual const VPose& PoseInThis() const = 0;
  virtual void SetPoseInThis(const VPose& pose) = 0;
  virtual std::shared_ptr<IJointCalibrated> Joint() const = 0;
  virtual void SetJoint(std::shared_ptr<IJointCalibrated> joint) = 0;
  /// Lower corner then upper corner.
  virtual const std::array<double, 6>& BoundingBox() const = 0;
  virtual void SetBoundingBox(const std::array<double, 6>& box) = 0;
  virtual std::shared_ptr<ISegmentCalibrated> Clone() const = 0;
  virtual bool Equals(const ISegmentCalibrated& other) const = 0;
  /// The segment's fields, then its joint's.
  virtual void Write(std::ostream& o_rStream) const = 0;
  virtual bool Read(VTextReader& io_rReader) = 0;
};

class ITargetCalibrated;

/// Receives a target with its factory key (ITargetCalibrated::Visit).
class ITargetVisitor {
public:
  virtual ~ITargetVisitor() = default;
  virtual void Visit(const char* key, const ITargetCalibrated& target) = 0;
};

class ITargetCalibrated {
public:
  virtual ~ITargetCalibrated() = default;
  virtual std::shared_ptr<ITargetCalibrated> Clone() const = 0;
  virtual bool Equals(const ITargetCalibrated& other) const = 0;
  /// The key under which the target factory knows the class ("TargetPosition", ...).
  virtual const char* Key() const = 0;
  /// The factory's index of Key().
  std::int32_t Type() const;
  /// Calls the receiver with Key() and this target.
  virtual void Visit(ITargetVisitor& receiver) const { receiver.Visit(Key(), *this); }
  virtual std::int32_t Identifier() const = 0;
  virtual void SetIdentifier(std::int32_t id) = 0;
  virtual const std::string& Name() const = 0;
  virtual void SetName(const std::string& name) = 0;
  /// The target's fields without its key (the subject writes the key before it).
  virtual void Write(std::ostream& o_rStream) const = 0;
  virtual bool Read(VTextReader& io_rReader) = 0;
};

/// A target fixed to one segment.
class ITargetSingleParent {
public:
  virtual ~ITargetSingleParent() = default;
  /// Identifier of the parent segment.
  virtual std::uint32_t ParentIdentifier() const = 0;
  virtual void SetParentIdentifier(std::uint32_t id) = 0;
  virtual const Eigen::Vector3d& PositionInParent() const = 0;
  virtual void SetPositionInParent(const Eigen::Vector3d& position) = 0;
};

/// A target with a 3x3 position covariance in its parent's frame.
class ITargetCovariance3 {
public:
  virtual ~ITargetCovariance3() = default;
  virtual const Eigen::Matrix3d& Covariance() const = 0;
  virtual void SetCovariance(const Eigen::Matrix3d& covariance) = 0;
};

using SegmentTree = VTree<std::shared_ptr<ISegmentCalibrated>>;

/// A line drawn between two markers (indices into the marker list), with its colour.
struct VStick {
  std::uint32_t m_Marker1 = 0;
  std::uint32_t m_Marker2 = 0;
  std::array<std::uint8_t, 3> m_Colour{};
  bool operator==(const VStick&) const = default;
};

class ISubjectCalibrated {
public:
  virtual ~ISubjectCalibrated() = default;
  virtual const std::string& Name() const = 0;
  virtual void SetName(const std::string& name) = 0;
  virtual std::int32_t Identifier() const = 0;
  virtual void SetIdentifier(std::int32_t id) = 0;
  virtual const SegmentTree& Segments() const = 0;
  virtual SegmentTree& Segments() = 0;
  virtual std::uint32_t NumTargets() const = 0;
  virtual std::shared_ptr<ITargetCalibrated> Target(std::uint32_t i) const = 0;
  virtual std::uint32_t NumMarkers() const = 0;
  /// A marker is a target too; it may be the same object as one of Target(i).
  virtual std::shared_ptr<ITargetCalibrated> Marker(std::uint32_t i) const = 0;
  virtual const std::vector<VStick>& Sticks() const = 0;
  virtual void SetSticks(const std::vector<VStick>& sticks) = 0;
  virtual std::shared_ptr<ISubjectCalibrated> Clone() const = 0;
  /// Name, identifier, tree shape and segments, targets, markers and sticks, all exactly.
  virtual bool Equals(const ISubjectCalibrated& other) const = 0;
  /// The whole subject as text (see CalibratedText.h).
  virtual void Write(std::ostream& o_rStream) const = 0;
  /// Reads a subject written by Write from the rest of the stream. On failure returns false,
  /// puts the reason (with its line) into `o_pError` and leaves this subject as it was.
  virtual bool Read(std::istream& io_rStream, std::string* o_pError = nullptr) = 0;
};

} // namespace KinematicAlgo
