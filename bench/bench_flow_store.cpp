// Streaming frames through the Flow store: 50 items of three types per frame, each created from
// the store, filled, added to a state, and released with the state at the end of the frame. The
// floor is the same data made with std::make_shared into a reused vector.
//
// Global operator new is replaced here (and only here) by a counting one, so that the run can
// show that a warmed-up store streams frames without touching the heap.

#include "Flow2/Flow2Store/VFlowStoreFactory.h"
#include "Flow2/Flow2Types/IFlowState.h"
#include "Flow2/Flow2Types/VFlowItem.h"

#include "FlowBenchMarker.h"
#include "RatioReporter.h"
#include <benchmark/benchmark.h>

#include <array>
#include <atomic>
#include <cstdio>
#include <cstdlib>
#include <map>
#include <memory>
#include <new>
#include <string>
#include <vector>

namespace {
std::atomic<std::uint64_t> g_Allocations{0};

void* CountedAllocate(std::size_t size, std::size_t align) {
  g_Allocations.fetch_add(1, std::memory_order_relaxed);
  if (size == 0) size = 1;
  void* p = align > alignof(std::max_align_t)
                ? std::aligned_alloc(align, (size + align - 1) / align * align)
                : std::malloc(size);
  if (!p) throw std::bad_alloc();
  return p;
}
} // namespace

void* operator new(std::size_t size) {
  return CountedAllocate(size, 0);
}
void* operator new[](std::size_t size) {
  return CountedAllocate(size, 0);
}
void* operator new(std::size_t size, std::align_val_t align) {
  return CountedAllocate(size, static_cast<std::size_t>(align));
}
void* operator new[](std::size_t size, std::align_val_t align) {
  return CountedAllocate(size, static_cast<std::size_t>(align));
}
void operator delete(void* p) noexcept {
  std::free(p);
}
void operator delete[](void* p) noexcept {
  std::free(p);
}
void operator delete(void* p, std::size_t) noexcept {
  std::free(p);
}
void operator delete[](void* p, std::size_t) noexcept {
  std::free(p);
}
void operator delete(void* p, std::align_val_t) noexcept {
  std::free(p);
}
void operator delete[](void* p, std::align_val_t) noexcept {
  std::free(p);
}
void operator delete(void* p, std::size_t, std::align_val_t) noexcept {
  std::free(p);
}
void operator delete[](void* p, std::size_t, std::align_val_t) noexcept {
  std::free(p);
}

namespace {

constexpr int ItemsPerFrame = 50;
constexpr int Markers = 40;
constexpr int Qualities = 5;
constexpr int Poses = 5;
constexpr int StreamFrames = 10000;
constexpr std::int64_t TicksPerFrame = 135000000 / 120;

using Bench::MarkerItem;
using Bench::VFlowBenchMarker;
using Bench::VMarker;

struct VQuality {
  static constexpr const char* FlowClassName = "BenchQuality";
  std::uint32_t m_SubjectId = 0;
  float m_Quality = 0;
  std::uint32_t m_Count = 0;
  template <class S, class V> static void FlowFields(S& s, V&& v) {
    v("SubjectId", "", s.m_SubjectId);
    v("Quality", "", s.m_Quality);
    v("Count", "", s.m_Count);
  }
};
struct VFlowBenchQuality : VQuality {
  static constexpr const char* FlowTypeName = "FlowBenchQuality";
  static constexpr std::uint32_t FlowTypeId = 2;
  static constexpr ZMT::IFlowItemVersion FlowVersion{1, 0, 0};
};

struct VPose {
  static constexpr const char* FlowClassName = "BenchPose";
  std::array<double, 4> m_Rotation{0, 0, 0, 1};
  std::array<double, 3> m_Translation{};
  template <class S, class V> static void FlowFields(S& s, V&& v) {
    v("Rotation", "", s.m_Rotation);
    v("Translation", "", s.m_Translation);
  }
};
struct VFlowBenchPose : VPose {
  static constexpr const char* FlowTypeName = "FlowBenchPose";
  static constexpr std::uint32_t FlowTypeId = 3;
  static constexpr ZMT::IFlowItemVersion FlowVersion{1, 0, 0};
};

using QualityItem = ZMT::Detail::VFlowItem<VFlowBenchQuality>;
using PoseItem = ZMT::Detail::VFlowItem<VFlowBenchPose>;

template <class T> const ZMT::IFlowItemTypeInfo& TypeOf() {
  return ZMT::Detail::FlowTypeStatics<T>().m_TypeInfo;
}

void Fill(VMarker& m, std::int64_t frame, int i) {
  m.m_X = frame * 0.5 + i;
  m.m_Y = i * 2.0;
  m.m_Z = 1000.0 - i;
  m.m_Residual = 0.25f;
  m.m_Flags = static_cast<std::uint32_t>(i);
}
void Fill(VQuality& q, std::int64_t, int i) {
  q.m_SubjectId = static_cast<std::uint32_t>(i);
  q.m_Quality = 0.9f;
  q.m_Count = 8;
}
void Fill(VPose& p, std::int64_t frame, int i) {
  p.m_Translation = {double(frame), double(i), 0};
  p.m_Rotation = {0, 0, 0.7071, 0.7071};
}

struct VStreamer {
  ZMT::IFlowStoreHandle m_Store;
  ZMT::IFlowStateFactoryHandle m_States;

  VStreamer() {
    auto& factory = Flow2Store::GetFlowStoreFactory();
    if (factory
            .CreateStore(
                m_Store,
                ZMT::MakeFlowItemFactories<VFlowBenchMarker, VFlowBenchQuality, VFlowBenchPose>(),
                1)
            .IsFailure() ||
        factory.CreateStateFactory(m_States).IsFailure())
      std::abort();
  }

