// Single-target evaluation over a target's pruned chain against the full evaluation, the chain's
// state ranges, and reloading a compute subject from a changed model.

#include "EveryKindSubject.h"
#include "TargetTestSupport.h"

#include "OstraAlgo/ComputeSubjectFK/VComputeSubject.h"

#include <gtest/gtest.h>

namespace KinematicTest {
namespace {

using namespace ComputeSubject;

Eigen::VectorXd ValuesOf(const IComputeTarget& t) {
  return Eigen::Map<const Eigen::VectorXd>(t.Values().data(), Eigen::Index(t.NumValues()));
}

Eigen::MatrixXd ValueJacobianOf(const IComputeTarget& t, Eigen::Index columns) {
  Eigen::MatrixXd j(t.NumValues(), columns);
  t.ValueJacobian(j);
  return j;
}

Eigen::MatrixXd ResidualJacobianOf(const IComputeTarget& t, const Eigen::VectorXd& observation,
                                   Eigen::Index columns) {
  Eigen::MatrixXd j(t.NumResiduals(), columns);
  t.ResidualJacobian(Span(observation), j);
  return j;
}

double RelativeDifference(const Eigen::MatrixXd& a, const Eigen::MatrixXd& b) {
  return (a - b).norm() / std::max(1.0, b.norm());
}

// Every target evaluated alone must give what the full evaluation gives: values, residuals and
// Jacobians of every type, in the joint form and the free-segment form.
TEST(TargetChain, SingleTargetEvaluationEqualsTheFullEvaluation) {
  std::mt19937 gen(41);
  for (std::uint32_t mode : {std::uint32_t(EJointsMode), std::uint32_t(EFreeSegmentsMode)}) {
    const auto model = SubjectWithEveryKind(14, gen);
    VComputeSubject full(model, 0, mode);
    VComputeSubject single(model, 0, mode);
    const Eigen::Index columns =
        std::max<Eigen::Index>(6 * 14, full.NumParams()); // EFree: 6 per segment
    for (int trial = 0; trial < 8; ++trial) {
      const Eigen::VectorXd x = RandomState(full.NumParams(), gen);
      for (std::uint32_t type : {ENone, EChain, EJoint, EFree}) {
        if (mode == EFreeSegmentsMode && type == EJoint) continue;
        full.UpdateSegments(Span(x), type);
        for (std::uint32_t t = 0; t < full.NumTargets(); ++t) {
          const IComputeTarget& reference = full.Target(t);
          const IComputeTarget& alone = single.UpdateTarget(t, Span(x), type);
          SCOPED_TRACE(std::string(reference.Target().Key()) + " type " + std::to_string(type));
          ASSERT_EQ(alone.NumValues(), reference.NumValues());
          EXPECT_LT(RelativeDifference(ValuesOf(alone), ValuesOf(reference)), 1e-13);
          Eigen::VectorXd observation = RandomState(reference.ObservationSize(), gen) * 80;
          Eigen::VectorXd r1(reference.NumResiduals()), r2(reference.NumResiduals());
          reference.Residual(Span(observation), View(r1.data(), size_t(r1.size())));
          alone.Residual(Span(observation), View(r2.data(), size_t(r2.size())));
          EXPECT_LT(RelativeDifference(r2, r1), 1e-13);
          if (type == ENone) continue;
          EXPECT_LT(RelativeDifference(ValueJacobianOf(alone, columns),
                                       ValueJacobianOf(reference, columns)),
                    1e-13);
          EXPECT_LT(RelativeDifference(ResidualJacobianOf(alone, observation, columns),
                                       ResidualJacobianOf(reference, observation, columns)),
                    1e-13);
        }
      }
    }
    // Single-target evaluation leaves the subject's own poses and cache alone.
    EXPECT_EQ(single.NumPoseEvaluations(), 0u);
  }
}

// The chain is the path from the root to the parent, its runs cover exactly the parameters of
// that path (merged where they touch) and the compacted state is those parameters in order.
TEST(TargetChain, ChainKeepsThePathAndCompactsItsParameters) {
  std::mt19937 gen(42);
  const auto model = RandomSubject(25, gen);
  VComputeSubject cs(model);
  const Eigen::VectorXd x = RandomState(cs.NumParams(), gen);
  for (std::uint32_t t = 0; t < cs.NumTargets(); ++t) {
    cs.UpdateTarget(t, Span(x), ENone);
    const VComputeSubject::VTgtChainInfo* info = cs.ChainInfo(t);
    ASSERT_NE(info, nullptr);
    const auto& chain = info->m_Chain;
    EXPECT_EQ(chain.front().ParentIndex(), -1);
    EXPECT_EQ(chain.back().Segment().Identifier(), std::int32_t(100 + t));
    std::vector<double> expected;
    for (size_t k = 0; k < chain.size(); ++k) {
      if (k) {
        EXPECT_EQ(chain[k].ParentIndex(), chain[k - 1].Index());
      }
      EXPECT_EQ(info->m_Offsets[k], expected.size());
      for (std::uint32_t i = 0; i < chain[k].NumParams(); ++i)
        expected.push_back(x[chain[k].FirstParam() + i]);
    }
    EXPECT_EQ(info->m_State, expected);
    std::uint32_t covered = 0;
    for (size_t r = 0; r < info->m_Runs.size(); ++r) {
      EXPECT_LT(info->m_Runs[r].first, info->m_Runs[r].second);
      if (r) { // touching runs merge
        EXPECT_GT(info->m_Runs[r].first, info->m_Runs[r - 1].second);
      }
      covered += info->m_Runs[r].second - info->m_Runs[r].first;
    }
    EXPECT_EQ(covered, expected.size());
  }
}

TEST(TargetChain, ALinearChainIsOneRunAndAnUnboundTargetIsReturnedAsItIs) {
  auto model = std::make_shared<VSubjectCalibrated>();
  model->ClearSegments();
  for (int i = 0; i < 5; ++i) {
    auto segment = std::make_shared<VSegmentCalibrated>();
    segment->SetIdentifier(i);
    segment->Joint()->SetType(i == 2 ? 5 : 1); // a dummy in the middle adds no parameters
    model->Segments().Add(i - 1, segment);
  }
  model->AddTarget(std::make_shared<VTargetPosition>(4u), true);
  model->AddTarget(std::make_shared<VTargetPosition>(77u), true);
  VComputeSubject cs(model);
  const VComputeSubject::VTgtChainInfo* info = cs.ChainInfo(0);
  ASSERT_NE(info, nullptr);
  ASSERT_EQ(info->m_Runs.size(), 1u);
  EXPECT_EQ(info->m_Runs[0], std::make_pair(0u, 12u));
  EXPECT_EQ(cs.ChainInfo(1), nullptr);
  const Eigen::VectorXd x = Eigen::VectorXd::Zero(cs.NumParams());
  EXPECT_EQ(&cs.UpdateTarget(1, Span(x), EChain), &cs.Target(1));
  EXPECT_FALSE(cs.Target(1).Errors().empty());
}

// Changes every quantity a reload reads, in place, on a copy of `model`'s objects.
void Perturb(VSubjectCalibrated& model, std::mt19937& gen) {
  for (std::int32_t i = 0; i < model.Segments().Size(); ++i) {
    ISegmentCalibrated& segment = *model.Segments()[i].m_Value;
    segment.SetPoseInParent(RandomPose(gen, 200));
    segment.SetPoseInThis(RandomPose(gen, 40));
    auto joint = segment.Joint();
    joint->SetRotation(RandomVector(gen, 1.2));
    const Eigen::Index n = joint->NumDynamicParams();
    const Eigen::MatrixXd m = Eigen::MatrixXd::Random(n, n);
    joint->SetMeanDynamic(Eigen::VectorXd::Random(n) * 0.3);
    joint->SetCovDynamic(m * m.transpose() + Eigen::MatrixXd::Identity(n, n));
  }
  for (std::uint32_t t = 0; t < model.NumTargets(); ++t) {
    auto* single = dynamic_cast<ITargetSingleParent*>(model.Target(t).get());
    single->SetPositionInParent(RandomVector(gen, 90));
    if (auto* d = dynamic_cast<ITargetDirection*>(model.Target(t).get()))
      d->SetDirectionInParent(RandomVector(gen, 1).normalized());
    if (t == 0) single->SetParentIdentifier(single->ParentIdentifier() == 100 ? 101 : 100);
  }
}

TEST(Reload, AReloadedSubjectEvaluatesAsANewlyBuiltOne) {
  std::mt19937 gen(43);
  for (std::uint32_t rotator : {0u, 1u}) {
    const auto model = SubjectWithEveryKind(12, gen);
    VComputeSubject cs(model, 0, 1, rotator);
    const Eigen::VectorXd x = RandomState(cs.NumParams(), gen);
    cs.UpdateSegments(Span(x), EChain);
    cs.UpdateTarget(0, Span(x), EChain); // a chain built before the change must not survive it
    Perturb(*model, gen);
    std::string why;
    ASSERT_TRUE(cs.ReloadFromModel(&why)) << why;
    VComputeSubject fresh(model, 0, 1, rotator);
    fresh.UpdateSegments(Span(x), EChain);
    cs.UpdateSegments(Span(x), EChain); // same state as before the reload: must still run
    for (std::uint32_t s = 0; s < cs.NumSegments(); ++s) {
      EXPECT_EQ(cs.Segment(s).WorldPose().m_Translation,
                fresh.Segment(s).WorldPose().m_Translation);
      EXPECT_EQ(cs.Segment(s).DynamicPrior().Mean(), fresh.Segment(s).DynamicPrior().Mean());
    }
    Eigen::VectorXd z1(cs.NumParams()), z2(cs.NumParams());
    cs.WhitenState(View(z1.data(), size_t(z1.size())), Span(x));
    fresh.WhitenState(View(z2.data(), size_t(z2.size())), Span(x));
    EXPECT_EQ(z1, z2);
    for (std::uint32_t t = 0; t < cs.NumTargets(); ++t) {
      EXPECT_EQ(ValuesOf(cs.Target(t)), ValuesOf(fresh.Target(t))) << t;
      EXPECT_EQ(ValueJacobianOf(cs.Target(t), x.size()),
                ValueJacobianOf(fresh.Target(t), x.size()));
      EXPECT_EQ(ValuesOf(cs.UpdateTarget(t, Span(x), ENone)), ValuesOf(fresh.Target(t))) << t;
    }
  }
}

TEST(Reload, AChangeOfShapeIsRefusedAndChangesNothing) {
  std::mt19937 gen(44);
  const auto model = RandomSubject(6, gen);
  VComputeSubject cs(model);
  const Eigen::VectorXd x = RandomState(cs.NumParams(), gen);
  cs.Update(Span(x));
  const VPose before = cs.Segment(5).WorldPose();
  std::string why;

  auto joint = model->Segments()[3].m_Value->Joint();
  const std::int32_t type = joint->Type();
  joint->SetType(type == 1 ? 3 : 1);
  model->Segments()[5].m_Value->SetPoseInParent(RandomPose(gen, 100));
  EXPECT_FALSE(cs.ReloadFromModel(&why));
  EXPECT_NE(why.find("joint type"), std::string::npos) << why;
  joint->SetType(type);

  model->AddTarget(std::make_shared<VTargetPosition>(100u), true);
  EXPECT_FALSE(cs.ReloadFromModel(&why));
  EXPECT_NE(why.find("number of targets"), std::string::npos) << why;

  model->Segments().Add(0, std::make_shared<VSegmentCalibrated>());
  EXPECT_FALSE(cs.ReloadFromModel(&why));

  cs.Update(Span(x)); // the cache still holds x: nothing was re-read
  EXPECT_EQ(cs.Segment(5).WorldPose().m_Translation, before.m_Translation);
}

TEST(Reload, RigidBodyMemberWeightsSurviveAReload) {
  std::mt19937 gen(45);
  const auto model = SubjectWithEveryKind(4, gen);
  VComputeSubject cs(model);
  const std::uint32_t body = cs.NumTargets() - 1;
  auto& rigid =
      const_cast<VComputeRigidBody&>(dynamic_cast<const VComputeRigidBody&>(cs.Target(body)));
  rigid.SetMemberWeight(2, 0.0);
  ASSERT_TRUE(cs.ReloadFromModel());
  EXPECT_EQ(rigid.MemberWeight(2), 0.0);
  EXPECT_EQ(rigid.MemberWeight(1), 1.0);
  EXPECT_EQ(rigid.NumResiduals(), 9u);
}

} // namespace
} // namespace KinematicTest
