#pragma once
// Walks a node's position along frame times that only grow: the key of a marker at each time is
// found by stepping forward from the last one instead of a search per frame, and the position
// is that key's value. Times between keys or outside them, and nodes that are not markers, ask
// the host as `getWSPos` does, so the values are the same as a query per frame.
#include "plugin/host/Marker.h"

namespace TrajectoryExport {

class MarkerCursor {
public:
  explicit MarkerCursor(const Node* i_pNode)
      : m_pNode(i_pNode),
        m_pMarker(i_pNode->isKindOf(&Marker::s_classMarker) ? static_cast<const Marker*>(i_pNode)
                                                            : nullptr),
        m_keys(m_pMarker ? m_pMarker->m_track : s_noKeys) {}

  bool isMarker() const { return m_pMarker != nullptr; }

  /// Moves past the keys before `i_t`: the key at the cursor is then the first at or after it.
  void advanceTo(HTime i_t) { m_keys.skipBefore(i_t); }
  /// Whether a marker has a key within [i_low, i_high] (after `advanceTo(i_low)`).
  bool hasKeyUpTo(HTime i_high) const { return !m_keys.atEnd() && m_keys.time() <= i_high; }
  /// Whether a marker has a key at exactly `i_t` (after `advanceTo(i_t)`).
  bool hasKeyAt(HTime i_t) const { return !m_keys.atEnd() && m_keys.time() == i_t; }
  /// The world position at `i_t` (after `advanceTo` of a time not after `i_t`).
  Vec3 position(HTime i_t) const {
    if (m_pMarker && hasKeyAt(i_t)) return m_pMarker->getWSKeyPos(m_keys.index());
    return m_pNode->getWSPos(i_t);
  }

private:
  inline static const HPositionTrack s_noKeys{};
  const Node* m_pNode;
  const Marker* m_pMarker;
  HPositionTrack::KeyCursor m_keys;
};

} // namespace TrajectoryExport
