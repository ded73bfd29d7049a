// The labelling point classes (range, covariance and range, view normal, descriptor) and the
// targets on several segments (centre of mass, relative orientation, relative ray): factory
// order, text round trip and equality, run-time values against direct geometry, Jacobians
// against central finite differences, and writing targets back to a model.

#include "EveryKindSubject.h"
#include "TargetTestSupport.h"

#include "OstraAlgo/ComputeSubjectFK/VComputeSubject.h"
#include "OstraAlgo/KinematicAlgo/VCalibratedPositionTargets.h"
#include "OstraAlgo/KinematicAlgo/VCalibratedRelativeTargets.h"

#include <gtest/gtest.h>

#include <functional>
#include <sstream>

namespace KinematicTest {
namespace {

using namespace ComputeSubject;

Eigen::Matrix3d RandomSpd(std::mt19937& gen) {
  Eigen::Matrix3d m;
  for (int i = 0; i < 9; ++i)
    m(i / 3, i % 3) = RandomVector(gen, 1)[0];
  return m * m.transpose() + Eigen::Matrix3d::Identity();
}

// The subject of EveryKindSubject.h plus one target of each class added here, the multi-parent
// ones between random segments, one relative pair on a single segment and one on a segment and
// its parent. Tree positions are looked up by identifier as insertion may reorder them.
std::shared_ptr<VSubjectCalibrated> Subject(int n, std::mt19937& gen) {
  auto subject = SubjectWithEveryKind(n, gen);
  const SegmentTree& tree = subject->Segments();
  const auto id = [&](int position) { return std::uint32_t(tree[position].m_Value->Identifier()); };
  const auto any = [&] { return id(int(gen() % std::uint32_t(n))); };

  auto range = std::make_shared<VTargetPositionWithRange>(any());
  range->SetPositionInParent(RandomVector(gen, 80));
  range->SetRange(RandomSpd(gen));
  subject->AddTarget(range, true);
  auto covarianceRange = std::make_shared<VTargetPositionCovarianceRange>(any());
  covarianceRange->SetPositionInParent(RandomVector(gen, 80));
  covarianceRange->SetMeanPosition(RandomVector(gen, 80));
  covarianceRange->SetCovariance(RandomSpd(gen));
  covarianceRange->SetRange(RandomSpd(gen));
  subject->AddTarget(covarianceRange, true);
  auto normal = std::make_shared<VTargetPositionCovarianceRangeNormal>(any());
  normal->SetPositionInParent(RandomVector(gen, 80));
  normal->SetCovariance(RandomSpd(gen));
  normal->SetRange(RandomSpd(gen));
  normal->SetViewNormal(RandomVector(gen, 1), 0.25);
  subject->AddTarget(normal, false);
  auto descriptor = std::make_shared<VTargetPositionCovarianceDescriptor>(any());
  descriptor->SetPositionInParent(RandomVector(gen, 80));
  descriptor->SetCovariance(RandomSpd(gen));
  descriptor->SetDescriptor(Eigen::VectorXd::Random(5));
  subject->AddTarget(descriptor, false);

  auto com = std::make_shared<VTargetCentreOfMass>(any());
  com->SetName("Centre");
  for (int i = 0; i < 4; ++i)
    com->AddTerm(any(), RandomVector(gen, 60), 0.5 + i);
  subject->AddTarget(com, false);
  const std::pair<int, int> pairs[] = {
      {int(gen() % std::uint32_t(n)), int(gen() % std::uint32_t(n))},
      {2, 2},
      {n - 1, tree[n - 1].m_Parent}};
  for (const auto& [a, b] : pairs) {
    auto orientation = std::make_shared<VTargetRelativeOrientation>();
    orientation->SetParentIdentifiers(id(a), id(b));
    orientation->SetOrientationsInParents(Exp(RandomVector(gen, 1.5)), Exp(RandomVector(gen, 1.5)));
    subject->AddTarget(orientation, false);
    auto ray = std::make_shared<VTargetRelativeRay>();
    ray->SetParentIdentifiers(id(a), id(b));
    ray->SetPositionsInParents(RandomVector(gen, 60), RandomVector(gen, 60));
    ray->SetDirectionInParent(RandomVector(gen, 2));
    subject->AddTarget(ray, false);
  }
  return subject;
}

const VComputeSegment& SegmentById(const VComputeSubject& cs, std::uint32_t id) {
  std::uint32_t s = 0;
  while (cs.Segment(s).Segment().Identifier() != std::int32_t(id))
    ++s;
  return cs.Segment(s);
}

// The run-time target made from model target `t`, or null when it has none.
const IComputeTarget* RunTime(const VComputeSubject& cs, const ITargetCalibrated& model) {
  for (std::uint32_t t = 0; t < cs.NumTargets(); ++t)
    if (&cs.Target(t).Target() == &model) return &cs.Target(t);
  return nullptr;
}

struct KeyRecorder : ITargetVisitor {
  std::string m_Key;
  void Visit(const char* key, const ITargetCalibrated&) override { m_Key = key; }
};

TEST(TargetFactory, ClassesComeInTheUsersListOrderWithTheirNames) {
  const VTargetFactory& f = VTargetFactory::Factory();
  const std::vector<std::string> keys = {"TargetPosition",
                                         "TargetCentreOfMass",
                                         "TargetPlane",
                                         "TargetOrientation",
                                         "TargetPositionWithRange",
                                         "TargetPositionWithCovariance",
                                         "TargetPositionCovarianceRange",
                                         "TargetPositionCovarianceRangeNormal",
                                         "TargetPositionCovarianceDescriptor",
                                         "TargetSegmentRay",
                                         "TargetSegmentPlane",
                                         "TargetRelativePosition",
                                         "TargetRelativeOrientation",
                                         "TargetRelativeRay",
                                         "TargetRigidBody",
                                         "TargetDirection"};
  EXPECT_EQ(f.Keys(), keys);
  for (size_t i = 0; i < keys.size(); ++i) {
    const auto target = f.Create(keys[i]);
    ASSERT_NE(target, nullptr) << keys[i];
    EXPECT_EQ(target->Key(), keys[i]);
    EXPECT_EQ(target->Type(), std::int32_t(i));
    KeyRecorder visitor;
    target->Visit(visitor);
    EXPECT_EQ(visitor.m_Key, keys[i]);
    EXPECT_FALSE(f.Description(keys[i]).empty()) << keys[i];
  }
  EXPECT_EQ(f.DisplayName("TargetCentreOfMass"), "Center of mass");
  EXPECT_EQ(f.DisplayName("TargetPositionCovarianceRangeNormal"),
            "Position in segment with covariance, range and normals");
  EXPECT_EQ(f.Description("TargetPositionWithRange"),
            "This is an experimental target.  Do not use.");
  EXPECT_EQ(f.Description("TargetRelativeRay"),
            "This target defines a ray from one segment to a marker on another segment.   This can "
            "be used to make a subject look at his big toe.");
  EXPECT_EQ(f.DisplayName("NoSuchTarget"), "");
}

TEST(LabellingAndMultiParentText, EveryClassReadsBackEqualAndEachFieldCounts) {
  std::mt19937 gen(81);
  const auto model = Subject(7, gen);
  std::ostringstream out;
  model->Write(out);
  VSubjectCalibrated read;
  std::string error;
  ASSERT_TRUE(read.ReadText(out.str(), &error)) << error;
  EXPECT_TRUE(read.Equals(*model));
  std::ostringstream again;
  read.Write(again);
  EXPECT_EQ(again.str(), out.str());

  // One change in each field a class adds must break equality with the original.
  const std::vector<std::function<void(ITargetCalibrated&)>> changes = {
      [](ITargetCalibrated& t) {
        auto& r = dynamic_cast<VTargetPositionWithRange&>(t);
        Eigen::Matrix3d m = r.Range();
        m(2, 1) += 1e-9;
        r.SetRange(m);
      },
      [](ITargetCalibrated& t) {
        auto& r = dynamic_cast<VTargetPositionCovarianceRange&>(t);
        r.SetMeanPosition(r.MeanPosition() + Eigen::Vector3d(0, 0, 1e-9));
      },
      [](ITargetCalibrated& t) {
        auto& r = dynamic_cast<VTargetPositionCovarianceRangeNormal&>(t);
        r.SetViewNormal(r.ViewNormal(), r.ViewNormalValue() + 1);
      },
      [](ITargetCalibrated& t) {
        auto& r = dynamic_cast<VTargetPositionCovarianceDescriptor&>(t);
        Eigen::VectorXd d = r.Descriptor();
        d.conservativeResize(d.size() + 1);
        d[d.size() - 1] = 0;
        r.SetDescriptor(d);
      },
      [](ITargetCalibrated& t) {
        auto& r = dynamic_cast<VTargetCentreOfMass&>(t);
        auto terms = r.Terms();
        terms[2].m_Weight *= 2;
        r.SetTerms(terms);
      },
      [](ITargetCalibrated& t) {
        auto& r = dynamic_cast<VTargetRelativeOrientation&>(t);
        r.SetOrientationsInParents(r.OrientationInParent1(), Eigen::Matrix3d::Identity());
      },
      [](ITargetCalibrated& t) {
        auto& r = dynamic_cast<VTargetRelativeRay&>(t);
        r.SetDirectionInParent(-r.DirectionInParent());
      }};
  const std::uint32_t first = model->NumTargets() - 11;
  const std::uint32_t changed[] = {first,     first + 1, first + 2, first + 3,
                                   first + 4, first + 5, first + 6};
  for (size_t c = 0; c < changes.size(); ++c) {
    VSubjectCalibrated copy(read);
    changes[c](*copy.Target(changed[c]));
    EXPECT_FALSE(copy.Equals(*model)) << copy.Target(changed[c])->Key();
  }
  // A relative orientation is not a relative position with the same parents and points.
  VTargetRelativePosition position;
  const auto& orientation = *model->Target(first + 5);
  EXPECT_FALSE(position.Equals(orientation));
  EXPECT_FALSE(orientation.Equals(position));
}

TEST(LabellingAndMultiParentText, OversizedOrTruncatedNewClassesAreRefused) {
  std::mt19937 gen(82);
  const auto model = Subject(4, gen);
  std::ostringstream out;
  model->Write(out);
  const std::string text = out.str();
  VSubjectCalibrated read;
  std::string error;
  std::string huge = text;
  huge.replace(huge.find("DescriptorSize: 5"), 17, "DescriptorSize: 4000000000");
  EXPECT_FALSE(read.ReadText(huge, &error));
  EXPECT_NE(error.find("DescriptorSize"), std::string::npos) << error;
  std::string terms = text;
  terms.replace(terms.find("NumTerms: 4"), 11, "NumTerms: 5");
  EXPECT_FALSE(read.ReadText(terms, &error));
  EXPECT_NE(error.find("expected"), std::string::npos) << error;
  for (const char* label : {"ViewNormal:", "RangeOfPos:", "OrientInParent2:", "DirInParent1:"}) {
    const size_t at = text.find(label);
    ASSERT_NE(at, std::string::npos) << label;
    EXPECT_FALSE(read.ReadText(text.substr(0, at + 20), &error)) << label;
    EXPECT_FALSE(error.empty());
  }
  EXPECT_EQ(read.NumTargets(), 0u); // never replaced by a failed read
}

using LabellingAndMultiParentTargets = ComputeTargetFixture;

TEST_F(LabellingAndMultiParentTargets, ValuesFollowTheSegmentsWorldPoses) {
  Build(83, [](std::mt19937& gen) { return Subject(8, gen); });
  const auto& model = m_pModel;
  VComputeSubject& cs = *m_pCs;
  // The range-only point has no run-time form; every other target has one and is bound.
  EXPECT_EQ(cs.NumTargets(), model->NumTargets() - 1);
  cs.Update(Span(m_X));
  const auto world = [&](std::uint32_t id, const Eigen::Vector3d& p) {
    const VPose& W = SegmentById(cs, id).WorldPose();
    return Eigen::Vector3d(W.m_Rotation * p + W.m_Translation);
  };
  for (std::uint32_t t = model->NumTargets() - 11; t < model->NumTargets(); ++t) {
    const ITargetCalibrated& m = *model->Target(t);
    const IComputeTarget* target = RunTime(cs, m);
    if (!target) {
      EXPECT_STREQ(m.Key(), "TargetPositionWithRange");
      continue;
    }
    EXPECT_TRUE(target->Errors().empty()) << m.Key();
    const Eigen::Map<const Eigen::VectorXd> v(target->Values().data(), target->NumValues());
    if (const auto* point = dynamic_cast<const VTargetPositionWithCovariance*>(&m)) {
      // The labelling forms evaluate as the covariance point at PositionInParent.
      EXPECT_LT((v - world(point->ParentIdentifier(), point->PositionInParent())).norm(), 1e-9);
    } else if (const auto* com = dynamic_cast<const VTargetCentreOfMass*>(&m)) {
      Eigen::Vector3d sum = Eigen::Vector3d::Zero();
      double weight = 0;
      for (const auto& term : com->Terms()) {
        sum += term.m_Weight * world(term.m_Parent, term.m_Position);
        weight += term.m_Weight;
      }
      EXPECT_LT((v - sum / weight).norm(), 1e-9);
    } else if (const auto* rel = dynamic_cast<const VTargetRelativeOrientation*>(&m)) {
      const Eigen::Matrix3d a = SegmentById(cs, rel->ParentIdentifier1()).WorldPose().m_Rotation *
                                rel->OrientationInParent1();
      const Eigen::Matrix3d b = SegmentById(cs, rel->ParentIdentifier2()).WorldPose().m_Rotation *
                                rel->OrientationInParent2();
      // M takes the first frame's axes into the second's: b M = a.
      const Eigen::Matrix<double, 3, 3, Eigen::RowMajor> M =
          Eigen::Map<const Eigen::Matrix<double, 3, 3, Eigen::RowMajor>>(v.data());
      EXPECT_LT((b * M - a).norm(), 1e-12);
    } else {
      const auto& ray = dynamic_cast<const VTargetRelativeRay&>(m);
      const Eigen::Vector3d o = world(ray.ParentIdentifier1(), ray.PositionInParent1());
      const Eigen::Vector3d p = world(ray.ParentIdentifier2(), ray.PositionInParent2());
      const Eigen::Vector3d d = v.segment<3>(3);
      EXPECT_LT((v.head<3>() - o).norm(), 1e-9);
      EXPECT_LT((v.tail<3>() - p).norm(), 1e-9);
      EXPECT_NEAR(d.norm(), 1.0, 1e-12);
      // The residual is the point's offset across the ray: its length is the distance.
      double r[2];
      target->Residual({}, View(r, 2));
      const Eigen::Vector3d across = (p - o) - d * d.dot(p - o);
      EXPECT_NEAR(std::hypot(r[0], r[1]), across.norm(), 1e-9);
    }
  }
}

TEST_F(LabellingAndMultiParentTargets, JacobiansMatchCentralDifferences) {
  std::mt19937 gen(84);
  for (int trial = 0; trial < 4; ++trial) {
    VComputeSubject cs(Subject(9, gen));
    ASSERT_EQ(cs.NumTargets(), 9u + 1 + 4 + 3 + 10); // points, every older kind, the new ones
    EXPECT_LT(WorstTargetJacobianError(cs, RandomState(cs.NumParams(), gen), gen, 17), 1e-6);
  }
}

TEST_F(LabellingAndMultiParentTargets, MissingSegmentsOrWeightLeaveThemUnboundWithTheirMessage) {
  auto model = std::make_shared<VSubjectCalibrated>();
  model->Segments()[0].m_Value->SetIdentifier(0);
  auto com = std::make_shared<VTargetCentreOfMass>();
  com->AddTerm(0, Eigen::Vector3d(1, 0, 0), 1.0);
  com->AddTerm(7, Eigen::Vector3d(0, 1, 0), 1.0);
  model->AddTarget(com, false);
  auto weightless = std::make_shared<VTargetCentreOfMass>();
  weightless->AddTerm(0, Eigen::Vector3d(1, 0, 0), 1.0);
  weightless->AddTerm(0, Eigen::Vector3d(1, 0, 0), -1.0);
  model->AddTarget(weightless, false);
  auto ray = std::make_shared<VTargetRelativeRay>();
  ray->SetParentIdentifiers(5, 6);
  model->AddTarget(ray, false);
  auto orientation = std::make_shared<VTargetRelativeOrientation>();
  orientation->SetParentIdentifiers(0, 9);
  model->AddTarget(orientation, false);
  VComputeSubject cs(model);
  ASSERT_EQ(cs.NumTargets(), 4u);
  EXPECT_EQ(cs.Target(0).Errors(), "VComputeTargetCentreOfMass cannot find segment ");
  EXPECT_EQ(cs.Target(1).Errors(), "VComputeTargetCentreOfMass has no weight ");
  EXPECT_EQ(cs.Target(2).Errors(), "VComputeTargetRelativeRay cannot find segment 1. "
                                   "VComputeTargetRelativeRay cannot find segment 2. ");
  EXPECT_EQ(cs.Target(3).Errors(), "VComputeTargetRelativeOrientation cannot find segment. ");
  const Eigen::VectorXd x = Eigen::VectorXd::Constant(cs.NumParams(), 0.3);
  cs.UpdateSegments(Span(x), EChain);
  for (std::uint32_t t = 0; t < 4; ++t) {
    const IComputeTarget& target = cs.Target(t);
    Eigen::MatrixXd J = Eigen::MatrixXd::Ones(target.NumValues(), x.size());
    target.ValueJacobian(J);
    EXPECT_EQ(J.norm(), 0.0);
    for (double v : target.Values())
      EXPECT_EQ(v, 0.0);
  }
  // The single-target path of a target on several segments is the whole tree's.
  EXPECT_EQ(&cs.UpdateTarget(2, Span(x), EChain), &cs.Target(2));
}

TEST(WriteTargetsToModel, ACopyTakesBackEveryTargetsGeometryAndAReloadFollowsTheModel) {
  std::mt19937 gen(85);
  const auto model = Subject(6, gen);
  VComputeSubject cs(model);

  // A copy of a model with other geometry (same classes) gets this model's targets back.
  const auto other = Subject(6, gen);
  const auto copy = std::static_pointer_cast<VSubjectCalibrated>(other->Clone());
  ASSERT_FALSE(copy->Equals(*model));
  std::string why;
  ASSERT_TRUE(cs.WriteToModel(*copy, WithTargets, &why)) << why;
  // Statistics the run-time targets do not hold stay the copy's own.
  const auto holdsAll = [](const ITargetCalibrated& t) {
    return !dynamic_cast<const ITargetRange*>(&t) && !dynamic_cast<const ITargetDescriptor*>(&t);
  };
  for (std::uint32_t t = 0; t < model->NumTargets(); ++t)
    if (holdsAll(*model->Target(t))) {
      EXPECT_TRUE(copy->Target(t)->Equals(*model->Target(t))) << t << model->Target(t)->Key();
    }

  // The other way round: the model takes the other geometry, a reload follows it, and what the
  // reloaded subject writes back is that geometry.
  VComputeSubject otherCs(other);
  ASSERT_TRUE(otherCs.WriteToModel(*model, WithTargets, &why)) << why;
  ASSERT_TRUE(cs.ReloadFromModel(&why)) << why;
  VComputeSubject fresh(model);
  const Eigen::VectorXd x = RandomState(cs.NumParams(), gen);
  cs.UpdateSegments(Span(x), EChain);
  fresh.UpdateSegments(Span(x), EChain);
  for (std::uint32_t t = 0; t < cs.NumTargets(); ++t) {
    const auto a = cs.Target(t).Values(), b = fresh.Target(t).Values();
    ASSERT_EQ(a.size(), b.size());
    for (size_t i = 0; i < a.size(); ++i)
      EXPECT_EQ(a[i], b[i]) << t;
  }
  const auto written = std::static_pointer_cast<VSubjectCalibrated>(other->Clone());
  ASSERT_TRUE(cs.WriteToModel(*written, WithTargets));
  for (std::uint32_t t = 0; t < model->NumTargets(); ++t)
    if (holdsAll(*model->Target(t))) {
      EXPECT_TRUE(written->Target(t)->Equals(*model->Target(t))) << t;
    }
}

TEST(WriteTargetsToModel, AModelWithOtherTargetsIsRefusedUntouched) {
  std::mt19937 gen(86);
  const auto model = Subject(5, gen);
  VComputeSubject cs(model);
  const auto fewer = RandomSubject(5, gen);
  const auto before = std::static_pointer_cast<VSubjectCalibrated>(fewer->Clone());
  std::string why;
  EXPECT_FALSE(cs.WriteToModel(*fewer, WithTargets, &why));
  EXPECT_EQ(why, "the model has another number of targets");
  EXPECT_TRUE(fewer->Equals(*before));

  // Same count, one class swapped (the last target, a relative ray, for a relative position).
  const auto swapped = std::static_pointer_cast<VSubjectCalibrated>(model->Clone());
  VSubjectCalibrated rebuilt;
  rebuilt.Segments() = swapped->Segments();
  for (std::uint32_t t = 0; t + 1 < swapped->NumTargets(); ++t)
    rebuilt.AddTarget(swapped->Target(t), false);
  rebuilt.AddTarget(std::make_shared<VTargetRelativePosition>(), false);
  const auto untouched = std::static_pointer_cast<VSubjectCalibrated>(rebuilt.Clone());
  EXPECT_FALSE(cs.WriteToModel(rebuilt, WithTargets, &why));
  EXPECT_NE(why.find("TargetRelativePosition, not a TargetRelativeRay"), std::string::npos) << why;
  EXPECT_TRUE(rebuilt.Equals(*untouched));
}

} // namespace
} // namespace KinematicTest
