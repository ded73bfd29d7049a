// USD export of five subjects of 60 bones over the long take's 36,000 frames, against the floor
// of formatting the same numbers with snprintf("%.9g") into memory.
#include "AnvilCore/ExportDriver.h"
#include "RatioReporter.h"
#include "SkeletonTake.h"
#include "exporters/scene/USDExporter.h"
#include <benchmark/benchmark.h>
#include <cstdio>
#include <filesystem>

namespace {
using namespace Bench;

constexpr int kSubjects = 5;
constexpr int kBones = 60;

std::vector<RetargetingBone*>& scene() {
  static std::vector<RetargetingBone*> s_bones;
  if (s_bones.empty()) {
    g_db->clearScene();
    HTimeManager* pTime = g_db->getTimeManager();
    pTime->setFrameRate(120.0);
    const int64_t tpf = pTime->getTicksPerFrame();
    pTime->setAnimRange(HTimeRange(0, (kFrames - 1) * tpf));
    pTime->setPlayRange(HTimeRange(0, (kFrames - 1) * tpf));
    g_theOperationStack.setStream(nullptr, false);
    s_bones = addSkeletonTake(kSubjects, kBones, kFrames);
  }
  return s_bones;
}

void BM_UsdExport(benchmark::State& state) {
  scene();
  USDExporter* pExporter = USDExporter::createInstance();
  AnvilCore::ExportRequest request;
  request.path = tempOutput(".usd");
  std::string error;
  for (auto _ : state) {
    if (AnvilCore::runExport(*pExporter, request, error) != AnvilCore::EExportStatus::EOk)
      state.SkipWithError(error.c_str());
  }
  state.SetBytesProcessed(int64_t(state.iterations()) *
                          int64_t(std::filesystem::file_size(request.path)));
  std::filesystem::remove(request.path);
  pExporter->deleteThis();
}

// Ten numbers a joint a frame (translation, rotation, scale) with snprintf("%.9g").
void BM_UsdSnprintfFloor(benchmark::State& state) {
  const std::vector<RetargetingBone*>& bones = scene();
  const int64_t tpf = g_db->getTimeManager()->getTicksPerFrame();
  std::string buffer;
  for (auto _ : state) {
    buffer.clear();
    char text[64];
    for (int f = 0; f < kFrames; ++f) {
      for (const RetargetingBone* pBone : bones) {
        const Vec3 p = pBone->getLocalPos(f * tpf);
        double x, y, z, w;
        pBone->getLocalRot(f * tpf).getAsQuaternion(x, y, z, w);
        for (const double value : {p.x * 0.1, p.y * 0.1, p.z * 0.1, w, x, y, z, 1.0, 1.0, 1.0})
          buffer.append(text, std::size_t(std::snprintf(text, sizeof text, "%.9g, ", value)));
      }
    }
    benchmark::DoNotOptimize(buffer.data());
  }
  state.SetBytesProcessed(int64_t(state.iterations()) * int64_t(buffer.size()));
}

BENCHMARK(BM_UsdExport)->Unit(benchmark::kMillisecond)->Iterations(1);
BENCHMARK(BM_UsdSnprintfFloor)->Unit(benchmark::kMillisecond)->Iterations(1);
} // namespace

int main(int argc, char** argv) {
  benchmark::Initialize(&argc, argv);
  Bench::RatioReporter reporter;
  benchmark::RunSpecifiedBenchmarks(&reporter);
  reporter.printRatio("USD export / snprintf of the same numbers", "BM_UsdExport/iterations:1",
                      "BM_UsdSnprintfFloor/iterations:1");
  benchmark::Shutdown();
  return 0;
}
