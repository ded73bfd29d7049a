// The factories a compute subject builds its run-time segments and targets with, and the
// computers it evaluates them with: a custom one decides what the subject holds or does, is
// shared (factories, target computer) or cloned (segment computer) by copies and used for target
// chains; the defaults give what the plain constructor gives.

#include "EveryKindSubject.h"
#include "TargetTestSupport.h"

#include "OstraAlgo/ComputeSubjectFK/VComputeSubject.h"

#include <gtest/gtest.h>

namespace KinematicTest {
namespace {

using namespace ComputeSubject;

/// Keeps position targets only and counts the segments and targets it was asked for.
class PositionsOnly : public VComputeSubject::VTargetFactory {
public:
  std::unique_ptr<IComputeTarget> Create(const KinematicAlgo::ITargetCalibrated& target,
                                         const SegmentLookup& lookup) const override {
    ++m_Calls;
    auto made = VTargetFactory::Create(target, lookup);
    if (!dynamic_cast<VComputeTargetPosition*>(made.get())) return nullptr;
    return made;
  }
  mutable int m_Calls = 0;
};

class CountingSegments : public VComputeSubject::VSegmentFactory {
public:
  using VSegmentFactory::VSegmentFactory;
  VComputeSegment Create(const KinematicAlgo::ISegmentCalibrated& segment,
                         bool freeSegments) const override {
    ++m_Calls;
    return VSegmentFactory::Create(segment, freeSegments);
  }
  mutable int m_Calls = 0;
};

/// Delegates to the default segment computer and counts its calls; clones share the counts.
class CountingSegmentComputer : public VComputeSubject::VSegmentComputerImpl {
public:
  struct Counts {
    int m_SetTree = 0, m_SetUp = 0, m_Update = 0, m_Clone = 0;
  };
  explicit CountingSegmentComputer(std::shared_ptr<Counts> counts) : m_pCounts(std::move(counts)) {}
  std::unique_ptr<ISegmentComputer> Clone() const override {
    ++m_pCounts->m_Clone;
    return std::make_unique<CountingSegmentComputer>(m_pCounts);
  }
  void SetTree(std::span<VComputeSegment> tree) override {
    ++m_pCounts->m_SetTree;
    VSegmentComputerImpl::SetTree(tree);
  }
  void Update(std::uint32_t cursor, ConstView params, std::uint32_t type) override {
    ++m_pCounts->m_Update;
    VSegmentComputerImpl::Update(cursor, params, type);
  }
  void SetUp(std::uint32_t cursor, std::uint32_t firstParam, std::uint32_t type) override {
    ++m_pCounts->m_SetUp;
    VSegmentComputerImpl::SetUp(cursor, firstParam, type);
  }
  std::shared_ptr<Counts> m_pCounts;
};

class CountingTargetComputer : public VComputeSubject::VTargetComputer {
public:
  void UpdateTargets(std::span<IComputeTarget* const> targets, std::uint32_t type) const override {
    ++m_Calls;
    m_Targets = targets.size();
    VTargetComputer::UpdateTargets(targets, type);
  }
  mutable int m_Calls = 0;
  mutable size_t m_Targets = 0;
};

/// Keeps position targets only, or (once told) nothing.
class PositionsThenNothing : public PositionsOnly {
public:
  std::unique_ptr<IComputeTarget> Create(const KinematicAlgo::ITargetCalibrated& target,
                                         const SegmentLookup& lookup) const override {
    return m_DropAll ? nullptr : PositionsOnly::Create(target, lookup);
  }
  bool m_DropAll = false;
};

TEST(StrategyObjects, ACustomTargetFactoryDecidesWhatTheSubjectHoldsAndCopiesShareIt) {
  std::mt19937 gen(11);
  const auto model = SubjectWithEveryKind(6, gen);
  auto targets = std::make_shared<PositionsOnly>();
  auto segments = std::make_shared<CountingSegments>(true);
  VComputeSubject cs(model, 1, segments, targets);
  const std::uint32_t numSegments = std::uint32_t(model->Segments().Size());
  EXPECT_EQ(targets->m_Calls, int(model->NumTargets()));
  EXPECT_EQ(segments->m_Calls, int(numSegments));
  VComputeSubject plain(model);
  std::uint32_t positions = 0;
  for (std::uint32_t t = 0; t < plain.NumTargets(); ++t)
    positions += plain.PositionTarget(t) != nullptr;
  ASSERT_LT(positions, plain.NumTargets());
  ASSERT_EQ(cs.NumTargets(), positions); // the other kinds are dropped
  for (std::uint32_t t = 0; t < cs.NumTargets(); ++t)
    EXPECT_NE(cs.PositionTarget(t), nullptr);

  VComputeSubject copy(cs);
  EXPECT_EQ(&copy.TargetFactory(), targets.get());
  EXPECT_EQ(&copy.SegmentFactory(), segments.get());
  EXPECT_EQ(copy.NumTargets(), positions);
  EXPECT_EQ(segments->m_Calls, 2 * int(numSegments));

  // A target's chain copy is made by the same factory.
  const int before = targets->m_Calls;
  const Eigen::VectorXd x = RandomState(cs.NumParams(), gen);
  cs.UpdateTarget(0, Span(x), ENone);
  EXPECT_EQ(targets->m_Calls, before + 1);
}

TEST(StrategyObjects, DefaultFactoriesGiveThePlainSubject) {
  std::mt19937 gen(5);
  const auto model = SubjectWithEveryKind(4, gen);
  for (std::uint32_t rotator : {0u, 1u}) {
    VComputeSubject plain(model, 0, 1, rotator);
    VComputeSubject given(
        model, 1, std::make_shared<VComputeSubject::VSegmentFactory>(rotator != 0), nullptr);
    VComputeSubject defaulted(model, 1, nullptr, nullptr);
    ASSERT_EQ(given.NumTargets(), plain.NumTargets());
    ASSERT_EQ(given.NumParams(), plain.NumParams());
    const Eigen::VectorXd x = RandomState(plain.NumParams(), gen);
    plain.UpdateSegments(Span(x), EChain);
    given.UpdateSegments(Span(x), EChain);
    for (std::uint32_t t = 0; t < plain.NumTargets(); ++t) {
      const auto a = plain.Target(t).Values(), b = given.Target(t).Values();
      EXPECT_TRUE(std::equal(a.begin(), a.end(), b.begin(), b.end())) << t;
    }
    Eigen::MatrixXd ja(3 * plain.NumTargets(), plain.NumJointParams()), jb = ja;
    plain.TargetJacobian(ja);
    given.TargetJacobian(jb);
    EXPECT_EQ(ja, jb);
    if (!rotator) {
      defaulted.Update(Span(x));
      for (std::uint32_t s = 0; s < plain.NumSegments(); ++s) {
        const VPose &a = defaulted.Segment(s).WorldPose(), &b = plain.Segment(s).WorldPose();
        EXPECT_EQ(a.m_Rotation, b.m_Rotation) << s;
        EXPECT_EQ(a.m_Translation, b.m_Translation) << s;
      }
    }
  }
}

TEST(StrategyObjects, CustomComputersAreTheOnesCalledAndCopiesCloneTheSegmentComputer) {
  std::mt19937 gen(23);
  const auto model = SubjectWithEveryKind(5, gen);
  auto counts = std::make_shared<CountingSegmentComputer::Counts>();
  auto segments = std::make_shared<CountingSegmentComputer>(counts);
  auto targets = std::make_shared<CountingTargetComputer>();
  VComputeSubject cs(model, 1, nullptr, nullptr, segments, targets);
  const int n = int(cs.NumSegments());
  EXPECT_EQ(&cs.SegmentComputer(), segments.get());
  EXPECT_EQ(counts->m_SetTree, 1);
  EXPECT_EQ(counts->m_SetUp, n); // once per segment, at construction

  const Eigen::VectorXd x = RandomState(cs.NumParams(), gen);
  cs.UpdateSegments(Span(x), EChain);
  EXPECT_EQ(counts->m_Update, n);
  EXPECT_EQ(targets->m_Calls, 1);
  EXPECT_EQ(targets->m_Targets, size_t(cs.NumTargets()));
  // The same state again: Jacobians only, still through the computers.
  cs.UpdateSegments(Span(x), EJoint);
  EXPECT_EQ(counts->m_Update, 2 * n);
  EXPECT_EQ(targets->m_Calls, 2);
  cs.Update(Span(x)); // unchanged state, nothing asked: nothing runs
  EXPECT_EQ(counts->m_Update, 2 * n);

  VComputeSubject copy(cs);
  EXPECT_EQ(counts->m_Clone, 1);
  EXPECT_NE(&copy.SegmentComputer(), &cs.SegmentComputer());
  EXPECT_NE(dynamic_cast<const CountingSegmentComputer*>(&copy.SegmentComputer()), nullptr);
  EXPECT_EQ(&copy.TargetComputer(), targets.get());
  EXPECT_EQ(counts->m_SetUp, 2 * n);
  copy.UpdateSegments(Span(x), EChain);
  EXPECT_EQ(counts->m_Update, 3 * n);
  // The copy's computer works on the copy's own segments.
  for (std::uint32_t s = 0; s < cs.NumSegments(); ++s)
    EXPECT_EQ(copy.Segment(s).WorldPose().m_Translation, cs.Segment(s).WorldPose().m_Translation);

  // A target chain runs on a clone of its own.
  const auto* chain = cs.ChainInfo(0);
  ASSERT_NE(chain, nullptr);
  EXPECT_EQ(counts->m_Clone, 2);
  cs.UpdateTarget(0, Span(x), EChain);
  EXPECT_EQ(counts->m_Update, 3 * n + int(chain->m_Chain.size()));
}

TEST(StrategyObjects, ExplicitDefaultComputersGiveBitIdenticalResults) {
  std::mt19937 gen(31);
  const auto model = SubjectWithEveryKind(5, gen);
  for (std::uint32_t mode : {EJointsMode, EFreeSegmentsMode}) {
    VComputeSubject plain(model, 0, mode, 0);
    VComputeSubject given(model, mode, std::make_shared<VComputeSubject::VSegmentFactory>(),
                          std::make_shared<VComputeSubject::VTargetFactory>(),
                          std::make_shared<VComputeSubject::VSegmentComputerImpl>(),
                          std::make_shared<VComputeSubject::VTargetComputer>());
    ASSERT_EQ(given.NumParams(), plain.NumParams());
    const std::uint32_t type = mode == EFreeSegmentsMode ? EFree : EChain;
    for (int trial = 0; trial < 4; ++trial) {
      const Eigen::VectorXd x = RandomState(plain.NumParams(), gen);
      plain.UpdateSegments(Span(x), type);
      given.UpdateSegments(Span(x), type);
      for (std::uint32_t s = 0; s < plain.NumSegments(); ++s) {
        const VComputeSegment &a = plain.Segment(s), &b = given.Segment(s);
        EXPECT_EQ(a.WorldPose().m_Rotation, b.WorldPose().m_Rotation) << s;
        EXPECT_EQ(a.WorldPose().m_Translation, b.WorldPose().m_Translation) << s;
        ASSERT_EQ(a.NumJacobianBlocks(), b.NumJacobianBlocks()) << s;
        for (std::uint32_t k = 0; k < a.NumJacobianBlocks(); ++k)
          for (std::uint32_t i = 0; i < a.JacobianBlocks()[k].m_NumParams; ++i) {
            EXPECT_EQ(a.JacobianBlocks()[k].m_dR[i], b.JacobianBlocks()[k].m_dR[i]);
            EXPECT_EQ(a.JacobianBlocks()[k].m_dT[i], b.JacobianBlocks()[k].m_dT[i]);
          }
      }
      for (std::uint32_t t = 0; t < plain.NumTargets(); ++t) {
        const auto a = plain.Target(t).Values(), b = given.Target(t).Values();
        EXPECT_TRUE(std::equal(a.begin(), a.end(), b.begin(), b.end())) << t;
      }
    }
  }
}

TEST(StrategyObjects, AReloadAsksTheTargetFactoryAgain) {
  std::mt19937 gen(37);
  const auto model = SubjectWithEveryKind(4, gen);
  auto targets = std::make_shared<PositionsThenNothing>();
  VComputeSubject cs(model, 1, nullptr, targets);
  const std::uint32_t positions = cs.NumTargets();
  ASSERT_LT(positions, model->NumTargets());
  const IComputeTarget* first = &cs.Target(0);
  const int calls = targets->m_Calls;
  std::string why;
  ASSERT_TRUE(cs.ReloadFromModel(&why)) << why;
  EXPECT_EQ(targets->m_Calls, calls + int(model->NumTargets()));
  EXPECT_EQ(cs.NumTargets(), positions); // the dropped kinds stay dropped
  for (std::uint32_t t = 0; t < cs.NumTargets(); ++t)
    EXPECT_NE(cs.PositionTarget(t), nullptr);
  EXPECT_EQ(&cs.Target(0), first); // rebound in place

  // A factory that now answers otherwise is refused, and the subject keeps its targets.
  targets->m_DropAll = true;
  EXPECT_FALSE(cs.ReloadFromModel(&why));
  EXPECT_NE(why.find("target factory"), std::string::npos) << why;
  EXPECT_EQ(cs.NumTargets(), positions);
}

} // namespace
} // namespace KinematicTest
