#pragma once
#include "SubjectBone.h"

/// A segment of a `LabelingSetup`.
class ANVIL_HOST_API LabelingBone : public SubjectBone {
  H_DECLARE_RUNTIME_CLASS(LabelingBone)
public:
  explicit LabelingBone(const HString& i_rName = HString());
};
