#include "OstraAlgo/ComputeSubjectFK/VComputeSubject.h"

#include <algorithm>
#include <cmath>
#include <map>

namespace ComputeSubject {

using namespace KinematicAlgo;

VComputeSubject::VComputeSubject(std::shared_ptr<const ISubjectCalibrated> subject, std::uint8_t,
                                 std::uint32_t mode, std::uint32_t useRotator)
    : m_pSubject(std::move(subject)), m_Mode(mode), m_UseRotator(useRotator) {
  if (!m_pSubject) throw VConstructionException("VComputeSubject needs a subject");
  Build();
}

VComputeSubject::VComputeSubject(const VComputeSubject& other)
    : m_pSubject(other.m_pSubject), m_Mode(other.m_Mode), m_UseRotator(other.m_UseRotator) {
  Build();
}

void VComputeSubject::Build() {
  const SegmentTree& tree = m_pSubject->Segments();
  m_Segments.reserve(size_t(tree.Size())); // targets keep pointers into this vector
  std::map<std::int32_t, std::int32_t> byIdentifier;
  for (std::int32_t i = 0; i < tree.Size(); ++i) {
    if (!tree[i].m_Value) throw VConstructionException("VComputeSubject: a segment is missing");
    m_Segments.emplace_back(*tree[i].m_Value, m_UseRotator != 0, m_Mode == EFreeSegmentsMode);
    m_Segments.back().SetUp(i, tree[i].m_Parent, m_NumJointParams, std::uint32_t(tree.Depth(i)));
    m_NumJointParams += m_Segments.back().NumParams();
    byIdentifier.emplace(tree[i].m_Value->Identifier(), i);
  }
  for (std::uint32_t t = 0; t < m_pSubject->NumTargets(); ++t) {
    const auto target = m_pSubject->Target(t);
    const auto* single = dynamic_cast<const ITargetSingleParent*>(target.get());
    if (!single) continue;
    const auto it = byIdentifier.find(std::int32_t(single->ParentIdentifier()));
    const VComputeSegment* parent =
        it == byIdentifier.end() ? nullptr : &m_Segments[size_t(it->second)];
    auto computed = MakeComputeTarget(*target, parent);
    if (!computed) continue;
    m_NumTargetParams += computed->NumParams();
    m_Targets.push_back(std::move(computed));
  }
  m_Cache.assign(NumParams(), 0.0);
  m_FirstTime = true;
}

const VComputeTargetPosition* VComputeSubject::PositionTarget(std::uint32_t i) const {
  return dynamic_cast<const VComputeTargetPosition*>(m_Targets[i].get());
}

void VComputeSubject::UpdateSegments(ConstView state, std::uint32_t type) {
  const bool same = !m_FirstTime && state.size() >= m_Cache.size() &&
                    std::equal(m_Cache.begin(), m_Cache.end(), state.begin());
  if (same && type == ENone) return;
  // An unchanged state only needs the Jacobians asked for.
  const std::uint32_t effective = (same && type < EChainOnly) ? type + 3 : type;
  const bool poses = effective < EChainOnly;
  const double* params = state.data();
  for (VComputeSegment& segment : m_Segments) {
    const VComputeSegment* parent =
        segment.m_Parent < 0 ? nullptr : &m_Segments[size_t(segment.m_Parent)];
    const double* own = params + segment.m_FirstParam;
    if (poses) segment.UpdatePose(own, parent);
    if (effective != ENone) segment.UpdateJacobian(own, parent, effective);
  }
  if (poses) {
    ++m_PoseEvaluations;
    for (auto& target : m_Targets)
      target->Update();
    m_FirstTime = false;
    std::copy_n(state.begin(), m_Cache.size(), m_Cache.begin());
  }
}

void VComputeSubject::UpdateTargets(ConstView) {
  for (auto& target : m_Targets)
    target->Update();
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

} // namespace ComputeSubject
