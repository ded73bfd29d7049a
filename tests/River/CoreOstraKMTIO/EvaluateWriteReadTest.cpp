// A parametrised subject evaluated, written and read back gives the same numbers, whether the
// file keeps the expressions with the parameter values or only the evaluated numbers.

#include "../CoreOstraTypesUtils/ValidSubject.h"
#include "KmtTestSupport.h"

#include "DebugServices/LogCapture.h"
#include "River/CoreOstraTypesUtils/ExpressionNumber.h"
#include "River/CoreOstraTypesUtils/SubjectCheck.h"
#include "River/CoreOstraTypesUtils/SubjectEvaluation.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <tuple>

using namespace CoreOstraTypesUtils;
using CoreOstraTypes::VSubject;
using CoreOstraTypes::VSubjectParametrised;

namespace {

VSubject Evaluated(const VSubjectParametrised& subject) {
  VSubject solved;
  EXPECT_TRUE(SubjectFromParametrised(subject, solved));
  return solved;
}

/// Writes and reads back `valid`; the read subject.
VSubjectParametrised WrittenAndRead(const VValidSubject& valid, const VScratch& scratch) {
  const auto path = scratch / "Walker.kmf";
  std::vector<std::string> messages;
  EXPECT_EQ(CoreOstraKMTIO::Write(path, valid.m_Subject, valid.m_AppData, {}, &messages,
                                  CoreOstraKMTIO::AutomaticVersionCode),
            CoreOstraKMTIO::ResultOk)
      << (messages.empty() ? "" : messages.front());
  const VReadBack back = ReadFile(path, "Walker");
  EXPECT_EQ(back.m_Result, CoreOstraKMTIO::ResultOk)
      << (back.m_Errors.empty() ? "" : back.m_Errors.front());
  return back.m_Records.m_Subject;
}

void ExpectSameNumbers(const VSubject& a, const VSubject& b) {
  ASSERT_EQ(a.m_Segments.size(), b.m_Segments.size());
  for (std::size_t i = 0; i < a.m_Segments.size(); ++i) {
    const auto &x = a.m_Segments[i], &y = b.m_Segments[i];
    EXPECT_EQ(x.m_PreTranslation, y.m_PreTranslation) << x.m_Name;
    EXPECT_EQ(x.m_PreRotation, y.m_PreRotation) << x.m_Name;
    EXPECT_EQ(x.m_Bounds, y.m_Bounds) << x.m_Name;
    EXPECT_EQ(x.m_Joint.m_Mean, y.m_Joint.m_Mean) << x.m_Name;
    EXPECT_EQ(x.m_Joint.m_Covariance, y.m_Joint.m_Covariance) << x.m_Name;
    for (int k = 0; k < 3; ++k)
      EXPECT_NEAR(x.m_Joint.m_JointOrientation[k], y.m_Joint.m_JointOrientation[k], 1e-12);
  }
  // Files group targets by kind, so compare them in one order.
  auto sorted = [](std::vector<VSubject::VTarget> targets) {
    std::sort(targets.begin(), targets.end(), [](const auto& x, const auto& y) {
      return std::tie(x.m_Type, x.m_SegmentIndices, x.m_MarkerIndices) <
             std::tie(y.m_Type, y.m_SegmentIndices, y.m_MarkerIndices);
    });
    return targets;
  };
  const auto ta = sorted(a.m_Targets), tb = sorted(b.m_Targets);
  ASSERT_EQ(ta.size(), tb.size());
  for (std::size_t i = 0; i < ta.size(); ++i) {
    EXPECT_EQ(ta[i].m_State, tb[i].m_State) << i;
    EXPECT_EQ(ta[i].m_Covariance, tb[i].m_Covariance) << i;
  }
  ASSERT_EQ(a.m_Markers.size(), b.m_Markers.size());
  for (std::size_t i = 0; i < a.m_Markers.size(); ++i)
    EXPECT_EQ(a.m_Markers[i].m_MarkerId, b.m_Markers[i].m_MarkerId);
}

} // namespace

TEST(EvaluateWriteRead, SameNumbersFromExpressionsAndFromBakedValues) {
  VValidSubject valid = MakeValidSubject();
  valid.m_Subject.m_DynamicParameters[0].m_Value = 123.45678901234567;
  valid.m_Subject.m_DynamicParameters[1].m_Value = 1.0 / 3.0;
  const VSubject solved = Evaluated(valid.m_Subject);
  VScratch scratch;

  const VSubjectParametrised read = WrittenAndRead(valid, scratch);
  ExpectSameNumbers(Evaluated(read), solved);
  ZMT::VLogCapture capture;
  EXPECT_TRUE(SubjectParametrisedCheck(read));
  EXPECT_TRUE(capture.Records().empty());

  // The evaluated numbers as the only expressions.
  VValidSubject baked = valid;
  for (std::size_t i = 0; i < solved.m_Segments.size(); ++i) {
    auto& segment = baked.m_Subject.m_Segments[i];
    const auto& numbers = solved.m_Segments[i];
    for (int k = 0; k < 3; ++k) {
      segment.m_PreTranslation[k] = FormatExpressionNumber(numbers.m_PreTranslation[k]);
      segment.m_PreRotation[k] = FormatExpressionNumber(numbers.m_PreRotation[k]);
    }
    for (int k = 0; k < 6; ++k)
      segment.m_Bounds[k] = FormatExpressionNumber(numbers.m_Bounds[k]);
  }
  for (std::size_t i = 0; i < solved.m_Targets.size(); ++i) {
    auto& texts = baked.m_Subject.m_Targets[i].m_StateExpressions;
    for (std::size_t k = 0; k < texts.size(); ++k)
      texts[k] = FormatExpressionNumber(solved.m_Targets[i].m_State[k]);
  }
  baked.m_Subject.m_DynamicParameters.clear();
  ExpectSameNumbers(Evaluated(WrittenAndRead(baked, scratch)), solved);
}
