#include "FbxKeyStore.h"
#include <mutex>
#include <sys/mman.h>

namespace AnvilFbx::FbxKeyStore {

namespace {
constexpr size_t kHugePage = size_t(2) << 20;
constexpr size_t kSlabBytes = 16 * kHugePage;
// Each array is preceded by its slab's address, in a cache line of its own.
constexpr size_t kHeader = 64;

struct Slab {
  void* pRaw;
  uint8_t* pBegin;
  size_t size;
  size_t used;
  size_t live; // arrays carved and not yet given back
};

std::mutex s_mutex;
Slab* s_pCurrent = nullptr; // the slab new arrays are carved from
size_t s_slabs = 0;

Slab* newSlab(size_t i_bytes) {
  const size_t size = (i_bytes + kHugePage - 1) / kHugePage * kHugePage;
  void* pRaw = ::operator new(size + kHugePage);
  auto* pBegin = reinterpret_cast<uint8_t*>((reinterpret_cast<uintptr_t>(pRaw) + kHugePage - 1) &
                                            ~uintptr_t(kHugePage - 1));
  ::madvise(pBegin, size, MADV_HUGEPAGE); // a hint: without huge pages all still works
  ++s_slabs;
  return new Slab{pRaw, pBegin, size, 0, 0};
}

void freeSlab(Slab* i_pSlab) {
  ::operator delete(i_pSlab->pRaw);
  delete i_pSlab;
  --s_slabs;
}

void* carve(Slab* io_pSlab, size_t i_need) {
  uint8_t* p = io_pSlab->pBegin + io_pSlab->used;
  io_pSlab->used += i_need;
  ++io_pSlab->live;
  *reinterpret_cast<Slab**>(p) = io_pSlab;
  return p + kHeader;
}
} // namespace

void* allocate(size_t i_bytes) {
  if (i_bytes < kLargeBytes) return ::operator new(i_bytes);
  const size_t need = kHeader + (i_bytes + kHeader - 1) / kHeader * kHeader;
  std::lock_guard<std::mutex> lock(s_mutex);
  if (need > kSlabBytes / 4) return carve(newSlab(need), need); // a slab of its own
  if (!s_pCurrent || s_pCurrent->size - s_pCurrent->used < need) {
    s_pCurrent = newSlab(kSlabBytes);
  }
  return carve(s_pCurrent, need);
}

void deallocate(void* i_p, size_t i_bytes) noexcept {
  if (!i_p) return;
  if (i_bytes < kLargeBytes) {
    ::operator delete(i_p);
    return;
  }
  std::lock_guard<std::mutex> lock(s_mutex);
  Slab* pSlab = *reinterpret_cast<Slab**>(static_cast<uint8_t*>(i_p) - kHeader);
  if (--pSlab->live > 0) return;
  if (pSlab == s_pCurrent) s_pCurrent = nullptr;
  freeSlab(pSlab);
}

size_t slabCount() {
  std::lock_guard<std::mutex> lock(s_mutex);
  return s_slabs;
}

} // namespace AnvilFbx::FbxKeyStore
