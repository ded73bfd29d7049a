// Recording to a Flow file and reading it back: 36,000 states of 200 marker items, written by
// VWriter the way the MCP exporter drives it (new items each state, bodies from the store), and
// read back through the memory-mapped input.
//
// Floors: the same bytes written with one fwrite, and the same bytes copied out of a mapped file.
// The writer's time is that of its calls (WriteState and Close), measured by hand, so that making
// and filling the items, which belongs to the caller, isn't counted.

#include "AllocationCounter.h"
#include "FlowBenchMarker.h"
#include "RatioReporter.h"

#include "Flow2/Flow2File/VReader.h"
#include "Flow2/Flow2File/VWriter.h"
#include "Flow2/Flow2Store/VFlowStoreFactory.h"
#include "Flow2/Flow2Types/VFlowItem.h"
#include "Utils/UtilsFileSystem/FileIO.h"
#include "Utils/UtilsFileSystem/FileStreams.h"
#include "Utils/UtilsFileSystem/MemoryMappedInputStream.h"

#include <benchmark/benchmark.h>
#include <boost/filesystem.hpp>

#include <chrono>
#include <cstdio>
#include <cstdlib>
#include <vector>

namespace {

constexpr int States = 36000;
constexpr int Markers = 200;
constexpr std::int64_t Period = 135000000 / 120;

using Bench::MarkerItem;
using Bench::VFlowBenchMarker;
using Bench::VMarker;

void Check(bool ok, const char* what) {
  if (!ok) {
    std::fprintf(stderr, "bench_flow_file: %s failed\n", what);
    std::abort();
  }
}

const boost::filesystem::path& Folder() {
  static const boost::filesystem::path s_Folder = [] {
    auto folder = boost::filesystem::temp_directory_path() /
                  boost::filesystem::unique_path("anvil-flow-bench-%%%%-%%%%");
    boost::filesystem::create_directories(folder);
    return folder;
  }();
  return s_Folder;
}

struct VRecorder {
  ZMT::IFlowStoreHandle m_Store;
  ZMT::IFlowBufferFactoryHandle m_Buffers;
  ZMT::IFlowStateFactoryHandle m_States;
  ZMT::VItemHandles m_Items;
  std::int64_t m_Frame = 0;

  VRecorder() {
    auto& factory = Flow2Store::GetFlowStoreFactory();
    Check(factory.CreateStore(m_Store, ZMT::MakeFlowItemFactories<VFlowBenchMarker>(), 1)
                  .IsSuccess() &&
              factory.CreateBufferFactory(m_Buffers, nullptr).IsSuccess() &&
              factory.CreateStateFactory(m_States).IsSuccess(),
          "making the store");
  }

  /// A state of new markers, as the exporter makes one per frame.
  ZMT::IFlowStateHandle Frame() {
    ZMT::IFlowStateHandle state;
    const std::int64_t frame = m_Frame++;
    Check(m_States->CreateState(state, {frame * Period, std::uint64_t(Period), 1}, {}, {})
              .IsSuccess(),
          "a state");
    Check(m_Store
              ->CreateItems(ZMT::Detail::FlowTypeStatics<VFlowBenchMarker>().m_TypeInfo, Markers,
                            m_Items)
              .IsSuccess(),
          "items");
    for (int i = 0; i < Markers; ++i) {
      auto& marker = static_cast<VMarker&>(*static_cast<MarkerItem*>(m_Items[i].Get()));
      marker.m_X = frame * 0.5 + i;
      marker.m_Y = i * 2.0;
      marker.m_Z = 1000.0 - i;
      marker.m_Residual = 0.25f;
      marker.m_Flags = static_cast<std::uint32_t>(i);
    }
    state->AddItems(std::move(m_Items));
    return state;
  }

