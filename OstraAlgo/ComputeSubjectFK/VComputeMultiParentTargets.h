#pragma once
// Run-time targets on more than one segment: the relative position, orientation and ray between
// two segments, and the centre of mass of points on several. Their Jacobians sum the blocks of
// every parent's chain, which is right where the chains share ancestors: each block is the total
// derivative of its segment's world pose.

#include "OstraAlgo/ComputeSubjectFK/VComputeTarget.h"

#include "OstraAlgo/KinematicAlgo/VCalibratedPositionTargets.h"
#include "OstraAlgo/KinematicAlgo/VCalibratedRelativeTargets.h"

#include <vector>

namespace ComputeSubject {

/// What the targets on several segments share: the binding (all parents or none), the values
/// and the walk over one parent's Jacobian blocks.
class VComputeTargetMultiParent : public IComputeTarget {
public:
  const KinematicAlgo::ITargetCalibrated& Target() const override { return *m_pTarget; }
  std::uint32_t NumParams() const override { return 0; }
  const std::string& Errors() const override { return m_Errors; }
  std::uint32_t NumValues() const override { return std::uint32_t(m_Values.size()); }
  ConstView Values() const override { return {m_Values.data(), size_t(m_Values.size())}; }
  /// One parent cannot bind this target: it becomes unbound.
  void Rebind(const VComputeSegment*) override {
    Rebind([](std::uint32_t) { return nullptr; });
  }
  /// Reads the model target again and finds each parent through `lookup`.
  virtual void Rebind(const SegmentLookup& lookup) = 0;
  bool IsBound() const { return !m_Parents.empty(); }

protected:
  VComputeTargetMultiParent(const KinematicAlgo::ITargetCalibrated& target, Eigen::Index numValues)
      : m_pTarget(&target), m_Values(Eigen::VectorXd::Zero(numValues)) {}
  /// Binds to `parents`; if one is null, none is bound, the values are zero and the error is
  /// the message of each missing parent (`missing(k)`, each distinct message once).
  template <class Missing>
  void Bind(const std::vector<const VComputeSegment*>& parents, Missing&& missing) {
    m_Parents = parents;
    m_Errors.clear();
    for (size_t k = 0; k < parents.size(); ++k)
      if (!parents[k] && m_Errors.find(missing(k)) == std::string::npos) m_Errors += missing(k);
    if (!m_Errors.empty()) m_Parents.clear();
    m_Values.setZero();
  }
  /// Calls f(column, ∂R, ∂T) for each parameter of each Jacobian block of parent k.
  template <class F> void ForEachDerivative(size_t k, F&& f) const {
    const VComputeSegment& parent = *m_Parents[k];
    const auto& blocks = parent.JacobianBlocks();
    for (std::uint32_t b = 0; b < parent.NumJacobianBlocks(); ++b)
      for (std::uint32_t i = 0; i < blocks[b].m_NumParams; ++i)
        f(Eigen::Index(blocks[b].m_FirstParam + i), blocks[b].m_dR[i], blocks[b].m_dT[i]);
  }

