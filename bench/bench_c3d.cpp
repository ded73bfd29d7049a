// C3D export of a long take: 200 markers x 36,000 frames (five minutes at 120 Hz), in float and
// integer form, against writing the same number of bytes with one plain fwrite per frame. The
// ratios of each export to its floor are printed after the table; "peak MB" is the most the
// export allocates.
#include "AllocationCounter.h"
#include "AnvilCore/ExportDriver.h"
#include "LongTake.h"
#include "RatioReporter.h"
#include "exporters/trajectory/C3DExporter.h"
#include "plugin/host/Database.h"
#include "plugin/host/HTimeManager.h"
#include "plugin/host/Marker.h"
#include "plugin/host/OperationStack.h"
#include <benchmark/benchmark.h>
#include <cmath>
#include <cstdio>
#include <filesystem>
#include <map>
#include <string>
#include <unistd.h>
#include <vector>

namespace {
using namespace Bench;

void buildScene() {
  longTake({"Subject:M", nullptr, true});
}

std::string outputPath(const char* i_pSuffix) {
  return tempOutput(i_pSuffix);
}

// File size of each form's export, for its floor.
std::map<bool, uintmax_t>& exportedBytes() {
  static std::map<bool, uintmax_t> s_bytes;
  return s_bytes;
}

void BM_C3DExport(benchmark::State& state) {
  buildScene();
  const bool real = state.range(0) != 0;
  C3DExporter* pExporter = C3DExporter::createInstance();
  pExporter->setRealFormat(real);
  AnvilCore::ExportRequest request;
  request.path = outputPath(".c3d");
  std::string error;
  int64_t peak = 0;
  for (auto _ : state) {
    const Bench::PeakAllocation allocation;
    if (AnvilCore::runExport(*pExporter, request, error) != AnvilCore::EExportStatus::EOk)
      state.SkipWithError(error.c_str());
    peak = allocation.bytes();
  }
  state.counters["peak MB"] = double(peak) / 1e6;
  const uintmax_t bytes = std::filesystem::file_size(request.path);
  exportedBytes()[real] = bytes;
  state.SetBytesProcessed(int64_t(state.iterations()) * int64_t(bytes));
  state.counters["frames/s"] =
      benchmark::Counter(double(kFrames) * double(state.iterations()), benchmark::Counter::kIsRate);
  state.SetLabel(real ? "float" : "integer");
  std::filesystem::remove(request.path);
  pExporter->deleteThis();
}

// The floor: the same file size, the parameter blocks in one fwrite, then one fwrite per frame.
void BM_PlainFwrite(benchmark::State& state) {
  const bool real = state.range(0) != 0;
  const size_t frameSize = (real ? 4 : 2) * 4 * size_t(kMarkers);
  const uintmax_t total = exportedBytes()[real];
  const size_t headBytes = total > frameSize * kFrames ? size_t(total - frameSize * kFrames) : 0;
  std::vector<uint8_t> head(headBytes, 1), frame(frameSize, 2);
  const std::string path = outputPath(".raw");
  for (auto _ : state) {
    FILE* pFile = std::fopen(path.c_str(), "wb");
    std::fwrite(head.data(), 1, head.size(), pFile);
    for (int f = 0; f < kFrames; ++f) {
      frame[0] = uint8_t(f);
      std::fwrite(frame.data(), 1, frame.size(), pFile);
    }
    std::fclose(pFile);
  }
  state.SetBytesProcessed(int64_t(state.iterations()) * int64_t(total));
  state.SetLabel(real ? "float" : "integer");
  std::filesystem::remove(path);
}

} // namespace

// Each export runs before its floor, which needs the export's file size.
BENCHMARK(BM_C3DExport)->Arg(1)->Arg(0)->Unit(benchmark::kMillisecond);
BENCHMARK(BM_PlainFwrite)->Arg(1)->Arg(0)->Unit(benchmark::kMillisecond);

int main(int argc, char** argv) {
  benchmark::Initialize(&argc, argv);
  Bench::RatioReporter reporter;
  benchmark::RunSpecifiedBenchmarks(&reporter);
  reporter.printRatio("C3D float export / plain fwrite of the same bytes", "BM_C3DExport/1",
                      "BM_PlainFwrite/1");
  reporter.printRatio("C3D integer export / plain fwrite of the same bytes", "BM_C3DExport/0",
                      "BM_PlainFwrite/0");
  benchmark::Shutdown();
  return 0;
}
