// Import throughput of the C3D and TRC readers on a long take: 100 markers x 12,000 frames
// (100 s at 120 Hz). Parsing alone (from memory) and a whole read into the scene (from a file)
// are measured, each against a floor that only decodes the same numbers without structure. The
// ratios of the reads to their floors, and the peak memory of a C3D read against the point data
// of the file, are printed after the table.
#include "AllocationCounter.h"
#include "AnvilCore/io/C3DReader.h"
#include "AnvilCore/io/ISceneReader.h"
#include "AnvilCore/io/TrcReader.h"
#include "RatioReporter.h"
#include "plugin/host/Database.h"
#include "tests/AnvilCore/io/C3DTestFile.h"
#include <benchmark/benchmark.h>
#include <cmath>
#include <cstdio>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <string>
#include <unistd.h>

namespace {
double s_c3dMemoryRatio = 0.0;
constexpr int kMarkers = 100;
constexpr int kFrames = 12000;

std::vector<uint8_t> makeC3D(C3D::EProcessor i_processor, float i_scale) {
  C3DTestFile file;
  file.processor = i_processor;
  file.scale = i_scale;
  file.rate = 120.0f;
  file.fillLinear(kMarkers, kFrames);
  for (int f = 0; f < kFrames; ++f)
    for (int m = 0; m < kMarkers; ++m) {
      auto& p = file.frames[size_t(f)][size_t(m)];
      p = {float(1000.0 * std::sin(f * 0.01 + m)), float(500 + m),
           float(1200.0 * std::cos(f * 0.013 - m)), (f + m) % 97 == 0 ? -1.0f : 1.0f};
    }
  return file.build();
}

std::string makeTrc() {
  std::string text = "PathFileType\t4\t(X/Y/Z)\tbench.trc\n"
                     "DataRate\tCameraRate\tNumFrames\tNumMarkers\tUnits\tOrigDataRate\t"
                     "OrigDataStartFrame\tOrigNumFrames\n";
  text += "120.000000\t120.000000\t" + std::to_string(kFrames) + "\t" + std::to_string(kMarkers) +
          "\tmm\t120.000000\t1\t" + std::to_string(kFrames) + "\nFrame#\tTime\t";
  for (int m = 0; m < kMarkers; ++m)
    text += "Bob:M" + std::to_string(m) + "\t\t\t";
  text += "\n\t\t";
  for (int m = 0; m < kMarkers; ++m) {
    const std::string n = std::to_string(m + 1);
    text += "X" + n + "\tY" + n + "\tZ" + n + "\t";
  }
  text += "\n";
  char buffer[96];
  for (int f = 0; f < kFrames; ++f) {
    std::snprintf(buffer, sizeof buffer, "%d\t%f", f + 1, f / 120.0);
    text += buffer;
    for (int m = 0; m < kMarkers; ++m) {
      if ((f + m) % 97 == 0) {
        text += "\t\t\t";
        continue;
      }
      std::snprintf(buffer, sizeof buffer, "\t%f\t%f\t%f", 1000.0 * std::sin(f * 0.01 + m),
                    500.0 + m, 1200.0 * std::cos(f * 0.013 - m));
      text += buffer;
    }
    text += "\n";
  }
  return text;
}

const std::vector<uint8_t>& c3dBytes(int i_form) {
  static const std::vector<uint8_t> s_forms[] = {makeC3D(C3D::EProcessorIntel, -1.0f),
                                                 makeC3D(C3D::EProcessorDec, -1.0f),
                                                 makeC3D(C3D::EProcessorIntel, 0.05f)};
  return s_forms[i_form];
}

const std::string& trcText() {
  static const std::string s_text = makeTrc();
  return s_text;
}

void setCounters(benchmark::State& io_rState, size_t i_bytes) {
  io_rState.SetBytesProcessed(int64_t(io_rState.iterations()) * int64_t(i_bytes));
  io_rState.counters["samples/s"] = benchmark::Counter(
      double(kMarkers) * kFrames * double(io_rState.iterations()), benchmark::Counter::kIsRate);
}

std::string writeTemp(const char* i_pExtension, const char* i_pData, size_t i_size) {
  const std::string path = (std::filesystem::temp_directory_path() /
                            ("anvil-bench-import-" + std::to_string(::getpid()) + i_pExtension))
                               .string();
  std::ofstream(path, std::ios::binary).write(i_pData, std::streamsize(i_size));
  return path;
}

// Arguments: 0 float Intel, 1 float DEC, 2 integer.
void BM_C3DParse(benchmark::State& state) {
  const std::vector<uint8_t>& bytes = c3dBytes(int(state.range(0)));
  AnvilCore::C3DContent content;
  std::string error;
  for (auto _ : state) {
    if (!AnvilCore::parseC3D(bytes.data(), bytes.size(), content, error))
      state.SkipWithError(error.c_str());
    benchmark::DoNotOptimize(content.points.data());
  }
  setCounters(state, bytes.size());
}
BENCHMARK(BM_C3DParse)->Arg(0)->Arg(1)->Arg(2)->Unit(benchmark::kMillisecond);

// Floor: decode every frame value of the float Intel file, nothing else.
void BM_C3DDecodeFloor(benchmark::State& state) {
  const std::vector<uint8_t>& bytes = c3dBytes(0);
  const size_t start = (size_t(bytes[16]) | size_t(bytes[17]) << 8) * 512 - 512;
  std::vector<float> out((bytes.size() - start) / 4);
  for (auto _ : state) {
    for (size_t i = 0; i < out.size(); ++i)
      out[i] = C3D::getFloat(&bytes[start + 4 * i], C3D::EProcessorIntel);
    benchmark::DoNotOptimize(out.data());
  }
  setCounters(state, bytes.size());
}
BENCHMARK(BM_C3DDecodeFloor)->Unit(benchmark::kMillisecond);

void BM_C3DReadIntoScene(benchmark::State& state) {
  const std::vector<uint8_t>& bytes = c3dBytes(0);
  const std::string path =
      writeTemp(".c3d", reinterpret_cast<const char*>(bytes.data()), bytes.size());
  AnvilCore::ISceneReader* pReader = AnvilCore::SceneReaderRegistry::instance().find(path);
  std::string error;
  int64_t peak = 0;
  for (auto _ : state) {
    state.PauseTiming();
    g_db->clearScene();
    const Bench::PeakAllocation allocation;
    state.ResumeTiming();
    if (!pReader->read(path, error)) state.SkipWithError(error.c_str());
    peak = allocation.bytes();
  }
  g_db->clearScene();
  std::filesystem::remove(path);
  setCounters(state, bytes.size());
  // The point data of the file: x, y, z and residual of every point in every frame, as floats.
  const double pointBytes = 16.0 * kMarkers * kFrames;
  state.counters["peak MB"] = double(peak) / 1e6;
  s_c3dMemoryRatio = double(peak) / pointBytes;
}
BENCHMARK(BM_C3DReadIntoScene)->Unit(benchmark::kMillisecond);

void BM_TrcParse(benchmark::State& state) {
  const std::string& text = trcText();
  AnvilCore::TrcContent content;
  std::string error;
  for (auto _ : state) {
    if (!AnvilCore::parseTrc(text.data(), text.size(), content, error))
      state.SkipWithError(error.c_str());
    benchmark::DoNotOptimize(content.samples.data());
  }
  setCounters(state, text.size());
}
BENCHMARK(BM_TrcParse)->Unit(benchmark::kMillisecond);

// Floor: strtod over every number of the text, skipping separators, with no structure.
void BM_TrcStrtodFloor(benchmark::State& state) {
  const std::string& text = trcText();
  const size_t dataStart = text.find("\n1\t") + 1;
  for (auto _ : state) {
    double sum = 0.0;
    const char* p = text.c_str() + dataStart;
    while (*p) {
      char* pEnd;
      sum += std::strtod(p, &pEnd);
      p = pEnd == p ? p + 1 : pEnd;
    }
    benchmark::DoNotOptimize(sum);
  }
  setCounters(state, text.size());
}
BENCHMARK(BM_TrcStrtodFloor)->Unit(benchmark::kMillisecond);

void BM_TrcReadIntoScene(benchmark::State& state) {
  const std::string& text = trcText();
  const std::string path = writeTemp(".trc", text.data(), text.size());
  AnvilCore::ISceneReader* pReader = AnvilCore::SceneReaderRegistry::instance().find(path);
  std::string error;
  int64_t peak = 0;
  for (auto _ : state) {
    state.PauseTiming();
    g_db->clearScene();
    const Bench::PeakAllocation allocation;
    state.ResumeTiming();
    if (!pReader->read(path, error)) state.SkipWithError(error.c_str());
    peak = allocation.bytes();
  }
  g_db->clearScene();
  std::filesystem::remove(path);
  setCounters(state, text.size());
  state.counters["peak MB"] = double(peak) / 1e6;
}
BENCHMARK(BM_TrcReadIntoScene)->Unit(benchmark::kMillisecond);

} // namespace

int main(int argc, char** argv) {
  benchmark::Initialize(&argc, argv);
  Bench::RatioReporter reporter;
  benchmark::RunSpecifiedBenchmarks(&reporter);
  reporter.printRatio("BM_C3DReadIntoScene / BM_C3DDecodeFloor", "BM_C3DReadIntoScene",
                      "BM_C3DDecodeFloor");
  reporter.printRatio("BM_TrcReadIntoScene / BM_TrcStrtodFloor", "BM_TrcReadIntoScene",
                      "BM_TrcStrtodFloor");
  if (s_c3dMemoryRatio > 0.0)
    std::printf("BM_C3DReadIntoScene peak memory / point data: %.2f\n", s_c3dMemoryRatio);
  benchmark::Shutdown();
  return 0;
}
