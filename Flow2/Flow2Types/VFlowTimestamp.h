#pragma once
// Time of a state and of each record in it, and the six ways two times can match.

#include <algorithm>
#include <cstdint>

namespace ZMT {

/// Ticks of 1/135,000,000 s.
struct VFlowTimestamp {
  std::int64_t m_Tick = 0;
  /// Duration in ticks.
  std::uint64_t m_Period = 0;
  std::uint32_t m_Session = 0;

  constexpr bool IsEmpty() const { return m_Tick == 0 && m_Period == 0 && m_Session == 0; }
  constexpr bool operator==(const VFlowTimestamp&) const = default;
};

enum class EMatch : std::uint8_t { Equal = 0, Before, AtOrBefore, After, AtOrAfter, Overlap };

/// Whether a record's time A matches the request B; sessions compare first, lower is earlier.
constexpr bool Matches(const VFlowTimestamp& a, EMatch match, const VFlowTimestamp& b) {
  switch (match) {
  case EMatch::Equal:
    return a.m_Session == b.m_Session && a.m_Tick == b.m_Tick;
  case EMatch::Before:
    return a.m_Session < b.m_Session || (a.m_Session == b.m_Session && a.m_Tick < b.m_Tick);
  case EMatch::AtOrBefore:
    return a.m_Session < b.m_Session || (a.m_Session == b.m_Session && a.m_Tick <= b.m_Tick);
  case EMatch::After:
    return a.m_Session > b.m_Session || (a.m_Session == b.m_Session && a.m_Tick > b.m_Tick);
  case EMatch::AtOrAfter:
    return a.m_Session > b.m_Session || (a.m_Session == b.m_Session && a.m_Tick >= b.m_Tick);
  case EMatch::Overlap: {
    const auto aPeriod = static_cast<std::int64_t>(std::max<std::uint64_t>(a.m_Period, 1));
    const auto bPeriod = static_cast<std::int64_t>(std::max<std::uint64_t>(b.m_Period, 1));
    return a.m_Session == b.m_Session && a.m_Tick + aPeriod > b.m_Tick &&
           a.m_Tick < b.m_Tick + bPeriod;
  }
  }
  return false;
}

} // namespace ZMT
