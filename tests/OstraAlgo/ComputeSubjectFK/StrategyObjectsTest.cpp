// The factories a compute subject builds its run-time segments and targets with: a custom one
// decides what the subject holds, is shared by copies and used for target chains; the defaults
// give what the plain constructor gives.

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

} // namespace
} // namespace KinematicTest
