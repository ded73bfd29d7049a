// TRC export of a long take: 200 markers x 36,000 frames (five minutes at 120 Hz), against the
// floor of formatting the same numbers with snprintf into memory.
#include "AnvilCore/ExportDriver.h"
#include "LongTake.h"
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
  for (auto _ : state) {
    if (AnvilCore::runExport(*pExporter, request, error) != AnvilCore::EExportStatus::EOk)
      state.SkipWithError(error.c_str());
  }
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

BENCHMARK_MAIN();
