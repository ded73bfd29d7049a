// State operations of the compute subject (unwrapping, blending, recentred priors, the free
// state and writing it back to a model) and the comparison of two models.

#include "RandomSubject.h"

#include "OstraAlgo/ComputeSubjectFK/ModelComparison.h"
#include "OstraAlgo/ComputeSubjectFK/VComputeSubject.h"

#include <gtest/gtest.h>

#include <numbers>

namespace KinematicTest {
namespace {

using namespace ComputeSubject;

constexpr double Turn = 2 * std::numbers::pi;

View Span(Eigen::VectorXd& v) {
  return {v.data(), size_t(v.size())};
}
ConstView Span(const Eigen::VectorXd& v) {
  return {v.data(), size_t(v.size())};
}

// Root free, then a ball, a hinge and a slider under it, with non-trivial priors.
std::shared_ptr<VSubjectCalibrated> Chain() {
  auto subject = std::make_shared<VSubjectCalibrated>();
  subject->ClearSegments();
  std::mt19937 gen(5);
  const std::int32_t types[] = {0, 1, 3, 4};
  for (int i = 0; i < 4; ++i) {
    auto segment = std::make_shared<VSegmentCalibrated>();
    segment->SetName("S" + std::to_string(i));
    segment->SetIdentifier(i);
    segment->SetPoseInParent(RandomPose(gen, 100));
    segment->SetPoseInThis(RandomPose(gen, 20));
    auto joint = std::make_shared<VJointCalibrated>();
    joint->SetType(types[i]);
    joint->SetRotation(Eigen::Vector3d(0.3, -0.2, 0.5));
    const Eigen::Index n = joint->NumDynamicParams();
    joint->SetMeanDynamic(Eigen::VectorXd::LinSpaced(n, 0.1, 0.4));
    Eigen::MatrixXd m = Eigen::MatrixXd::Random(n, n);
    joint->SetCovDynamic(0.01 * (m * m.transpose() + Eigen::MatrixXd::Identity(n, n)));
    segment->SetJoint(joint);
    subject->Segments().Add(i == 0 ? SegmentTree::NoParent : i - 1, segment);
    auto target = std::make_shared<VTargetPosition>(std::uint32_t(i));
    target->SetPositionInParent(Eigen::Vector3d(i, 10, -5));
    target->SetIdentifier(i);
    subject->AddTarget(target, true);
  }
  return subject;
}

TEST(StateOperations, UnwrappingMovesAnglesByWholeTurnsTowardsTheReference) {
  VComputeSubject cs(Chain()); // free 0..5, ball 6..8, hinge 9, slider 10
  Eigen::VectorXd reference = Eigen::VectorXd::Zero(cs.NumParams());
  Eigen::VectorXd x = reference;
  const Eigen::Vector3d axis = Eigen::Vector3d(1, 2, 2) / 3.0;
  x.segment<3>(6) = axis * (0.4 + Turn);
  x[9] = 0.3 - 2 * Turn;
  x[10] = 7.0; // a slider goes by the count rule too: 7 - 2π is nearer 0
  reference[9] = Turn;
  cs.UnwrapState(Span(x), Span(reference));
  EXPECT_LT((x.segment<3>(6) - axis * 0.4).norm(), 1e-12);
  EXPECT_NEAR(x[9], 0.3 + Turn, 1e-12);
  EXPECT_NEAR(x[10], 7.0 - Turn, 1e-12);
  // Unwrapping changes no pose.
  VComputeSubject a(cs), b(cs);
  Eigen::VectorXd original = x;
  original.segment<3>(6) = axis * (0.4 + Turn);
  original[9] = 0.3 - 2 * Turn;
  original[10] = x[10];
  a.Update(Span(x));
  b.Update(Span(original));
  for (std::uint32_t s = 0; s < 4; ++s)
    EXPECT_LT(
        (a.Segment(s).WorldPose().m_Translation - b.Segment(s).WorldPose().m_Translation).norm(),
        1e-9);
}

TEST(StateOperations, BlendingAndRecentringFollowEachJoint) {
  VComputeSubject cs(Chain());
  Eigen::VectorXd a = Eigen::VectorXd::Constant(cs.NumParams(), 0.2);
  Eigen::VectorXd b = Eigen::VectorXd::Constant(cs.NumParams(), 0.6);
  Eigen::VectorXd blend = a;
  cs.BlendStates(Span(blend), Span(b), 0.5, 0.5);
  EXPECT_NEAR(blend[9], 0.4, 1e-12); // hinge: the mean angle
  EXPECT_LT((blend.segment<3>(6) - Eigen::Vector3d::Constant(0.4)).norm(), 1e-12); // same axis

  Eigen::VectorXd mean(cs.NumParams()), prior(cs.NumParams());
  cs.PriorMeanState(Span(prior));
  cs.RecentrePrior(Span(a));
  cs.CurrentMeanState(Span(mean));
  EXPECT_EQ(mean, a);
  cs.RecentrePrior(Span(a), 1.0); // all weight on the prior's mean
  cs.CurrentMeanState(Span(mean));
  EXPECT_LT((mean - prior).norm(), 1e-12);
  cs.RecentrePrior(Span(a), 0.25);
  cs.CurrentMeanState(Span(mean));
  EXPECT_NEAR(mean[9], 0.75 * 0.2 + 0.25 * prior[9], 1e-12);
  cs.RecentrePrior(Span(a), 1.5); // outside [0, 1]: the prior's own mean
  cs.CurrentMeanState(Span(mean));
  EXPECT_EQ(mean, prior);
  // Whitening uses the working prior: the state equal to its mean whitens to zero.
  cs.RecentrePrior(Span(b));
  Eigen::VectorXd z(cs.NumParams());
  cs.WhitenState(Span(z), Span(b));
  EXPECT_LT(z.norm(), 1e-9);
}

TEST(StateOperations, AFreeSegmentSolutionWrittenToAModelIsItsRestPose) {
  const auto model = Chain();
  VComputeSubject free(model, 0, EFreeSegmentsMode);
  Eigen::VectorXd x(free.NumParams());
  free.FreeState(Span(x));
  std::mt19937 gen(6);
  std::uniform_real_distribution<double> u(-0.3, 0.3);
  for (auto& v : x)
    v += u(gen) * (std::abs(v) + 1.0);
  free.Update(Span(x));
  auto written = std::static_pointer_cast<VSubjectCalibrated>(model->Clone());
  ASSERT_TRUE(free.WriteToModel(*written));
  VComputeSubject joints(written);
  joints.Update(Span(Eigen::VectorXd::Zero(joints.NumParams())));
  for (std::uint32_t s = 0; s < 4; ++s) {
    EXPECT_LT(
        (joints.Segment(s).WorldPose().m_Rotation - free.Segment(s).WorldPose().m_Rotation).norm(),
        1e-12);
    EXPECT_LT(
        (joints.Segment(s).WorldPose().m_Translation - free.Segment(s).WorldPose().m_Translation)
            .norm(),
        1e-9);
  }
  // The joint form writes back exactly what it read.
  auto same = std::static_pointer_cast<VSubjectCalibrated>(model->Clone());
  ASSERT_TRUE(VComputeSubject(model).WriteToModel(*same));
  for (std::int32_t s = 0; s < 4; ++s)
    EXPECT_LT((same->Segments()[s].m_Value->PoseInParent().m_Rotation -
               model->Segments()[s].m_Value->PoseInParent().m_Rotation)
                  .norm(),
              1e-15);
  VSubjectCalibrated other; // one segment
  EXPECT_FALSE(free.WriteToModel(other));
}

TEST(ModelComparison, ACopyIsTheSameAndAChangedJointOrMarkerIsNot) {
  std::mt19937 gen(7);
  const auto model = Chain();
  const auto copy = model->Clone();
  EXPECT_TRUE(SameJointStatistics(model, copy, 1e-9, gen));
  EXPECT_TRUE(SameMarkerPositions(model, copy, 1e-9, 10, gen));

  auto wider = std::static_pointer_cast<VSubjectCalibrated>(model->Clone());
  auto joint = wider->Segments()[2].m_Value->Joint();
  joint->SetCovDynamic(joint->CovDynamic() * 1.1);
  std::string report;
  EXPECT_FALSE(SameJointStatistics(model, wider, 1e-6, gen, &report));
  EXPECT_EQ(report, "Segment S2, joint Hinge differs");
  EXPECT_TRUE(SameMarkerPositions(model, wider, 1e-9, 1, gen)); // the mean state alone

  auto moved = std::static_pointer_cast<VSubjectCalibrated>(model->Clone());
  std::dynamic_pointer_cast<VTargetPosition>(moved->Target(3))
      ->SetPositionInParent(Eigen::Vector3d(3, 10, -4.99));
  EXPECT_TRUE(SameJointStatistics(model, moved, 1e-9, gen));
  EXPECT_FALSE(SameMarkerPositions(model, moved, 1e-3, 3, gen));
  EXPECT_TRUE(SameMarkerPositions(model, moved, 0.011, 3, gen));

  auto fewer = std::make_shared<VSubjectCalibrated>(
      *std::static_pointer_cast<VSubjectCalibrated>(model->Clone()));
  fewer->AddTarget(std::make_shared<VTargetPosition>(0u), false);
  EXPECT_FALSE(SameJointStatistics(model, fewer, 1e-9, gen));
  EXPECT_FALSE(SameMarkerPositions(model, fewer, 1e-9, 2, gen));
}

} // namespace
} // namespace KinematicTest
