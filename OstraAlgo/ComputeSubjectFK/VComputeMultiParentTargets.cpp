#include "OstraAlgo/ComputeSubjectFK/VComputeMultiParentTargets.h"

#include <cmath>
#include <cstring>

namespace ComputeSubject {

using namespace KinematicAlgo;

namespace {
Eigen::Vector3d Point(ConstView v) {
  return Eigen::Vector3d(v[0], v[1], v[2]);
}
Eigen::Vector3d World(const VPose& W, const Eigen::Vector3d& local) {
  return W.m_Rotation * local + W.m_Translation;
}
bool SameKey(const ITargetCalibrated& a, const ITargetCalibrated& b) {
  return std::strcmp(a.Key(), b.Key()) == 0;
}
} // namespace

// --- Relative position ---------------------------------------------------------------------

VComputeTargetRelativePosition::VComputeTargetRelativePosition(
    const VTargetRelativePosition& target, const SegmentLookup& lookup)
    : VComputeTargetMultiParent(target, 3) {
  Rebind(lookup);
}

void VComputeTargetRelativePosition::Rebind(const SegmentLookup& lookup) {
  const auto& target = static_cast<const VTargetRelativePosition&>(*m_pTarget);
  m_Ids = {target.ParentIdentifier1(), target.ParentIdentifier2()};
  m_Local = {target.PositionInParent1(), target.PositionInParent2()};
  Bind({lookup(m_Ids[0]), lookup(m_Ids[1])},
       [](size_t) { return "VComputeTargetRelativePosition cannot find segment. "; });
}

void VComputeTargetRelativePosition::Update() {
  if (!IsBound()) return;
  m_Values =
      World(m_Parents[0]->WorldPose(), m_Local[0]) - World(m_Parents[1]->WorldPose(), m_Local[1]);
}

void VComputeTargetRelativePosition::ValueJacobian(JacobianRef o_rJacobian) const {
  o_rJacobian.setZero();
  if (!IsBound()) return;
  for (size_t k = 0; k < 2; ++k) {
    const double sign = k ? -1.0 : 1.0;
    ForEachDerivative(k, [&](Eigen::Index c, const Matrix3r& dR, const Eigen::Vector3d& dT) {
      o_rJacobian.col(c).head<3>() += sign * (dR * m_Local[k] + dT);
    });
  }
}

void VComputeTargetRelativePosition::Residual(ConstView observation, View o_rResidual) const {
  Eigen::Map<Eigen::Vector3d>(o_rResidual.data()) = m_Values - Point(observation);
}

bool VComputeTargetRelativePosition::WriteToModel(ITargetCalibrated& o_rTarget) const {
  auto* target = dynamic_cast<VTargetRelativePosition*>(&o_rTarget);
  if (!target || !SameKey(o_rTarget, *m_pTarget)) return false;
  target->SetParentIdentifiers(m_Ids[0], m_Ids[1]);
  target->SetPositionsInParents(m_Local[0], m_Local[1]);
  return true;
}

// --- Relative orientation ------------------------------------------------------------------

VComputeTargetRelativeOrientation::VComputeTargetRelativeOrientation(
    const VTargetRelativeOrientation& target, const SegmentLookup& lookup)
    : VComputeTargetMultiParent(target, 9) {
  Rebind(lookup);
}

void VComputeTargetRelativeOrientation::Rebind(const SegmentLookup& lookup) {
  const auto& target = static_cast<const VTargetRelativeOrientation&>(*m_pTarget);
  m_Ids = {target.ParentIdentifier1(), target.ParentIdentifier2()};
  m_Local = {target.PositionInParent1(), target.PositionInParent2()};
  m_Orientation = {target.OrientationInParent1(), target.OrientationInParent2()};
  Bind({lookup(m_Ids[0]), lookup(m_Ids[1])},
       [](size_t) { return "VComputeTargetRelativeOrientation cannot find segment. "; });
}

void VComputeTargetRelativeOrientation::Update() {
  if (!IsBound()) return;
  const Eigen::Matrix3d first = m_Parents[0]->WorldPose().m_Rotation * m_Orientation[0];
  const Eigen::Matrix3d second = m_Parents[1]->WorldPose().m_Rotation * m_Orientation[1];
  Eigen::Map<Eigen::Matrix<double, 3, 3, Eigen::RowMajor>>(m_Values.data()) =
      second.transpose() * first;
}

void VComputeTargetRelativeOrientation::ValueJacobian(JacobianRef o_rJacobian) const {
  o_rJacobian.setZero();
  if (!IsBound()) return;
  const Eigen::Matrix3d first = m_Parents[0]->WorldPose().m_Rotation * m_Orientation[0];
  const Eigen::Matrix3d second = m_Parents[1]->WorldPose().m_Rotation * m_Orientation[1];
  const auto add = [&](Eigen::Index c, const Eigen::Matrix3d& d) {
    for (int r = 0; r < 3; ++r)
      o_rJacobian.col(c).segment<3>(3 * r) += d.row(r).transpose();
  };
  ForEachDerivative(0, [&](Eigen::Index c, const Matrix3r& dR, const Eigen::Vector3d&) {
    add(c, second.transpose() * (dR * m_Orientation[0]));
  });
  ForEachDerivative(1, [&](Eigen::Index c, const Matrix3r& dR, const Eigen::Vector3d&) {
    add(c, (dR * m_Orientation[1]).transpose() * first);
  });
}

void VComputeTargetRelativeOrientation::Residual(ConstView observation, View o_rResidual) const {
  for (size_t i = 0; i < 9; ++i)
    o_rResidual[i] = m_Values[Eigen::Index(i)] - observation[i];
}

bool VComputeTargetRelativeOrientation::WriteToModel(ITargetCalibrated& o_rTarget) const {
  auto* target = dynamic_cast<VTargetRelativeOrientation*>(&o_rTarget);
  if (!target || !SameKey(o_rTarget, *m_pTarget)) return false;
  target->SetParentIdentifiers(m_Ids[0], m_Ids[1]);
  target->SetPositionsInParents(m_Local[0], m_Local[1]);
  target->SetOrientationsInParents(m_Orientation[0], m_Orientation[1]);
  return true;
}

// --- Relative ray --------------------------------------------------------------------------

VComputeTargetRelativeRay::VComputeTargetRelativeRay(const VTargetRelativeRay& target,
                                                     const SegmentLookup& lookup)
    : VComputeTargetMultiParent(target, 9) {
  Rebind(lookup);
}

void VComputeTargetRelativeRay::Rebind(const SegmentLookup& lookup) {
  const auto& target = static_cast<const VTargetRelativeRay&>(*m_pTarget);
  m_Ids = {target.ParentIdentifier1(), target.ParentIdentifier2()};
  m_Local = {target.PositionInParent1(), target.PositionInParent2()};
  m_ModelDirection = target.DirectionInParent();
  m_Direction = m_ModelDirection.normalized();
  m_Across = AcrossRows(m_Direction);
  Bind({lookup(m_Ids[0]), lookup(m_Ids[1])}, [](size_t k) {
    return k ? "VComputeTargetRelativeRay cannot find segment 2. "
             : "VComputeTargetRelativeRay cannot find segment 1. ";
  });
}

void VComputeTargetRelativeRay::Update() {
  if (!IsBound()) return;
  const VPose& A = m_Parents[0]->WorldPose();
  m_Values << World(A, m_Local[0]), A.m_Rotation * m_Direction,
      World(m_Parents[1]->WorldPose(), m_Local[1]);
}

void VComputeTargetRelativeRay::ValueJacobian(JacobianRef o_rJacobian) const {
  o_rJacobian.setZero();
  if (!IsBound()) return;
  ForEachDerivative(0, [&](Eigen::Index c, const Matrix3r& dR, const Eigen::Vector3d& dT) {
    o_rJacobian.col(c).head<3>() += dR * m_Local[0] + dT;
    o_rJacobian.col(c).segment<3>(3) += dR * m_Direction;
  });
  ForEachDerivative(1, [&](Eigen::Index c, const Matrix3r& dR, const Eigen::Vector3d& dT) {
    o_rJacobian.col(c).segment<3>(6) += dR * m_Local[1] + dT;
  });
}

void VComputeTargetRelativeRay::Residual(ConstView, View o_rResidual) const {
  const Matrix3r R =
      IsBound() ? m_Parents[0]->WorldPose().m_Rotation : Matrix3r(Matrix3r::Identity());
  const Eigen::Vector2d r = m_Across * (R.transpose() * (m_Values.tail<3>() - m_Values.head<3>()));
  o_rResidual[0] = r[0];
  o_rResidual[1] = r[1];
}

void VComputeTargetRelativeRay::ResidualJacobian(ConstView, JacobianRef o_rJacobian) const {
  o_rJacobian.setZero();
  if (!IsBound()) return;
  const Matrix3r Rt = m_Parents[0]->WorldPose().m_Rotation.transpose();
  const Eigen::Vector3d offset = m_Values.tail<3>() - m_Values.head<3>();
  // The ray's segment moves both the origin and the axes the offset is measured in.
  ForEachDerivative(0, [&](Eigen::Index c, const Matrix3r& dR, const Eigen::Vector3d& dT) {
    o_rJacobian.col(c).head<2>() +=
        m_Across * (dR.transpose() * offset - Rt * (dR * m_Local[0] + dT));
  });
  ForEachDerivative(1, [&](Eigen::Index c, const Matrix3r& dR, const Eigen::Vector3d& dT) {
    o_rJacobian.col(c).head<2>() += m_Across * (Rt * (dR * m_Local[1] + dT));
  });
}

bool VComputeTargetRelativeRay::WriteToModel(ITargetCalibrated& o_rTarget) const {
  auto* target = dynamic_cast<VTargetRelativeRay*>(&o_rTarget);
  if (!target || !SameKey(o_rTarget, *m_pTarget)) return false;
  target->SetParentIdentifiers(m_Ids[0], m_Ids[1]);
  target->SetPositionsInParents(m_Local[0], m_Local[1]);
  target->SetDirectionInParent(m_ModelDirection);
  return true;
}

// --- Centre of mass ------------------------------------------------------------------------

VComputeTargetCentreOfMass::VComputeTargetCentreOfMass(const VTargetCentreOfMass& target,
                                                       const SegmentLookup& lookup)
    : VComputeTargetMultiParent(target, 3) {
  Rebind(lookup);
}

void VComputeTargetCentreOfMass::Rebind(const SegmentLookup& lookup) {
  const auto& target = static_cast<const VTargetCentreOfMass&>(*m_pTarget);
  m_HeaderParent = target.ParentIdentifier();
  m_HeaderPosition = target.PositionInParent();
  m_Terms = target.Terms();
  std::vector<const VComputeSegment*> parents;
  double total = 0.0;
  for (const VCentreOfMassTerm& term : m_Terms) {
    parents.push_back(lookup(term.m_Parent));
    total += term.m_Weight;
  }
  Bind(parents, [](size_t) { return "VComputeTargetCentreOfMass cannot find segment "; });
  m_Share.clear();
  for (const VCentreOfMassTerm& term : m_Terms)
    m_Share.push_back(term.m_Weight / total);
  if (!(total != 0.0) || !std::isfinite(total)) {
    m_Errors += "VComputeTargetCentreOfMass has no weight ";
    m_Parents.clear();
  }
}

void VComputeTargetCentreOfMass::Update() {
  if (!IsBound()) return;
  m_Values.setZero();
  for (size_t i = 0; i < m_Terms.size(); ++i)
    m_Values += m_Share[i] * World(m_Parents[i]->WorldPose(), m_Terms[i].m_Position);
}

void VComputeTargetCentreOfMass::ValueJacobian(JacobianRef o_rJacobian) const {
  o_rJacobian.setZero();
  if (!IsBound()) return;
  for (size_t i = 0; i < m_Terms.size(); ++i)
    ForEachDerivative(i, [&](Eigen::Index c, const Matrix3r& dR, const Eigen::Vector3d& dT) {
      o_rJacobian.col(c).head<3>() += m_Share[i] * (dR * m_Terms[i].m_Position + dT);
    });
}

void VComputeTargetCentreOfMass::Residual(ConstView observation, View o_rResidual) const {
  Eigen::Map<Eigen::Vector3d>(o_rResidual.data()) = m_Values - Point(observation);
}

bool VComputeTargetCentreOfMass::WriteToModel(ITargetCalibrated& o_rTarget) const {
  auto* target = dynamic_cast<VTargetCentreOfMass*>(&o_rTarget);
  if (!target || !SameKey(o_rTarget, *m_pTarget)) return false;
  target->SetParentIdentifier(m_HeaderParent);
  target->SetPositionInParent(m_HeaderPosition);
  target->SetTerms(m_Terms);
  return true;
}

// --- Factory -------------------------------------------------------------------------------

std::unique_ptr<IComputeTarget> MakeComputeTarget(const ITargetCalibrated& target,
                                                  const SegmentLookup& lookup) {
  if (const auto* com = dynamic_cast<const VTargetCentreOfMass*>(&target))
    return std::make_unique<VComputeTargetCentreOfMass>(*com, lookup);
  if (const auto* ray = dynamic_cast<const VTargetRelativeRay*>(&target))
    return std::make_unique<VComputeTargetRelativeRay>(*ray, lookup);
  if (const auto* orientation = dynamic_cast<const VTargetRelativeOrientation*>(&target))
    return std::make_unique<VComputeTargetRelativeOrientation>(*orientation, lookup);
  if (const auto* position = dynamic_cast<const VTargetRelativePosition*>(&target))
    return std::make_unique<VComputeTargetRelativePosition>(*position, lookup);
  if (const auto* single = dynamic_cast<const ITargetSingleParent*>(&target))
    return MakeComputeTarget(target, lookup(single->ParentIdentifier()));
  return nullptr;
}

} // namespace ComputeSubject
