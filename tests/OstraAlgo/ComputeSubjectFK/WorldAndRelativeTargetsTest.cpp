// The world plane and the relative position between two segments: geometry, Jacobians against
// central finite differences, text round trip, reload and single-target evaluation.

#include "RandomSubject.h"
#include "TargetTestSupport.h"

#include "OstraAlgo/ComputeSubjectFK/VComputeSubject.h"
#include "OstraAlgo/KinematicAlgo/VCalibratedTargets.h"

#include <gtest/gtest.h>

#include <sstream>

namespace KinematicTest {
namespace {

using namespace ComputeSubject;

Eigen::Vector3d Random3(std::mt19937& gen, double scale) {
  std::uniform_real_distribution<double> u(-1.0, 1.0);
  return Eigen::Vector3d(u(gen), u(gen), u(gen)) * scale;
}

// Point targets on every segment (0..n-1), then world planes, then relative positions between
// random segments (one pair on the same segment, one between a segment and its parent).
std::shared_ptr<VSubjectCalibrated> Subject(int n, std::mt19937& gen) {
  auto subject = RandomSubject(n, gen);
  for (int i = 0; i < 3; ++i) {
    auto plane = std::make_shared<VTargetPlane>(std::uint32_t(100 + gen() % n));
    plane->SetPositionInParent(Random3(gen, 50));
    plane->SetWorldPlane(Random3(gen, 2), 30.0 * i);
    subject->AddTarget(plane, false);
  }
  // Tree positions; identifiers are 100 + creation order, which insertion may have reordered.
  const SegmentTree& tree = subject->Segments();
  const std::pair<int, int> pairs[] = {
      {int(gen() % n), int(gen() % n)}, {3, 3}, {n - 1, tree[n - 1].m_Parent}};
  for (const auto& [a, b] : pairs) {
    auto relative = std::make_shared<VTargetRelativePosition>();
    relative->SetParentIdentifiers(std::uint32_t(tree[a].m_Value->Identifier()),
                                   std::uint32_t(tree[b].m_Value->Identifier()));
    relative->SetPositionsInParents(Random3(gen, 60), Random3(gen, 60));
    subject->AddTarget(relative, false);
  }
  return subject;
}

using WorldAndRelativeTargets = ComputeTargetFixture;

TEST_F(WorldAndRelativeTargets, ValuesAndResidualsFollowTheWorldPoses) {
  Build(71, [](std::mt19937& gen) { return Subject(8, gen); });
  std::mt19937& gen = m_Gen;
  VComputeSubject& cs = *m_pCs;
  cs.Update(Span(m_X));
  const auto world = [&](std::uint32_t id, const Eigen::Vector3d& p) {
    std::uint32_t s = 0;
    while (cs.Segment(s).Segment().Identifier() != std::int32_t(id))
      ++s;
    const VPose& W = cs.Segment(s).WorldPose();
    return Eigen::Vector3d(W.m_Rotation * p + W.m_Translation);
  };
  for (std::uint32_t t = 8; t < cs.NumTargets(); ++t) {
    const IComputeTarget& target = cs.Target(t);
    EXPECT_TRUE(target.Errors().empty());
    const Eigen::Vector3d value(target.Values()[0], target.Values()[1], target.Values()[2]);
    Eigen::Vector3d observed = Random3(gen, 10);
    Eigen::Vector3d residual;
    target.Residual(ConstView(observed.data(), 3), View(residual.data(), 3));
    if (const auto* plane = dynamic_cast<const VTargetPlane*>(&target.Target())) {
      const Eigen::Vector3d x0 = world(plane->ParentIdentifier(), plane->PositionInParent());
      EXPECT_LT((value - x0).norm(), 1e-9);
      const Eigen::Vector3d n = plane->WorldNormal().normalized();
      EXPECT_NEAR(residual[0], n.dot(x0) - plane->WorldOffset(), 1e-9);
    } else {
      const auto& rel = dynamic_cast<const VTargetRelativePosition&>(target.Target());
      const Eigen::Vector3d d = world(rel.ParentIdentifier1(), rel.PositionInParent1()) -
                                world(rel.ParentIdentifier2(), rel.PositionInParent2());
      EXPECT_LT((value - d).norm(), 1e-9);
      EXPECT_LT((residual - (d - observed)).norm(), 1e-9);
    }
  }
}

TEST_F(WorldAndRelativeTargets, JacobiansMatchCentralDifferences) {
  std::mt19937 gen(72);
  for (int trial = 0; trial < 4; ++trial) {
    VComputeSubject cs(Subject(9, gen));
    EXPECT_LT(WorstTargetJacobianError(cs, RandomState(cs.NumParams(), gen), gen, 9), 1e-6);
  }
}

TEST_F(WorldAndRelativeTargets, TextReloadAndSingleTargetEvaluation) {
  std::mt19937 gen(73);
  const auto model = Subject(6, gen);
  std::ostringstream out;
  model->Write(out);
  VSubjectCalibrated read;
  std::string error;
  ASSERT_TRUE(read.ReadText(out.str(), &error)) << error;
  EXPECT_TRUE(read.Equals(*model));

  VComputeSubject cs(model), reference(model);
  const Eigen::VectorXd x = RandomState(cs.NumParams(), gen);
  reference.UpdateSegments(Span(x), EChain);
  for (std::uint32_t t = 6; t < cs.NumTargets(); ++t) {
    const IComputeTarget& alone = cs.UpdateTarget(t, Span(x), EChain);
    Eigen::MatrixXd a(3, x.size()), b(3, x.size());
    alone.ValueJacobian(a);
    reference.Target(t).ValueJacobian(b);
    EXPECT_LT((a - b).norm(), 1e-9 * std::max(1.0, b.norm())) << t;
  }

  // A relative position moved to another pair of segments follows them after a reload.
  auto* rel = dynamic_cast<VTargetRelativePosition*>(model->Target(model->NumTargets() - 1).get());
  ASSERT_NE(rel, nullptr);
  rel->SetParentIdentifiers(100, 104);
  ASSERT_TRUE(cs.ReloadFromModel());
  VComputeSubject fresh(model);
  cs.Update(Span(x));
  fresh.Update(Span(x));
  const std::uint32_t last = cs.NumTargets() - 1;
  for (int i = 0; i < 3; ++i)
    EXPECT_EQ(cs.Target(last).Values()[size_t(i)], fresh.Target(last).Values()[size_t(i)]);
  rel->SetParentIdentifiers(100, 999);
  ASSERT_TRUE(cs.ReloadFromModel());
  EXPECT_EQ(cs.Target(last).Errors(), "VComputeTargetRelativePosition cannot find segment. ");
}

} // namespace
} // namespace KinematicTest
