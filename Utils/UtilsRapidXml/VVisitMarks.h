#pragma once
// A set of small indices (positions of a node's attributes or children), held in one word for
// the first 64 and spilling to the heap beyond.

#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <vector>

namespace UtilsRapidXml {

class VVisitMarks {
public:
  void Set(std::size_t index) {
    if (index < WordBits) {
      m_Word |= std::uint64_t{1} << index;
      return;
    }
    index -= WordBits;
    if (m_More.size() <= index) m_More.resize(std::max(index + 1, 2 * m_More.size()));
    m_More[index] = true;
  }
  bool Test(std::size_t index) const {
    if (index < WordBits) return (m_Word >> index) & 1u;
    index -= WordBits;
    return index < m_More.size() && m_More[index];
  }

  /// Whether every index below `count` is set.
  bool AllBelow(std::size_t count) const {
    if (count <= WordBits) {
      const std::uint64_t mask =
          count == WordBits ? ~std::uint64_t{0} : (std::uint64_t{1} << count) - 1;
      return (m_Word & mask) == mask;
    }
    if (~m_Word != 0 || m_More.size() < count - WordBits) return false;
    return std::all_of(m_More.begin(),
                       m_More.begin() + static_cast<std::ptrdiff_t>(count - WordBits),
                       [](bool set) { return set; });
  }

private:
  static constexpr std::size_t WordBits = 64;
  std::uint64_t m_Word = 0;
  std::vector<bool> m_More;
};

} // namespace UtilsRapidXml
