// MCP export of the long take (200 markers x 36,000 frames) together with the demo's subjects and
// cameras, against writing the same number of bytes with one plain fwrite; the heap allocations
// each frame costs once the take is under way; and reading the recording back into a scene
// against reading the same take from C3D.
#include "AllocationCounter.h"
#include "AnvilCore/ExportDriver.h"
#include "AnvilCore/demo/DemoScene.h"
#include "AnvilCore/io/ISceneReader.h"
#include "LongTake.h"
#include "PlainFwrite.h"
#include "RatioReporter.h"
#include "exporters/mcp/AnvilMCPExporter.h"
#include "exporters/trajectory/C3DExporter.h"
#include <benchmark/benchmark.h>
#include <cstdio>
#include <filesystem>
#include <vector>

namespace {
using namespace Bench;

void buildScene() {
  static bool s_built = false;
  if (s_built) return;
  s_built = true;
  AnvilCore::buildDemoScene();
  LongTakeShape shape;
  shape.keepScene = true;
  longTake(shape);
}

bool exportTo(FileExporter& io_rExporter, const std::string& i_rPath) {
  AnvilCore::ExportRequest request;
  request.path = i_rPath;
  std::string error;
  return AnvilCore::runExport(io_rExporter, request, error) == AnvilCore::EExportStatus::EOk;
}

uintmax_t s_bytes = 0;
double s_allocationsPerFrame = -1.0;
const std::string& mcpPath() {
  static const std::string s_path = tempOutput(".mcp");
  return s_path;
}
const std::string& c3dPath() {
  static const std::string s_path = tempOutput(".c3d");
  return s_path;
}

void BM_McpExport(benchmark::State& state) {
  buildScene();
  AnvilMCPExporter* pExporter = AnvilMCPExporter::createInstance();
  for (auto _ : state)
    if (!exportTo(*pExporter, mcpPath())) state.SkipWithError("the MCP export failed");
  s_bytes = std::filesystem::file_size(mcpPath());
  state.SetBytesProcessed(int64_t(state.iterations()) * int64_t(s_bytes));
  state.counters["file MB"] = double(s_bytes) / 1e6;

  // Allocations of a whole take less those of its first thousand frames, per remaining frame.
  HTimeManager& time = *g_db->getTimeManager();
  const HTimeRange whole = time.getPlayRange();
  const int64_t tpf = time.getTicksPerFrame();
  constexpr int kWarmUp = 1000;
  time.setPlayRange(HTimeRange(whole.getStart(), whole.getStart() + (kWarmUp - 1) * tpf));
  const uint64_t before = g_allocationCount.load();
  exportTo(*pExporter, mcpPath());
  const uint64_t warmUp = g_allocationCount.load() - before;
  time.setPlayRange(whole);
  const uint64_t beforeWhole = g_allocationCount.load();
  exportTo(*pExporter, mcpPath());
  const uint64_t all = g_allocationCount.load() - beforeWhole;
  s_allocationsPerFrame = (double(all) - double(warmUp)) / double(kFrames - kWarmUp);
  pExporter->deleteThis();
}

// The floor: the file's size in one fwrite.
void BM_PlainFwrite(benchmark::State& state) {
  plainFwrite(state, s_bytes);
}

// Reading a recording into a fresh scene, through the reader `anvil` uses for its extension.
void readInto(benchmark::State& state, const std::string& i_rPath) {
  AnvilCore::ISceneReader* pReader = AnvilCore::SceneReaderRegistry::instance().find(i_rPath);
  if (!pReader) {
    state.SkipWithError(("no reader for " + i_rPath).c_str());
    return;
  }
  std::string error;
  for (auto _ : state) {
    state.PauseTiming();
    g_db->clearScene();
    state.ResumeTiming();
    if (!pReader->read(i_rPath, error)) state.SkipWithError(error.c_str());
  }
}

void BM_McpReadIntoScene(benchmark::State& state) {
  readInto(state, mcpPath());
}

void BM_C3DReadIntoScene(benchmark::State& state) {
  // The same take as C3D, written from the scene before it is cleared.
  static bool s_written = false;
  if (!s_written) {
    buildScene();
    C3DExporter* pExporter = C3DExporter::createInstance();
    s_written = exportTo(*pExporter, c3dPath());
    pExporter->deleteThis();
  }
  readInto(state, c3dPath());
}

} // namespace

BENCHMARK(BM_McpExport)->Unit(benchmark::kMillisecond)->Iterations(3);
BENCHMARK(BM_PlainFwrite)->Unit(benchmark::kMillisecond)->Iterations(3);
BENCHMARK(BM_C3DReadIntoScene)->Unit(benchmark::kMillisecond)->Iterations(3);
BENCHMARK(BM_McpReadIntoScene)->Unit(benchmark::kMillisecond)->Iterations(3);

int main(int argc, char** argv) {
  benchmark::Initialize(&argc, argv);
  Bench::RatioReporter reporter;
  benchmark::RunSpecifiedBenchmarks(&reporter);
  reporter.printRatio("MCP export / plain fwrite of the same bytes", "BM_McpExport/iterations:3",
                      "BM_PlainFwrite/iterations:3");
  if (s_allocationsPerFrame >= 0.0)
    std::printf("MCP export heap allocations per frame after warm-up: %.3f\n",
                s_allocationsPerFrame);
  reporter.printRatio("MCP read into the scene / C3D read into the scene",
                      "BM_McpReadIntoScene/iterations:3", "BM_C3DReadIntoScene/iterations:3");
  std::filesystem::remove(mcpPath());
  std::filesystem::remove(c3dPath());
  benchmark::Shutdown();
  return 0;
}
