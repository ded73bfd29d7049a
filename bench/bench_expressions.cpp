// Expressions per second on the parameter and geometry expressions of a lower-body subject.

#include "River/CoreOstraTypesUtils/ExpressionParsers.h"

#include <benchmark/benchmark.h>

#include <string>
#include <vector>

using namespace CoreOstraTypesUtils;
using CoreOstraTypes::VSubjectParametrised;

namespace {

VSubjectParametrised LowerBodySubject() {
  VSubjectParametrised subject;
  auto addStatic = [&](const char* name, const char* expression) {
    VSubjectParametrised::VStaticParameter p;
    p.m_Name = name;
    p.m_DefaultExpression = expression;
    subject.m_StaticParameters.push_back(p);
  };
  addStatic("Height", "1780");
  addStatic("MarkerRadius", "7");
  addStatic("Leg Length", "Height*0.53");
  addStatic("Knee Width", "105");
  addStatic("Ankle Width", "72");
  addStatic("InterAsisDistance", "0.1288*'Leg Length' - 48.56");
  addStatic("AsisTrocanterDistance", "0.1288*'Leg Length'-48.56");
  addStatic("C", "'Leg Length'*0.115 - 15.3");
  addStatic("Theta", "0.5");
  addStatic("Beta", "0.314");
  const char* dynamics[] = {"LThighLength", "RThighLength", "LTibiaLength", "RTibiaLength",
                            "PelvisDepth",  "HipOffsetX",   "HipOffsetY",   "FootLength"};
  for (const char* name : dynamics) {
    VSubjectParametrised::VDynamicParameter p;
    p.m_Name = name;
    p.m_Value = 400.0;
    subject.m_DynamicParameters.push_back(p);
  }
  return subject;
}

const std::vector<std::string>& GeometryExpressions() {
  static const std::vector<std::string> expressions = {
      "C*cos(Theta)*sin(Beta) - AsisTrocanterDistance*cos(Beta)",
      "-(C*sin(Theta) - InterAsisDistance/2)",
      "C*cos(Theta)*cos(Beta) + AsisTrocanterDistance*sin(Beta)",
      "-LThighLength",
      "LTibiaLength*-1",
      "('Knee Width'/2 + MarkerRadius)",
      "-('Ankle Width'/2 + MarkerRadius)",
      "FootLength*0.75",
      "PelvisDepth/2 + HipOffsetX",
      "HipOffsetY - 0.5*PelvisDepth",
      "RThighLength^1",
      "0",
      "-0.10471975511965977",
      "1.5707963267948966",
      "RTibiaLength/2",
      "'Leg Length'*0.0125 + MarkerRadius",
  };
  return expressions;
}

void BM_EvaluateSubjectExpressions(benchmark::State& state) {
  VDynamicExpressionParserSimple parser;
  std::vector<std::string> errors;
  parser.SetParameters(LowerBodySubject(), errors);
  const auto& expressions = GeometryExpressions();
  for (auto _ : state) {
    for (const auto& text : expressions) {
      double value = 0.0;
      if (!parser.Evaluate(text, value)) state.SkipWithError("expression failed");
      benchmark::DoNotOptimize(value);
    }
  }
  state.SetItemsProcessed(state.iterations() * static_cast<int64_t>(expressions.size()));
}
BENCHMARK(BM_EvaluateSubjectExpressions);

void BM_EvaluateLinearSubjectExpressions(benchmark::State& state) {
  VDynamicExpressionParserSimple parser;
  std::vector<std::string> errors;
  parser.SetParameters(LowerBodySubject(), errors);
  const auto& expressions = GeometryExpressions();
  VMathNodeSimple node("", 0.0);
  std::string message;
  for (auto _ : state) {
    for (const auto& text : expressions) {
      if (!parser.EvaluateLinear(text, node, message)) state.SkipWithError("expression failed");
      benchmark::DoNotOptimize(node.m_Value);
    }
  }
  state.SetItemsProcessed(state.iterations() * static_cast<int64_t>(expressions.size()));
}
BENCHMARK(BM_EvaluateLinearSubjectExpressions);

void BM_DefineSubjectParameters(benchmark::State& state) {
  const VSubjectParametrised subject = LowerBodySubject();
  VDynamicExpressionParserSimple parser;
  std::vector<std::string> errors;
  for (auto _ : state) {
    errors.clear();
    benchmark::DoNotOptimize(parser.SetParameters(subject, errors));
  }
  state.SetItemsProcessed(
      state.iterations() *
      static_cast<int64_t>(subject.m_StaticParameters.size() + subject.m_DynamicParameters.size()));
}
BENCHMARK(BM_DefineSubjectParameters);

} // namespace

BENCHMARK_MAIN();
