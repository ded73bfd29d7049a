// A set of calibrated subjects as text, and skeleton parameters: evaluation of their
// expressions, link values, and their text form.

#include "EveryKindSubject.h"

#include "OstraAlgo/KinematicAlgo/CalibratedText.h"
#include "OstraAlgo/KinematicAlgo/VSkeletonParameters.h"
#include "OstraAlgo/KinematicAlgo/VSubjectSetCalibrated.h"

#include <gtest/gtest.h>

#include <sstream>

namespace KinematicTest {
namespace {

TEST(SubjectSet, ASetReadsBackEqualAndAFailedReadKeepsTheOldSet) {
  std::mt19937 gen(61);
  VSubjectSetCalibrated set;
  for (int i = 0; i < 3; ++i)
    set.Add(SubjectWithEveryKind(3 + i, gen));
  set.Add(nullptr); // ignored
  ASSERT_EQ(set.Count(), 3u);
  std::ostringstream out;
  set.Write(out);

  VSubjectSetCalibrated read;
  std::istringstream in(out.str());
  std::string error;
  ASSERT_TRUE(read.Read(in, &error)) << error;
  EXPECT_TRUE(read.Equals(set));

  EXPECT_FALSE(read.Remove(3));
  EXPECT_TRUE(read.Remove(1));
  EXPECT_FALSE(read.Equals(set));
  EXPECT_EQ(read.Get(1)->Segments().Size(), 5);
  EXPECT_EQ(read.Get(2), nullptr);

  // The third subject cut short: the whole read fails and the two-subject set stays.
  const std::string text = out.str();
  EXPECT_FALSE(read.ReadText(text.substr(0, text.size() - 40), &error));
  EXPECT_EQ(read.Count(), 2u);
  EXPECT_FALSE(read.ReadText("NumSubjects: 1\n", &error));
  EXPECT_EQ(read.Count(), 2u);
  read.Clear();
  EXPECT_EQ(read.Count(), 0u);
}

VSkeletonParameter Parameter(const std::string& name, const std::string& expression, double prior,
                             bool isStatic = true) {
  VSkeletonParameter p;
  p.m_Name = name;
  p.m_Expression = expression;
  p.m_Prior = prior;
  p.m_Value = -1.0;
  p.m_Static = isStatic;
  return p;
}

TEST(SkeletonParameters, ExpressionsUseTheParametersBeforeThem) {
  VSkeletonParameters parameters;
  parameters.Parameters() = {Parameter("Height", "", 1700),   Parameter("Leg", "Height * 0.5", 0),
                             Parameter("Bad", "Height +", 3), Parameter("Early", "Later", 0),
                             Parameter("Later", "", 5),       Parameter("Knee", "", 0.2, false)};
  std::vector<std::string> errors;
  EXPECT_FALSE(parameters.Evaluate(errors));
  const auto& p = parameters.Parameters();
  EXPECT_EQ(p[0].m_Value, 1700.0);
  EXPECT_EQ(p[1].m_Value, 850.0);
  EXPECT_EQ(p[2].m_Value, -1.0); // failed: left as it was
  EXPECT_EQ(p[3].m_Value, -1.0); // a later parameter is not known yet
  EXPECT_EQ(p[4].m_Value, 5.0);
  EXPECT_EQ(p[5].m_Value, -1.0); // not a shape parameter
  ASSERT_EQ(errors.size(), 2u);
  EXPECT_NE(errors[0].find("Bad"), std::string::npos) << errors[0];

  // Links use the current values, including one changed by hand.
  parameters.Parameters()[0].m_Value = 1800;
  VMarkerParameterLink marker{"LKNE", {"Leg", "0", "-Height / 10"}};
  std::array<double, 3> values{};
  errors.clear();
  ASSERT_TRUE(parameters.LinkValues(marker, values, errors));
  EXPECT_EQ(values, (std::array<double, 3>{850.0, 0.0, -180.0}));
  VSkeletonParameterLink segment{"Femur", {}};
  segment.m_Expressions.fill("Later");
  segment.m_Expressions[7] = "Nowhere * 2";
  std::array<double, 12> pose{};
  EXPECT_FALSE(parameters.LinkValues(segment, pose, errors));
  ASSERT_EQ(errors.size(), 1u);
  EXPECT_NE(errors[0].find("expression 7 of segment Femur"), std::string::npos) << errors[0];
  EXPECT_EQ(pose[0], 5.0);
}

TEST(SkeletonParameters, TextReadsBackEqualAndPrintShowsTheFlags) {
  VSkeletonParameters parameters;
  parameters.SetName("Bob's\nparameters");
  parameters.Parameters() = {Parameter("Height", "", 1700), Parameter("Leg", "Height * 0.5", 0.1)};
  parameters.Parameters()[1].m_Advanced = true;
  parameters.Parameters()[1].m_ReadOnly = true;
  parameters.Parameters()[1].m_Used = false;
  parameters.Parameters()[1].m_StandardDeviation = 1.0 / 3.0;
  parameters.SegmentLinks().push_back({"Femur", {"Leg", "", "1 2"}});
  parameters.MarkerLinks().push_back({"LKNE", {"Leg", "0", ""}});
  std::ostringstream out;
  parameters.Write(out);
  const std::string text = out.str();
  VSkeletonParameters read;
  VTextReader reader(text);
  ASSERT_TRUE(read.Read(reader)) << reader.Error();
  EXPECT_TRUE(reader.AtEnd());
  EXPECT_TRUE(read.Equals(parameters));
  read.MarkerLinks()[0].m_Expressions[2] = "1";
  EXPECT_FALSE(read.Equals(parameters));

  for (size_t n : {size_t(0), size_t(10), text.size() / 2, text.size() - 3}) {
    VTextReader cut(std::string_view(text).substr(0, n));
    EXPECT_FALSE(read.Read(cut)) << n;
    EXPECT_FALSE(cut.Error().empty());
  }
  EXPECT_EQ(parameters.Print(),
            "Parameter: Height Expression:  Value: -1 Prior: 1700 SD: 0 Static\n"
            "Parameter: Leg Expression: Height * 0.5 Value: -1 Prior: 0.1 SD: 0.333333 Advanced "
            "Read-only (not used) Static\n");
}

} // namespace
} // namespace KinematicTest
