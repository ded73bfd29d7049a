#pragma once
// Run-time targets of a compute subject. A target reads its parent segment's world pose and
// Jacobian blocks and gives a world quantity (its values), and, for an observation of that
// quantity, a residual. Both come with their derivative with respect to the state, built from
// the parent's Jacobian blocks of the last update: EChain gives the full derivative over the
// joint state, EJoint the part of the parent's own joint, EFree the part of the parent's free
// pose (columns in the free layout, six per segment). No kind here has parameters of its own,
// so the columns of the target part of the state are always zero.
//
// Every world quantity is in world axes; every fixed quantity in the parent segment's frame.

#include "OstraAlgo/ComputeSubjectFK/VComputeSegment.h"

#include "OstraAlgo/KinematicAlgo/VCalibratedTargets.h"

#include <functional>
#include <memory>
#include <string>

namespace ComputeSubject {

using JacobianRef = Eigen::Ref<Eigen::MatrixXd>;

class IComputeTarget {
public:
  virtual ~IComputeTarget() = default;
  virtual const KinematicAlgo::ITargetCalibrated& Target() const = 0;
  /// Parameters of the target's own in the state vector.
  virtual std::uint32_t NumParams() const = 0;
  /// Recomputes the world quantity from the parent's current pose.
  virtual void Update() = 0;
  /// Takes and gives the target's own parameters (NumParams() values); a kind with parameters
  /// overrides both, the others have nothing to move.
  virtual void SetParams(ConstView) {}
  virtual void GetParams(View) const {}
  /// Reads the model target's geometry again and binds to `parent` (null: unbound). Settings
  /// of the run-time target that the model does not hold (member weights) are kept where they
  /// still apply.
  virtual void Rebind(const VComputeSegment* parent) = 0;
  /// The message of a failed binding, empty when bound.
  virtual const std::string& Errors() const = 0;
  /// Writes the geometry this target evaluates with (parents, fixed points, directions,
  /// rotations, covariances) into `o_rTarget`, a model target of the same key. False, with
  /// nothing written, for a target of another key. Statistics the run-time target does not use
  /// (a labelling mean, range, view normal or descriptor) are left as they are.
  virtual bool WriteToModel(KinematicAlgo::ITargetCalibrated& o_rTarget) const = 0;

  /// The world quantity as of the last Update.
  virtual std::uint32_t NumValues() const = 0;
  virtual ConstView Values() const = 0;
  /// d(values)/d(state): NumValues() rows, cleared then filled. The matrix needs at least as
  /// many columns as the Jacobian blocks address.
  virtual void ValueJacobian(JacobianRef o_rJacobian) const = 0;

