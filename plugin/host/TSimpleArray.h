#pragma once
#include <cstdlib>
#include <cstring>
#include <new>
#include <stdexcept>
#include <type_traits>
#include <utility>

/// Thrown when an array cannot grow.
class HOutOfMemory : public std::runtime_error {
public:
  HOutOfMemory() : std::runtime_error("E1224: Out of memory in TSimpleArray::addSpace") {}
};

/// Growable array of plain elements: a count, a capacity and a grow step. A full array grows by
/// one step into a new buffer; the old one is copied and released.
template <typename T> class TSimpleArray {
  static_assert(std::is_trivially_copyable_v<T>, "TSimpleArray holds plain elements; use TArray");

public:
  explicit TSimpleArray(int i_growStep = 16) : m_growStep(i_growStep > 0 ? i_growStep : 16) {}
  TSimpleArray(const TSimpleArray& i_rOther) : m_growStep(i_rOther.m_growStep) { *this = i_rOther; }
  TSimpleArray& operator=(const TSimpleArray& i_rOther) {
    if (this == &i_rOther) return *this;
    setCount(0);
    for (int i = 0; i < i_rOther.m_count; ++i)
      add(i_rOther.m_pData[i]);
    return *this;
  }
  ~TSimpleArray() { std::free(m_pData); }

  int getCount() const { return m_count; }
  int getCapacity() const { return m_capacity; }
  int getGrowStep() const { return m_growStep; }
  bool isEmpty() const { return m_count == 0; }

  /// Appends one element and returns its index.
  int add(const T& i_rValue) {
    if (m_count == m_capacity) addSpace(m_growStep);
    m_pData[m_count] = i_rValue;
    return m_count++;
  }
  /// Unchecked element access, as the host's arrays give it.
  T& operator[](int i_index) { return m_pData[i_index]; }
  const T& operator[](int i_index) const { return m_pData[i_index]; }
  T* begin() { return m_pData; }
  T* end() { return m_pData + m_count; }
  const T* begin() const { return m_pData; }
  const T* end() const { return m_pData + m_count; }

  /// Sets the count; growing fills new places with value-initialised elements.
  void setCount(int i_count) {
    if (i_count <= 0) {
      m_count = 0;
      return;
    }
    if (i_count > m_capacity) addSpace(i_count - m_capacity);
    for (int i = m_count; i < i_count; ++i)
      m_pData[i] = T();
    m_count = i_count;
  }
  void removeAll() { m_count = 0; }
  void removeAt(int i_index) {
    if (i_index < 0 || i_index >= m_count) return;
    std::memmove(static_cast<void*>(m_pData + i_index), m_pData + i_index + 1,
                 sizeof(T) * (m_count - i_index - 1));
    --m_count;
  }
  int find(const T& i_rValue) const {
    for (int i = 0; i < m_count; ++i)
      if (m_pData[i] == i_rValue) return i;
    return -1;
  }

private:
  void addSpace(int i_extra) {
    const int capacity = m_capacity + (i_extra > 0 ? i_extra : m_growStep);
    T* pData = static_cast<T*>(std::malloc(sizeof(T) * static_cast<size_t>(capacity)));
    if (!pData) throw HOutOfMemory();
    for (int i = 0; i < m_count; ++i)
      pData[i] = m_pData[i];
    std::free(m_pData);
    m_pData = pData;
    m_capacity = capacity;
  }

  int m_count = 0;
  int m_capacity = 0;
  int m_growStep;
  T* m_pData = nullptr;
};

/// The same array for elements with constructors and destructors.
template <typename T> class TArray {
public:
  explicit TArray(int i_growStep = 16) : m_growStep(i_growStep > 0 ? i_growStep : 16) {}
  TArray(const TArray& i_rOther) : m_growStep(i_rOther.m_growStep) { *this = i_rOther; }
  TArray& operator=(const TArray& i_rOther) {
    if (this == &i_rOther) return *this;
    removeAll();
    for (int i = 0; i < i_rOther.m_count; ++i)
      add(i_rOther[i]);
    return *this;
  }
  ~TArray() {
    removeAll();
    ::operator delete(m_pData);
  }

  int getCount() const { return m_count; }
  int getCapacity() const { return m_capacity; }
  int getGrowStep() const { return m_growStep; }
  bool isEmpty() const { return m_count == 0; }

  int add(const T& i_rValue) {
    if (m_count == m_capacity) addSpace();
    new (m_pData + m_count) T(i_rValue);
    return m_count++;
  }
  T& operator[](int i_index) { return m_pData[i_index]; }
  const T& operator[](int i_index) const { return m_pData[i_index]; }
  T* begin() { return m_pData; }
  T* end() { return m_pData + m_count; }
  const T* begin() const { return m_pData; }
  const T* end() const { return m_pData + m_count; }
  void removeAll() {
    for (int i = 0; i < m_count; ++i)
      m_pData[i].~T();
    m_count = 0;
  }

private:
  void addSpace() {
    const int capacity = m_capacity + m_growStep;
    T* pData = static_cast<T*>(::operator new(sizeof(T) * capacity, std::nothrow));
    if (!pData) throw HOutOfMemory();
    for (int i = 0; i < m_count; ++i) {
      new (pData + i) T(std::move(m_pData[i]));
      m_pData[i].~T();
    }
    ::operator delete(m_pData);
    m_pData = pData;
    m_capacity = capacity;
  }

  int m_count = 0;
  int m_capacity = 0;
  int m_growStep;
  T* m_pData = nullptr;
};
