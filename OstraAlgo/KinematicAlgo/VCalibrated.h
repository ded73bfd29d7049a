#pragma once
// Implementations of the calibrated model interfaces.

#include "OstraAlgo/KinematicAlgo/ICalibrated.h"

#include <functional>
#include <map>
#include <string_view>

namespace KinematicAlgo {

class VJointCalibrated : public IJointCalibrated {
public:
  VJointCalibrated() { SetType(0); }
  std::int32_t Type() const override { return m_Type; }
  void SetType(std::int32_t code) override;
  std::string TypeName() const override;
  std::uint32_t NumDynamicParams() const override { return m_NumDynamic; }
  std::uint32_t NumStaticParams() const override { return m_NumStatic; }
  const std::string& Name() const override { return m_Name; }
  void SetName(const std::string& name) override { m_Name = name; }
  const Eigen::Vector3d& Rotation() const override { return m_Rotation; }
  void SetRotation(const Eigen::Vector3d& rotation) override { m_Rotation = rotation; }
  const Eigen::VectorXd& MeanDynamic() const override { return m_MeanDynamic; }
  void SetMeanDynamic(const Eigen::VectorXd& mean) override { m_MeanDynamic = mean; }
  const Eigen::MatrixXd& CovDynamic() const override { return m_CovDynamic; }
  void SetCovDynamic(const Eigen::MatrixXd& covariance) override { m_CovDynamic = covariance; }
  const Eigen::VectorXd& CentreDynamic() const override { return m_CentreDynamic; }
  void SetCentreDynamic(const Eigen::VectorXd& centre) override { m_CentreDynamic = centre; }
  const Eigen::MatrixXd& RangeDynamic() const override { return m_RangeDynamic; }
  void SetRangeDynamic(const Eigen::MatrixXd& range) override { m_RangeDynamic = range; }
  const Eigen::VectorXd& MeanStatic() const override { return m_MeanStatic; }
  const Eigen::MatrixXd& CovStatic() const override { return m_CovStatic; }
  std::shared_ptr<IJointCalibrated> Clone() const override {
    return std::make_shared<VJointCalibrated>(*this);
  }
  bool Equals(const IJointCalibrated& other) const override;
  void Write(std::ostream& o_rStream) const override;
  bool Read(VTextReader& io_rReader) override;

private:
  std::string m_Name = "DefaultName";
  std::int32_t m_Type = 0;
  std::uint32_t m_NumDynamic = 0;
  std::uint32_t m_NumStatic = 0;
  Eigen::Vector3d m_Rotation = Eigen::Vector3d::Zero();
  Eigen::VectorXd m_MeanDynamic;
  Eigen::VectorXd m_MeanStatic;
  Eigen::VectorXd m_CentreDynamic;
  Eigen::MatrixXd m_CovDynamic;
  Eigen::MatrixXd m_CovStatic;
  Eigen::MatrixXd m_RangeDynamic;
};

class VSegmentCalibrated : public ISegmentCalibrated {
public:
  VSegmentCalibrated() : m_pJoint(std::make_shared<VJointCalibrated>()) {}
  std::int32_t Identifier() const override { return m_Identifier; }
  void SetIdentifier(std::int32_t id) override { m_Identifier = id; }
  const std::string& Name() const override { return m_Name; }
  void SetName(const std::string& name) override { m_Name = name; }
  const VPose& PoseInParent() const override { return m_PoseInParent; }
  void SetPoseInParent(const VPose& pose) override { m_PoseInParent = pose; }
  const VPose& PoseInThis() const override { return m_PoseInThis; }
  void SetPoseInThis(const VPose& pose) override { m_PoseInThis = pose; }
  std::shared_ptr<IJointCalibrated> Joint() const override { return m_pJoint; }
  void SetJoint(std::shared_ptr<IJointCalibrated> joint) override { m_pJoint = std::move(joint); }
  const std::array<double, 6>& BoundingBox() const override { return m_Box; }
  void SetBoundingBox(const std::array<double, 6>& box) override { m_Box = box; }
  /// Deep: the joint is cloned too.
  std::shared_ptr<ISegmentCalibrated> Clone() const override;
  bool Equals(const ISegmentCalibrated& other) const override;
  void Write(std::ostream& o_rStream) const override;
  bool Read(VTextReader& io_rReader) override;

private:
  std::string m_Name;
  std::int32_t m_Identifier = -1;
  VPose m_PoseInParent;
  VPose m_PoseInThis;
  std::shared_ptr<IJointCalibrated> m_pJoint;
  std::array<double, 6> m_Box{};
};

/// A point fixed in its parent segment: "TargetPosition".
class VTargetPosition : public ITargetCalibrated, public ITargetSingleParent {
public:
  explicit VTargetPosition(std::uint32_t parent = 0) : m_Parent(parent) {}
  std::shared_ptr<ITargetCalibrated> Clone() const override {
    return std::make_shared<VTargetPosition>(*this);
  }
  bool Equals(const ITargetCalibrated& other) const override;
  const char* Key() const override { return "TargetPosition"; }
  std::int32_t Identifier() const override { return m_Identifier; }
  void SetIdentifier(std::int32_t id) override { m_Identifier = id; }
  const std::string& Name() const override { return m_Name; }
  void SetName(const std::string& name) override { m_Name = name; }
  std::uint32_t ParentIdentifier() const override { return m_Parent; }
  void SetParentIdentifier(std::uint32_t id) override { m_Parent = id; }
  const Eigen::Vector3d& PositionInParent() const override { return m_Position; }
  void SetPositionInParent(const Eigen::Vector3d& p) override { m_Position = p; }
  void Write(std::ostream& o_rStream) const override;
  bool Read(VTextReader& io_rReader) override;

private:
  std::string m_Name;
  std::int32_t m_Identifier = -1;
  std::uint32_t m_Parent;
  Eigen::Vector3d m_Position = Eigen::Vector3d::Zero();
};

/// A point with a placement covariance: "TargetPositionWithCovariance".
class VTargetPositionWithCovariance : public VTargetPosition, public ITargetCovariance3 {
public:
  using VTargetPosition::VTargetPosition;
  std::shared_ptr<ITargetCalibrated> Clone() const override {
    return std::make_shared<VTargetPositionWithCovariance>(*this);
  }
  bool Equals(const ITargetCalibrated& other) const override;
  const char* Key() const override { return "TargetPositionWithCovariance"; }
  const Eigen::Matrix3d& Covariance() const override { return m_Covariance; }
  void SetCovariance(const Eigen::Matrix3d& c) override { m_Covariance = c; }
  void Write(std::ostream& o_rStream) const override;
  bool Read(VTextReader& io_rReader) override;

private:
  Eigen::Matrix3d m_Covariance = Eigen::Matrix3d::Zero();
};

/// Creators of model targets by key, each with its registration index, the name a user sees and
/// a description of what the target does.
class VTargetFactory {
public:
  using Creator = std::function<std::shared_ptr<ITargetCalibrated>()>;
  /// The process-wide factory, with the built-in classes registered.
  static VTargetFactory& Factory();
  /// Registers `key`; a key registered twice keeps its first index and takes the new creator,
  /// display name and description. The display name defaults to the key.
  void Register(const std::string& key, Creator creator, const std::string& displayName = {},
                const std::string& description = {});
  /// Null for an unknown key.
  std::shared_ptr<ITargetCalibrated> Create(const std::string& key) const;
  /// -1 for an unknown key.
  std::int32_t Index(const std::string& key) const;
  /// Empty for an unknown key.
  std::string DisplayName(const std::string& key) const;
  std::string Description(const std::string& key) const;
  /// Every key, in registration order (by index).
  std::vector<std::string> Keys() const;

private:
  struct VEntry {
    std::int32_t m_Index;
    Creator m_Creator;
    std::string m_DisplayName;
    std::string m_Description;
  };
  std::map<std::string, VEntry> m_Entries;
};

class VSubjectCalibrated : public ISubjectCalibrated {
public:
  /// One root segment with a default joint.
  VSubjectCalibrated();
  /// Deep copy: segments and targets are cloned; a marker that is also a target (the same
  /// object; identifiers are often left at -1 and would pair the wrong ones) shares the copied
  /// target.
  VSubjectCalibrated(const VSubjectCalibrated& other);
  VSubjectCalibrated& operator=(const VSubjectCalibrated&) = delete;

