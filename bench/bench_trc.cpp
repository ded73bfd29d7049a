// TRC export of a long take: 200 markers x 36,000 frames (five minutes at 120 Hz), against the
// floor of formatting the same numbers with snprintf into memory.
#include "AnvilCore/ExportDriver.h"
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
constexpr int kMarkers = 200;
constexpr int kFrames = 36000;

void buildScene() {
  static bool s_built = false;
  if (s_built) return;
  s_built = true;
  g_db->clearScene();
  HTimeManager* pTime = g_db->getTimeManager();
  pTime->setFrameRate(120.0);
  const int64_t tpf = pTime->getTicksPerFrame();
  pTime->setAnimRange(HTimeRange(0, (kFrames - 1) * tpf));
  for (int m = 0; m < kMarkers; ++m) {
    auto* pMarker = new Marker(HString("M" + std::to_string(m)));
    pMarker->m_track.reserve(kFrames);
    for (int f = 0; f < kFrames; ++f)
      pMarker->m_track.setKey(f * tpf, Vec3(1000.0 * std::sin(f * 0.01 + m), 500.0 + m,
                                            1200.0 * std::cos(f * 0.013 - m)));
    g_db->addToScene(pMarker, false, nullptr, false, false);
  }
  g_theOperationStack.setStream(nullptr, false);
}

std::string outputPath() {
  return (std::filesystem::temp_directory_path() /
          ("anvil-bench-" + std::to_string(::getpid()) + ".trc"))
      .string();
}

void BM_TrcExport(benchmark::State& state) {
  buildScene();
  TrcExporter* pExporter = TrcExporter::createInstance();
  AnvilCore::ExportRequest request;
  request.path = outputPath();
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
  buildScene();
  std::vector<const Marker*> markers;
  for (int i = 0; i < g_db->getNumNodes(); ++i) markers.push_back(static_cast<Marker*>(g_db->getNode(i)));
  std::string buffer;
  for (auto _ : state) {
    buffer.clear();
    char text[160];
    for (int f = 0; f < kFrames; ++f) {
      buffer.append(text, size_t(std::snprintf(text, sizeof text, "%d\t%f", f, f / 120.0)));
      for (const Marker* pMarker : markers) {
        const Vec3& p = pMarker->m_track.getKeyValue(f);
        buffer.append(text, size_t(std::snprintf(text, sizeof text, "\t%f\t%f\t%f", p.x, p.y, p.z)));
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