  /// Size of an observation and of the residual it gives.
  virtual std::uint32_t ObservationSize() const = 0;
  virtual std::uint32_t NumResiduals() const = 0;
  /// Residual of `observation` (ObservationSize() values) into NumResiduals() values.
  virtual void Residual(ConstView observation, View o_rResidual) const = 0;
  /// d(residual)/d(state) at `observation`: NumResiduals() rows, cleared then filled.
  virtual void ResidualJacobian(ConstView observation, JacobianRef o_rJacobian) const = 0;
};

/// What the targets on one segment share: the binding, the values and the walk over the parent's
/// Jacobian blocks.
class VComputeTargetSingleParent : public IComputeTarget {
public:
  const KinematicAlgo::ITargetCalibrated& Target() const override { return *m_pTarget; }
  std::uint32_t NumParams() const override { return 0; }
  const std::string& Errors() const override { return m_Errors; }
  std::uint32_t NumValues() const override { return std::uint32_t(m_Values.size()); }
  ConstView Values() const override { return {m_Values.data(), size_t(m_Values.size())}; }
  /// Tree index of the parent, or -1 when unbound.
  std::int32_t ParentIndex() const { return m_pParent ? m_pParent->Index() : -1; }

protected:
  /// Unbound (`parent` null) targets keep the identity as their parent pose, report
  /// "<className> cannot find segment. " and have zero derivatives.
  VComputeTargetSingleParent(const KinematicAlgo::ITargetCalibrated& target,
                             const VComputeSegment* parent, const char* className,
                             Eigen::Index numValues);
  const VPose& ParentPose() const { return m_pParent ? m_pParent->WorldPose() : m_Identity; }
  /// For WriteToModel: the model target as a single-parent target of this key with its parent
  /// and `position` written, or null (nothing written).
  KinematicAlgo::ITargetSingleParent* WriteParent(KinematicAlgo::ITargetCalibrated& o_rTarget,
                                                  const Eigen::Vector3d& position) const;
  /// Calls f(column, ∂R, ∂T) for each parameter of each Jacobian block of the parent: the
  /// derivative of the parent's world pose.
  template <class F> void ForEachDerivative(F&& f) const {
    if (!m_pParent) return;
    const auto& blocks = m_pParent->JacobianBlocks();
    for (std::uint32_t b = 0; b < m_pParent->NumJacobianBlocks(); ++b)
      for (std::uint32_t i = 0; i < blocks[b].m_NumParams; ++i)
        f(Eigen::Index(blocks[b].m_FirstParam + i), blocks[b].m_dR[i], blocks[b].m_dT[i]);
  }

  const KinematicAlgo::ITargetCalibrated* m_pTarget;
  const VComputeSegment* m_pParent;
  /// The model's parent identifier as read.
  std::uint32_t m_ParentId = 0;
  /// The model's direction or normal as read, before normalising (written back as it was).
  Eigen::Vector3d m_ModelDirection = Eigen::Vector3d::Zero();
  Eigen::VectorXd m_Values;
  std::string m_Errors;
  VPose m_Identity;
};

/// A point fixed in a segment (with or without a placement covariance). Values: the world
/// position. Residual: world - observed, or, with a covariance C, S Rᵀ (world - observed) with
/// S the inverse root of C (+1e-10 I), R the parent's world rotation.
class VComputeTargetPosition : public VComputeTargetSingleParent {
public:
  /// `parent` null: "VComputeTargetPosition cannot find segment. " (or the covariance class's
  /// name).
  VComputeTargetPosition(const KinematicAlgo::ITargetCalibrated& target,
                         const VComputeSegment* parent);
  void Update() override;
  void Rebind(const VComputeSegment* parent) override;
  bool WriteToModel(KinematicAlgo::ITargetCalibrated& o_rTarget) const override;
  void ValueJacobian(JacobianRef o_rJacobian) const override { Jacobian(o_rJacobian); }
  std::uint32_t ObservationSize() const override { return 3; }
  std::uint32_t NumResiduals() const override { return 3; }
  void Residual(ConstView observation, View o_rResidual) const override;
  void ResidualJacobian(ConstView observation, JacobianRef o_rJacobian) const override;