  const std::string& Name() const override { return m_Name; }
  void SetName(const std::string& name) override { m_Name = name; }
  std::int32_t Identifier() const override { return m_Identifier; }
  void SetIdentifier(std::int32_t id) override { m_Identifier = id; }
  const SegmentTree& Segments() const override { return m_Tree; }
  SegmentTree& Segments() override { return m_Tree; }
  std::uint32_t NumTargets() const override { return std::uint32_t(m_Targets.size()); }
  std::shared_ptr<ITargetCalibrated> Target(std::uint32_t i) const override { return m_Targets[i]; }
  std::uint32_t NumMarkers() const override { return std::uint32_t(m_Markers.size()); }
  std::shared_ptr<ITargetCalibrated> Marker(std::uint32_t i) const override { return m_Markers[i]; }
  const std::vector<VStick>& Sticks() const override { return m_Sticks; }
  void SetSticks(const std::vector<VStick>& sticks) override { m_Sticks = sticks; }
  std::shared_ptr<ISubjectCalibrated> Clone() const override {
    return std::make_shared<VSubjectCalibrated>(*this);
  }
  bool Equals(const ISubjectCalibrated& other) const override;
  void Write(std::ostream& o_rStream) const override;
  bool Read(std::istream& io_rStream, std::string* o_pError = nullptr) override;
  /// Reads from text in memory; as Read otherwise.
  bool ReadText(std::string_view text, std::string* o_pError = nullptr);
  /// Reads one subject from `io_rReader`, leaving the reader after it (for files that hold more
  /// than a subject). False with the reader's error set, and this subject unchanged, on failure.
  bool ReadFrom(VTextReader& io_rReader);

  /// Replaces the tree by an empty one.
  void ClearSegments() { m_Tree = SegmentTree(); }
  void AddTarget(std::shared_ptr<ITargetCalibrated> target, bool isMarker);
  /// A marker that is not among the targets.
  void AddMarker(std::shared_ptr<ITargetCalibrated> marker) { m_Markers.push_back(marker); }

private:
  SegmentTree m_Tree;
  std::vector<std::shared_ptr<ITargetCalibrated>> m_Targets;
  std::vector<std::shared_ptr<ITargetCalibrated>> m_Markers;
  std::vector<VStick> m_Sticks;
  std::string m_Name;
  std::int32_t m_Identifier = -1;
};

} // namespace KinematicAlgo
