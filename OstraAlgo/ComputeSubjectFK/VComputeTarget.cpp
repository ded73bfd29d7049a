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
  if (const auto* single = dynamic_cast<const ITargetSingleParent*>(&target))
    m_ParentId = single->ParentIdentifier();
  if (const auto* direction = dynamic_cast<const ITargetDirection*>(&target))
    m_ModelDirection = direction->DirectionInParent();
  else if (const auto* plane = dynamic_cast<const VTargetPlane*>(&target))
    m_ModelDirection = plane->WorldNormal();
}

ITargetSingleParent*
VComputeTargetSingleParent::WriteParent(ITargetCalibrated& o_rTarget,
                                        const Eigen::Vector3d& position) const {
  auto* single = dynamic_cast<ITargetSingleParent*>(&o_rTarget);
  if (!single || std::strcmp(o_rTarget.Key(), m_pTarget->Key()) != 0) return nullptr;
  single->SetParentIdentifier(m_ParentId);
  single->SetPositionInParent(position);
  return single;
}

Eigen::Matrix<double, 2, 3> AcrossRows(const Eigen::Vector3d& direction) {
  Eigen::Index least;
  direction.cwiseAbs().minCoeff(&least);
  const Eigen::Vector3d u = direction.cross(Eigen::Vector3d::Unit(least)).normalized();
  Eigen::Matrix<double, 2, 3> across;
  across.row(0) = u.transpose();
  across.row(1) = direction.cross(u).transpose();
  return across;
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
  const Eigen::MatrixXd& c = m_ResidualCovariance = target.ResidualCovariance();
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
  m_Across = AcrossRows(m_Direction);
  const Eigen::MatrixXd& c = m_ResidualCovariance = target.ResidualCovariance();
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
  const VPose& B = m_Body = target.BodyPoseInParent();
  for (std::uint32_t i = 0; i < target.NumMembers(); ++i) {
    m_InBody.push_back(target.Member(i).PositionInParent());
    m_Points.push_back(B.m_Rotation * m_InBody.back() + B.m_Translation);
  }
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

// --- Writing back -------------------------------------------------------------------------

bool VComputeTargetPosition::WriteToModel(ITargetCalibrated& o_rTarget) const {
  if (!WriteParent(o_rTarget, m_Local)) return false;
  if (auto* covariance = dynamic_cast<ITargetCovariance3*>(&o_rTarget);
      covariance && m_HasCovariance)
    covariance->SetCovariance(m_Covariance);
  return true;
}

namespace {
bool WriteShape(ITargetSingleParent* o_pTarget, const Eigen::Vector3d& direction,
                const Eigen::MatrixXd& covariance) {
  auto* shaped = dynamic_cast<VTargetPointDirection*>(o_pTarget);
  if (!shaped) return false;
  shaped->SetDirectionInParent(direction);
  shaped->SetResidualCovariance(covariance);
  return true;
}
} // namespace

bool VComputeTargetSegmentPlane::WriteToModel(ITargetCalibrated& o_rTarget) const {
  return WriteShape(WriteParent(o_rTarget, m_Origin), m_ModelDirection, m_ResidualCovariance);
}

bool VComputeTargetSegmentRay::WriteToModel(ITargetCalibrated& o_rTarget) const {
  return WriteShape(WriteParent(o_rTarget, m_Origin), m_ModelDirection, m_ResidualCovariance);
}

bool VComputeTargetDirection::WriteToModel(ITargetCalibrated& o_rTarget) const {
  auto* target = dynamic_cast<VTargetDirection*>(&o_rTarget);
  if (!target || !WriteParent(o_rTarget, target->PositionInParent())) return false;
  target->SetDirectionInParent(m_ModelDirection);
  return true;
}

bool VComputeTargetOrientation::WriteToModel(ITargetCalibrated& o_rTarget) const {
  auto* target = dynamic_cast<VTargetOrientation*>(&o_rTarget);
  if (!target || !WriteParent(o_rTarget, target->PositionInParent())) return false;
  target->SetOrientationInParent(m_Orientation);
  return true;
}

bool VComputeRigidBody::WriteToModel(ITargetCalibrated& o_rTarget) const {
  auto* target = dynamic_cast<VTargetRigidBody*>(&o_rTarget);
  if (!target || target->NumMembers() != m_InBody.size() ||
      !WriteParent(o_rTarget, m_Body.m_Translation))
    return false;
  target->SetBodyPoseInParent(m_Body);
  for (std::uint32_t i = 0; i < target->NumMembers(); ++i) {
    target->MemberPtr(i)->SetParentIdentifier(m_ParentId);
    target->MemberPtr(i)->SetPositionInParent(m_InBody[i]);
  }
  return true;
}

bool VComputeTargetPlane::WriteToModel(ITargetCalibrated& o_rTarget) const {
  auto* target = dynamic_cast<VTargetPlane*>(&o_rTarget);
  if (!target || !WriteParent(o_rTarget, m_Local)) return false;
  target->SetWorldPlane(m_ModelDirection, m_Offset);
  return true;
}

std::unique_ptr<IComputeTarget> MakeComputeTarget(const ITargetCalibrated& target,
                                                  const VComputeSegment* parent) {
  const char* key = target.Key();
  const auto is = [key](const char* k) { return std::strcmp(key, k) == 0; };
  // The labelling forms of the covariance point evaluate as it does; the point with a range
  // alone has no run-time form.
  if (is("TargetPosition") || is("TargetPositionWithCovariance") ||
      is("TargetPositionCovarianceRange") || is("TargetPositionCovarianceRangeNormal") ||
      is("TargetPositionCovarianceDescriptor"))
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
