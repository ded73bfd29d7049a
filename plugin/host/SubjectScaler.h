#pragma once
#include "HostExport.h"

/// Removes the retargeting scale of the scene's subjects, for exports that want the skeletons
/// at their own size.
class ANVIL_HOST_API SubjectScaler {
public:
  SubjectScaler() = default;
  SubjectScaler(const SubjectScaler&) = delete;
  SubjectScaler& operator=(const SubjectScaler&) = delete;
  /// Sets the scale of every subject's `RetargetingSetup` to 1 (static value and keys); returns
  /// how many setups were scaled. The change stays after the scaler is gone.
  int unscaleRetargetingSubjects();
};
