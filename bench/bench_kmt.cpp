// Subject file writing and reading of a large subject (60 segments, 300 markers, 300 targets),
// against rapidxml parsing and printing the same document alone: the ratio is what the schema
// layer, the records and the expression passes cost on top of the XML itself.

#include "RatioReporter.h"
#include "River/CoreOstraKMTIO/Reader.h"
#include "River/CoreOstraKMTIO/Writer.h"
#include "River/CoreOstraTypes/NameHash.h"

#include <benchmark/benchmark.h>
#include <rapidxml/rapidxml.hpp>
#include <rapidxml/rapidxml_print.hpp>

#include <iterator>
#include <string>
#include <vector>

namespace {

using namespace CoreOstraTypes;

struct VLargeSubject {
  VSubjectParametrised m_Subject;
  VSubjectApplicationData m_AppData;
  VSubjectDynamicSubspace m_Subspace;
};

/// A chain of ball joints with markers spread over it, each marker with a Gaussian point target.
VLargeSubject MakeLargeSubject() {
  VLargeSubject large;
  auto& s = large.m_Subject;
  s.m_Name = "Large";
  s.m_DynamicParameters = {{"Length", 100.0, 1.0, 100.0, true}};
  for (std::uint32_t i = 0; i < 60; ++i) {
    VSubjectParametrised::VSegment segment;
    segment.m_Name = "Seg" + std::to_string(i);
    segment.m_SegmentIndex = i;
    if (i > 0) segment.m_ParentSegmentIndex = i - 1;
    segment.m_TreeDepth = i;
    segment.m_Joint.m_Name = "Joint" + std::to_string(i);
    segment.m_Joint.m_JointType = i == 0 ? VJointTypeBase::EFree : VJointTypeBase::EBall;
    const std::size_t n = i == 0 ? 6 : 3;
    segment.m_Joint.m_Mean.assign(n, 0.1);
    segment.m_Joint.m_Covariance.assign(n * n, 0.01);
    segment.m_PreRotation = {"0", "0.1", "0"};
    segment.m_PreTranslation = {"0", "0", i == 0 ? "0" : "Length"};
    s.m_Segments.push_back(segment);
  }
  large.m_AppData.m_Segments.resize(60);
  for (std::uint32_t m = 0; m < 300; ++m) {
    const std::string name = "M" + std::to_string(m);
    s.m_Markers.push_back({name, NameHash(name), false, 10.0, {}, 0.0});
    VSubjectParametrised::VTarget target;
    target.m_Type = VTargetTypeBase::ELocalPointToWorldPointGaussian;
    target.m_MarkerIndices = {m};
    target.m_SegmentIndices = {m % 60};
    target.m_StateExpressions = {"10", "-20", "Length/2"};
    target.m_Covariance = {1, 0, 0, 0, 1, 0, 0, 0, 1};
    target.m_TemplateCovariance = {2, 0, 0, 0, 2, 0, 0, 0, 2};
    target.m_ViewNormals = {{0, 0, 1}};
    s.m_Targets.push_back(target);
  }
  large.m_AppData.m_Markers.resize(300);
  large.m_AppData.m_Targets.resize(300);
  return large;
}

const VLargeSubject& Large() {
  static const VLargeSubject large = MakeLargeSubject();
  return large;
}

const std::string& LargeText() {
  static const std::string text = [] {
    std::string out;
    CoreOstraKMTIO::VWriter().WriteText(out, Large().m_Subject, Large().m_AppData,
                                        Large().m_Subspace, 16);
    return out;
  }();
  return text;
}

void BM_KmtWrite(benchmark::State& state) {
  CoreOstraKMTIO::VWriter writer;
  std::string text;
  for (auto _ : state) {
    writer.WriteText(text, Large().m_Subject, Large().m_AppData, Large().m_Subspace, 16);
    benchmark::DoNotOptimize(text.data());
  }
  state.SetBytesProcessed(std::int64_t(state.iterations()) * std::int64_t(LargeText().size()));
}

void BM_RapidXmlPrint(benchmark::State& state) {
  std::vector<char> buffer(LargeText().begin(), LargeText().end());
  buffer.push_back('\0');
  rapidxml::xml_document<> document;
  document.parse<0>(buffer.data());
  std::string text;
  for (auto _ : state) {
    text.clear();
    rapidxml::print(std::back_inserter(text), document, 0);
    benchmark::DoNotOptimize(text.data());
  }
  state.SetBytesProcessed(std::int64_t(state.iterations()) * std::int64_t(LargeText().size()));
}

void BM_KmtRead(benchmark::State& state) {
  CoreOstraKMTIO::VReader reader;
  VSubjectParametrised subject;
  VSubjectApplicationData appData;
  VSubjectDynamicSubspace subspace;
  std::vector<std::string> errors, warnings;
  for (auto _ : state) {
    if (reader.ReadText(LargeText(), subject, appData, subspace, errors, warnings) !=
        CoreOstraKMTIO::ResultOk) {
      state.SkipWithError("read failed");
      break;
    }
    benchmark::DoNotOptimize(subject.m_Targets.data());
  }
  state.SetBytesProcessed(std::int64_t(state.iterations()) * std::int64_t(LargeText().size()));
}

void BM_RapidXmlParse(benchmark::State& state) {
  std::vector<char> buffer;
  for (auto _ : state) {
    buffer.assign(LargeText().begin(), LargeText().end());
    buffer.push_back('\0');
    rapidxml::xml_document<> document;
    document.parse<0>(buffer.data());
    benchmark::DoNotOptimize(document.first_node());
  }
  state.SetBytesProcessed(std::int64_t(state.iterations()) * std::int64_t(LargeText().size()));
}

} // namespace

BENCHMARK(BM_KmtWrite)->Unit(benchmark::kMillisecond);
BENCHMARK(BM_RapidXmlPrint)->Unit(benchmark::kMillisecond);
BENCHMARK(BM_KmtRead)->Unit(benchmark::kMillisecond);
BENCHMARK(BM_RapidXmlParse)->Unit(benchmark::kMillisecond);
int main(int argc, char** argv) {
  benchmark::Initialize(&argc, argv);
  Bench::RatioReporter reporter;
  benchmark::RunSpecifiedBenchmarks(&reporter);
  reporter.printRatio("KMT read / bare rapidxml parse", "BM_KmtRead", "BM_RapidXmlParse");
  reporter.printRatio("KMT write / bare rapidxml print", "BM_KmtWrite", "BM_RapidXmlPrint");
  benchmark::Shutdown();
  return 0;
}
