#pragma once
// Model targets beyond the fixed point: a plane or a ray fixed in a segment (each optionally with
// a covariance on its residual), an orientation, a direction, and a rigid body of markers.
// Every vector and matrix is in the parent segment's frame.

#include "OstraAlgo/KinematicAlgo/VCalibrated.h"

namespace KinematicAlgo {

/// A target whose residual has a covariance of its own (the Gaussian forms of the plane and the
/// ray). An empty matrix means the plain form.
class ITargetResidualCovariance {
public:
  virtual ~ITargetResidualCovariance() = default;
  virtual const Eigen::MatrixXd& ResidualCovariance() const = 0;
  virtual void SetResidualCovariance(const Eigen::MatrixXd& covariance) = 0;
};

/// A target that carries a direction (a ray's direction, a plane's normal, a direction target's
/// vector). Setters store the vector as given; the record conversion normalises it.
class ITargetDirection {
public:
  virtual ~ITargetDirection() = default;
  virtual const Eigen::Vector3d& DirectionInParent() const = 0;
  virtual void SetDirectionInParent(const Eigen::Vector3d& direction) = 0;
};

/// Shared by the plane and the ray: a point, a direction and an optional residual covariance.
class VTargetPointDirection : public VTargetPosition,
                              public ITargetDirection,
                              public ITargetResidualCovariance {
public:
  using VTargetPosition::VTargetPosition;
  bool Equals(const ITargetCalibrated& other) const override;
  const Eigen::Vector3d& DirectionInParent() const override { return m_Direction; }
  void SetDirectionInParent(const Eigen::Vector3d& d) override { m_Direction = d; }
  const Eigen::MatrixXd& ResidualCovariance() const override { return m_ResidualCovariance; }
  void SetResidualCovariance(const Eigen::MatrixXd& c) override { m_ResidualCovariance = c; }
  /// The point, then the direction under the label of the class, then the residual covariance.
  void Write(std::ostream& o_rStream) const override;
  bool Read(VTextReader& io_rReader) override;

protected:
  /// "NormalInParent: " for the plane, "DirInParent: " for the others.
  virtual const char* DirectionLabel() const { return "DirInParent: "; }

private:
  Eigen::Vector3d m_Direction = Eigen::Vector3d::UnitZ();
  Eigen::MatrixXd m_ResidualCovariance;
};

/// A plane through PositionInParent() with normal DirectionInParent(): "TargetSegmentPlane".
/// Its residual is the signed distance of an observed point (covariance 1 x 1).
class VTargetSegmentPlane : public VTargetPointDirection {
public:
  using VTargetPointDirection::VTargetPointDirection;
  std::shared_ptr<ITargetCalibrated> Clone() const override {
    return std::make_shared<VTargetSegmentPlane>(*this);
  }
  const char* Key() const override { return "TargetSegmentPlane"; }

protected:
  const char* DirectionLabel() const override { return "NormalInParent: "; }
};

/// A ray from PositionInParent() along DirectionInParent(): "TargetSegmentRay". Its residual is
/// the offset of an observed point across the ray (covariance 2 x 2).
class VTargetSegmentRay : public VTargetPointDirection {
public:
  using VTargetPointDirection::VTargetPointDirection;
  std::shared_ptr<ITargetCalibrated> Clone() const override {
    return std::make_shared<VTargetSegmentRay>(*this);
  }
  const char* Key() const override { return "TargetSegmentRay"; }
};

/// A direction fixed in the segment, observed as a world direction: "TargetDirection".
class VTargetDirection : public VTargetPointDirection {
public:
  using VTargetPointDirection::VTargetPointDirection;
  std::shared_ptr<ITargetCalibrated> Clone() const override {
    return std::make_shared<VTargetDirection>(*this);
  }
  const char* Key() const override { return "TargetDirection"; }
};

/// A rotation fixed in the segment, observed as a world rotation: "TargetOrientation". Its
/// position in parent is unused (zero).
class VTargetOrientation : public VTargetPosition {
public:
  using VTargetPosition::VTargetPosition;
  std::shared_ptr<ITargetCalibrated> Clone() const override {
    return std::make_shared<VTargetOrientation>(*this);
  }
  bool Equals(const ITargetCalibrated& other) const override;
  const char* Key() const override { return "TargetOrientation"; }
  const Eigen::Matrix3d& OrientationInParent() const { return m_Orientation; }
  void SetOrientationInParent(const Eigen::Matrix3d& r) { m_Orientation = r; }
  void Write(std::ostream& o_rStream) const override;
  bool Read(VTextReader& io_rReader) override;

private:
  Eigen::Matrix3d m_Orientation = Eigen::Matrix3d::Identity();
};

/// Markers at fixed places relative to each other: "TargetRigidBody". The body's pose in the
/// parent segment is B; each member's PositionInParent() is its place in the body's frame, so
/// its place in the segment is B ∘ position. PositionInParent() of the body itself is B's
/// translation.
class VTargetRigidBody : public VTargetPosition {
public:
  using VTargetPosition::VTargetPosition;
  /// Deep: members are cloned.
  std::shared_ptr<ITargetCalibrated> Clone() const override;
  bool Equals(const ITargetCalibrated& other) const override;
  const char* Key() const override { return "TargetRigidBody"; }
  const VPose& BodyPoseInParent() const { return m_Body; }
  void SetBodyPoseInParent(const VPose& pose);
  std::uint32_t NumMembers() const { return std::uint32_t(m_Members.size()); }
  const VTargetPosition& Member(std::uint32_t i) const { return *m_Members[i]; }
  std::shared_ptr<VTargetPosition> MemberPtr(std::uint32_t i) const { return m_Members[i]; }
  void AddMember(std::shared_ptr<VTargetPosition> member) { m_Members.push_back(member); }
  /// Its own header (group name, identifier, parent, body pose), then the members.
  void Write(std::ostream& o_rStream) const override;
  bool Read(VTextReader& io_rReader) override;

private:
  VPose m_Body;
  std::vector<std::shared_ptr<VTargetPosition>> m_Members;
};

/// A point fixed in its segment that should lie on a plane fixed in the world: "TargetPlane".
/// The plane is the points x with n · x = d (n as given, normalised by the run-time target).
class VTargetPlane : public VTargetPosition {
public:
  using VTargetPosition::VTargetPosition;
  std::shared_ptr<ITargetCalibrated> Clone() const override {
    return std::make_shared<VTargetPlane>(*this);
  }
  bool Equals(const ITargetCalibrated& other) const override;
  const char* Key() const override { return "TargetPlane"; }
  const Eigen::Vector3d& WorldNormal() const { return m_Normal; }
  double WorldOffset() const { return m_Offset; }
  void SetWorldPlane(const Eigen::Vector3d& normal, double offset) {
    m_Normal = normal;
    m_Offset = offset;
  }
  void Write(std::ostream& o_rStream) const override;
  bool Read(VTextReader& io_rReader) override;

private:
  Eigen::Vector3d m_Normal = Eigen::Vector3d::UnitZ();
  double m_Offset = 0.0;
};

/// A target between two segments.
class ITargetTwoParents {
public:
  virtual ~ITargetTwoParents() = default;
  virtual std::uint32_t ParentIdentifier1() const = 0;
  virtual std::uint32_t ParentIdentifier2() const = 0;
  virtual void SetParentIdentifiers(std::uint32_t first, std::uint32_t second) = 0;
  virtual const Eigen::Vector3d& PositionInParent1() const = 0;
  virtual const Eigen::Vector3d& PositionInParent2() const = 0;
  virtual void SetPositionsInParents(const Eigen::Vector3d& first,
                                     const Eigen::Vector3d& second) = 0;
};

/// What every target between two segments holds: a name, an identifier, the two parents and
/// a point fixed in each. Equality compares the key too, so two classes never compare equal.
class VTargetBetweenSegments : public ITargetCalibrated, public ITargetTwoParents {
public:
  bool Equals(const ITargetCalibrated& other) const override;
  std::int32_t Identifier() const override { return m_Identifier; }
  void SetIdentifier(std::int32_t id) override { m_Identifier = id; }
  const std::string& Name() const override { return m_Name; }
  void SetName(const std::string& name) override { m_Name = name; }
  std::uint32_t ParentIdentifier1() const override { return m_Parents[0]; }
  std::uint32_t ParentIdentifier2() const override { return m_Parents[1]; }
  void SetParentIdentifiers(std::uint32_t first, std::uint32_t second) override {
    m_Parents = {first, second};
  }
  const Eigen::Vector3d& PositionInParent1() const override { return m_Positions[0]; }
  const Eigen::Vector3d& PositionInParent2() const override { return m_Positions[1]; }
  void SetPositionsInParents(const Eigen::Vector3d& first, const Eigen::Vector3d& second) override {
    m_Positions = {first, second};
  }
  /// Name, identifier, both parents, both points.
  void Write(std::ostream& o_rStream) const override;
  bool Read(VTextReader& io_rReader) override;

private:
  std::string m_Name;
  std::int32_t m_Identifier = -1;
  std::array<std::uint32_t, 2> m_Parents{};
  std::array<Eigen::Vector3d, 2> m_Positions{Eigen::Vector3d::Zero(), Eigen::Vector3d::Zero()};
};

/// The offset between a point fixed in one segment and a point fixed in another:
/// "TargetRelativePosition".
class VTargetRelativePosition : public VTargetBetweenSegments {
public:
  std::shared_ptr<ITargetCalibrated> Clone() const override {
    return std::make_shared<VTargetRelativePosition>(*this);
  }
  const char* Key() const override { return "TargetRelativePosition"; }
};

/// Registers every model target class with `factory` (with its display name and description),
/// in a fixed order: the order gives Type().
void RegisterModelTargets(VTargetFactory& factory);

} // namespace KinematicAlgo