  /// Writes a whole recording to `path`; gives the seconds spent in the writer's own calls.
  double Record(const boost::filesystem::path& path) {
    auto [pFile, result] = UtilsFileSystem::OpenOutputFile(path, true);
    Check(pFile != nullptr, "opening the output");
    Flow2File::VFileStreamOutput stream{UtilsFileSystem::VFileOutputStream(pFile)};
    Flow2File::VWriter writer(m_Buffers, m_Store);
    using Clock = std::chrono::steady_clock;
    Clock::duration spent{};
    m_Frame = 0;
    auto begin = Clock::now();
    Check(writer.Open(&stream).IsSuccess(), "Open");
    spent += Clock::now() - begin;
    // The previous frame is held until the next one is made, so its items go back to the store
    // while the new frame's are live and the free list keeps them for reuse. Released before the
    // next frame, 200 items would leave the free list past 8 times the live count: trimmed.
    ZMT::IFlowStateHandle previous;
    for (int s = 0; s < States; ++s) {
      ZMT::IFlowStateHandle state = Frame();
      begin = Clock::now();
      Check(writer.WriteState(*state).IsSuccess(), "WriteState");
      spent += Clock::now() - begin;
      previous = std::move(state);
    }
    begin = Clock::now();
    Check(writer.Close().IsSuccess(), "Close");
    Check(stream.Stream().Close().IsSuccess(), "closing the file");
    spent += Clock::now() - begin;
    return std::chrono::duration<double>(spent).count();
  }
};

boost::filesystem::path RecordingPath() {
  return Folder() / "recording.mcp";
}

std::vector<std::uint8_t> ReadWhole(const boost::filesystem::path& path) {
  std::vector<std::uint8_t> bytes(boost::filesystem::file_size(path));
  std::FILE* pFile = std::fopen(path.c_str(), "rb");
  Check(pFile && std::fread(bytes.data(), 1, bytes.size(), pFile) == bytes.size(), "reading back");
  std::fclose(pFile);
  return bytes;
}

void BM_FlowFileWrite(benchmark::State& state) {
  VRecorder recorder;
  for (auto _ : state)
    state.SetIterationTime(recorder.Record(RecordingPath()));
  state.SetBytesProcessed(std::int64_t(state.iterations()) *
                          std::int64_t(boost::filesystem::file_size(RecordingPath())));
}

void BM_PlainFwrite(benchmark::State& state) {
  const std::vector<std::uint8_t> bytes = ReadWhole(RecordingPath());
  const auto path = Folder() / "plain.bin";
  for (auto _ : state) {
    const auto begin = std::chrono::steady_clock::now();
    std::FILE* pFile = std::fopen(path.c_str(), "wb");
    Check(pFile && std::fwrite(bytes.data(), bytes.size(), 1, pFile) == 1, "fwrite");
    std::fclose(pFile);
    state.SetIterationTime(
        std::chrono::duration<double>(std::chrono::steady_clock::now() - begin).count());
  }
  state.SetBytesProcessed(std::int64_t(state.iterations()) * std::int64_t(bytes.size()));
  boost::filesystem::remove(path);
}

void BM_FlowFileRead(benchmark::State& state) {
  VRecorder side; // a fresh store to read into
  std::size_t items = 0;
  for (auto _ : state) {
    auto [pStream, result] = UtilsFileSystem::OpenInputStream(RecordingPath());
    Check(pStream != nullptr, "opening the recording");
    Flow2File::VReader reader(side.m_Store, side.m_Buffers, side.m_States);
    Check(reader.Open(pStream.get()).IsSuccess(), "reader Open");
    Check(reader.GetStateCount() == std::size_t(States), "state count");
    for (std::size_t i = 0; i < reader.GetStateCount(); ++i) {
      ZMT::IFlowStateHandle read;
      Check(reader.ReadState(i, read) == ZMT::IResult::Ok, "ReadState");
      items += read->GetItemCount();
    }
  }
  benchmark::DoNotOptimize(items);
  state.SetBytesProcessed(std::int64_t(state.iterations()) *
                          std::int64_t(boost::filesystem::file_size(RecordingPath())));
}

void BM_MappedMemcpy(benchmark::State& state) {
  std::vector<std::uint8_t> buffer(1 << 20);
  for (auto _ : state) {
    UtilsFileSystem::VMemoryMappedInputStream stream;
    Check(stream.Open(RecordingPath()).IsSuccess(), "mapping");
    std::uint64_t size = 0;
    stream.GetSize(size);
    for (std::uint64_t done = 0; done < size; done += buffer.size())
      Check(stream.Read(buffer.data(), std::min<std::uint64_t>(buffer.size(), size - done)),
            "mapped read");
    benchmark::DoNotOptimize(buffer.data());
  }
}

/// Heap allocations per state once warmed up: those of the writer's calls, and those of the
/// whole road (making the state and its items, writing it, releasing it).
void ReportAllocations() {
  VRecorder recorder;
  auto [pFile, result] = UtilsFileSystem::OpenOutputFile(Folder() / "allocations.mcp", true);
  Check(pFile != nullptr, "opening the output");
  Flow2File::VFileStreamOutput stream{UtilsFileSystem::VFileOutputStream(pFile)};
  Flow2File::VWriter writer(recorder.m_Buffers, recorder.m_Store);
  Check(writer.Open(&stream).IsSuccess(), "Open");
  ZMT::IFlowStateHandle previous; // held until the next frame is made, as in Record
  for (int s = 0; s < 1000; ++s) {
    ZMT::IFlowStateHandle state = recorder.Frame();
    Check(writer.WriteState(*state).IsSuccess(), "WriteState");
    previous = std::move(state);
  }
  constexpr int Counted = 9000; // stays below the index chunk at 10,000
  std::uint64_t inWriter = 0;
  const std::uint64_t before = Bench::g_allocationCount.load();
  for (int s = 0; s < Counted; ++s) {
    ZMT::IFlowStateHandle state = recorder.Frame();
    const std::uint64_t start = Bench::g_allocationCount.load();
    Check(writer.WriteState(*state).IsSuccess(), "WriteState");
    inWriter += Bench::g_allocationCount.load() - start;
    previous = std::move(state);
  }
  const std::uint64_t road = Bench::g_allocationCount.load() - before;
  Check(writer.Close().IsSuccess(), "Close");
  stream.Stream().Close();
  boost::filesystem::remove(Folder() / "allocations.mcp");
  std::printf("states written after warm-up: %d x %d markers; heap allocations in WriteState: "
              "%llu, on the whole road: %llu\n",
              Counted, Markers, static_cast<unsigned long long>(inWriter),
              static_cast<unsigned long long>(road));
  std::printf("allocations per state after warm-up: %g\n", double(inWriter) / Counted);
  std::printf("allocations per state after warm-up, whole road (store included): %g\n",
              double(road) / Counted);
}

} // namespace

BENCHMARK(BM_FlowFileWrite)->Unit(benchmark::kMillisecond)->UseManualTime()->Iterations(3);
BENCHMARK(BM_PlainFwrite)->Unit(benchmark::kMillisecond)->UseManualTime()->Iterations(3);
BENCHMARK(BM_FlowFileRead)->Unit(benchmark::kMillisecond)->Iterations(3);
BENCHMARK(BM_MappedMemcpy)->Unit(benchmark::kMillisecond)->Iterations(3);

int main(int argc, char** argv) {
  ReportAllocations();
  benchmark::Initialize(&argc, argv);
  Bench::RatioReporter reporter;
  benchmark::RunSpecifiedBenchmarks(&reporter);
  reporter.printRatio("Flow file writer / plain fwrite of the same bytes",
                      "BM_FlowFileWrite/iterations:3/manual_time",
                      "BM_PlainFwrite/iterations:3/manual_time");
  reporter.printRatio("Flow file reader (memory-mapped) / memcpy from the mapped file",
                      "BM_FlowFileRead/iterations:3", "BM_MappedMemcpy/iterations:3");
  benchmark::Shutdown();
  boost::system::error_code error;
  boost::filesystem::remove_all(Folder(), error);
  return 0;
}
