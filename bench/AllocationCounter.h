#pragma once
// Counts the bytes a program allocates through operator new (the standard containers, and the
// libraries it loads), so a benchmark can report the peak memory of one operation. Include it
// in exactly one source file of a benchmark program: it replaces the global operator new.
#include <atomic>
#include <cstdint>
#include <cstdlib>
#include <malloc.h>
#include <new>

namespace Bench {
inline std::atomic<int64_t> g_liveBytes{0};
inline std::atomic<int64_t> g_peakBytes{0};
/// Calls of operator new so far (a benchmark compares two readings).
inline std::atomic<uint64_t> g_allocationCount{0};

/// Peak bytes allocated above the level at construction, while it lives.
class PeakAllocation {
public:
  PeakAllocation() : m_before(g_liveBytes.load()) { g_peakBytes = m_before; }
  int64_t bytes() const { return g_peakBytes.load() - m_before; }

private:
  int64_t m_before;
};
} // namespace Bench

void* operator new(size_t i_size) {
  void* p = std::malloc(i_size ? i_size : 1);
  if (!p) throw std::bad_alloc();
  Bench::g_allocationCount.fetch_add(1, std::memory_order_relaxed);
  const int64_t now = Bench::g_liveBytes += int64_t(malloc_usable_size(p));
  int64_t peak = Bench::g_peakBytes.load();
  while (now > peak && !Bench::g_peakBytes.compare_exchange_weak(peak, now)) {
  }
  return p;
}
// Every operator new of the program allocates with malloc, so free is the right release; GCC
// cannot see that once this is inlined into a caller of new.
#pragma GCC diagnostic push
#pragma GCC diagnostic ignored "-Wmismatched-new-delete"
void operator delete(void* i_p) noexcept {
  if (!i_p) return;
  Bench::g_liveBytes -= int64_t(malloc_usable_size(i_p));
  std::free(i_p);
}
#pragma GCC diagnostic pop
void operator delete(void* i_p, size_t) noexcept {
  operator delete(i_p);
}
void* operator new[](size_t i_size) {
  return operator new(i_size);
}
void operator delete[](void* i_p) noexcept {
  operator delete(i_p);
}
void operator delete[](void* i_p, size_t) noexcept {
  operator delete(i_p);
}
