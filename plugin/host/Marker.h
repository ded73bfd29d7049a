#pragma once
#include "Node.h"

/// World position track of a marker: keys only where the marker was seen; a time without a key
/// is a gap.
class ANVIL_HOST_API HPositionTrack : public HVec3Track {
public:
  /// Number of keys inside the range; `o_rFirst` receives the index of the first of them.
  int getKeysInRange(const HTimeRange& i_rRange, int& o_rFirst) const {
    return countInRange(i_rRange.getStart(), i_rRange.getEnd(), o_rFirst);
  }
  /// Whether the track holds a value at exactly `i_t`; `o_rIndex` receives the key's index.
  bool hasKeyAt(HTime i_t, int& o_rIndex) const {
    o_rIndex = findKey(i_t);
    return o_rIndex >= 0;
  }
  bool hasKeyAt(HTime i_t) const { return findKey(i_t) >= 0; }
};

/// A marker: a node whose world position is its own track.
class ANVIL_HOST_API Marker : public Node {
  H_DECLARE_RUNTIME_CLASS(Marker)
public:
  explicit Marker(const HString& i_rName = HString());

  /// True for a trajectory that no subject has claimed.
  bool isUnlabeled() const { return m_unlabeled; }
  void setUnlabeled(bool i_unlabeled) { m_unlabeled = i_unlabeled; }

  /// The track's value at t (interpolated in gaps, held outside the keys) in the scene's current
  /// orientation. A marker without keys falls back to its node transform.
  Vec3 getWSPos(HTime i_t) const override;
  void getWSTransform(HTime i_t, Vec3& o_rPos, AnvilRotation& o_rRot) const override;
  /// The value of key `i_index` of `m_track` in the scene's current orientation: what
  /// `getWSPos` gives at that key's time, without searching for it.
  Vec3 getWSKeyPos(int i_index) const;

  HPositionTrack m_track;

private:
  bool m_unlabeled = false;
};
