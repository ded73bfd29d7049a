// Every run-time target kind: values and residuals against direct geometry, their Jacobians
// against central finite differences over the whole state (joint form and free-segment form),
// the free-pose Jacobian type, and the model targets made from subject records.

#include "EveryKindSubject.h"
#include "TargetTestSupport.h"

#include "OstraAlgo/ComputeSubjectFK/VComputeSubject.h"
#include "OstraAlgo/KinematicAlgo/SubjectCalibratedFromRecord.h"
#include "OstraAlgo/KinematicAlgo/VCalibratedTargets.h"
#include "OstraAlgo/KinematicAlgo/VJointFunctionalFree.h"

#include "River/CoreOstraTypesUtils/RigidBodyUtils.h"

#include <gtest/gtest.h>

namespace KinematicTest {
namespace {

using namespace ComputeSubject;

using TargetKinds = ComputeTargetFixture;

TEST_F(TargetKinds, EveryKindHasARunTimeFormWithItsSizes) {
  std::mt19937 gen(11);
  VComputeSubject cs(SubjectWithEveryKind(6, gen));
  ASSERT_EQ(cs.NumTargets(), 6u + 1 + 4 + 3);
  const std::uint32_t values[] = {3, 6, 6, 6, 6, 3, 9, 12};
  const std::uint32_t residuals[] = {3, 1, 2, 1, 2, 3, 9, 12};
  for (std::uint32_t k = 0; k < 8; ++k) {
    const IComputeTarget& target = cs.Target(6 + k);
    EXPECT_EQ(target.NumValues(), values[k]) << target.Target().Key();
    EXPECT_EQ(target.NumResiduals(), residuals[k]) << target.Target().Key();
    EXPECT_EQ(target.NumParams(), 0u);
    EXPECT_TRUE(target.Errors().empty());
  }
  EXPECT_EQ(cs.NumTargetParams(), 0u);
}

TEST_F(TargetKinds, ValuesAndResidualsFollowTheParentsWorldPose) {
  Build(12, [](std::mt19937& gen) { return SubjectWithEveryKind(5, gen); });
  std::mt19937& gen = m_Gen;
  VComputeSubject& cs = *m_pCs;
  cs.Update(Span(m_X));
  const Eigen::Vector3d observed = RandomVector(gen, 200);
  double residual[12];
  for (std::uint32_t t = 0; t < cs.NumTargets(); ++t) {
    const auto& target = dynamic_cast<const VComputeTargetSingleParent&>(cs.Target(t));
    const VPose& W = cs.Segment(std::uint32_t(target.ParentIndex())).WorldPose();
    const std::string key = target.Target().Key();
    const auto* shaped = dynamic_cast<const VTargetPointDirection*>(&target.Target());
    const Eigen::Map<const Eigen::VectorXd> v(target.Values().data(), target.NumValues());
    if (key == "TargetSegmentPlane") {
      const Eigen::Vector3d o = W.m_Rotation * shaped->PositionInParent() + W.m_Translation;
      const Eigen::Vector3d n = W.m_Rotation * shaped->DirectionInParent();
      EXPECT_LT((v.head<3>() - o).norm(), 1e-9);
      EXPECT_LT((v.tail<3>() - n).norm(), 1e-12);
      target.Residual(ConstView(observed.data(), 3), View(residual, 1));
      const double sigma = shaped->ResidualCovariance().size() ? 2.0 : 1.0;
      EXPECT_NEAR(residual[0], n.dot(observed - o) / sigma, 1e-6);
    } else if (key == "TargetSegmentRay") {
      // The point on the ray nearest to the observation, plus the residual's offset across it,
      // gives back the observation (plain form).
      const Eigen::Vector3d o = v.head<3>(), d = v.tail<3>();
      target.Residual(ConstView(observed.data(), 3), View(residual, 2));
      if (shaped->ResidualCovariance().size() == 0) {
        const Eigen::Vector3d across = observed - o - d * d.dot(observed - o);
        EXPECT_NEAR(Eigen::Vector2d(residual[0], residual[1]).norm(), across.norm(), 1e-9);
      }
    } else if (key == "TargetOrientation") {
      const auto& orientation = dynamic_cast<const VTargetOrientation&>(target.Target());
      const Eigen::Matrix3d R = W.m_Rotation * orientation.OrientationInParent();
      for (int i = 0; i < 9; ++i)
        EXPECT_NEAR(v[i], R(i / 3, i % 3), 1e-12);
    } else if (key == "TargetRigidBody") {
      const auto& body = dynamic_cast<const VTargetRigidBody&>(target.Target());
      const VPose& B = body.BodyPoseInParent();
      for (std::uint32_t m = 0; m < body.NumMembers(); ++m) {
        const Eigen::Vector3d inParent =
            B.m_Rotation * body.Member(m).PositionInParent() + B.m_Translation;
        const Eigen::Vector3d p = W.m_Rotation * inParent + W.m_Translation;
        EXPECT_LT((v.segment<3>(3 * m) - p).norm(), 1e-9);
      }
    }
  }
}

TEST_F(TargetKinds, JacobiansOfEveryKindMatchFiniteDifferences) {
  std::mt19937 gen(13);
  for (std::uint32_t rotator : {0u, 1u})
    for (int subject = 0; subject < 3; ++subject) {
      VComputeSubject cs(SubjectWithEveryKind(7, gen), 0, 1, rotator);
      for (int trial = 0; trial < 8; ++trial)
        ASSERT_LT(WorstTargetJacobianError(cs, RandomState(cs.NumParams(), gen), gen), 1e-6)
            << "rotator " << rotator << " trial " << trial;
      EXPECT_LT(WorstTargetJacobianError(cs, Eigen::VectorXd::Zero(cs.NumParams()), gen), 1e-6);
    }
}

TEST_F(TargetKinds, ARigidBodyCountsOnlyItsPresentMembers) {
  std::mt19937 gen(14);
  VComputeSubject cs(SubjectWithEveryKind(4, gen));
  auto& body = const_cast<VComputeRigidBody&>(
      dynamic_cast<const VComputeRigidBody&>(cs.Target(cs.NumTargets() - 1)));
  body.SetMemberWeight(1, 0.0);
  body.SetMemberWeight(3, 2.0);
  EXPECT_EQ(body.NumResiduals(), 9u);
  std::mt19937 probe(15);
  EXPECT_LT(WorstTargetJacobianError(cs, RandomState(cs.NumParams(), gen), probe), 1e-6);
  const Eigen::VectorXd x = RandomState(cs.NumParams(), gen);
  cs.Update(Span(x));
  Eigen::VectorXd observation = Eigen::VectorXd::Zero(12);
  double r[9];
  body.Residual(Span(observation), View(r, 9));
  const Eigen::Map<const Eigen::VectorXd> v(body.Values().data(), 12);
  EXPECT_DOUBLE_EQ(r[3], v[6]);       // member 1 skipped: rows 3..5 are member 2
  EXPECT_DOUBLE_EQ(r[6], 2.0 * v[9]); // member 3 weighted
  for (std::uint32_t m = 0; m < 4; ++m)
    body.SetMemberWeight(m, 0.0);
  EXPECT_EQ(body.NumResiduals(), 0u);
}

TEST_F(TargetKinds, UnboundTargetsNameTheirClass) {
  std::mt19937 gen(16);
  auto model = SubjectWithEveryKind(3, gen);
  for (std::uint32_t t = 3; t < model->NumTargets(); ++t)
    dynamic_cast<ITargetSingleParent&>(*model->Target(t)).SetParentIdentifier(999);
  VComputeSubject cs(model);
  const char* expected[] = {"VComputeTargetPositionWithCovariance",
                            "VComputeTargetSegmentPlane",
                            "VComputeTargetSegmentRay",
                            "VComputeTargetSegmentPlane",
                            "VComputeTargetSegmentRay",
                            "VComputeTargetDirection",
                            "VComputeTargetOrientation",
                            "VComputeRigidBody"};
  const Eigen::VectorXd x = RandomState(cs.NumParams(), gen);
  cs.UpdateSegments(Span(x), EChain);
  for (std::uint32_t k = 0; k < 8; ++k) {
    const IComputeTarget& target = cs.Target(3 + k);
    EXPECT_EQ(target.Errors(), std::string(expected[k]) + " cannot find segment. ");
    Eigen::MatrixXd J = Eigen::MatrixXd::Ones(target.NumValues(), cs.NumParams());
    target.ValueJacobian(J);
    EXPECT_TRUE(J.isZero());
  }
}

// --- Free pose ----------------------------------------------------------------------------

TEST(FreePose, TheFreeBlockIsTheDerivativeByTheFreeParametersOfP) {
  std::mt19937 gen(21);
  for (std::uint32_t rotator : {0u, 1u}) {
    VComputeSubject cs(RandomSubject(8, gen), 0, 1, rotator);
    const Eigen::VectorXd x = RandomState(cs.NumParams(), gen);
    cs.UpdateSegments(Span(x), EFree);
    KinematicAlgo::VJointFunctionalFree free;
    for (std::uint32_t s = 0; s < cs.NumSegments(); ++s) {
      const VComputeSegment& segment = cs.Segment(s);
      ASSERT_EQ(segment.NumJacobianBlocks(), 1u);
      const JointJacobian& block = segment.JacobianBlocks()[0];
      EXPECT_EQ(block.m_FirstParam, 6 * s);
      // W(p) = parent W ∘ F(p) ∘ P⁻¹ ∘ L, p the free parameters of P.
      const VPose parentWorld = segment.ParentIndex() < 0
                                    ? VPose()
                                    : cs.Segment(std::uint32_t(segment.ParentIndex())).WorldPose();
      const VPose rest = segment.ModelPoseInParent().Inverse() * segment.LocalPose();
      for (int k = 0; k < 6; ++k) {
        std::array<double, 6> plus = segment.FreeParams(), minus = plus;
        const double h = 1e-6 * std::max(1.0, std::abs(plus[k]));
        plus[k] += h;
        minus[k] -= h;
        VPose Fp, Fm;
        free.ComputePose(ConstView(plus), ConstView(), Fp);
        free.ComputePose(ConstView(minus), ConstView(), Fm);
        const VPose Wp = parentWorld * Fp * rest, Wm = parentWorld * Fm * rest;
        const Matrix3r dR = (Wp.m_Rotation - Wm.m_Rotation) / (2 * h);
        const Eigen::Vector3d dT = (Wp.m_Translation - Wm.m_Translation) / (2 * h);
        EXPECT_LT((block.m_dR[k] - dR).norm(), 1e-6 * std::max(1.0, dR.norm()));
        EXPECT_LT((block.m_dT[k] - dT).norm(), 1e-6 * std::max(1.0, dT.norm()));
      }
    }
    // An unchanged state fills the free blocks without forward kinematics.
    const auto walks = cs.NumPoseEvaluations();
    cs.UpdateSegments(Span(x), EFree);
    EXPECT_EQ(cs.NumPoseEvaluations(), walks);
    EXPECT_EQ(cs.Segment(1).NumJacobianBlocks(), 1u);
  }
}

TEST(FreePose, FreeSegmentsAtTheModelsPosesReproduceTheJointsAtRest) {
  std::mt19937 gen(22);
  const auto model = SubjectWithEveryKind(9, gen);
  VComputeSubject joints(model), free(model, 0, EFreeSegmentsMode);
  ASSERT_EQ(free.NumParams(), 6 * free.NumSegments());
  joints.Update(Span(Eigen::VectorXd::Zero(joints.NumParams())));
  Eigen::VectorXd state(free.NumParams());
  for (std::uint32_t s = 0; s < free.NumSegments(); ++s)
    for (int k = 0; k < 6; ++k)
      state[6 * s + k] = free.Segment(s).FreeParams()[k];
  free.Update(Span(state));
  for (std::uint32_t s = 0; s < free.NumSegments(); ++s) {
    EXPECT_LT(
        (free.Segment(s).WorldPose().m_Rotation - joints.Segment(s).WorldPose().m_Rotation).norm(),
        1e-12);
    EXPECT_LT(
        (free.Segment(s).WorldPose().m_Translation - joints.Segment(s).WorldPose().m_Translation)
            .norm(),
        1e-9);
  }
  // Every target's Jacobian over the free state, through the chain.
  for (int trial = 0; trial < 4; ++trial) {
    Eigen::VectorXd x = state + 0.3 * RandomState(free.NumParams(), gen);
    ASSERT_LT(WorstTargetJacobianError(free, x, gen), 1e-6) << "trial " << trial;
  }
}

// --- Model targets from records ------------------------------------------------------------

CoreOstraTypes::VSubject RecordWithEveryKind() {
  using CoreOstraTypes::VSubject;
  VSubject subject;
  subject.m_Name = "Prop";
  VSubject::VSegment root;
  root.m_Name = "Root";
  root.m_Joint.m_JointType = VSubject::VJoint::EFree;
  root.m_PreTranslation = {10, 20, 30};
  subject.m_Segments = {root};
  for (const char* name : {"A", "B", "C"})
    subject.m_Markers.push_back({name, 0, 7.0, false, 0.0});
  const auto add = [&](VSubject::VTarget::ETargetType type, std::vector<double> state,
                       std::vector<double> covariance = {}) {
    VSubject::VTarget target;
    target.m_Type = type;
    target.m_SegmentIndices = {0};
    target.m_State = std::move(state);
    target.m_Covariance = std::move(covariance);
    subject.m_Targets.push_back(target);
  };
  add(VSubject::VTarget::ELocalPlaneToWorldPoint, {1, 2, 3, 0, 0, 2});
  add(VSubject::VTarget::ELocalPlaneToWorldPointGaussian, {1, 2, 3, 0, 3, 0}, {4});
  add(VSubject::VTarget::ELocalLineToWorldPoint, {1, 2, 3, 5, 0, 0});
  add(VSubject::VTarget::ELocalLineToWorldPointGaussian, {1, 2, 3, 0, 0, 1}, {2, 0, 0, 3});
  add(VSubject::VTarget::ELocalRotationToWorldRotation, {0, 0, 0.5});
  add(VSubject::VTarget::ELocalDirectionToWorldDirection, {0, 3, 4});
  VSubject::VTarget body;
  body.m_Type = VSubject::VTarget::ERigidBody;
  CoreOstraTypesUtils::WriteRigidBodyInformation(
      body, {0.1, 0.2, 0.3}, {5, 6, 7}, {{1, 0, 0}, {0, 1, 0}, {0, 0, 1}},
      std::vector<CoreOstraTypesUtils::RigidCovariance>(3, {1, 0, 0, 0, 1, 0, 0, 0, 1}), {});
  body.m_SegmentIndices = {0};
  body.m_MarkerIndices = {0, 1, 2};
  subject.m_Targets.push_back(body);
  return subject;
}

TEST(TargetRecords, EveryKindBecomesItsModelTarget) {
  std::vector<std::string> errors, notes;
  const auto model = SubjectCalibratedFromRecord(RecordWithEveryKind(), errors, notes);
  ASSERT_TRUE(model) << errors.front();
  EXPECT_TRUE(notes.empty());
  ASSERT_EQ(model->NumTargets(), 7u);
  const char* keys[] = {"TargetSegmentPlane", "TargetSegmentPlane", "TargetSegmentRay",
                        "TargetSegmentRay",   "TargetOrientation",  "TargetDirection",
                        "TargetRigidBody"};
  for (std::uint32_t t = 0; t < 7; ++t)
    EXPECT_STREQ(model->Target(t)->Key(), keys[t]);
  const auto& plane = dynamic_cast<const VTargetSegmentPlane&>(*model->Target(1));
  EXPECT_EQ(plane.DirectionInParent(), Eigen::Vector3d(0, 1, 0)); // normalised
  EXPECT_EQ(plane.ResidualCovariance(), Eigen::MatrixXd::Constant(1, 1, 4));
  EXPECT_EQ(dynamic_cast<const VTargetSegmentRay&>(*model->Target(2)).ResidualCovariance().size(),
            0);
  EXPECT_EQ(dynamic_cast<const VTargetDirection&>(*model->Target(5)).DirectionInParent(),
            Eigen::Vector3d(0, 0.6, 0.8));
  const auto& body = dynamic_cast<const VTargetRigidBody&>(*model->Target(6));
  ASSERT_EQ(body.NumMembers(), 3u);
  EXPECT_EQ(body.Member(2).Name(), "C");
  EXPECT_EQ(model->NumMarkers(), 0u);
  // A copy is deep and equal; a changed member makes it differ.
  const auto copy = model->Clone();
  EXPECT_TRUE(copy->Equals(*model));
  std::dynamic_pointer_cast<VTargetRigidBody>(copy->Target(6))
      ->MemberPtr(0)
      ->SetPositionInParent(Eigen::Vector3d(9, 9, 9));
  EXPECT_FALSE(copy->Equals(*model));
  EXPECT_EQ(body.Member(0).PositionInParent(), Eigen::Vector3d(1, 0, 0));
}

TEST(TargetRecords, ARigidBodyPlacesItsMembersAsItsPointTargetFormDoes) {
  // The subject utilities turn the body into point targets with the body offset applied; both
  // forms must put every marker in the same world place.
  CoreOstraTypes::VSubject record = RecordWithEveryKind();
  record.m_Targets.erase(record.m_Targets.begin(), record.m_Targets.end() - 1);
  CoreOstraTypes::VSubject points = record;
  ASSERT_TRUE(CoreOstraTypesUtils::ConvertToPointTargets(points));
  std::vector<std::string> errors, notes;
  VComputeSubject asBody(SubjectCalibratedFromRecord(record, errors, notes));
  VComputeSubject asPoints(SubjectCalibratedFromRecord(points, errors, notes));
  ASSERT_TRUE(errors.empty());
  ASSERT_EQ(asPoints.NumTargets(), 3u);
  std::mt19937 gen(23);
  const Eigen::VectorXd x = RandomState(6, gen);
  asBody.Update(Span(x));
  asPoints.Update(Span(x));
  for (std::uint32_t m = 0; m < 3; ++m)
    EXPECT_LT((Eigen::Map<const Eigen::Vector3d>(asBody.Target(0).Values().data() + 3 * m) -
               asPoints.PositionTarget(m)->WorldPosition())
                  .norm(),
              1e-9);
}

TEST(TargetRecords, MalformedTargetsAreRefusedWithTheirReasons) {
  using CoreOstraTypes::VSubject;
  struct Case {
    std::size_t target;
    std::function<void(VSubject::VTarget&)> breakIt;
    const char* reason;
  };
  const Case cases[] = {
      {0, [](auto& t) { t.m_State = {1, 2, 3, 0, 0, 0}; }, "zero or non-finite normal"},
      {2, [](auto& t) { t.m_State.pop_back(); }, "needs 6 state values, not 5"},
      {3, [](auto& t) { t.m_Covariance = {1}; }, "2 by 2 residual covariance"},
      {4,
       [](auto& t) {
         t.m_SegmentIndices = {0, 0};
       },
       "exactly one segment"},
      {5,
       [](auto& t) {
         t.m_State = {0, 0, 0};
       },
       "zero or non-finite direction"},
      {6, [](auto& t) { t.m_MarkerIndices[1] = 40; }, "refers to marker 40"},
  };
  for (const Case& c : cases) {
    VSubject record = RecordWithEveryKind();
    c.breakIt(record.m_Targets[c.target]);
    std::vector<std::string> errors, notes;
    EXPECT_EQ(SubjectCalibratedFromRecord(record, errors, notes), nullptr) << c.reason;
    ASSERT_EQ(errors.size(), 1u) << c.reason;
    EXPECT_NE(errors[0].find(c.reason), std::string::npos) << errors[0];
  }
}

} // namespace
} // namespace KinematicTest