  const Eigen::Vector3d& PositionInParent() const { return m_Local; }
  Eigen::Vector3d WorldPosition() const { return m_Values.head<3>(); }
  /// R C Rᵀ for a target with a placement covariance; zero otherwise.
  Eigen::Matrix3d WorldCovariance() const;
  /// d(world position)/d(state), 3 rows.
  void Jacobian(JacobianRef o_rJacobian) const;

private:
  Eigen::Vector3d m_Local = Eigen::Vector3d::Zero();
  Eigen::Matrix3d m_Covariance = Eigen::Matrix3d::Zero();
  bool m_HasCovariance = false;
  Eigen::Matrix3d m_InverseRoot = Eigen::Matrix3d::Identity();
};

/// A plane fixed in a segment. Values: world origin, then world unit normal. Residual (1): the
/// signed distance n · (x - o) of an observed point x, divided by the residual's standard
/// deviation for the Gaussian form.
class VComputeTargetSegmentPlane : public VComputeTargetSingleParent {
public:
  VComputeTargetSegmentPlane(const KinematicAlgo::VTargetSegmentPlane& target,
                             const VComputeSegment* parent);
  void Update() override;
  void Rebind(const VComputeSegment* parent) override;
  bool WriteToModel(KinematicAlgo::ITargetCalibrated& o_rTarget) const override;
  void ValueJacobian(JacobianRef o_rJacobian) const override;
  std::uint32_t ObservationSize() const override { return 3; }
  std::uint32_t NumResiduals() const override { return 1; }
  void Residual(ConstView observation, View o_rResidual) const override;
  void ResidualJacobian(ConstView observation, JacobianRef o_rJacobian) const override;

private:
  Eigen::Vector3d m_Origin;
  Eigen::Vector3d m_Normal;
  Eigen::MatrixXd m_ResidualCovariance;
  double m_Scale = 1.0;
};

/// A ray fixed in a segment. Values: world origin, then world unit direction. Residual (2): the
/// offset of an observed point across the ray, A Rᵀ (x - o), A two orthonormal rows
/// perpendicular to the local direction; whitened by the residual covariance's inverse root in
/// the Gaussian form.
class VComputeTargetSegmentRay : public VComputeTargetSingleParent {
public:
  VComputeTargetSegmentRay(const KinematicAlgo::VTargetSegmentRay& target,
                           const VComputeSegment* parent);
  void Update() override;
  void Rebind(const VComputeSegment* parent) override;
  bool WriteToModel(KinematicAlgo::ITargetCalibrated& o_rTarget) const override;
  void ValueJacobian(JacobianRef o_rJacobian) const override;
  std::uint32_t ObservationSize() const override { return 3; }
  std::uint32_t NumResiduals() const override { return 2; }
  void Residual(ConstView observation, View o_rResidual) const override;
  void ResidualJacobian(ConstView observation, JacobianRef o_rJacobian) const override;
  /// The two rows across the ray, already whitened.
  const Eigen::Matrix<double, 2, 3>& Across() const { return m_Across; }

private:
  Eigen::Vector3d m_Origin;
  Eigen::Vector3d m_Direction;
  Eigen::MatrixXd m_ResidualCovariance;
  Eigen::Matrix<double, 2, 3> m_Across;
};

/// A direction fixed in a segment. Values and residual (3): R d, and R d - observed.
class VComputeTargetDirection : public VComputeTargetSingleParent {
public:
  VComputeTargetDirection(const KinematicAlgo::VTargetDirection& target,
                          const VComputeSegment* parent);
  void Update() override;
  void Rebind(const VComputeSegment* parent) override;
  bool WriteToModel(KinematicAlgo::ITargetCalibrated& o_rTarget) const override;
  void ValueJacobian(JacobianRef o_rJacobian) const override;
  std::uint32_t ObservationSize() const override { return 3; }
  std::uint32_t NumResiduals() const override { return 3; }
  void Residual(ConstView observation, View o_rResidual) const override;
  void ResidualJacobian(ConstView observation, JacobianRef o_rJacobian) const override {
    ValueJacobian(o_rJacobian);
  }

private:
  Eigen::Vector3d m_Direction;
};

/// A rotation fixed in a segment. Values (9): the world rotation R O, row-major. Residual (9):
/// R O - observed, element by element on the matrices, row-major.
class VComputeTargetOrientation : public VComputeTargetSingleParent {
public:
  VComputeTargetOrientation(const KinematicAlgo::VTargetOrientation& target,
                            const VComputeSegment* parent);
  void Update() override;
  void Rebind(const VComputeSegment* parent) override;
  bool WriteToModel(KinematicAlgo::ITargetCalibrated& o_rTarget) const override;
  void ValueJacobian(JacobianRef o_rJacobian) const override;
  std::uint32_t ObservationSize() const override { return 9; }
  std::uint32_t NumResiduals() const override { return 9; }
  void Residual(ConstView observation, View o_rResidual) const override;
  void ResidualJacobian(ConstView observation, JacobianRef o_rJacobian) const override {
    ValueJacobian(o_rJacobian);
  }

private:
  Eigen::Matrix3d m_Orientation;
};

/// A rigid group of markers on one segment. Values: each member's world position, in member
/// order (3 each). Residual: three rows per member with non-zero weight, weight × (world -
/// observed); the observation holds all members, absent ones included.
class VComputeRigidBody : public VComputeTargetSingleParent {
public:
  VComputeRigidBody(const KinematicAlgo::VTargetRigidBody& target, const VComputeSegment* parent);
  void Update() override;
  void Rebind(const VComputeSegment* parent) override;
  bool WriteToModel(KinematicAlgo::ITargetCalibrated& o_rTarget) const override;
  void ValueJacobian(JacobianRef o_rJacobian) const override;
  std::uint32_t ObservationSize() const override { return 3 * NumMembers(); }
  std::uint32_t NumResiduals() const override;
  void Residual(ConstView observation, View o_rResidual) const override;
  void ResidualJacobian(ConstView observation, JacobianRef o_rJacobian) const override;

