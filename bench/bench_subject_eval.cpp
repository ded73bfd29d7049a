// Evaluations per second of a parametrised subject of 60 segments, 300 markers and 300 targets
// for new parameter values, against evaluating the same expression texts alone.

#include "RatioReporter.h"

#include "River/CoreOstraTypes/NameHash.h"
#include "River/CoreOstraTypesUtils/SubjectEvaluation.h"

#include <benchmark/benchmark.h>

#include <string>
#include <vector>

using namespace CoreOstraTypesUtils;
using CoreOstraTypes::VJointTypeBase;
using CoreOstraTypes::VSubject;
using CoreOstraTypes::VSubjectParametrised;
using CoreOstraTypes::VTargetTypeBase;

namespace {

constexpr int SegmentCount = 60, MarkerCount = 300;

VSubjectParametrised LargeSubject() {
  VSubjectParametrised s;
  s.m_Name = "Large";
  s.m_SubjectId = CoreOstraTypes::NameHash(s.m_Name);
  VSubjectParametrised::VStaticParameter height;
  height.m_Name = "Height";
  height.m_UserValue = 1780.0;
  VSubjectParametrised::VStaticParameter radius;
  radius.m_Name = "MarkerRadius";
  radius.m_DefaultExpression = "7";
  s.m_StaticParameters = {height, radius};
  for (int i = 0; i < SegmentCount; ++i)
    s.m_DynamicParameters.push_back({"Length" + std::to_string(i), 100.0, {}, 100.0 + i, true});

  for (int i = 0; i < SegmentCount; ++i) {
    VSubjectParametrised::VSegment segment;
    const std::string length = "Length" + std::to_string(i);
    segment.m_Name = "Segment" + std::to_string(i);
    segment.m_SegmentIndex = static_cast<std::uint32_t>(i);
    if (i > 0) segment.m_ParentSegmentIndex = static_cast<std::uint32_t>((i - 1) / 2);
    segment.m_TreeDepth = i == 0 ? 0 : s.m_Segments[(i - 1) / 2].m_TreeDepth + 1;
    segment.m_Joint.m_Name = "Joint" + std::to_string(i);
    segment.m_Joint.m_JointType = i == 0 ? VJointTypeBase::EFree : VJointTypeBase::EBall;
    const std::size_t n = i == 0 ? 6 : 3;
    segment.m_Joint.m_Mean.assign(n, 0.0);
    segment.m_Joint.m_Covariance.assign(n * n, 0.0);
    segment.m_PreTranslation = {"0", length + "*0.05", "-" + length};
    segment.m_PreRotation = {"0.1", "-0.05", "Height*0.0001"};
    segment.m_Bounds = {"-" + length + "/10", "-20", "-" + length,
                        length + "/10",       "20",  "MarkerRadius"};
    s.m_Segments.push_back(segment);
  }
  for (int i = 0; i < MarkerCount; ++i) {
    VSubjectParametrised::VMarker marker;
    marker.m_Name = "Marker" + std::to_string(i);
    marker.m_MarkerId = CoreOstraTypes::NameHash(marker.m_Name);
    marker.m_Radius = 7.0;
    s.m_Markers.push_back(marker);
    VSubjectParametrised::VTarget target;
    target.m_Type = VTargetTypeBase::ELocalPointToWorldPointGaussian;
    target.m_MarkerIndices = {static_cast<std::uint32_t>(i)};
    const int segment = i % SegmentCount;
    target.m_SegmentIndices = {static_cast<std::uint32_t>(segment)};
    const std::string length = "Length" + std::to_string(segment);
    target.m_StateExpressions = {"MarkerRadius + " + std::to_string(i % 7), length + "*0.25",
                                 "-(" + length + "/2 + MarkerRadius)"};
    target.m_Covariance = {1, 0, 0, 0, 1, 0, 0, 0, 1};
    s.m_Targets.push_back(target);
  }
  return s;
}

/// Every expression text that an evaluation reads, in its order.
std::vector<std::string> Expressions(const VSubjectParametrised& s) {
  std::vector<std::string> texts;
  for (const auto& segment : s.m_Segments) {
    texts.insert(texts.end(), segment.m_PreTranslation.begin(), segment.m_PreTranslation.end());
    texts.insert(texts.end(), segment.m_PreRotation.begin(), segment.m_PreRotation.end());
    texts.insert(texts.end(), segment.m_Bounds.begin(), segment.m_Bounds.end());
  }
  for (const auto& target : s.m_Targets)
    texts.insert(texts.end(), target.m_StateExpressions.begin(), target.m_StateExpressions.end());
  return texts;
}

void BM_SubjectEval(benchmark::State& state) {
  VSubjectEvaluator evaluator;
  if (!evaluator.SetSubject(LargeSubject())) state.SkipWithError("subject");
  VSubject solved;
  double bump = 0.0;
  for (auto _ : state) {
    bump += 0.001;
    for (std::size_t p = 0; p < SegmentCount; ++p)
      evaluator.SetParameter(p, 100.0 + double(p) + bump);
    if (!evaluator.Evaluate(solved)) state.SkipWithError("evaluation failed");
    benchmark::DoNotOptimize(solved.m_Targets.back().m_State.back());
  }
  state.SetItemsProcessed(state.iterations());
}
BENCHMARK(BM_SubjectEval);

// The floor: the same texts through the same parser with the same parameter updates, values
// into a flat array and nothing else.
void BM_ExpressionsAlone(benchmark::State& state) {
  const VSubjectParametrised subject = LargeSubject();
  const std::vector<std::string> texts = Expressions(subject);
  VDynamicExpressionParserSimple parser;
  std::vector<std::string> errors;
  parser.SetParameters(subject, errors);
  std::vector<std::string> names;
  for (const auto& p : subject.m_DynamicParameters)
    names.push_back(p.m_Name);
  std::vector<double> values(texts.size());
  double bump = 0.0;
  for (auto _ : state) {
    bump += 0.001;
    for (std::size_t p = 0; p < SegmentCount; ++p)
      parser.SetDynamicValue(names[p], 100.0 + double(p) + bump);
    for (std::size_t i = 0; i < texts.size(); ++i)
      if (!parser.Evaluate(texts[i], values[i])) state.SkipWithError("expression failed");
    benchmark::DoNotOptimize(values.back());
  }
  state.SetItemsProcessed(state.iterations());
}
BENCHMARK(BM_ExpressionsAlone);

} // namespace

int main(int argc, char** argv) {
  benchmark::Initialize(&argc, argv);
  Bench::RatioReporter reporter;
  benchmark::RunSpecifiedBenchmarks(&reporter);
  reporter.printRatio("bench_subject_eval / expressions alone", "BM_SubjectEval",
                      "BM_ExpressionsAlone");
  return 0;
}