  /// Items of one type for one frame: one CreateItem each, or one CreateItems for all.
  template <class Item, class Data>
  void Add(ZMT::IFlowState& state, std::int64_t frame, int count, bool batch) {
    const ZMT::IFlowItemTypeInfo& type = TypeOf<Data>();
    if (batch) {
      if (m_Store->CreateItems(type, static_cast<std::uint32_t>(count), m_Items).IsFailure())
        std::abort();
      for (int i = 0; i < count; ++i)
        Fill(*static_cast<Item*>(m_Items[i].Get()), frame, i);
      state.AddItems(std::move(m_Items));
      return;
    }
    for (int i = 0; i < count; ++i) {
      ZMT::IFlowItemHandle item;
      if (m_Store->CreateItem(type, item).IsFailure()) std::abort();
      Fill(*static_cast<Item*>(item.Get()), frame, i);
      state.AddItem(item);
    }
  }

  /// One frame: a state with 50 new items, released at the end.
  void Frame(std::int64_t frame, bool batch) {
    ZMT::IFlowStateHandle state;
    const ZMT::VFlowTimestamp time{frame * TicksPerFrame, TicksPerFrame, 1};
    if (m_States->CreateState(state, time, {}, {}).IsFailure()) std::abort();
    Add<MarkerItem, VFlowBenchMarker>(*state, frame, Markers, batch);
    Add<QualityItem, VFlowBenchQuality>(*state, frame, Qualities, batch);
    Add<PoseItem, VFlowBenchPose>(*state, frame, Poses, batch);
    benchmark::DoNotOptimize(state->GetItemCount());
  }

  ZMT::VItemHandles m_Items;
};

/// The floor: the same values with make_shared, held by a vector reused from frame to frame.
struct VSharedFloor {
  std::vector<std::shared_ptr<const void>> m_Frame;
  VSharedFloor() { m_Frame.reserve(ItemsPerFrame); }

  template <class Data> void Add(std::int64_t frame, int count) {
    for (int i = 0; i < count; ++i) {
      auto p = std::make_shared<Data>();
      Fill(*p, frame, i);
      m_Frame.push_back(std::move(p));
    }
  }
  void Frame(std::int64_t frame) {
    Add<VMarker>(frame, Markers);
    Add<VQuality>(frame, Qualities);
    Add<VPose>(frame, Poses);
    benchmark::DoNotOptimize(m_Frame.data());
    m_Frame.clear();
  }
};

/// Items made per type in one call: how a frame of markers is streamed.
void BM_FlowStoreFrame(benchmark::State& state) {
  VStreamer streamer;
  std::int64_t frame = 0;
  for (int i = 0; i < 200; ++i)
    streamer.Frame(frame++, true);
  for (auto _ : state)
    streamer.Frame(frame++, true);
  state.SetItemsProcessed(state.iterations() * ItemsPerFrame);
}

/// One CreateItem and one AddItem per item.
void BM_FlowStoreFrameSingle(benchmark::State& state) {
  VStreamer streamer;
  std::int64_t frame = 0;
  for (int i = 0; i < 200; ++i)
    streamer.Frame(frame++, false);
  for (auto _ : state)
    streamer.Frame(frame++, false);
  state.SetItemsProcessed(state.iterations() * ItemsPerFrame);
}

void BM_MakeSharedFrame(benchmark::State& state) {
  VSharedFloor floor;
  std::int64_t frame = 0;
  for (auto _ : state)
    floor.Frame(frame++);
  state.SetItemsProcessed(state.iterations() * ItemsPerFrame);
}

/// Streams 10,000 frames after a warm-up and counts what reached the heap meanwhile.
void ReportAllocations() {
  VStreamer streamer;
  std::int64_t frame = 0;
  // Both roads, past the first deliberate rebuild of each recycled item.
  for (int i = 0; i < 1000; ++i)
    streamer.Frame(frame++, i % 2 == 0);
  const std::uint64_t before = g_Allocations.load();
  for (int i = 0; i < StreamFrames; ++i)
    streamer.Frame(frame++, i % 2 == 0);
  const std::uint64_t allocations = g_Allocations.load() - before;
  std::printf("frames streamed: %d x %d items (alternating batch and single creation), heap "
              "allocations: %llu\n",
              StreamFrames, ItemsPerFrame, static_cast<unsigned long long>(allocations));
  if (allocations % StreamFrames == 0)
    std::printf("allocations per frame after warm-up: %llu\n",
                static_cast<unsigned long long>(allocations / StreamFrames));
  else
    std::printf("allocations per frame after warm-up: %.4f\n", double(allocations) / StreamFrames);
}

} // namespace

BENCHMARK(BM_FlowStoreFrame)->Unit(benchmark::kMicrosecond);
BENCHMARK(BM_FlowStoreFrameSingle)->Unit(benchmark::kMicrosecond);
BENCHMARK(BM_MakeSharedFrame)->Unit(benchmark::kMicrosecond);

int main(int argc, char** argv) {
  ReportAllocations();
  benchmark::Initialize(&argc, argv);
  Bench::RatioReporter reporter;
  benchmark::RunSpecifiedBenchmarks(&reporter);
  reporter.printRatio("Flow store item / make_shared", "BM_FlowStoreFrame", "BM_MakeSharedFrame");
  reporter.printRatio("Flow store item, one CreateItem each / make_shared",
                      "BM_FlowStoreFrameSingle", "BM_MakeSharedFrame");
  benchmark::Shutdown();
  return 0;
}
