#include "OstraAlgo/KinematicAlgo/VCalibrated.h"
#include "OstraAlgo/KinematicAlgo/VCalibratedTargets.h"

namespace KinematicAlgo {

namespace {
constexpr std::uint32_t DynamicCounts[] = {6, 3, 2, 1, 1, 0};

bool SamePose(const VPose& a, const VPose& b) {
  return a.m_Rotation == b.m_Rotation && a.m_Translation == b.m_Translation;
}
template <class M> bool SameMatrix(const M& a, const M& b) {
  return a.rows() == b.rows() && a.cols() == b.cols() && a == b;
}
} // namespace

std::int32_t ITargetCalibrated::Type() const {
  return VTargetFactory::Factory().Index(Key());
}

void VJointCalibrated::SetType(std::int32_t code) {
  m_Type = code;
  m_NumDynamic = (code >= 0 && code < 6) ? DynamicCounts[code] : 0;
  m_NumStatic = 0;
  const Eigen::Index n = m_NumDynamic;
  m_MeanDynamic = Eigen::VectorXd::Zero(n);
  m_CentreDynamic = Eigen::VectorXd::Zero(n);
  m_CovDynamic = Eigen::MatrixXd::Zero(n, n);
  m_RangeDynamic = Eigen::MatrixXd::Zero(n, n);
  m_MeanStatic.resize(0);
  m_CovStatic.resize(0, 0);
}

std::string VJointCalibrated::TypeName() const {
  static const char* const names[] = {"Free", "Ball", "HardySpicer", "Hinge", "Slider", "Dummy"};
  return (m_Type >= 0 && m_Type < 6) ? names[m_Type] : "InvalidJointType";
}

bool VJointCalibrated::Equals(const IJointCalibrated& o) const {
  return m_Name == o.Name() && m_Type == o.Type() && m_NumDynamic == o.NumDynamicParams() &&
         m_NumStatic == o.NumStaticParams() && m_Rotation == o.Rotation() &&
         SameMatrix(m_MeanDynamic, o.MeanDynamic()) && SameMatrix(m_MeanStatic, o.MeanStatic()) &&
         SameMatrix(m_CentreDynamic, o.CentreDynamic()) &&
         SameMatrix(m_CovDynamic, o.CovDynamic()) && SameMatrix(m_CovStatic, o.CovStatic()) &&
         SameMatrix(m_RangeDynamic, o.RangeDynamic());
}

std::shared_ptr<ISegmentCalibrated> VSegmentCalibrated::Clone() const {
  auto copy = std::make_shared<VSegmentCalibrated>(*this);
  if (m_pJoint) copy->m_pJoint = m_pJoint->Clone();
  return copy;
}

bool VSegmentCalibrated::Equals(const ISegmentCalibrated& o) const {
  const bool joints =
      (!m_pJoint && !o.Joint()) || (m_pJoint && o.Joint() && m_pJoint->Equals(*o.Joint()));
  return m_Name == o.Name() && m_Identifier == o.Identifier() &&
         SamePose(m_PoseInParent, o.PoseInParent()) && SamePose(m_PoseInThis, o.PoseInThis()) &&
         joints && m_Box == o.BoundingBox();
}

bool VTargetPosition::Equals(const ITargetCalibrated& o) const {
  const auto* other = dynamic_cast<const ITargetSingleParent*>(&o);
  return other && std::string(Key()) == o.Key() && m_Name == o.Name() &&
         m_Parent == other->ParentIdentifier() && m_Position == other->PositionInParent();
}

bool VTargetPositionWithCovariance::Equals(const ITargetCalibrated& o) const {
  const auto* other = dynamic_cast<const ITargetCovariance3*>(&o);
  return other && VTargetPosition::Equals(o) && m_Covariance == other->Covariance();
}

VTargetFactory& VTargetFactory::Factory() {
  static VTargetFactory factory = [] {
    VTargetFactory f;
    RegisterModelTargets(f);
    return f;
  }();
  return factory;
}

void VTargetFactory::Register(const std::string& key, Creator creator,
                              const std::string& displayName, const std::string& description) {
  const std::string shown = displayName.empty() ? key : displayName;
  auto it = m_Entries.find(key);
  if (it != m_Entries.end()) {
    it->second = {it->second.m_Index, std::move(creator), shown, description};
    return;
  }
  const std::int32_t index = std::int32_t(m_Entries.size());
  m_Entries.emplace(key, VEntry{index, std::move(creator), shown, description});
}

std::shared_ptr<ITargetCalibrated> VTargetFactory::Create(const std::string& key) const {
  auto it = m_Entries.find(key);
  return it == m_Entries.end() ? nullptr : it->second.m_Creator();
}

std::int32_t VTargetFactory::Index(const std::string& key) const {
  auto it = m_Entries.find(key);
  return it == m_Entries.end() ? -1 : it->second.m_Index;
}

std::string VTargetFactory::DisplayName(const std::string& key) const {
  auto it = m_Entries.find(key);
  return it == m_Entries.end() ? std::string() : it->second.m_DisplayName;
}

std::string VTargetFactory::Description(const std::string& key) const {
  auto it = m_Entries.find(key);
  return it == m_Entries.end() ? std::string() : it->second.m_Description;
}

std::vector<std::string> VTargetFactory::Keys() const {
  std::vector<std::string> keys(m_Entries.size());
  for (const auto& [key, entry] : m_Entries)
    keys[size_t(entry.m_Index)] = key;
  return keys;
}

VSubjectCalibrated::VSubjectCalibrated() {
  m_Tree.Add(SegmentTree::NoParent, std::make_shared<VSegmentCalibrated>());
}

VSubjectCalibrated::VSubjectCalibrated(const VSubjectCalibrated& other)
    : m_Tree(other.m_Tree), m_Sticks(other.m_Sticks), m_Name(other.m_Name),
      m_Identifier(other.m_Identifier) {
  for (std::int32_t i = 0; i < m_Tree.Size(); ++i)
    m_Tree[i].m_Value = m_Tree[i].m_Value->Clone();
  for (const auto& target : other.m_Targets)
    m_Targets.push_back(target->Clone());
  for (const auto& marker : other.m_Markers) {
    std::shared_ptr<ITargetCalibrated> copy;
    for (size_t t = 0; t < other.m_Targets.size() && !copy; ++t)
      if (other.m_Targets[t] == marker) copy = m_Targets[t];
    m_Markers.push_back(copy ? copy : marker->Clone());
  }
}

void VSubjectCalibrated::AddTarget(std::shared_ptr<ITargetCalibrated> target, bool isMarker) {
  if (isMarker) m_Markers.push_back(target);
  m_Targets.push_back(std::move(target));
}

bool VSubjectCalibrated::Equals(const ISubjectCalibrated& o) const {
  if (m_Name != o.Name() || m_Identifier != o.Identifier()) return false;
  const SegmentTree& tree = o.Segments();
  if (tree.Size() != m_Tree.Size() || o.NumTargets() != NumTargets() ||
      o.NumMarkers() != NumMarkers())
    return false;
  for (std::int32_t i = 0; i < m_Tree.Size(); ++i)
    if (m_Tree[i].m_Parent != tree[i].m_Parent || !m_Tree[i].m_Value->Equals(*tree[i].m_Value))
      return false;
  for (std::uint32_t t = 0; t < NumTargets(); ++t)
    if (!m_Targets[t]->Equals(*o.Target(t))) return false;
  for (std::uint32_t m = 0; m < NumMarkers(); ++m)
    if (!m_Markers[m]->Equals(*o.Marker(m))) return false;
  return m_Sticks == o.Sticks();
}

} // namespace KinematicAlgo
