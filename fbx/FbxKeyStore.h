#pragma once
// Memory of the curves' key arrays. Large arrays are carved from slabs aligned to the huge page
// size and offered to the kernel for huge pages: a long take holds hundreds of megabytes of keys,
// and filling them 4 KiB page by page costs more in page faults than the keys cost to compute.
// Small arrays use the ordinary heap. Elements made without a value are left uninitialised, as
// key arrays are sized and then filled.
#include <cstddef>
#include <cstdint>
#include <new>
#include <utility>
#include <vector>

namespace AnvilFbx {

namespace FbxKeyStore {
/// Arrays of this many bytes or more come from the slabs.
inline constexpr size_t kLargeBytes = size_t(64) << 10;
void* allocate(size_t i_bytes);
void deallocate(void* i_p, size_t i_bytes) noexcept;
/// Slabs alive now (a slab goes once the last array in it does).
size_t slabCount();
} // namespace FbxKeyStore

template <typename T> struct FbxKeyAllocator {
  using value_type = T;
  FbxKeyAllocator() = default;
  template <typename U> FbxKeyAllocator(const FbxKeyAllocator<U>&) noexcept {}
  T* allocate(size_t i_count) {
    return static_cast<T*>(FbxKeyStore::allocate(i_count * sizeof(T)));
  }
  void deallocate(T* i_p, size_t i_count) noexcept {
    FbxKeyStore::deallocate(i_p, i_count * sizeof(T));
  }
  template <typename U> void construct(U* i_p) noexcept { ::new (static_cast<void*>(i_p)) U; }
  template <typename U, typename... A> void construct(U* i_p, A&&... i_args) {
    ::new (static_cast<void*>(i_p)) U(std::forward<A>(i_args)...);
  }
  template <typename U> bool operator==(const FbxKeyAllocator<U>&) const noexcept { return true; }
};

using FbxKeyTimes = std::vector<int64_t, FbxKeyAllocator<int64_t>>;
using FbxKeyValues = std::vector<float, FbxKeyAllocator<float>>;

} // namespace AnvilFbx
