#pragma once
// Run-time targets of a compute subject. A target reads its parent segment's world pose and
// Jacobian blocks; it has no parameters of its own unless NumParams() says otherwise.

#include "OstraAlgo/ComputeSubjectFK/VComputeSegment.h"

#include <string>

namespace ComputeSubject {

class IComputeTarget {
public:
  virtual ~IComputeTarget() = default;
  virtual const KinematicAlgo::ITargetCalibrated& Target() const = 0;
  /// Parameters of the target's own in the state vector (0 for a fixed point).
  virtual std::uint32_t NumParams() const = 0;
  /// Recomputes the world quantity from the parent's current pose.
  virtual void Update() = 0;
  /// The message of a failed binding, empty when bound.
  virtual const std::string& Errors() const = 0;
};

/// A point fixed in a segment: world position, its covariance in world axes, and its dense
/// Jacobian with respect to the joint state.
class VComputeTargetPosition : public IComputeTarget {
public:
  /// `parent` is null when the target's segment isn't in the tree: the target then reports
  /// "VComputeTargetPosition cannot find segment. " in Errors(), keeps the identity as its
  /// parent pose and has a zero Jacobian.
  VComputeTargetPosition(const KinematicAlgo::ITargetCalibrated& target,
                         const VComputeSegment* parent);
  const KinematicAlgo::ITargetCalibrated& Target() const override { return *m_pTarget; }
  std::uint32_t NumParams() const override { return 0; }
  void Update() override;
  const std::string& Errors() const override { return m_Errors; }

  const Eigen::Vector3d& PositionInParent() const { return m_Local; }
  /// World position as of the last Update.
  const Eigen::Vector3d& WorldPosition() const { return m_World; }
  /// R C Rᵀ for a target with a placement covariance; zero otherwise.
  Eigen::Matrix3d WorldCovariance() const;
  /// d(world position)/d(state), 3 rows; the columns are cleared then filled from the parent's
  /// Jacobian blocks of the last update (EChain gives the full derivative, EJoint the part of the
  /// parent's own joint). `o_rJacobian` must have at least as many columns as the joint state.
  void Jacobian(Eigen::Ref<Eigen::MatrixXd> o_rJacobian) const;
  /// Tree index of the parent, or -1.
  std::int32_t ParentIndex() const { return m_pParent ? m_pParent->Index() : -1; }

  /// Rebinds to another segment (after a clone).
  void Rebind(const VComputeSegment* parent) { m_pParent = parent; }

private:
  const KinematicAlgo::ITargetCalibrated* m_pTarget;
  const VComputeSegment* m_pParent;
  Eigen::Vector3d m_Local = Eigen::Vector3d::Zero();
  Eigen::Matrix3d m_Covariance = Eigen::Matrix3d::Zero();
  Eigen::Vector3d m_World = Eigen::Vector3d::Zero();
  std::string m_Errors;
};

} // namespace ComputeSubject
