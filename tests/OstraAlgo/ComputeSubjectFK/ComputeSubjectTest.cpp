// Forward kinematics against a direct product of transforms, whole-subject Jacobians against
// central finite differences, the state cache, and copies.

#include "RandomSubject.h"
#include "TargetTestSupport.h"

#include "OstraAlgo/ComputeSubjectFK/VComputeSubject.h"

#include <gtest/gtest.h>

namespace KinematicTest {
namespace {

using ComputeSubject::VComputeSubject;

Eigen::VectorXd RandomJointState(const VComputeSubject& cs, std::mt19937& gen) {
  std::uniform_real_distribution<double> angle(-3.0, 3.0), length(-200.0, 200.0);
  Eigen::VectorXd x(cs.NumParams());
  for (std::uint32_t s = 0; s < cs.NumSegments(); ++s) {
    const auto& segment = cs.Segment(s);
    for (std::uint32_t i = 0; i < segment.NumParams(); ++i)
      x[segment.FirstParam() + i] =
          i < segment.Joint()->NumRotationParams() ? angle(gen) : length(gen);
  }
  return x;
}

// World poses straight from the model: W = W_parent P A J A⁻¹ Q⁻¹.
std::vector<VPose> ReferencePoses(const ISubjectCalibrated& subject, const Eigen::VectorXd& x) {
  const SegmentTree& tree = subject.Segments();
  std::vector<VPose> world(size_t(tree.Size()));
  std::uint32_t cursor = 0;
  for (std::int32_t i = 0; i < tree.Size(); ++i) {
    const ISegmentCalibrated& segment = *tree[i].m_Value;
    const auto functional = MakeJointFunctional(segment.Joint()->Type());
    VPose J, A;
    functional->ComputePose(ConstView(x.data() + cursor, functional->NumDynamicParams()),
                            ConstView(), J);
    cursor += functional->NumDynamicParams();
    A.m_Rotation = Exp(segment.Joint()->Rotation());
    const VPose local =
        segment.PoseInParent() * A * J * A.Inverse() * segment.PoseInThis().Inverse();
    world[size_t(i)] = tree[i].m_Parent < 0 ? local : world[size_t(tree[i].m_Parent)] * local;
  }
  return world;
}

TEST(ComputeSubject, StateLayoutFollowsTheTreeInPreOrder) {
  std::mt19937 gen(1);
  const auto model = RandomSubject(12, gen);
  VComputeSubject cs(model);
  std::uint32_t expected = 0;
  for (std::uint32_t s = 0; s < cs.NumSegments(); ++s) {
    EXPECT_EQ(cs.Segment(s).FirstParam(), expected);
    EXPECT_EQ(&cs.Segment(s).Segment(), model->Segments()[std::int32_t(s)].m_Value.get());
    const std::uint32_t counts[] = {6, 3, 2, 1, 1, 0};
    expected += counts[model->Segments()[std::int32_t(s)].m_Value->Joint()->Type()];
  }
  EXPECT_EQ(cs.NumJointParams(), expected);
  EXPECT_EQ(cs.NumTargetParams(), 0u);
  EXPECT_EQ(cs.NumParams(), expected);
  EXPECT_EQ(cs.NumTargets(), 12u);
}

TEST(ComputeSubject, ForwardKinematicsIsTheProductOfTheSegmentTransforms) {
  std::mt19937 gen(2);
  for (std::uint32_t rotator : {0u, 1u}) {
    const auto model = RandomSubject(15, gen);
    VComputeSubject cs(model, 0, 1, rotator);
    for (int trial = 0; trial < 20; ++trial) {
      const Eigen::VectorXd x = RandomJointState(cs, gen);
      cs.Update(Span(x));
      const std::vector<VPose> reference = ReferencePoses(*model, x);
      for (std::uint32_t s = 0; s < cs.NumSegments(); ++s) {
        EXPECT_LT((cs.Segment(s).WorldPose().m_Rotation - reference[s].m_Rotation).norm(), 1e-12);
        EXPECT_LT((cs.Segment(s).WorldPose().m_Translation - reference[s].m_Translation).norm(),
                  1e-9);
      }
      for (std::uint32_t t = 0; t < cs.NumTargets(); ++t) {
        const auto* target = cs.PositionTarget(t);
        const VPose& W = reference[size_t(target->ParentIndex())];
        EXPECT_LT((target->WorldPosition() -
                   (W.m_Rotation * target->PositionInParent() + W.m_Translation))
                      .norm(),
                  1e-9);
      }
    }
  }
}

Eigen::MatrixXd TargetPositions(VComputeSubject& cs, const Eigen::VectorXd& x) {
  cs.Update(Span(x));
  Eigen::MatrixXd p(3 * cs.NumTargets(), 1);
  for (std::uint32_t t = 0; t < cs.NumTargets(); ++t)
    p.block<3, 1>(3 * t, 0) = cs.PositionTarget(t)->WorldPosition();
  return p;
}

double JacobianError(VComputeSubject& cs, const Eigen::VectorXd& x) {
  Eigen::MatrixXd analytic(3 * cs.NumTargets(), cs.NumJointParams());
  cs.UpdateSegments(Span(x), ComputeSubject::EChain);
  cs.TargetJacobian(analytic);
  VComputeSubject probe(cs);
  Eigen::MatrixXd numeric(analytic.rows(), analytic.cols());
  for (Eigen::Index i = 0; i < x.size(); ++i) {
    const double h = 1e-6 * std::max(1.0, std::abs(x[i]));
    Eigen::VectorXd plus = x, minus = x;
    plus[i] += h;
    minus[i] -= h;
    numeric.col(i) = (TargetPositions(probe, plus) - TargetPositions(probe, minus)) / (2 * h);
  }
  double worst = 0.0;
  for (Eigen::Index c = 0; c < analytic.cols(); ++c)
    worst = std::max(worst, (analytic.col(c) - numeric.col(c)).norm() /
                                std::max(1.0, analytic.col(c).norm()));
  return worst;
}

TEST(ComputeSubject, ChainJacobiansMatchFiniteDifferences) {
  std::mt19937 gen(3);
  for (std::uint32_t rotator : {0u, 1u})
    for (int subject = 0; subject < 4; ++subject) {
      VComputeSubject cs(RandomSubject(10, gen), 0, 1, rotator);
      for (int trial = 0; trial < 25; ++trial) {
        const Eigen::VectorXd x = RandomJointState(cs, gen);
        ASSERT_LT(JacobianError(cs, x), 1e-6) << "rotator " << rotator << " trial " << trial;
      }
      // All joints at rest, and tiny rotations: the small-angle forms of the derivatives.
      EXPECT_LT(JacobianError(cs, Eigen::VectorXd::Zero(cs.NumParams())), 1e-6);
      EXPECT_LT(JacobianError(cs, Eigen::VectorXd::Constant(cs.NumParams(), 1e-9)), 1e-6);
    }
}

TEST(ComputeSubject, JointJacobianIsTheOwnBlockOfTheChain) {
  std::mt19937 gen(4);
  const auto model = RandomSubject(8, gen);
  VComputeSubject chain(model), joint(model);
  const Eigen::VectorXd x = RandomJointState(chain, gen);
  chain.UpdateSegments(Span(x), ComputeSubject::EChain);
  joint.UpdateSegments(Span(x), ComputeSubject::EJoint);
  for (std::uint32_t s = 0; s < chain.NumSegments(); ++s) {
    ASSERT_EQ(joint.Segment(s).NumJacobianBlocks(), 1u);
    EXPECT_EQ(chain.Segment(s).NumJacobianBlocks(),
              std::uint32_t(model->Segments().Depth(std::int32_t(s))) + 1);
    const auto& a = chain.Segment(s).JacobianBlocks()[0];
    const auto& b = joint.Segment(s).JacobianBlocks()[0];
    for (std::uint32_t i = 0; i < a.m_NumParams; ++i) {
      EXPECT_EQ(a.m_dR[i], b.m_dR[i]);
      EXPECT_EQ(a.m_dT[i], b.m_dT[i]);
    }
  }
}

TEST(ComputeSubject, AnUnchangedStateSkipsForwardKinematicsButFillsJacobians) {
  std::mt19937 gen(5);
  const auto model = RandomSubject(6, gen);
  VComputeSubject cs(model), fresh(model);
  const Eigen::VectorXd x = RandomJointState(cs, gen);
  cs.Update(Span(x));
  EXPECT_EQ(cs.NumPoseEvaluations(), 1u);
  cs.Update(Span(x));
  EXPECT_EQ(cs.NumPoseEvaluations(), 1u);
  cs.UpdateSegments(Span(x), ComputeSubject::EChain);
  EXPECT_EQ(cs.NumPoseEvaluations(), 1u);
  fresh.UpdateSegments(Span(x), ComputeSubject::EChain);
  Eigen::MatrixXd a(3 * cs.NumTargets(), cs.NumParams()), b = a;
  cs.TargetJacobian(a);
  fresh.TargetJacobian(b);
  EXPECT_EQ(a, b);
  Eigen::VectorXd y = x;
  y[0] += 0.1;
  cs.Update(Span(y));
  EXPECT_EQ(cs.NumPoseEvaluations(), 2u);
}

TEST(ComputeSubject, ADummyRootHasNoParametersButItsPoseIsFilledOnTheFirstUpdate) {
  auto model = std::make_shared<VSubjectCalibrated>();
  auto& root = *model->Segments()[0].m_Value;
  root.Joint()->SetType(5);
  VPose P;
  P.m_Translation = Eigen::Vector3d(1.0, 2.0, 3.0);
  root.SetPoseInParent(P);
  VComputeSubject cs(model);
  EXPECT_EQ(cs.NumParams(), 0u);
  cs.Update(ConstView());
  EXPECT_EQ(cs.Segment(0).WorldPose().m_Translation, P.m_Translation);
  EXPECT_EQ(cs.NumPoseEvaluations(), 1u);
}

TEST(ComputeSubject, ATargetOnAMissingSegmentIsKeptWithItsMessage) {
  std::mt19937 gen(6);
  auto model = RandomSubject(3, gen);
  auto stray = std::make_shared<VTargetPosition>(999u);
  stray->SetPositionInParent(Eigen::Vector3d(1, 2, 3));
  model->AddTarget(stray, true);
  VComputeSubject cs(model);
  ASSERT_EQ(cs.NumTargets(), 4u);
  EXPECT_EQ(cs.Target(3).Errors(), "VComputeTargetPosition cannot find segment. ");
  EXPECT_TRUE(cs.Target(0).Errors().empty());
  const Eigen::VectorXd x = RandomJointState(cs, gen);
  cs.UpdateSegments(Span(x), ComputeSubject::EChain);
  EXPECT_EQ(cs.PositionTarget(3)->WorldPosition(), Eigen::Vector3d(1, 2, 3));
  Eigen::MatrixXd J(3, cs.NumParams());
  cs.PositionTarget(3)->Jacobian(J);
  EXPECT_EQ(J.norm(), 0.0);
}

TEST(ComputeSubject, ACopysTargetsFollowTheCopysSegments) {
  std::mt19937 gen(7);
  VComputeSubject original(RandomSubject(5, gen));
  const Eigen::VectorXd x = RandomJointState(original, gen), y = RandomJointState(original, gen);
  original.Update(Span(x));
  const Eigen::Vector3d before = original.PositionTarget(4)->WorldPosition();
  VComputeSubject copy(original);
  copy.Update(Span(y));
  EXPECT_EQ(original.PositionTarget(4)->WorldPosition(), before);
  original.Update(Span(y));
  EXPECT_LT((copy.PositionTarget(4)->WorldPosition() - original.PositionTarget(4)->WorldPosition())
                .norm(),
            1e-12);
}

TEST(ComputeSubject, StateComesBackFromTheWorldPoses) {
  std::mt19937 gen(8);
  VComputeSubject cs(RandomSubject(10, gen));
  Eigen::VectorXd x = RandomJointState(cs, gen);
  for (std::uint32_t s = 0; s < cs.NumSegments(); ++s) // canonical ranges
    if (cs.Segment(s).NumParams() >= 3)
      x.segment<3>(cs.Segment(s).FirstParam()) *= 0.5;
    else if (cs.Segment(s).NumParams() == 2)
      x[cs.Segment(s).FirstParam() + 1] *= 0.4;
  cs.Update(Span(x));
  Eigen::VectorXd back = Eigen::VectorXd::Zero(cs.NumParams());
  EXPECT_TRUE(cs.StateFromWorldPoses({back.data(), size_t(back.size())}, 1e-6));
  EXPECT_LT((back - x).norm(), 1e-8);
}

TEST(ComputeSubject, WhiteningAStateRoundTripsThroughEachJointsPrior) {
  std::mt19937 gen(9);
  auto model = RandomSubject(8, gen);
  for (std::int32_t i = 0; i < model->Segments().Size(); ++i) {
    auto joint = model->Segments()[i].m_Value->Joint();
    const Eigen::Index n = joint->NumDynamicParams();
    joint->SetCovDynamic(Eigen::MatrixXd::Identity(n, n) * 0.04);
    joint->SetMeanDynamic(Eigen::VectorXd::Constant(n, 0.2));
  }
  VComputeSubject cs(model);
  Eigen::VectorXd x(cs.NumParams()), z(cs.NumParams()), back(cs.NumParams());
  const double squared = cs.SampleState({x.data(), size_t(x.size())}, gen);
  cs.WhitenState({z.data(), size_t(z.size())}, Span(x));
  EXPECT_NEAR(z.squaredNorm(), squared, 1e-6 * squared); // the prior's loading is 1e-8
  cs.ColourState({back.data(), size_t(back.size())}, Span(z));
  EXPECT_LT((back - x).norm(), 1e-9);
  Eigen::VectorXd mean(cs.NumParams());
  cs.PriorMeanState({mean.data(), size_t(mean.size())});
  EXPECT_EQ(mean, Eigen::VectorXd::Constant(cs.NumParams(), 0.2));
}

} // namespace
} // namespace KinematicTest
