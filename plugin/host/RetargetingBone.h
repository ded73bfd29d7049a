#pragma once
#include "SubjectBone.h"

/// A segment of a `RetargetingSetup`.
class ANVIL_HOST_API RetargetingBone : public SubjectBone {
  H_DECLARE_RUNTIME_CLASS(RetargetingBone)
public:
  explicit RetargetingBone(const HString& i_rName = HString());
};
