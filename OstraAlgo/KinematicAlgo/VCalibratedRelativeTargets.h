#pragma once
// Targets between two segments beyond the relative position: the rotation of one segment's
// frame relative to another's, and a ray fixed in one segment aimed at a point fixed in another.

#include "OstraAlgo/KinematicAlgo/VCalibratedTargets.h"

namespace KinematicAlgo {

/// A rotation fixed in each of two segments: "TargetRelativeOrientation". The run-time target
/// compares the first with the second. The points of the two parents are unused (zero).
class VTargetRelativeOrientation : public VTargetBetweenSegments {
public:
  std::shared_ptr<ITargetCalibrated> Clone() const override {
    return std::make_shared<VTargetRelativeOrientation>(*this);
  }
  bool Equals(const ITargetCalibrated& other) const override;
  const char* Key() const override { return "TargetRelativeOrientation"; }
  const Eigen::Matrix3d& OrientationInParent1() const { return m_Orientations[0]; }
  const Eigen::Matrix3d& OrientationInParent2() const { return m_Orientations[1]; }
  void SetOrientationsInParents(const Eigen::Matrix3d& first, const Eigen::Matrix3d& second) {
    m_Orientations = {first, second};
  }
  void Write(std::ostream& o_rStream) const override;
  bool Read(VTextReader& io_rReader) override;

private:
  std::array<Eigen::Matrix3d, 2> m_Orientations{Eigen::Matrix3d::Identity(),
                                                Eigen::Matrix3d::Identity()};
};

/// A ray from PositionInParent1() along DirectionInParent() in the first segment, and a point
/// PositionInParent2() in the second that should lie on it: "TargetRelativeRay".
class VTargetRelativeRay : public VTargetBetweenSegments, public ITargetDirection {
public:
  std::shared_ptr<ITargetCalibrated> Clone() const override {
    return std::make_shared<VTargetRelativeRay>(*this);
  }
  bool Equals(const ITargetCalibrated& other) const override;
  const char* Key() const override { return "TargetRelativeRay"; }
  /// The ray's direction in the first parent; the run-time target normalises it.
  const Eigen::Vector3d& DirectionInParent() const override { return m_Direction; }
  void SetDirectionInParent(const Eigen::Vector3d& direction) override { m_Direction = direction; }
  void Write(std::ostream& o_rStream) const override;
  bool Read(VTextReader& io_rReader) override;

private:
  Eigen::Vector3d m_Direction = Eigen::Vector3d::UnitZ();
};

} // namespace KinematicAlgo
