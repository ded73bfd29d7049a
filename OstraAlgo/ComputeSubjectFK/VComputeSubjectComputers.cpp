// The default segment and target computers of VComputeSubject.

#include "OstraAlgo/ComputeSubjectFK/VComputeSubject.h"

#include <algorithm>

namespace ComputeSubject {

std::unique_ptr<IComputeSubject::ISegmentComputer>
VComputeSubject::VSegmentComputerImpl::Clone() const {
  return std::make_unique<VSegmentComputerImpl>();
}

std::uint32_t
VComputeSubject::VSegmentComputerImpl::NumParams(const VComputeSegment& segment) const {
  return segment.NumParams();
}

void VComputeSubject::VSegmentComputerImpl::SetTree(std::span<VComputeSegment> tree) {
  m_Tree = tree;
  // A chain holds copies whose parent indices are those of the full tree: map them to
  // positions in this list through the segments' own indices.
  std::int32_t maxIndex = -1;
  for (const VComputeSegment& s : tree)
    maxIndex = std::max(maxIndex, s.Index());
  std::vector<std::int32_t> position(size_t(maxIndex + 1), -1);
  m_Parents.assign(tree.size(), -1);
  for (size_t k = 0; k < tree.size(); ++k) {
    const std::int32_t parent = tree[k].ParentIndex();
    if (parent >= 0 && parent <= maxIndex) m_Parents[k] = position[size_t(parent)];
    if (tree[k].Index() >= 0) position[size_t(tree[k].Index())] = std::int32_t(k);
  }
}

void VComputeSubject::VSegmentComputerImpl::SetUp(std::uint32_t cursor, std::uint32_t firstParam,
                                                  std::uint32_t) {
  // One block per segment on the path to the root covers every Jacobian type (the joint and
  // free types use the first only).
  std::uint32_t blocks = 1;
  for (std::int32_t p = m_Parents[cursor]; p >= 0; p = m_Parents[size_t(p)])
    ++blocks;
  m_Tree[cursor].SetUp(firstParam, blocks);
}

void VComputeSubject::VTargetComputer::UpdateTargets(std::span<IComputeTarget* const> targets,
                                                     std::uint32_t type) const {
  if (type >= EChainOnly) return;
  for (IComputeTarget* target : targets)
    target->Update();
}

void VComputeSubject::VTargetComputer::UpdateParametrisedTargets(
    std::span<IComputeTarget* const> targets, ConstView, ConstView targetState,
    std::uint32_t type) const {
  if (type >= EChainOnly) return;
  size_t first = 0;
  for (IComputeTarget* target : targets) {
    target->SetParams(targetState.subspan(first, target->NumParams()));
    first += target->NumParams();
    target->Update();
  }
}

void VComputeSubject::VTargetComputer::GatherTargetParams(std::span<IComputeTarget* const> targets,
                                                          View o_rState) const {
  size_t first = 0;
  for (const IComputeTarget* target : targets) {
    target->GetParams(o_rState.subspan(first, target->NumParams()));
    first += target->NumParams();
  }
}

} // namespace ComputeSubject
