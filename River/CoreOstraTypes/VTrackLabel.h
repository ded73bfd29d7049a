#pragma once
// The track and the label of one element of a set (a centroid, a reconstruction), kept in lists
// parallel to the set's elements.

#include <cstdint>

namespace CoreOstraTypes {

/// One element's track: the id it shares with the same element in other frames.
struct VTrack {
  static constexpr const char* FlowClassName = "Track";
  std::uint32_t m_TrackId = 0xFFFFFFFFu;
  float m_Score = 0.0f;
  std::uint32_t m_Padding = 0;
  bool operator==(const VTrack&) const = default;
  template <class S, class V> static void FlowFields(S& s, V&& v) {
    v("TrackId", "Track of the element, all ones for none", s.m_TrackId);
    v("Score", "Confidence of the tracking", s.m_Score);
    v("Padding", "", s.m_Padding);
  }
};

/// The label of one element, by position: the element's index in its set is the subject marker
/// it was given to, the score how sure the labeller was.
struct VLabel {
  static constexpr const char* FlowClassName = "Label";
  float m_Score = 0.0f;
  std::uint32_t m_Padding = 0;
  bool operator==(const VLabel&) const = default;
  template <class S, class V> static void FlowFields(S& s, V&& v) {
    v("Score", "Confidence of the label", s.m_Score);
    v("Padding", "", s.m_Padding);
  }
};

} // namespace CoreOstraTypes
