#include "OstraAlgo/ComputeSubjectFK/VComputeTarget.h"

#include <Eigen/Eigenvalues>

#include <cmath>
#include <cstring>

namespace ComputeSubject {

using namespace KinematicAlgo;

namespace {
Eigen::Vector3d Point(ConstView v, size_t first = 0) {
  return Eigen::Vector3d(v[first], v[first + 1], v[first + 2]);
}

// Inverse root of a symmetric positive definite matrix, with `floor` added to the diagonal.
template <int N>
Eigen::Matrix<double, N, N> InverseRoot(const Eigen::MatrixXd& covariance, double floor) {
  using M = Eigen::Matrix<double, N, N>;
  const M c = M(covariance) + floor * M::Identity();
  Eigen::SelfAdjointEigenSolver<M> eigen(c);
  const auto values = eigen.eigenvalues().cwiseAbs().cwiseSqrt().cwiseInverse();
  return eigen.eigenvectors() * values.asDiagonal() * eigen.eigenvectors().transpose();
}
} // namespace

VComputeTargetSingleParent::VComputeTargetSingleParent(const ITargetCalibrated& target,
                                                       const VComputeSegment* parent,
                                                       const char* className,
                                                       Eigen::Index numValues)
    : m_pTarget(&target), m_pParent(parent), m_Values(Eigen::VectorXd::Zero(numValues)) {
  if (!parent) m_Errors = std::string(className) + " cannot find segment. ";
}

// --- Point --------------------------------------------------------------------------------

VComputeTargetPosition::VComputeTargetPosition(const ITargetCalibrated& target,
                                               const VComputeSegment* parent)
    : VComputeTargetSingleParent(target, parent,
                                 dynamic_cast<const ITargetCovariance3*>(&target)
                                     ? "VComputeTargetPositionWithCovariance"
                                     : "VComputeTargetPosition",
                                 3) {
  if (const auto* single = dynamic_cast<const ITargetSingleParent*>(&target))
    m_Local = single->PositionInParent();
  if (const auto* covariance = dynamic_cast<const ITargetCovariance3*>(&target)) {
    m_Covariance = covariance->Covariance();
    m_HasCovariance = true;
    m_InverseRoot = InverseRoot<3>(m_Covariance, 1e-10);
  }
  m_Values = m_Local;
}

void VComputeTargetPosition::Update() {
  if (!m_pParent) return;
  const VPose& W = m_pParent->WorldPose();
  m_Values.head<3>().noalias() = W.m_Rotation * m_Local;
  m_Values.head<3>() += W.m_Translation;
}

Eigen::Matrix3d VComputeTargetPosition::WorldCovariance() const {
  const Eigen::Matrix3d R = ParentPose().m_Rotation;
  return R * m_Covariance * R.transpose();
}

void VComputeTargetPosition::Jacobian(JacobianRef o_rJacobian) const {
  o_rJacobian.setZero();
  ForEachDerivative([&](Eigen::Index c, const Matrix3r& dR, const Eigen::Vector3d& dT) {
    o_rJacobian.col(c).head<3>() += dR * m_Local + dT;
  });
}

void VComputeTargetPosition::Residual(ConstView observation, View o_rResidual) const {
  Eigen::Map<Eigen::Vector3d> r(o_rResidual.data());
  r = m_Values.head<3>() - Point(observation);
  if (m_HasCovariance) r = m_InverseRoot * (ParentPose().m_Rotation.transpose() * r).eval();
}

void VComputeTargetPosition::ResidualJacobian(ConstView observation,
                                              JacobianRef o_rJacobian) const {
  o_rJacobian.setZero();
  const Eigen::Vector3d offset = m_Values.head<3>() - Point(observation);
  const Matrix3r Rt = ParentPose().m_Rotation.transpose();
  ForEachDerivative([&](Eigen::Index c, const Matrix3r& dR, const Eigen::Vector3d& dT) {
    const Eigen::Vector3d dp = dR * m_Local + dT;
    if (m_HasCovariance)
      o_rJacobian.col(c).head<3>() += m_InverseRoot * (dR.transpose() * offset + Rt * dp);
    else
      o_rJacobian.col(c).head<3>() += dp;
  });
}

// --- Plane --------------------------------------------------------------------------------

VComputeTargetSegmentPlane::VComputeTargetSegmentPlane(const VTargetSegmentPlane& target,
                                                       const VComputeSegment* parent)
    : VComputeTargetSingleParent(target, parent, "VComputeTargetSegmentPlane", 6),
      m_Origin(target.PositionInParent()), m_Normal(target.DirectionInParent().normalized()) {
  const Eigen::MatrixXd& c = target.ResidualCovariance();
  if (c.rows() == 1 && c.cols() == 1) m_Scale = 1.0 / std::sqrt(std::abs(c(0, 0)) + 1e-10);
  m_Values << m_Origin, m_Normal;
}

void VComputeTargetSegmentPlane::Update() {
  if (!m_pParent) return;
  const VPose& W = m_pParent->WorldPose();
  m_Values.head<3>() = W.m_Rotation * m_Origin + W.m_Translation;
  m_Values.tail<3>() = W.m_Rotation * m_Normal;
}

void VComputeTargetSegmentPlane::ValueJacobian(JacobianRef o_rJacobian) const {
  o_rJacobian.setZero();
  ForEachDerivative([&](Eigen::Index c, const Matrix3r& dR, const Eigen::Vector3d& dT) {
    o_rJacobian.col(c).head<3>() += dR * m_Origin + dT;
    o_rJacobian.col(c).segment<3>(3) += dR * m_Normal;
  });
}

void VComputeTargetSegmentPlane::Residual(ConstView observation, View o_rResidual) const {
  o_rResidual[0] = m_Scale * m_Values.tail<3>().dot(Point(observation) - m_Values.head<3>());
}

void VComputeTargetSegmentPlane::ResidualJacobian(ConstView observation,
                                                  JacobianRef o_rJacobian) const {
  o_rJacobian.setZero();
  const Eigen::Vector3d offset = Point(observation) - m_Values.head<3>();
  const Eigen::Vector3d n = m_Values.tail<3>();
  ForEachDerivative([&](Eigen::Index c, const Matrix3r& dR, const Eigen::Vector3d& dT) {
    o_rJacobian(0, c) += m_Scale * ((dR * m_Normal).dot(offset) - n.dot(dR * m_Origin + dT));
  });
}

// --- Ray ----------------------------------------------------------------------------------

VComputeTargetSegmentRay::VComputeTargetSegmentRay(const VTargetSegmentRay& target,
                                                   const VComputeSegment* parent)
    : VComputeTargetSingleParent(target, parent, "VComputeTargetSegmentRay", 6),
      m_Origin(target.PositionInParent()), m_Direction(target.DirectionInParent().normalized()) {
  // Two unit rows across the direction, from the axis least aligned with it.
  Eigen::Index least;
  m_Direction.cwiseAbs().minCoeff(&least);
  const Eigen::Vector3d u = m_Direction.cross(Eigen::Vector3d::Unit(least)).normalized();
  const Eigen::Vector3d v = m_Direction.cross(u);
  m_Across.row(0) = u.transpose();
  m_Across.row(1) = v.transpose();
  const Eigen::MatrixXd& c = target.ResidualCovariance();
  if (c.rows() == 2 && c.cols() == 2) m_Across = InverseRoot<2>(c, 1e-10) * m_Across;
  m_Values << m_Origin, m_Direction;
}

void VComputeTargetSegmentRay::Update() {
  if (!m_pParent) return;
  const VPose& W = m_pParent->WorldPose();
  m_Values.head<3>() = W.m_Rotation * m_Origin + W.m_Translation;
  m_Values.tail<3>() = W.m_Rotation * m_Direction;
}

void VComputeTargetSegmentRay::ValueJacobian(JacobianRef o_rJacobian) const {
  o_rJacobian.setZero();
  ForEachDerivative([&](Eigen::Index c, const Matrix3r& dR, const Eigen::Vector3d& dT) {
    o_rJacobian.col(c).head<3>() += dR * m_Origin + dT;
    o_rJacobian.col(c).segment<3>(3) += dR * m_Direction;
  });
}

void VComputeTargetSegmentRay::Residual(ConstView observation, View o_rResidual) const {
  const Eigen::Vector2d r =
      m_Across * (ParentPose().m_Rotation.transpose() * (Point(observation) - m_Values.head<3>()));
  o_rResidual[0] = r[0];
  o_rResidual[1] = r[1];
}

void VComputeTargetSegmentRay::ResidualJacobian(ConstView observation,
                                                JacobianRef o_rJacobian) const {
  o_rJacobian.setZero();
  const Eigen::Vector3d offset = Point(observation) - m_Values.head<3>();
  const Matrix3r Rt = ParentPose().m_Rotation.transpose();
  ForEachDerivative([&](Eigen::Index c, const Matrix3r& dR, const Eigen::Vector3d& dT) {
    o_rJacobian.col(c).head<2>() +=
        m_Across * (dR.transpose() * offset - Rt * (dR * m_Origin + dT));
  });
}

// --- Direction ----------------------------------------------------------------------------

VComputeTargetDirection::VComputeTargetDirection(const VTargetDirection& target,
                                                 const VComputeSegment* parent)
    : VComputeTargetSingleParent(target, parent, "VComputeTargetDirection", 3),
      m_Direction(target.DirectionInParent().normalized()) {
  m_Values = m_Direction;
}

void VComputeTargetDirection::Update() {
  if (m_pParent) m_Values = m_pParent->WorldPose().m_Rotation * m_Direction;
}

void VComputeTargetDirection::ValueJacobian(JacobianRef o_rJacobian) const {
  o_rJacobian.setZero();
  ForEachDerivative([&](Eigen::Index c, const Matrix3r& dR, const Eigen::Vector3d&) {
    o_rJacobian.col(c).head<3>() += dR * m_Direction;
  });
}

void VComputeTargetDirection::Residual(ConstView observation, View o_rResidual) const {
  Eigen::Map<Eigen::Vector3d>(o_rResidual.data()) = m_Values - Point(observation);
}

// --- Orientation --------------------------------------------------------------------------

VComputeTargetOrientation::VComputeTargetOrientation(const VTargetOrientation& target,
                                                     const VComputeSegment* parent)
    : VComputeTargetSingleParent(target, parent, "VComputeTargetOrientation", 9),
      m_Orientation(target.OrientationInParent()) {
  Update();
}

void VComputeTargetOrientation::Update() {
  using RowMajor = Eigen::Matrix<double, 3, 3, Eigen::RowMajor>;
  Eigen::Map<RowMajor>(m_Values.data()) = ParentPose().m_Rotation * m_Orientation;
}

void VComputeTargetOrientation::ValueJacobian(JacobianRef o_rJacobian) const {
  o_rJacobian.setZero();
  ForEachDerivative([&](Eigen::Index c, const Matrix3r& dR, const Eigen::Vector3d&) {
    const Eigen::Matrix3d d = dR * m_Orientation;
    for (int r = 0; r < 3; ++r)
      o_rJacobian.col(c).segment<3>(3 * r) += d.row(r).transpose();
  });
}

void VComputeTargetOrientation::Residual(ConstView observation, View o_rResidual) const {
  for (int i = 0; i < 9; ++i)
    o_rResidual[size_t(i)] = m_Values[i] - observation[size_t(i)];
}

// --- Rigid body ---------------------------------------------------------------------------

VComputeRigidBody::VComputeRigidBody(const VTargetRigidBody& target, const VComputeSegment* parent)
    : VComputeTargetSingleParent(target, parent, "VComputeRigidBody",
                                 3 * Eigen::Index(target.NumMembers())) {
  const VPose& B = target.BodyPoseInParent();
  for (std::uint32_t i = 0; i < target.NumMembers(); ++i)
    m_Points.push_back(B.m_Rotation * target.Member(i).PositionInParent() + B.m_Translation);
  m_Weights.assign(m_Points.size(), 1.0);
  for (size_t i = 0; i < m_Points.size(); ++i)
    m_Values.segment<3>(Eigen::Index(3 * i)) = m_Points[i];
}

void VComputeRigidBody::Update() {
  if (!m_pParent) return;
  const VPose& W = m_pParent->WorldPose();
  for (size_t i = 0; i < m_Points.size(); ++i)
    m_Values.segment<3>(Eigen::Index(3 * i)) = W.m_Rotation * m_Points[i] + W.m_Translation;
}

void VComputeRigidBody::ValueJacobian(JacobianRef o_rJacobian) const {
  o_rJacobian.setZero();
  ForEachDerivative([&](Eigen::Index c, const Matrix3r& dR, const Eigen::Vector3d& dT) {
    for (size_t i = 0; i < m_Points.size(); ++i)
      o_rJacobian.col(c).segment<3>(Eigen::Index(3 * i)) += dR * m_Points[i] + dT;
  });
}

std::uint32_t VComputeRigidBody::NumResiduals() const {
  std::uint32_t present = 0;
  for (double w : m_Weights)
    present += w != 0.0;
  return 3 * present;
}

void VComputeRigidBody::Residual(ConstView observation, View o_rResidual) const {
  size_t row = 0;
  for (size_t i = 0; i < m_Points.size(); ++i) {
    if (m_Weights[i] == 0.0) continue;
    for (size_t k = 0; k < 3; ++k)
      o_rResidual[row + k] =
          m_Weights[i] * (m_Values[Eigen::Index(3 * i + k)] - observation[3 * i + k]);
    row += 3;
  }
}

void VComputeRigidBody::ResidualJacobian(ConstView, JacobianRef o_rJacobian) const {
  o_rJacobian.setZero();
  ForEachDerivative([&](Eigen::Index c, const Matrix3r& dR, const Eigen::Vector3d& dT) {
    Eigen::Index row = 0;
    for (size_t i = 0; i < m_Points.size(); ++i) {
      if (m_Weights[i] == 0.0) continue;
      o_rJacobian.col(c).segment<3>(row) += m_Weights[i] * (dR * m_Points[i] + dT);
      row += 3;
    }
  });
}

// --- Factory ------------------------------------------------------------------------------

// --- World plane ---------------------------------------------------------------------------

VComputeTargetPlane::VComputeTargetPlane(const VTargetPlane& target, const VComputeSegment* parent)
    : VComputeTargetSingleParent(target, parent, "VComputeTargetPlane", 3),
      m_Local(target.PositionInParent()), m_Normal(target.WorldNormal().normalized()),
      m_Offset(target.WorldOffset()) {
  m_Values = m_Local;
}

void VComputeTargetPlane::Update() {
  if (!m_pParent) return;
  const VPose& W = m_pParent->WorldPose();
  m_Values = W.m_Rotation * m_Local + W.m_Translation;
}

void VComputeTargetPlane::ValueJacobian(JacobianRef o_rJacobian) const {
  o_rJacobian.setZero();
  ForEachDerivative([&](Eigen::Index c, const Matrix3r& dR, const Eigen::Vector3d& dT) {
    o_rJacobian.col(c).head<3>() += dR * m_Local + dT;
  });
}

void VComputeTargetPlane::Residual(ConstView, View o_rResidual) const {
  o_rResidual[0] = m_Normal.dot(m_Values.head<3>()) - m_Offset;
}

void VComputeTargetPlane::ResidualJacobian(ConstView, JacobianRef o_rJacobian) const {
  o_rJacobian.setZero();
  ForEachDerivative([&](Eigen::Index c, const Matrix3r& dR, const Eigen::Vector3d& dT) {
    o_rJacobian(0, c) += m_Normal.dot(dR * m_Local + dT);
  });
}

void VComputeTargetPlane::Rebind(const VComputeSegment* parent) {
  *this = VComputeTargetPlane(static_cast<const VTargetPlane&>(*m_pTarget), parent);
}

// --- Relative position ---------------------------------------------------------------------

VComputeTargetRelativePosition::VComputeTargetRelativePosition(
    const VTargetRelativePosition& target, const VComputeSegment* first,
    const VComputeSegment* second)
    : m_pTarget(&target) {
  Rebind(first, second);
}

void VComputeTargetRelativePosition::Rebind(const VComputeSegment* first,
                                            const VComputeSegment* second) {
  m_Local = {m_pTarget->PositionInParent1(), m_pTarget->PositionInParent2()};
  m_Parents = {first, second};
  if (!first || !second) m_Parents = {nullptr, nullptr};
  m_Errors = m_Parents[0] ? "" : "VComputeTargetRelativePosition cannot find segment. ";
  m_Values.setZero();
}

void VComputeTargetRelativePosition::Update() {
  if (!m_Parents[0]) return;
  const VPose& A = m_Parents[0]->WorldPose();
  const VPose& B = m_Parents[1]->WorldPose();
  m_Values =
      (A.m_Rotation * m_Local[0] + A.m_Translation) - (B.m_Rotation * m_Local[1] + B.m_Translation);
}

void VComputeTargetRelativePosition::ValueJacobian(JacobianRef o_rJacobian) const {
  o_rJacobian.setZero();
  if (!m_Parents[0]) return;
  // Blocks of both chains add up where they share ancestors.
  for (int k = 0; k < 2; ++k) {
    const double sign = k ? -1.0 : 1.0;
    const auto& blocks = m_Parents[size_t(k)]->JacobianBlocks();
    for (std::uint32_t b = 0; b < m_Parents[size_t(k)]->NumJacobianBlocks(); ++b)
      for (std::uint32_t i = 0; i < blocks[b].m_NumParams; ++i)
        o_rJacobian.col(Eigen::Index(blocks[b].m_FirstParam + i)).head<3>() +=
            sign * (blocks[b].m_dR[i] * m_Local[size_t(k)] + blocks[b].m_dT[i]);
  }
}

void VComputeTargetRelativePosition::Residual(ConstView observation, View o_rResidual) const {
  Eigen::Map<Eigen::Vector3d>(o_rResidual.data()) = m_Values - Point(observation);
}

// Each run-time target re-reads its model target by being built again in place; the model
// target's class is the one it was made from.
void VComputeTargetPosition::Rebind(const VComputeSegment* parent) {
  *this = VComputeTargetPosition(*m_pTarget, parent);
}
void VComputeTargetSegmentPlane::Rebind(const VComputeSegment* parent) {
  *this = VComputeTargetSegmentPlane(static_cast<const VTargetSegmentPlane&>(*m_pTarget), parent);
}
void VComputeTargetSegmentRay::Rebind(const VComputeSegment* parent) {
  *this = VComputeTargetSegmentRay(static_cast<const VTargetSegmentRay&>(*m_pTarget), parent);
}
void VComputeTargetDirection::Rebind(const VComputeSegment* parent) {
  *this = VComputeTargetDirection(static_cast<const VTargetDirection&>(*m_pTarget), parent);
}
void VComputeTargetOrientation::Rebind(const VComputeSegment* parent) {
  *this = VComputeTargetOrientation(static_cast<const VTargetOrientation&>(*m_pTarget), parent);
}
void VComputeRigidBody::Rebind(const VComputeSegment* parent) {
  std::vector<double> weights = std::move(m_Weights);
  *this = VComputeRigidBody(static_cast<const VTargetRigidBody&>(*m_pTarget), parent);
  if (weights.size() == m_Weights.size()) m_Weights = std::move(weights);
}

std::unique_ptr<IComputeTarget> MakeComputeTarget(const ITargetCalibrated& target,
                                                  const VComputeSegment* parent) {
  const char* key = target.Key();
  const auto is = [key](const char* k) { return std::strcmp(key, k) == 0; };
  if (is("TargetPosition") || is("TargetPositionWithCovariance"))
    return std::make_unique<VComputeTargetPosition>(target, parent);
  if (const auto* plane = dynamic_cast<const VTargetSegmentPlane*>(&target))
    return std::make_unique<VComputeTargetSegmentPlane>(*plane, parent);
  if (const auto* ray = dynamic_cast<const VTargetSegmentRay*>(&target))
    return std::make_unique<VComputeTargetSegmentRay>(*ray, parent);
  if (const auto* direction = dynamic_cast<const VTargetDirection*>(&target))
    return std::make_unique<VComputeTargetDirection>(*direction, parent);
  if (const auto* orientation = dynamic_cast<const VTargetOrientation*>(&target))
    return std::make_unique<VComputeTargetOrientation>(*orientation, parent);
  if (const auto* plane = dynamic_cast<const VTargetPlane*>(&target))
    return std::make_unique<VComputeTargetPlane>(*plane, parent);
  if (const auto* body = dynamic_cast<const VTargetRigidBody*>(&target))
    return std::make_unique<VComputeRigidBody>(*body, parent);
  return nullptr;
}

} // namespace ComputeSubject
