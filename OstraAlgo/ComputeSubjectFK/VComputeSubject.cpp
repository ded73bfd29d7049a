#include "OstraAlgo/ComputeSubjectFK/VComputeSubject.h"

#include <algorithm>
#include <cmath>
#include <map>
#include <typeinfo>

namespace ComputeSubject {

using namespace KinematicAlgo;

VComputeSegment VComputeSubject::VSegmentFactory::Create(const ISegmentCalibrated& segment,
                                                         bool freeSegments) const {
  return VComputeSegment(segment, m_UseRotator, freeSegments);
}

std::unique_ptr<IComputeTarget>
VComputeSubject::VTargetFactory::Create(const ITargetCalibrated& target,
                                        const SegmentLookup& lookup) const {
  return MakeComputeTarget(target, lookup);
}

VComputeSubject::VComputeSubject(std::shared_ptr<const ISubjectCalibrated> subject, std::uint8_t,
                                 std::uint32_t mode, std::uint32_t useRotator)
    : VComputeSubject(std::move(subject), mode, std::make_shared<VSegmentFactory>(useRotator != 0),
                      nullptr) {}

VComputeSubject::VComputeSubject(std::shared_ptr<const ISubjectCalibrated> subject,
                                 std::uint32_t mode,
                                 std::shared_ptr<const ISegmentFactory> segmentFactory,
                                 std::shared_ptr<const ITargetFactory> targetFactory,
                                 std::shared_ptr<ISegmentComputer> segmentComputer,
                                 std::shared_ptr<const ITargetComputer> targetComputer)
    : m_pSubject(std::move(subject)), m_Mode(mode), m_pSegmentFactory(std::move(segmentFactory)),
      m_pTargetFactory(std::move(targetFactory)), m_pSegmentComputer(std::move(segmentComputer)),
      m_pTargetComputer(std::move(targetComputer)) {
  if (!m_pSubject) throw VConstructionException("VComputeSubject needs a subject");
  if (!m_pSegmentFactory) m_pSegmentFactory = std::make_shared<VSegmentFactory>();
  if (!m_pTargetFactory) m_pTargetFactory = std::make_shared<VTargetFactory>();
  if (!m_pSegmentComputer) m_pSegmentComputer = std::make_shared<VSegmentComputerImpl>();
  if (!m_pTargetComputer) m_pTargetComputer = std::make_shared<VTargetComputer>();
  Build();
}

VComputeSubject::VComputeSubject(const VComputeSubject& other)
    : m_pSubject(other.m_pSubject), m_Mode(other.m_Mode),
      m_pSegmentFactory(other.m_pSegmentFactory), m_pTargetFactory(other.m_pTargetFactory),
      m_pSegmentComputer(other.m_pSegmentComputer->Clone()),
      m_pTargetComputer(other.m_pTargetComputer) {
  Build();
}

void VComputeSubject::Build() {
  const SegmentTree& tree = m_pSubject->Segments();
  m_Segments.reserve(size_t(tree.Size())); // targets keep pointers into this vector
  for (std::int32_t i = 0; i < tree.Size(); ++i) {
    if (!tree[i].m_Value) throw VConstructionException("VComputeSubject: a segment is missing");
    m_Segments.push_back(m_pSegmentFactory->Create(*tree[i].m_Value, m_Mode == EFreeSegmentsMode));
    m_Segments.back().Place(i, tree[i].m_Parent);
  }
  // The computer allocates every segment's Jacobian blocks once, here, before any target binds.
  m_pSegmentComputer->SetTree(m_Segments);
  for (std::uint32_t i = 0; i < m_Segments.size(); ++i) {
    m_pSegmentComputer->SetUp(i, m_NumJointParams, EChain);
    m_NumJointParams += m_pSegmentComputer->NumParams(m_Segments[i]);
  }
  for (std::uint32_t t = 0; t < m_pSubject->NumTargets(); ++t) {
    const auto target = m_pSubject->Target(t);
    m_ModelTargets.push_back(target);
    std::unique_ptr<IComputeTarget> computed = m_pTargetFactory->Create(*target, Lookup());
    if (!computed) continue;
    m_NumTargetParams += computed->NumParams();
    (computed->NumParams() ? m_ParamTargets : m_PlainTargets).push_back(computed.get());
    m_Targets.push_back(std::move(computed));
    m_TargetModelIndex.push_back(t);
  }
  m_Cache.assign(NumParams(), 0.0);
  m_FirstTime = true;
}

const VComputeSegment* VComputeSubject::SegmentByIdentifier(std::uint32_t id) const {
  // The first segment with the identifier, as a map filled in tree order would give.
  for (const VComputeSegment& segment : m_Segments)
    if (segment.Segment().Identifier() == std::int32_t(id)) return &segment;
  return nullptr;
}

SegmentLookup VComputeSubject::Lookup() const {
  return [this](std::uint32_t id) { return SegmentByIdentifier(id); };
}

const VComputeTargetPosition* VComputeSubject::PositionTarget(std::uint32_t i) const {
  return dynamic_cast<const VComputeTargetPosition*>(m_Targets[i].get());
}

// Defined here, next to the loop that calls it, so that loop can call it directly.
void VComputeSubject::VSegmentComputerImpl::Update(std::uint32_t cursor, ConstView params,
                                                   std::uint32_t type) {
  VComputeSegment& segment = m_Tree[cursor];
  const std::int32_t p = m_Parents[cursor];
  const VComputeSegment* parent = p < 0 ? nullptr : &m_Tree[size_t(p)];
  if (type < EChainOnly) segment.UpdatePose(params.data(), parent);
  if (type != ENone) segment.UpdateJacobian(params.data(), parent, type);
}

void VComputeSubject::UpdateSegments(ConstView state, std::uint32_t type) {
  const bool same = !m_FirstTime && state.size() >= m_Cache.size() &&
                    std::equal(m_Cache.begin(), m_Cache.end(), state.begin());
  if (same && type == ENone) return;
  // An unchanged state only needs the Jacobians asked for.
  const std::uint32_t effective = (same && type < EChainOnly) ? type + 3 : type;
  ISegmentComputer& computer = *m_pSegmentComputer;
  const auto own = [&](const VComputeSegment& s) {
    return ConstView(state.data() + s.m_FirstParam, s.m_NumParams);
  };
  // The default computer, which nearly every subject uses, without a virtual call per segment.
  if (typeid(computer) == typeid(VSegmentComputerImpl)) {
    auto& impl = static_cast<VSegmentComputerImpl&>(computer);
    for (std::uint32_t i = 0; i < m_Segments.size(); ++i)
      impl.VSegmentComputerImpl::Update(i, own(m_Segments[i]), effective);
  } else {
    for (std::uint32_t i = 0; i < m_Segments.size(); ++i)
      computer.Update(i, own(m_Segments[i]), effective);
  }
  // The target computer does nothing for an "only" type: the poses are those of the cache.
  m_pTargetComputer->UpdateTargets(m_PlainTargets, effective);
  if (!m_ParamTargets.empty())
    m_pTargetComputer->UpdateParametrisedTargets(m_ParamTargets, state.first(m_NumJointParams),
                                                 state.subspan(m_NumJointParams), effective);
  if (effective < EChainOnly) {
    ++m_PoseEvaluations;
    m_FirstTime = false;
    std::copy_n(state.begin(), m_Cache.size(), m_Cache.begin());
  }
}

void VComputeSubject::UpdateTargets(ConstView state) {
  m_pTargetComputer->UpdateTargets(m_PlainTargets, ENone);
  if (!m_ParamTargets.empty())
    m_pTargetComputer->UpdateParametrisedTargets(m_ParamTargets, state.first(m_NumJointParams),
                                                 state.subspan(m_NumJointParams), ENone);
}

void VComputeSubject::GatherTargetParams(View o_rState) const {
  m_pTargetComputer->GatherTargetParams(m_ParamTargets, o_rState.subspan(m_NumJointParams));
}

void VComputeSubject::TargetJacobian(Eigen::Ref<Eigen::MatrixXd> o_rJacobian) const {
  o_rJacobian.setZero();
  for (std::uint32_t t = 0; t < NumTargets(); ++t)
    if (const auto* position = PositionTarget(t))
      position->Jacobian(o_rJacobian.middleRows(3 * t, 3));
}

void VComputeSubject::PriorMeanState(View o_rState) const {
  for (const VComputeSegment& s : m_Segments)
    for (std::uint32_t i = 0; i < s.NumParams(); ++i)
      o_rState[s.FirstParam() + i] = s.DynamicPrior().Mean()[i];
}

void VComputeSubject::CurrentMeanState(View o_rState) const {
  for (const VComputeSegment& s : m_Segments)
    for (std::uint32_t i = 0; i < s.NumParams(); ++i)
      o_rState[s.FirstParam() + i] = s.CurrentPrior().Mean()[i];
}

double VComputeSubject::SampleState(View o_rState, std::mt19937& gen) const {
  std::normal_distribution<double> normal;
  double sum = 0.0;
  double z[JointJacobian::MaxParams];
  for (const VComputeSegment& s : m_Segments) {
    if (!s.NumParams()) continue;
    for (std::uint32_t i = 0; i < s.NumParams(); ++i) {
      z[i] = normal(gen);
      sum += z[i] * z[i];
    }
    s.Joint()->FromNormalised(o_rState.subspan(s.FirstParam(), s.NumParams()),
                              ConstView(z, s.NumParams()), s.CurrentPrior());
  }
  return sum;
}

void VComputeSubject::WhitenState(View o_rZ, ConstView x) const {
  for (const VComputeSegment& s : m_Segments)
    if (s.NumParams())
      s.Joint()->ToNormalised(o_rZ.subspan(s.FirstParam(), s.NumParams()),
                              x.subspan(s.FirstParam(), s.NumParams()), s.CurrentPrior());
}

void VComputeSubject::ColourState(View o_rX, ConstView z) const {
  for (const VComputeSegment& s : m_Segments)
    if (s.NumParams())
      s.Joint()->FromNormalised(o_rX.subspan(s.FirstParam(), s.NumParams()),
                                z.subspan(s.FirstParam(), s.NumParams()), s.CurrentPrior());
}

void VComputeSubject::NormaliseState(View io_rState) const {
  for (const VComputeSegment& s : m_Segments)
    if (s.NumParams()) s.Joint()->NormaliseParams(io_rState.subspan(s.FirstParam(), s.NumParams()));
}

bool VComputeSubject::StateFromWorldPoses(View o_rState, double tolerance) const {
  std::vector<bool> succeeded(m_Segments.size(), true);
  for (size_t i = 0; i < m_Segments.size(); ++i) {
    const VComputeSegment& s = m_Segments[i];
    if (!s.NumParams()) continue;
    // J = P⁻¹ L Q.
    const VPose joint = s.PoseInParent().Inverse() * s.LocalPose() * s.PoseInThis();
    succeeded[i] = s.Joint()->ComputeParams(o_rState.subspan(s.FirstParam(), s.NumParams()), View(),
                                            joint, tolerance);
  }
  return std::find(succeeded.begin(), succeeded.end(), false) == succeeded.end();
}

void VComputeSubject::BlendStates(View io_rA, ConstView b, double wa, double wb) const {
  for (const VComputeSegment& s : m_Segments)
    if (s.NumParams())
      s.Joint()->Blend(io_rA.subspan(s.FirstParam(), s.NumParams()),
                       b.subspan(s.FirstParam(), s.NumParams()), wa, wb);
}

void VComputeSubject::UnwrapState(View io_rState, ConstView reference) const {
  constexpr double turn = 2.0 * 3.14159265358979323846;
  for (const VComputeSegment& s : m_Segments) {
    double* x = io_rState.data() + s.FirstParam();
    const double* ref = reference.data() + s.FirstParam();
    if (s.NumParams() >= 3) {
      Eigen::Map<Eigen::Vector3d> r(x);
      const double theta = r.norm();
      if (theta <= 1e-10) continue;
      const Eigen::Vector3d axis = r / theta;
      const double along = axis.dot(Eigen::Map<const Eigen::Vector3d>(ref));
      r = axis * (theta - std::rint((theta - along) / turn) * turn);
    } else {
      for (std::uint32_t i = 0; i < s.NumParams(); ++i)
        x[i] -= std::rint((x[i] - ref[i]) / turn) * turn;
    }
  }
}

void VComputeSubject::RecentrePrior(ConstView state) {
  for (VComputeSegment& s : m_Segments) {
    s.m_CurrentPrior = s.m_DynamicPrior;
    s.m_CurrentPrior.SetMean(
        Eigen::Map<const Eigen::VectorXd>(state.data() + s.FirstParam(), s.NumParams()));
  }
}

void VComputeSubject::RecentrePrior(ConstView state, double weight) {
  for (VComputeSegment& s : m_Segments) {
    s.m_CurrentPrior = s.m_DynamicPrior;
    if (!(weight >= 0.0 && weight <= 1.0) || !s.NumParams()) continue;
    Eigen::VectorXd mean =
        Eigen::Map<const Eigen::VectorXd>(state.data() + s.FirstParam(), s.NumParams());
    s.Joint()->Blend(View(mean.data(), size_t(mean.size())),
                     ConstView(s.m_DynamicPrior.Mean().data(), s.NumParams()), 1.0 - weight,
                     weight);
    s.m_CurrentPrior.SetMean(mean);
  }
}

void VComputeSubject::FreeState(View o_rState) const {
  for (size_t i = 0; i < m_Segments.size(); ++i)
    std::copy_n(m_Segments[i].FreeParams().begin(), 6, o_rState.begin() + std::ptrdiff_t(6 * i));
}

bool VComputeSubject::WriteToModel(ISubjectCalibrated& io_rModel) const {
  SegmentTree& tree = io_rModel.Segments();
  if (tree.Size() != std::int32_t(m_Segments.size())) return false;
  for (size_t i = 0; i < m_Segments.size(); ++i) {
    const VComputeSegment& s = m_Segments[i];
    VPose P = s.m_FreeSegment ? s.m_Joint : s.m_ModelP;
    VPose Q = s.m_Q;
    if (!s.m_UsesRotator) {
      P.m_Rotation = P.m_Rotation * s.m_A.transpose();
      Q.m_Rotation = Q.m_Rotation * s.m_A.transpose();
    }
    tree[std::int32_t(i)].m_Value->SetPoseInParent(P);
    tree[std::int32_t(i)].m_Value->SetPoseInThis(Q);
  }
  return true;
}

bool VComputeSubject::WriteToModel(ISubjectCalibrated& io_rModel, VWithTargets,
                                   std::string* o_pWhy) const {
  const auto fail = [&](const std::string& why) {
    if (o_pWhy) *o_pWhy = why;
    return false;
  };
  if (io_rModel.Segments().Size() != std::int32_t(m_Segments.size()))
    return fail("the model's tree has another number of segments");
  if (io_rModel.NumTargets() != m_ModelTargets.size())
    return fail("the model has another number of targets");
  // Every target is checked before anything is written, so a refusal changes nothing.
  for (std::uint32_t t = 0; t < io_rModel.NumTargets(); ++t)
    if (std::string(io_rModel.Target(t)->Key()) != m_ModelTargets[t]->Key())
      return fail("the model's target " + std::to_string(t) + " is a " +
                  io_rModel.Target(t)->Key() + ", not a " + m_ModelTargets[t]->Key());
  for (size_t i = 0; i < m_Targets.size(); ++i) {
    const auto* body = dynamic_cast<const VComputeRigidBody*>(m_Targets[i].get());
    const auto* other =
        dynamic_cast<const VTargetRigidBody*>(io_rModel.Target(m_TargetModelIndex[i]).get());
    if (body && other && other->NumMembers() != body->NumMembers())
      return fail("the model's rigid body " + std::to_string(m_TargetModelIndex[i]) +
                  " has another number of members");
  }
  WriteToModel(io_rModel);
  for (size_t i = 0; i < m_Targets.size(); ++i)
    m_Targets[i]->WriteToModel(*io_rModel.Target(m_TargetModelIndex[i]));
  return true;
}

} // namespace ComputeSubject

