// FBX export of the long take (200 markers x 36,000 frames) plus one 60-bone skeleton animated
// over the same frames, against writing the same number of bytes with one plain fwrite. Prints
// the time ratio, and the peak memory the export allocates against the key data in flat form
// (8-byte time, 4-byte value and 4-byte flags per key; the layer itself holds less, as the three
// curves of a property share their times and flags are kept as runs). Both benchmarks run the
// same number of iterations, so that a moment of load on the shared machine weighs alike.
#include "AllocationCounter.h"
#include "AnvilCore/ExportDriver.h"
#include "LongTake.h"
#include "RatioReporter.h"
#include "exporters/scene/AnvilFbxExporter.h"
#include "plugin/host/SolvingBone.h"
#include "plugin/host/SolvingSetup.h"
#include "plugin/host/SubjectManager.h"
#include <atomic>
#include <benchmark/benchmark.h>
#include <cstdio>
#include <cstdlib>
#include <filesystem>
#include <malloc.h>
#include <map>
#include <new>
#include <vector>

namespace {
using namespace Bench;
constexpr int kBones = 60;

void buildScene() {
  static bool s_built = false;
  if (s_built) return;
  s_built = true;
  longTake({"M", "Walker", false});
  Character* pWalker = g_db->getSubjectManager()->getSubject(0);
  SolvingSetup* pSetup = pWalker->getSolvingSetup(true);
  const int64_t tpf = g_db->getTimeManager()->getTicksPerFrame();
  Module* pParent = pSetup;
  for (int b = 0; b < kBones; ++b) {
    auto* pBone = new SolvingBone(HString("Bone" + std::to_string(b)));
    pBone->setPreTranslation(Vec3(0.0, 0.0, 100.0));
    pBone->m_rotationTrack.reserve(kFrames);
    for (int f = 0; f < kFrames; ++f)
      pBone->m_rotationTrack.setKey(f * tpf, AnvilRotation(Vec3(std::sin(b), 1.0, std::cos(b)),
                                                           30.0 * std::sin(f * 0.02 + b)));
    g_db->addChild(pParent, pBone);
    // A chain of five, then back to the setup: twelve limbs of five bones.
    pParent = (b % 5 == 4) ? static_cast<Module*>(pSetup) : pBone;
  }
}

// Key data in flat form: three curves per animated property.
int64_t heldKeyBytes() {
  return int64_t(kMarkers + kBones) * 3 * kFrames * (8 + 4 + 4);
}

uintmax_t s_bytes = 0;
double s_memoryRatio = 0.0;

void BM_FbxExport(benchmark::State& state) {
  buildScene();
  AnvilFbxExporter* pExporter = AnvilFbxExporter::createInstance();
  AnvilCore::ExportRequest request;
  request.path = tempOutput(".fbx");
  std::string error;
  for (auto _ : state) {
    const PeakAllocation peak;
    if (AnvilCore::runExport(*pExporter, request, error) != AnvilCore::EExportStatus::EOk)
      state.SkipWithError(error.c_str());
    s_memoryRatio = double(peak.bytes()) / double(heldKeyBytes());
  }
  s_bytes = std::filesystem::file_size(request.path);
  state.SetBytesProcessed(int64_t(state.iterations()) * int64_t(s_bytes));
  state.counters["file MB"] = double(s_bytes) / 1e6;
  std::filesystem::remove(request.path);
  pExporter->deleteThis();
}

// The floor: the file's size in one fwrite.
void BM_PlainFwrite(benchmark::State& state) {
  std::vector<uint8_t> bytes(s_bytes, 1);
  const std::string path = tempOutput(".raw");
  for (auto _ : state) {
    FILE* pFile = std::fopen(path.c_str(), "wb");
    std::fwrite(bytes.data(), 1, bytes.size(), pFile);
    std::fclose(pFile);
  }
  state.SetBytesProcessed(int64_t(state.iterations()) * int64_t(s_bytes));
  std::filesystem::remove(path);
}

} // namespace

BENCHMARK(BM_FbxExport)->Unit(benchmark::kMillisecond)->Iterations(3);
BENCHMARK(BM_PlainFwrite)->Unit(benchmark::kMillisecond)->Iterations(3);

int main(int argc, char** argv) {
  benchmark::Initialize(&argc, argv);
  Bench::RatioReporter reporter;
  benchmark::RunSpecifiedBenchmarks(&reporter);
  reporter.printRatio("FBX export / plain fwrite of the same bytes", "BM_FbxExport/iterations:3",
                      "BM_PlainFwrite/iterations:3");
  std::printf("FBX export peak memory / key data held: %.2f\n", s_memoryRatio);
  benchmark::Shutdown();
  return 0;
}
