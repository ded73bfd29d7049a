#pragma once
// Per-thread object pools with a shared global vector behind them. The fast road is a thread's own
// vector; the global vector's mutex is taken once per 128 objects.

#include <cstddef>
#include <cstdint>
#include <functional>
#include <mutex>
#include <new>
#include <utility>
#include <vector>

namespace Flow2Store::Detail {

using VDeleteObject = void (*)(void*);

/// The calling thread's vector for the pool with this id, made (reserved to `reserve`) on first
/// use. Objects left in it when the thread ends are deleted with `deleteObject`.
std::vector<void*>& ThreadObjects(std::uint64_t poolId, VDeleteObject deleteObject,
                                  std::size_t reserve);
/// Deletes the calling thread's objects of a pool and forgets its vector.
void DropThreadObjects(std::uint64_t poolId);
/// A process-unique pool id; ids are never reused, so a thread's stale vector can't be mistaken
/// for a later pool's.
std::uint64_t NewPoolId();

template <class T> class VObjectPool {
public:
  static constexpr std::size_t Batch = 128;
  static constexpr std::size_t ThreadCapacity = 2 * Batch;

  explicit VObjectPool(std::function<T*()> make) : m_Id(NewPoolId()), m_Make(std::move(make)) {}
  VObjectPool(const VObjectPool&) = delete;
  VObjectPool& operator=(const VObjectPool&) = delete;
  /// Deletes the global vector and the calling thread's vector; other threads delete theirs when
  /// they end.
  ~VObjectPool() {
    DropThreadObjects(m_Id);
    for (T* pObject : m_Global)
      delete pObject;
  }

  /// Raises std::bad_alloc when new objects are needed and can't be made.
  T* Get() {
    std::vector<void*>& local = Local();
    if (local.empty()) Refill(local);
    T* pObject = static_cast<T*>(local.back());
    local.pop_back();
    return pObject;
  }

  void Return(T* pObject) {
    std::vector<void*>& local = Local();
    if (local.size() >= ThreadCapacity) {
      std::lock_guard<std::mutex> lock(m_Mutex);
      for (std::size_t i = local.size() - Batch; i < local.size(); ++i)
        m_Global.push_back(static_cast<T*>(local[i]));
      local.resize(local.size() - Batch);
    }
    local.push_back(pObject);
  }

private:
  std::vector<void*>& Local() {
    return ThreadObjects(
        m_Id, [](void* p) { delete static_cast<T*>(p); }, ThreadCapacity);
  }

  void Refill(std::vector<void*>& local) {
    {
      std::lock_guard<std::mutex> lock(m_Mutex);
      if (m_Global.size() >= Batch) {
        local.insert(local.end(), m_Global.end() - Batch, m_Global.end());
        m_Global.resize(m_Global.size() - Batch);
        return;
      }
    }
    for (std::size_t i = 0; i < Batch; ++i)
      local.push_back(m_Make());
  }

  const std::uint64_t m_Id;
  const std::function<T*()> m_Make;
  std::mutex m_Mutex;
  std::vector<T*> m_Global;
};

} // namespace Flow2Store::Detail
