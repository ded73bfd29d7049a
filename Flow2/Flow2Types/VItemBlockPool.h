#pragma once
// Recycled memory blocks of one size. Items of a type are destroyed and rebuilt now and then by
// the store's reuse policy; taking their memory from here keeps that free of heap traffic once
// warmed up.

#include <cstddef>
#include <mutex>
#include <new>
#include <vector>

namespace ZMT::Detail {

template <std::size_t Size, std::size_t Align> class VItemBlockPool {
public:
  /// Blocks kept for reuse; beyond this they go back to the heap.
  static constexpr std::size_t Capacity = 64;

  static void* Allocate() {
    VItemBlockPool& pool = Instance();
    {
      std::lock_guard<std::mutex> lock(pool.m_Mutex);
      if (!pool.m_Blocks.empty()) {
        void* pBlock = pool.m_Blocks.back();
        pool.m_Blocks.pop_back();
        return pBlock;
      }
    }
    return ::operator new(Size, std::align_val_t(Align));
  }

  static void Free(void* pBlock) {
    if (!pBlock) return;
    VItemBlockPool& pool = Instance();
    {
      std::lock_guard<std::mutex> lock(pool.m_Mutex);
      if (pool.m_Blocks.size() < Capacity) {
        pool.m_Blocks.push_back(pBlock);
        return;
      }
    }
    ::operator delete(pBlock, std::align_val_t(Align));
  }

private:
  VItemBlockPool() { m_Blocks.reserve(Capacity); }
  ~VItemBlockPool() {
    for (void* pBlock : m_Blocks)
      ::operator delete(pBlock, std::align_val_t(Align));
  }
  static VItemBlockPool& Instance() {
    static VItemBlockPool s_Pool;
    return s_Pool;
  }

  std::mutex m_Mutex;
  std::vector<void*> m_Blocks;
};

} // namespace ZMT::Detail
