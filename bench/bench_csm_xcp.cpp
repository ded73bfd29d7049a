// CSM export of 200 markers over 36,000 frames (five minutes at 120 Hz), against the floor of
// formatting the same numbers with snprintf into memory; the ratio of the two times of one run
// and the export's peak allocation are printed after the table.
#include "AllocationCounter.h"
#include "LongTake.h"
#include "RatioReporter.h"
#include "exporters/trajectory/CsmExporter.h"
#include "plugin/host/Character.h"
#include "plugin/host/Database.h"
#include "plugin/host/HTimeManager.h"
#include "plugin/host/Marker.h"
#include <benchmark/benchmark.h>
#include <cmath>
#include <cstdio>
#include <vector>

namespace {

using Bench::kFrames;
using Bench::kMarkers;

std::vector<Marker*>& buildScene() {
  return Bench::longTake({"M", "Bench", false});
}

// A stream that counts and discards what is written to it.
FILE* countingStream(long long* o_pCount) {
  cookie_io_functions_t functions{};
  functions.write = [](void* i_pCookie, const char*, size_t i_size) -> ssize_t {
    *static_cast<long long*>(i_pCookie) += static_cast<long long>(i_size);
    return static_cast<ssize_t>(i_size);
  };
  return fopencookie(o_pCount, "w", functions);
}

void BM_CsmExport(benchmark::State& state) {
  std::vector<Marker*>& markers = buildScene();
  CsmExporter* pExporter = CsmExporter::createInstance();
  long long bytes = 0;
  FILE* pNull = countingStream(&bytes);
  pExporter->setStream(pNull);
  pExporter->setFilePath("bench.csm");
  for (Marker* pMarker : markers)
    pExporter->moduleList().add(pMarker);
  int64_t peak = 0;
  for (auto _ : state) {
    const Bench::PeakAllocation allocation;
    pExporter->reset();
    pExporter->write();
    std::fflush(pNull);
    peak = allocation.bytes();
  }
  state.counters["peak MB"] = double(peak) / 1e6;
  state.SetItemsProcessed(state.iterations() * int64_t(kMarkers) * kFrames);
  state.SetBytesProcessed(bytes);
  std::fclose(pNull);
  pExporter->deleteThis();
}

// The same numbers taken straight from the tracks and printed into one growing buffer.
void BM_SnprintfFloor(benchmark::State& state) {
  std::vector<Marker*>& markers = buildScene();
  std::vector<char> buffer;
  for (auto _ : state) {
    buffer.clear();
    char text[1024];
    for (int f = 0; f < kFrames; ++f) {
      int n = std::snprintf(text, sizeof text, "%d", f);
      buffer.insert(buffer.end(), text, text + n);
      for (const Marker* pMarker : markers) {
        const Vec3& p = pMarker->m_track.getKeyValue(f);
        n = std::snprintf(text, sizeof text, "  %.3f %.3f %.3f", p.x, p.y, p.z);
        buffer.insert(buffer.end(), text, text + n);
      }
      buffer.push_back('\n');
    }
    benchmark::DoNotOptimize(buffer.data());
  }
  state.SetItemsProcessed(state.iterations() * int64_t(kMarkers) * kFrames);
  state.SetBytesProcessed(int64_t(state.iterations()) * int64_t(buffer.size()));
}

} // namespace

BENCHMARK(BM_CsmExport)->Unit(benchmark::kMillisecond)->Iterations(2);
BENCHMARK(BM_SnprintfFloor)->Unit(benchmark::kMillisecond)->Iterations(2);

int main(int argc, char** argv) {
  benchmark::Initialize(&argc, argv);
  Bench::RatioReporter reporter;
  benchmark::RunSpecifiedBenchmarks(&reporter);
  reporter.printRatio("BM_CsmExport / BM_SnprintfFloor", "BM_CsmExport/iterations:2",
                      "BM_SnprintfFloor/iterations:2");
  benchmark::Shutdown();
  return 0;
}