namespace ComputeSubject {

bool VComputeSubject::ReloadFromModel(std::string* o_pWhy) {
  const auto fail = [&](const std::string& why) {
    if (o_pWhy) *o_pWhy = why;
    return false;
  };
  const SegmentTree& tree = m_pSubject->Segments();
  if (tree.Size() != std::int32_t(m_Segments.size()))
    return fail("the model's tree has another number of segments");
  for (std::int32_t i = 0; i < tree.Size(); ++i) {
    const VComputeSegment& s = m_Segments[size_t(i)];
    if (tree[i].m_Value.get() != &s.Segment() || tree[i].m_Parent != s.ParentIndex())
      return fail("the model's tree changed at segment " + s.Segment().Name());
    const auto joint = tree[i].m_Value->Joint();
    if ((joint ? joint->Type() : -1) != s.m_JointType)
      return fail("the joint type of segment " + s.Segment().Name() + " changed");
  }
  if (m_pSubject->NumTargets() != m_ModelTargets.size())
    return fail("the model has another number of targets");
  for (std::uint32_t t = 0; t < m_pSubject->NumTargets(); ++t)
    if (m_pSubject->Target(t) != m_ModelTargets[t])
      return fail("the model's target " + std::to_string(t) + " was replaced");
  // The factory is asked again which targets have a run-time form, and of which class; the
  // subject's own targets are then rebound in place, so references to them and their run-time
  // settings (member weights) survive.
  size_t held = 0;
  for (std::uint32_t t = 0; t < m_pSubject->NumTargets(); ++t) {
    const std::unique_ptr<IComputeTarget> fresh =
        m_pTargetFactory->Create(*m_pSubject->Target(t), Lookup());
    const bool wasHeld = held < m_TargetModelIndex.size() && m_TargetModelIndex[held] == t;
    if (!fresh && !wasHeld) continue;
    const IComputeTarget* made = fresh.get();
    const IComputeTarget* kept = wasHeld ? m_Targets[held].get() : nullptr;
    if (!made || !kept || typeid(*made) != typeid(*kept))
      return fail("the target factory now gives another run-time form for target " +
                  std::to_string(t));
    ++held;
  }
  for (VComputeSegment& s : m_Segments)
    s.Reload();
  for (auto& target : m_Targets) {
    const auto* single = dynamic_cast<const ITargetSingleParent*>(&target->Target());
    if (auto* multi = dynamic_cast<VComputeTargetMultiParent*>(target.get()))
      multi->Rebind(Lookup());
    else
      target->Rebind(single ? SegmentByIdentifier(single->ParentIdentifier()) : nullptr);
  }
  m_Chains.clear();
  m_FirstTime = true;
  return true;
}

void VComputeSubject::BuildChain(std::uint32_t index, VTgtChainInfo& o_rInfo) const {
  const auto* bound = dynamic_cast<const VComputeTargetSingleParent*>(m_Targets[index].get());
  // The path from the parent to the root, then reversed: every other node of the tree is
  // pruned, with its subtree.
  std::vector<std::int32_t> path;
  for (std::int32_t s = bound->ParentIndex(); s >= 0; s = m_Segments[size_t(s)].ParentIndex())
    path.push_back(s);
  o_rInfo.m_Chain.reserve(path.size()); // the target keeps a pointer to the last one
  for (auto it = path.rbegin(); it != path.rend(); ++it) {
    const VComputeSegment& s = m_Segments[size_t(*it)];
    o_rInfo.m_Chain.push_back(s);
    o_rInfo.m_Offsets.push_back(std::uint32_t(o_rInfo.m_State.size()));
    o_rInfo.m_State.resize(o_rInfo.m_State.size() + s.NumParams());
    if (!s.NumParams()) continue;
    const std::uint32_t first = s.FirstParam(), end = first + s.NumParams();
    if (!o_rInfo.m_Runs.empty() && o_rInfo.m_Runs.back().second == first)
      o_rInfo.m_Runs.back().second = end;
    else
      o_rInfo.m_Runs.emplace_back(first, end);
  }
  // Through the factory, so the chain's copy is of the subject's own kind for that target.
  const VComputeSegment* parent = &o_rInfo.m_Chain.back();
  o_rInfo.m_pTarget = m_pTargetFactory->Create(m_Targets[index]->Target(),
                                               [parent](std::uint32_t) { return parent; });
  o_rInfo.m_pComputer = m_pSegmentComputer->Clone();
  o_rInfo.m_pComputer->SetTree(o_rInfo.m_Chain);
}

VComputeSubject::VTgtChainInfo* VComputeSubject::Chain(std::uint32_t index) {
  const auto* bound = dynamic_cast<const VComputeTargetSingleParent*>(m_Targets[index].get());
  if (!bound || bound->ParentIndex() < 0) return nullptr;
  auto it = m_Chains.find(index);
  if (it == m_Chains.end()) {
    it = m_Chains.try_emplace(index).first;
    BuildChain(index, it->second);
  }
  return &it->second;
}

const IComputeTarget& VComputeSubject::UpdateTarget(std::uint32_t index, ConstView state,
                                                    std::uint32_t type) {
  VTgtChainInfo* info = Chain(index);
  if (!info) {
    // Targets on more than one segment have no single chain: the whole tree is evaluated.
    if (!dynamic_cast<const VComputeTargetSingleParent*>(m_Targets[index].get()))
      UpdateSegments(state, type);
    return *m_Targets[index];
  }
  double* compact = info->m_State.data();
  for (const auto& [first, end] : info->m_Runs)
    compact = std::copy(state.begin() + first, state.begin() + end, compact);
  for (std::uint32_t k = 0; k < info->m_Chain.size(); ++k) {
    const double* own = info->m_State.data() + info->m_Offsets[k];
    info->m_pComputer->Update(k, ConstView(own, info->m_Chain[k].NumParams()), type);
  }
  info->m_pTarget->Update();
  return *info->m_pTarget;
}

} // namespace ComputeSubject
