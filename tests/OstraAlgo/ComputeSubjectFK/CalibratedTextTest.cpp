// The calibrated model's text form: a written model reads back equal, malformed text is refused
// with a message naming its line and leaves the model as it was, and the log summary.

#include "EveryKindSubject.h"

#include "OstraAlgo/KinematicAlgo/CalibratedText.h"

#include <gtest/gtest.h>

#include <cstring>
#include <sstream>

namespace KinematicTest {
namespace {

// Every target kind, every joint kind with non-trivial statistics, names that need their
// length prefix, a marker that is not a target, and sticks.
std::shared_ptr<VSubjectCalibrated> RichSubject(std::mt19937& gen) {
  auto subject = SubjectWithEveryKind(9, gen);
  subject->SetName("Walker with\na line break ");
  subject->SetIdentifier(17);
  std::uniform_real_distribution<double> u(-1.0, 1.0);
  for (std::int32_t i = 0; i < subject->Segments().Size(); ++i) {
    ISegmentCalibrated& segment = *subject->Segments()[i].m_Value;
    segment.SetBoundingBox({u(gen), u(gen), u(gen), u(gen), u(gen), 1e-300});
    auto joint = segment.Joint();
    joint->SetName(i == 1 ? "" : "joint " + std::to_string(i));
    const Eigen::Index n = joint->NumDynamicParams();
    joint->SetMeanDynamic(Eigen::VectorXd::Random(n) / 3.0);
    joint->SetCentreDynamic(Eigen::VectorXd::Random(n) * 1e-17);
    joint->SetCovDynamic(Eigen::MatrixXd::Random(n, n));
    joint->SetRangeDynamic(Eigen::MatrixXd::Random(n, n) * 1e12);
  }
  auto lone = std::make_shared<VTargetPosition>(101u);
  lone->SetName("  Lone marker  ");
  lone->SetPositionInParent(RandomVector(gen, 3.0));
  subject->AddMarker(lone);
  subject->SetSticks({{0, 3, {255, 0, 10}}, {2, 9, {1, 2, 3}}});
  return subject;
}

std::string Written(const ISubjectCalibrated& subject) {
  std::ostringstream out;
  subject.Write(out);
  return out.str();
}

TEST(CalibratedText, AWrittenSubjectReadsBackEqual) {
  std::mt19937 gen(51);
  for (int trial = 0; trial < 5; ++trial) {
    const auto subject = RichSubject(gen);
    const std::string text = Written(*subject);
    VSubjectCalibrated read;
    std::string error;
    std::istringstream in(text);
    ASSERT_TRUE(read.Read(in, &error)) << error;
    EXPECT_TRUE(read.Equals(*subject));
    EXPECT_TRUE(subject->Equals(read));
    EXPECT_EQ(Written(read), text);
    // A target that is a marker is still the same object as that marker.
    for (std::uint32_t t = 0; t < subject->NumTargets(); ++t)
      for (std::uint32_t m = 0; m < subject->NumMarkers(); ++m)
        EXPECT_EQ(subject->Target(t) == subject->Marker(m), read.Target(t) == read.Marker(m));
  }
}

TEST(CalibratedText, EqualityNoticesEachKindOfChange) {
  std::mt19937 gen(52);
  const auto subject = RichSubject(gen);
  const auto changed = [&](auto change) {
    VSubjectCalibrated copy(*subject);
    change(copy);
    return !copy.Equals(*subject);
  };
  EXPECT_FALSE(changed([](VSubjectCalibrated&) {}));
  EXPECT_TRUE(changed([](VSubjectCalibrated& s) { s.SetSticks({}); }));
  EXPECT_TRUE(changed([](VSubjectCalibrated& s) {
    s.Segments()[2].m_Value->Joint()->SetRotation(Eigen::Vector3d(0, 0, 1e-300));
  }));
  EXPECT_TRUE(changed([](VSubjectCalibrated& s) { s.Marker(s.NumMarkers() - 1)->SetName("x"); }));
  EXPECT_TRUE(changed([](VSubjectCalibrated& s) {
    auto* ray = dynamic_cast<VTargetSegmentRay*>(s.Target(11).get());
    ASSERT_NE(ray, nullptr);
    ray->SetResidualCovariance(Eigen::MatrixXd::Identity(2, 2));
  }));
}

// Every way the text can end early must be refused cleanly, and a failed read must not touch
// the subject read into.
TEST(CalibratedText, TruncatedTextIsRefusedAndChangesNothing) {
  std::mt19937 gen(53);
  const auto subject = SubjectWithEveryKind(3, gen);
  subject->SetSticks({{0, 1, {9, 9, 9}}});
  const std::string text = Written(*subject);
  std::mt19937 other(54);
  const auto before = RandomSubject(2, other);
  VSubjectCalibrated target(*before);
  for (size_t n = 0; n + 1 < text.size(); ++n) {
    // Cutting only trailing white space leaves a complete subject.
    if (text.find_first_not_of(" \n", n) == std::string::npos) continue;
    std::string error;
    ASSERT_FALSE(target.ReadText(std::string_view(text).substr(0, n), &error)) << n;
    ASSERT_EQ(error.rfind("line ", 0), 0u) << error;
    ASSERT_TRUE(target.Equals(*before)) << n;
  }
}

struct Malformed {
  const char* m_Find;
  const char* m_Replace;
  const char* m_Message;
};

TEST(CalibratedText, MalformedTextNamesWhatIsWrong) {
  std::mt19937 gen(55);
  const auto subject = RandomSubject(3, gen);
  subject->AddTarget(std::make_shared<VTargetSegmentPlane>(101u), false);
  subject->SetSticks({{0, 2, {1, 2, 3}}});
  const std::string text = Written(*subject);
  const Malformed cases[] = {
      {"NumSegments: 3", "NumSegments: x3", "expected an unsigned whole number"},
      {"NumSegments: 3", "NumSegments: 99999999", "NumSegments 99999999 exceeds"},
      {"ParentSegment: 0\n2\nSegment: S2", "ParentSegment: 2\n2\nSegment: S2",
       "which does not come before it"},
      {"TypeName: TargetSegmentPlane", "TypeName: TargetSegmentPlanX", "unknown target type"},
      {"NumDynamicParams: 6", "NumDynamicParams: 5", "has 6 parameters, not 5"},
      {"IsMarker: 1 Reference: 2", "IsMarker: 1 Reference: 7", "refers to marker 7 of 3"},
      {"IsMarker: 1 Reference: 2", "IsMarker: 2 Reference: 2", "IsMarker 2 exceeds 1"},
      {"NumSticks: 1\n0 2 1 2 3", "NumSticks: 1\n0 5 1 2 3", "joins a marker that does not exist"},
      {"NumSticks: 1\n0 2 1 2 3", "NumSticks: 1\n0 2 1 256 3", "colour 256 exceeds 255"},
      {"PoseInThis:", "PoseInThat:", "expected 'PoseInThis:'"},
      {"NumSticks: 1\n0 2 1 2 3\n", "NumSticks: 1\n0 2 1 2 3\nmore", "unexpected text after"},
      {"\nSubject: Random", "\nSubject: Rand", "expected 'ID:'"},
  };
  for (const Malformed& c : cases) {
    std::string bad = text;
    const size_t at = bad.find(c.m_Find);
    ASSERT_NE(at, std::string::npos) << c.m_Find;
    bad.replace(at, std::strlen(c.m_Find), c.m_Replace);
    VSubjectCalibrated read;
    std::string error;
    EXPECT_FALSE(read.ReadText(bad, &error)) << c.m_Replace;
    EXPECT_NE(error.find(c.m_Message), std::string::npos) << error;
    EXPECT_EQ(error.rfind("line ", 0), 0u) << error;
  }
  // A string length beyond the text, and a length that makes the label miss.
  VSubjectCalibrated read;
  std::string error;
  EXPECT_FALSE(read.ReadText("4000000000\nSubject: x", &error));
  EXPECT_NE(error.find("runs past the end"), std::string::npos) << error;
  EXPECT_FALSE(read.ReadText("3\nSubject: Random ID: -1", &error));
  EXPECT_NE(error.find("expected 'ID:'"), std::string::npos) << error;
}

TEST(CalibratedText, SummaryIndentsSegmentsByTheirDepth) {
  auto subject = std::make_shared<VSubjectCalibrated>();
  subject->SetName("Bob");
  subject->ClearSegments();
  const char* names[] = {"Hips", "Spine", "Head", "LeftLeg"};
  const std::int32_t parents[] = {-1, 0, 1, 0};
  const std::int32_t types[] = {0, 1, 3, 2};
  for (int i = 0; i < 4; ++i) {
    auto segment = std::make_shared<VSegmentCalibrated>();
    segment->SetName(names[i]);
    segment->Joint()->SetType(types[i]);
    subject->Segments().Add(parents[i], segment);
  }
  subject->AddTarget(std::make_shared<VTargetPosition>(0u), true);
  EXPECT_EQ(Summary(*subject), "Subject: Bob\n"
                               "Markers : 1\n"
                               "Segments : 4\n"
                               "Root Segment : Hips, joint=Free\n"
                               " Segment : Spine (parent= Hips), joint=Ball\n"
                               "  Segment : Head (parent= Spine), joint=Hinge\n"
                               " Segment : LeftLeg (parent= Hips), joint=HardySpicer\n");
}

} // namespace
} // namespace KinematicTest
