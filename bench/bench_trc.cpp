// TRC export of a long take: 200 markers x 36,000 frames (five minutes at 120 Hz), against the
// floor of formatting the same numbers with snprintf into memory; the ratio and the export's
// peak allocation are printed after the table.
#include "AllocationCounter.h"
#include "AnvilCore/ExportDriver.h"
#include "LongTake.h"
#include "RatioReporter.h"
#include "exporters/trajectory/TrcExporter.h"
#include "plugin/host/Database.h"
#include "plugin/host/HTimeManager.h"
#include "plugin/host/Marker.h"
#include "plugin/host/OperationStack.h"
#include <benchmark/benchmark.h>
#include <cmath>
#include <cstdio>
#include <filesystem>
#include <string>
#include <unistd.h>

namespace {
using namespace Bench;

void BM_TrcExport(benchmark::State& state) {
  longTake();
  TrcExporter* pExporter = TrcExporter::createInstance();
  AnvilCore::ExportRequest request;
  request.path = tempOutput(".trc");
  std::string error;
  int64_t peak = 0;
  for (auto _ : state) {
    const Bench::PeakAllocation allocation;
    if (AnvilCore::runExport(*pExporter, request, error) != AnvilCore::EExportStatus::EOk)
      state.SkipWithError(error.c_str());
    peak = allocation.bytes();
  }
  state.counters["peak MB"] = double(peak) / 1e6;
  const auto bytes = std::filesystem::file_size(request.path);
  state.SetBytesProcessed(int64_t(state.iterations()) * int64_t(bytes));
  state.counters["values/s"] = benchmark::Counter(3.0 * kMarkers * kFrames * state.iterations(),
                                                  benchmark::Counter::kIsRate);
  std::filesystem::remove(request.path);
  pExporter->deleteThis();
}

// The same numbers formatted with plain snprintf into one memory buffer: the cost of the text.
void BM_SnprintfFloor(benchmark::State& state) {
  const std::vector<Marker*>& markers = longTake();
  std::string buffer;
  for (auto _ : state) {
    buffer.clear();
    char text[160];
    for (int f = 0; f < kFrames; ++f) {
      buffer.append(text, size_t(std::snprintf(text, sizeof text, "%d\t%f", f, f / 120.0)));
      for (const Marker* pMarker : markers) {
        const Vec3& p = pMarker->m_track.getKeyValue(f);
        buffer.append(text,
                      size_t(std::snprintf(text, sizeof text, "\t%f\t%f\t%f", p.x, p.y, p.z)));
      }
      buffer += '\n';
    }
    benchmark::DoNotOptimize(buffer.data());
  }
  state.SetBytesProcessed(int64_t(state.iterations()) * int64_t(buffer.size()));
  state.counters["values/s"] = benchmark::Counter(3.0 * kMarkers * kFrames * state.iterations(),
                                                  benchmark::Counter::kIsRate);
}

BENCHMARK(BM_TrcExport)->Unit(benchmark::kMillisecond)->Iterations(2);
BENCHMARK(BM_SnprintfFloor)->Unit(benchmark::kMillisecond)->Iterations(2);
} // namespace

int main(int argc, char** argv) {
  benchmark::Initialize(&argc, argv);
  Bench::RatioReporter reporter;
  benchmark::RunSpecifiedBenchmarks(&reporter);
  reporter.printRatio("BM_TrcExport / BM_SnprintfFloor", "BM_TrcExport/iterations:2",
                      "BM_SnprintfFloor/iterations:2");
  benchmark::Shutdown();
  return 0;
}
