#pragma once
// Point targets that carry statistics of where their marker was seen (a range ellipsoid, a
// covariance, a view normal, a descriptor), mostly for labelling, and the centre of mass of
// weighted points on several segments. Every vector and matrix is in the parent segment's frame.

#include "OstraAlgo/KinematicAlgo/VCalibratedTargets.h"

namespace KinematicAlgo {

/// A target with a 3x3 range matrix: the covering ellipsoid centre ⊕ root(range) u, |u| <= 1.
class ITargetRange {
public:
  virtual ~ITargetRange() = default;
  virtual const Eigen::Matrix3d& Range() const = 0;
  virtual void SetRange(const Eigen::Matrix3d& range) = 0;
};

/// A target with the normal of the direction it was mostly seen from, and a fourth value that
/// is stored and written only.
class ITargetNormal {
public:
  virtual ~ITargetNormal() = default;
  virtual const Eigen::Vector3d& ViewNormal() const = 0;
  virtual double ViewNormalValue() const = 0;
  virtual void SetViewNormal(const Eigen::Vector3d& normal, double value) = 0;
};

/// A target with a descriptor vector of any size.
class ITargetDescriptor {
public:
  virtual ~ITargetDescriptor() = default;
  virtual const Eigen::VectorXd& Descriptor() const = 0;
  virtual void SetDescriptor(const Eigen::VectorXd& descriptor) = 0;
};

/// A point with a range ellipsoid about it: "TargetPositionWithRange".
class VTargetPositionWithRange : public VTargetPosition, public ITargetRange {
public:
  using VTargetPosition::VTargetPosition;
  std::shared_ptr<ITargetCalibrated> Clone() const override {
    return std::make_shared<VTargetPositionWithRange>(*this);
  }
  bool Equals(const ITargetCalibrated& other) const override;
  const char* Key() const override { return "TargetPositionWithRange"; }
  const Eigen::Matrix3d& Range() const override { return m_Range; }
  void SetRange(const Eigen::Matrix3d& range) override { m_Range = range; }
  void Write(std::ostream& o_rStream) const override;
  bool Read(VTextReader& io_rReader) override;

private:
  Eigen::Matrix3d m_Range = Eigen::Matrix3d::Zero();
};

/// A point with the mean of its observed positions, their covariance and their range:
/// "TargetPositionCovarianceRange". The run-time target uses PositionInParent() and the
/// covariance; the mean and the range are statistics for labelling.
class VTargetPositionCovarianceRange : public VTargetPositionWithCovariance, public ITargetRange {
public:
  using VTargetPositionWithCovariance::VTargetPositionWithCovariance;
  std::shared_ptr<ITargetCalibrated> Clone() const override {
    return std::make_shared<VTargetPositionCovarianceRange>(*this);
  }
  bool Equals(const ITargetCalibrated& other) const override;
  const char* Key() const override { return "TargetPositionCovarianceRange"; }
  const Eigen::Vector3d& MeanPosition() const { return m_Mean; }
  void SetMeanPosition(const Eigen::Vector3d& mean) { m_Mean = mean; }
  const Eigen::Matrix3d& Range() const override { return m_Range; }
  void SetRange(const Eigen::Matrix3d& range) override { m_Range = range; }
  void Write(std::ostream& o_rStream) const override;
  bool Read(VTextReader& io_rReader) override;

private:
  Eigen::Vector3d m_Mean = Eigen::Vector3d::Zero();
  Eigen::Matrix3d m_Range = Eigen::Matrix3d::Zero();
};

/// As the covariance-and-range point, with a view normal: "TargetPositionCovarianceRangeNormal".
class VTargetPositionCovarianceRangeNormal : public VTargetPositionCovarianceRange,
                                             public ITargetNormal {
public:
  using VTargetPositionCovarianceRange::VTargetPositionCovarianceRange;
  std::shared_ptr<ITargetCalibrated> Clone() const override {
    return std::make_shared<VTargetPositionCovarianceRangeNormal>(*this);
  }
  bool Equals(const ITargetCalibrated& other) const override;
  const char* Key() const override { return "TargetPositionCovarianceRangeNormal"; }
  const Eigen::Vector3d& ViewNormal() const override { return m_Normal; }
  double ViewNormalValue() const override { return m_NormalValue; }
  void SetViewNormal(const Eigen::Vector3d& normal, double value) override {
    m_Normal = normal;
    m_NormalValue = value;
  }
  void Write(std::ostream& o_rStream) const override;
  bool Read(VTextReader& io_rReader) override;

private:
  Eigen::Vector3d m_Normal = Eigen::Vector3d::Zero();
  double m_NormalValue = 0.0;
};

/// A point with a covariance and a descriptor vector: "TargetPositionCovarianceDescriptor".
class VTargetPositionCovarianceDescriptor : public VTargetPositionWithCovariance,
                                            public ITargetDescriptor {
public:
  using VTargetPositionWithCovariance::VTargetPositionWithCovariance;
  std::shared_ptr<ITargetCalibrated> Clone() const override {
    return std::make_shared<VTargetPositionCovarianceDescriptor>(*this);
  }
  bool Equals(const ITargetCalibrated& other) const override;
  const char* Key() const override { return "TargetPositionCovarianceDescriptor"; }
  const Eigen::VectorXd& Descriptor() const override { return m_Descriptor; }
  void SetDescriptor(const Eigen::VectorXd& descriptor) override { m_Descriptor = descriptor; }
  void Write(std::ostream& o_rStream) const override;
  bool Read(VTextReader& io_rReader) override;

private:
  Eigen::VectorXd m_Descriptor;
};

/// One weighted point of a centre of mass.
struct VCentreOfMassTerm {
  std::uint32_t m_Parent = 0;
  Eigen::Vector3d m_Position = Eigen::Vector3d::Zero();
  double m_Weight = 0.0;
  bool operator==(const VCentreOfMassTerm&) const = default;
};

/// A target made of several items: the centre of mass's terms, a rigid body's members.
class ITargetGroup {
public:
  virtual ~ITargetGroup() = default;
  virtual std::uint32_t NumItems() const = 0;
};

/// The weighted mean of points fixed in several segments, observed as a world point:
/// "TargetCentreOfMass". Its own parent and position (the header every target writes) are not
/// used by the run-time target.
class VTargetCentreOfMass : public VTargetPosition, public ITargetGroup {
public:
  using VTargetPosition::VTargetPosition;
  std::shared_ptr<ITargetCalibrated> Clone() const override {
    return std::make_shared<VTargetCentreOfMass>(*this);
  }
  bool Equals(const ITargetCalibrated& other) const override;
  const char* Key() const override { return "TargetCentreOfMass"; }
  std::uint32_t NumItems() const override { return std::uint32_t(m_Terms.size()); }
  const std::vector<VCentreOfMassTerm>& Terms() const { return m_Terms; }
  void SetTerms(std::vector<VCentreOfMassTerm> terms) { m_Terms = std::move(terms); }
  void AddTerm(std::uint32_t parent, const Eigen::Vector3d& position, double weight) {
    m_Terms.push_back({parent, position, weight});
  }
  void Write(std::ostream& o_rStream) const override;
  bool Read(VTextReader& io_rReader) override;

private:
  std::vector<VCentreOfMassTerm> m_Terms;
};

} // namespace KinematicAlgo
