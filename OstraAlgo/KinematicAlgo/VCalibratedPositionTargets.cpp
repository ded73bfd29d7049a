#include "OstraAlgo/KinematicAlgo/VCalibratedPositionTargets.h"

#include "OstraAlgo/KinematicAlgo/CalibratedText.h"

#include <algorithm>
#include <ostream>

namespace KinematicAlgo {

// --- Equality -----------------------------------------------------------------------------

bool VTargetPositionWithRange::Equals(const ITargetCalibrated& o) const {
  const auto* other = dynamic_cast<const ITargetRange*>(&o);
  return other && VTargetPosition::Equals(o) && m_Range == other->Range();
}

bool VTargetPositionCovarianceRange::Equals(const ITargetCalibrated& o) const {
  const auto* other = dynamic_cast<const VTargetPositionCovarianceRange*>(&o);
  return other && VTargetPositionWithCovariance::Equals(o) && m_Mean == other->m_Mean &&
         m_Range == other->m_Range;
}

bool VTargetPositionCovarianceRangeNormal::Equals(const ITargetCalibrated& o) const {
  const auto* other = dynamic_cast<const VTargetPositionCovarianceRangeNormal*>(&o);
  return other && VTargetPositionCovarianceRange::Equals(o) && m_Normal == other->m_Normal &&
         m_NormalValue == other->m_NormalValue;
}

bool VTargetPositionCovarianceDescriptor::Equals(const ITargetCalibrated& o) const {
  const auto* other = dynamic_cast<const VTargetPositionCovarianceDescriptor*>(&o);
  return other && VTargetPositionWithCovariance::Equals(o) &&
         m_Descriptor.size() == other->m_Descriptor.size() && m_Descriptor == other->m_Descriptor;
}

bool VTargetCentreOfMass::Equals(const ITargetCalibrated& o) const {
  const auto* other = dynamic_cast<const VTargetCentreOfMass*>(&o);
  return other && VTargetPosition::Equals(o) && m_Terms == other->m_Terms;
}

// --- Text ---------------------------------------------------------------------------------

void VTargetPositionWithRange::Write(std::ostream& o) const {
  VTargetPosition::Write(o);
  Text::Matrix3(o, "RangeOfPos: ", m_Range);
}

bool VTargetPositionWithRange::Read(VTextReader& r) {
  return VTargetPosition::Read(r) && r.Matrix3("RangeOfPos: ", m_Range);
}

void VTargetPositionCovarianceRange::Write(std::ostream& o) const {
  VTargetPosition::Write(o);
  Text::Numbers(o, "MeanPos: ", m_Mean.data(), 3);
  o << '\n';
  Text::Matrix3(o, "CovariancePos: ", Covariance());
  Text::Matrix3(o, "RangePos: ", m_Range);
}

bool VTargetPositionCovarianceRange::Read(VTextReader& r) {
  Eigen::Matrix3d covariance;
  if (!VTargetPosition::Read(r) || !r.Label("MeanPos: ") || !r.Numbers(m_Mean.data(), 3) ||
      !r.Matrix3("CovariancePos: ", covariance) || !r.Matrix3("RangePos: ", m_Range))
    return false;
  SetCovariance(covariance);
  return true;
}

void VTargetPositionCovarianceRangeNormal::Write(std::ostream& o) const {
  VTargetPositionCovarianceRange::Write(o);
  const double normal[] = {m_Normal[0], m_Normal[1], m_Normal[2], m_NormalValue};
  Text::Numbers(o, "ViewNormal: ", normal, 4);
  o << '\n';
}

bool VTargetPositionCovarianceRangeNormal::Read(VTextReader& r) {
  double normal[4];
  if (!VTargetPositionCovarianceRange::Read(r) || !r.Label("ViewNormal: ") || !r.Numbers(normal, 4))
    return false;
  SetViewNormal(Eigen::Vector3d(normal[0], normal[1], normal[2]), normal[3]);
  return true;
}

void VTargetPositionCovarianceDescriptor::Write(std::ostream& o) const {
  VTargetPositionWithCovariance::Write(o);
  o << "DescriptorSize: " << m_Descriptor.size() << '\n';
  Text::Numbers(o, "Descriptor: ", m_Descriptor.data(), size_t(m_Descriptor.size()));
  o << '\n';
}

bool VTargetPositionCovarianceDescriptor::Read(VTextReader& r) {
  std::uint32_t size = 0;
  // Every number takes two bytes at least: the size is bounded by the text left.
  if (!VTargetPositionWithCovariance::Read(r) || !r.Label("DescriptorSize: ") ||
      !r.Count(size, std::uint32_t(std::min<size_t>(r.Remaining() / 2, UINT32_MAX)),
               "DescriptorSize"))
    return false;
  Eigen::VectorXd descriptor(size);
  if (!r.Label("Descriptor: ") || !r.Numbers(descriptor.data(), size)) return false;
  m_Descriptor = std::move(descriptor);
  return true;
}

void VTargetCentreOfMass::Write(std::ostream& o) const {
  VTargetPosition::Write(o);
  o << "NumTerms: " << m_Terms.size() << '\n';
  for (const VCentreOfMassTerm& term : m_Terms) {
    o << "ParentID: " << term.m_Parent;
    Text::Numbers(o, " PosInParent: ", term.m_Position.data(), 3);
    Text::Numbers(o, " Weight: ", &term.m_Weight, 1);
    o << '\n';
  }
}

bool VTargetCentreOfMass::Read(VTextReader& r) {
  std::uint32_t count = 0;
  if (!VTargetPosition::Read(r) || !r.Label("NumTerms: ") ||
      !r.Count(count, std::uint32_t(std::min<size_t>(r.Remaining(), UINT32_MAX)), "NumTerms"))
    return false;
  std::vector<VCentreOfMassTerm> terms;
  for (std::uint32_t i = 0; i < count; ++i) {
    VCentreOfMassTerm term;
    if (!r.Label("ParentID: ") || !r.UInt(term.m_Parent) || !r.Label(" PosInParent: ") ||
        !r.Numbers(term.m_Position.data(), 3) || !r.Label(" Weight: ") || !r.Number(term.m_Weight))
      return false;
    terms.push_back(term);
  }
  m_Terms = std::move(terms);
  return true;
}

} // namespace KinematicAlgo