  const KinematicAlgo::ITargetCalibrated* m_pTarget;
  std::vector<const VComputeSegment*> m_Parents;
  Eigen::VectorXd m_Values;
  std::string m_Errors;
};

/// The world offset x1 - x2 between a point fixed in one segment and a point fixed in another.
/// Values (3): the offset. Residual (3): offset - observed. Either parent missing:
/// "VComputeTargetRelativePosition cannot find segment. ".
class VComputeTargetRelativePosition : public VComputeTargetMultiParent {
public:
  VComputeTargetRelativePosition(const KinematicAlgo::VTargetRelativePosition& target,
                                 const SegmentLookup& lookup);
  using VComputeTargetMultiParent::Rebind;
  void Rebind(const SegmentLookup& lookup) override;
  void Update() override;
  bool WriteToModel(KinematicAlgo::ITargetCalibrated& o_rTarget) const override;
  void ValueJacobian(JacobianRef o_rJacobian) const override;
  std::uint32_t ObservationSize() const override { return 3; }
  std::uint32_t NumResiduals() const override { return 3; }
  void Residual(ConstView observation, View o_rResidual) const override;
  void ResidualJacobian(ConstView, JacobianRef o_rJacobian) const override {
    ValueJacobian(o_rJacobian);
  }

private:
  std::array<std::uint32_t, 2> m_Ids{};
  std::array<Eigen::Vector3d, 2> m_Local;
};

/// The rotation of the first segment's fixed frame in the second's: M = (R2 O2)ᵀ R1 O1, the
/// identity when the two frames agree. Values (9): M row-major. Residual (9): M - observed,
/// element by element. A missing parent: "VComputeTargetRelativeOrientation cannot find
/// segment. ".
class VComputeTargetRelativeOrientation : public VComputeTargetMultiParent {
public:
  VComputeTargetRelativeOrientation(const KinematicAlgo::VTargetRelativeOrientation& target,
                                    const SegmentLookup& lookup);
  using VComputeTargetMultiParent::Rebind;
  void Rebind(const SegmentLookup& lookup) override;
  void Update() override;
  bool WriteToModel(KinematicAlgo::ITargetCalibrated& o_rTarget) const override;
  void ValueJacobian(JacobianRef o_rJacobian) const override;
  std::uint32_t ObservationSize() const override { return 9; }
  std::uint32_t NumResiduals() const override { return 9; }
  void Residual(ConstView observation, View o_rResidual) const override;
  void ResidualJacobian(ConstView, JacobianRef o_rJacobian) const override {
    ValueJacobian(o_rJacobian);
  }

private:
  std::array<std::uint32_t, 2> m_Ids{};
  std::array<Eigen::Vector3d, 2> m_Local;
  std::array<Eigen::Matrix3d, 2> m_Orientation;
};

/// A ray fixed in the first segment (origin o, unit direction d) and a point x fixed in the
/// second. Values (9): world origin, world direction, world point. Residual (2, no
/// observation): the point's offset across the ray, A R1ᵀ (x - o), A two orthonormal rows
/// across d. Missing parents: "VComputeTargetRelativeRay cannot find segment 1. " and
/// "... segment 2. ".
class VComputeTargetRelativeRay : public VComputeTargetMultiParent {
public:
  VComputeTargetRelativeRay(const KinematicAlgo::VTargetRelativeRay& target,
                            const SegmentLookup& lookup);
  using VComputeTargetMultiParent::Rebind;
  void Rebind(const SegmentLookup& lookup) override;
  void Update() override;
  bool WriteToModel(KinematicAlgo::ITargetCalibrated& o_rTarget) const override;
  void ValueJacobian(JacobianRef o_rJacobian) const override;
  std::uint32_t ObservationSize() const override { return 0; }
  std::uint32_t NumResiduals() const override { return 2; }
  void Residual(ConstView observation, View o_rResidual) const override;
  void ResidualJacobian(ConstView observation, JacobianRef o_rJacobian) const override;

private:
  std::array<std::uint32_t, 2> m_Ids{};
  std::array<Eigen::Vector3d, 2> m_Local;
  Eigen::Vector3d m_Direction;
  /// The direction as the model gives it (written back as it was).
  Eigen::Vector3d m_ModelDirection;
  Eigen::Matrix<double, 2, 3> m_Across;
};

/// The weighted mean Σ wᵢ xᵢ / Σ wᵢ of points fixed in several segments. Values (3): that
/// world point. Residual (3): value - observed. A term whose segment is missing, or weights
/// that sum to zero, leave it unbound ("VComputeTargetCentreOfMass cannot find segment ",
/// "VComputeTargetCentreOfMass has no weight ").
class VComputeTargetCentreOfMass : public VComputeTargetMultiParent {
public:
  VComputeTargetCentreOfMass(const KinematicAlgo::VTargetCentreOfMass& target,
                             const SegmentLookup& lookup);
  using VComputeTargetMultiParent::Rebind;
  void Rebind(const SegmentLookup& lookup) override;
  void Update() override;
  bool WriteToModel(KinematicAlgo::ITargetCalibrated& o_rTarget) const override;
  void ValueJacobian(JacobianRef o_rJacobian) const override;
  std::uint32_t ObservationSize() const override { return 3; }
  std::uint32_t NumResiduals() const override { return 3; }
  void Residual(ConstView observation, View o_rResidual) const override;
  void ResidualJacobian(ConstView, JacobianRef o_rJacobian) const override {
    ValueJacobian(o_rJacobian);
  }

private:
  /// The model target's own parent and position, unused here but written back.
  std::uint32_t m_HeaderParent = 0;
  Eigen::Vector3d m_HeaderPosition = Eigen::Vector3d::Zero();
  std::vector<KinematicAlgo::VCentreOfMassTerm> m_Terms;
  /// Each term's weight over the sum of the weights.
  std::vector<double> m_Share;
};

} // namespace ComputeSubject