  std::uint32_t NumMembers() const { return std::uint32_t(m_Points.size()); }
  /// A member's place in the parent segment (the body pose applied to its place in the body).
  const Eigen::Vector3d& MemberInParent(std::uint32_t i) const { return m_Points[i]; }
  /// 0 marks a member absent; every member starts at 1.
  void SetMemberWeight(std::uint32_t i, double weight) { m_Weights[i] = weight; }
  double MemberWeight(std::uint32_t i) const { return m_Weights[i]; }

private:
  VPose m_Body;
  /// Each member's place in the body, and in the parent segment.
  std::vector<Eigen::Vector3d> m_InBody;
  std::vector<Eigen::Vector3d> m_Points;
  std::vector<double> m_Weights;
};

/// A point fixed in a segment held to a plane fixed in the world. Values: the world position.
/// Residual (1, no observation): n · x - d, n the plane's unit normal.
class VComputeTargetPlane : public VComputeTargetSingleParent {
public:
  VComputeTargetPlane(const KinematicAlgo::VTargetPlane& target, const VComputeSegment* parent);
  void Update() override;
  void Rebind(const VComputeSegment* parent) override;
  bool WriteToModel(KinematicAlgo::ITargetCalibrated& o_rTarget) const override;
  void ValueJacobian(JacobianRef o_rJacobian) const override;
  std::uint32_t ObservationSize() const override { return 0; }
  std::uint32_t NumResiduals() const override { return 1; }
  void Residual(ConstView observation, View o_rResidual) const override;
  void ResidualJacobian(ConstView observation, JacobianRef o_rJacobian) const override;

private:
  Eigen::Vector3d m_Local;
  Eigen::Vector3d m_Normal;
  double m_Offset;
};

/// Two orthonormal rows across the unit vector `direction`, built from the axis least aligned
/// with it.
Eigen::Matrix<double, 2, 3> AcrossRows(const Eigen::Vector3d& direction);

/// The run-time target of a model target, bound to `parent` (null when its segment is not in
/// the tree). Null for a model class without a run-time form.
std::unique_ptr<IComputeTarget> MakeComputeTarget(const KinematicAlgo::ITargetCalibrated& target,
                                                  const VComputeSegment* parent);

/// Finds a segment by its model identifier (null when there is none).
using SegmentLookup = std::function<const VComputeSegment*(std::uint32_t id)>;

/// The run-time target of any model target, single-parent or not, its parents found through
/// `lookup`. Null for a model class without a run-time form.
std::unique_ptr<IComputeTarget> MakeComputeTarget(const KinematicAlgo::ITargetCalibrated& target,
                                                  const SegmentLookup& lookup);

} // namespace ComputeSubject
