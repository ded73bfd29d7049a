#pragma once
#include "HObject.h"
#include "HString.h"
#include "HTime.h"

/// One clip of the scene's clip list: a named span of the scene's time. Its own timeline runs
/// `getStartOffset` ticks ahead of the scene's, so the clip time of a scene time t is
/// t + start offset; timecode is read on the clip's timeline. The database owns its clips.
class ANVIL_HOST_API NLEClip : public HObject {
  H_DECLARE_RUNTIME_CLASS(NLEClip)
public:
  NLEClip(const HString& i_rName, const HTimeRange& i_rRange, HTime i_startOffset = 0);

  const HString& getName() const { return m_name; }
  /// The span of the scene's time the clip covers, in ticks.
  const HTimeRange& getRange() const { return m_range; }
  void setRange(const HTimeRange& i_rRange) { m_range = i_rRange; }
  /// Ticks added to a scene time to give the clip's time.
  HTime getStartOffset() const { return m_startOffset; }
  void setStartOffset(HTime i_offset) { m_startOffset = i_offset; }
  /// The clip's first tick on its own timeline: range start plus start offset.
  HTime getStartTime() const { return m_range.getStart() + m_startOffset; }
  /// The next clip of the list, or null.
  NLEClip* getNext() const { return m_pNext; }

private:
  friend class Database;
  HString m_name;
  HTimeRange m_range;
  HTime m_startOffset;
  NLEClip* m_pNext = nullptr;
};
