#include "Flow2/Flow2Store/VObjectPool.h"

#include <algorithm>
#include <atomic>
#include <memory>

namespace Flow2Store::Detail {

namespace {

struct VThreadObjects {
  std::uint64_t m_PoolId = 0;
  VDeleteObject m_pDelete = nullptr;
  std::vector<void*> m_Objects;

  ~VThreadObjects() {
    for (void* pObject : m_Objects)
      m_pDelete(pObject);
  }
};

/// Set once the thread's caches are destroyed (a trivial thread_local outlives them), so that a
/// pool destroyed later on that thread, by a static destructor at exit, doesn't touch them.
thread_local bool t_CachesGone = false;

/// Every pool's vector of one thread; the last one used is looked at first.
struct VThreadCaches {
  std::vector<std::unique_ptr<VThreadObjects>> m_Pools;
  VThreadObjects* m_pLast = nullptr;
  ~VThreadCaches() { t_CachesGone = true; }
};

VThreadCaches& Caches() {
  thread_local VThreadCaches t_Caches;
  return t_Caches;
}

std::atomic<std::uint64_t> s_NextPoolId{1};

} // namespace

std::vector<void*>& ThreadObjects(std::uint64_t poolId, VDeleteObject deleteObject,
                                  std::size_t reserve) {
  VThreadCaches& caches = Caches();
  if (caches.m_pLast && caches.m_pLast->m_PoolId == poolId) return caches.m_pLast->m_Objects;
  for (auto& pPool : caches.m_Pools)
    if (pPool->m_PoolId == poolId) {
      caches.m_pLast = pPool.get();
      return pPool->m_Objects;
    }
  auto pPool = std::make_unique<VThreadObjects>();
  pPool->m_PoolId = poolId;
  pPool->m_pDelete = deleteObject;
  pPool->m_Objects.reserve(reserve);
  caches.m_Pools.push_back(std::move(pPool));
  caches.m_pLast = caches.m_Pools.back().get();
  return caches.m_pLast->m_Objects;
}

void DropThreadObjects(std::uint64_t poolId) {
  if (t_CachesGone) return; // the thread's objects were deleted with its caches
  VThreadCaches& caches = Caches();
  auto it = std::find_if(caches.m_Pools.begin(), caches.m_Pools.end(),
                         [&](const auto& pPool) { return pPool->m_PoolId == poolId; });
  if (it == caches.m_Pools.end()) return;
  if (caches.m_pLast == it->get()) caches.m_pLast = nullptr;
  caches.m_Pools.erase(it);
}

std::uint64_t NewPoolId() {
  return s_NextPoolId.fetch_add(1, std::memory_order_relaxed);
}

} // namespace Flow2Store::Detail
