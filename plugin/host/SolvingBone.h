#pragma once
#include "SubjectBone.h"

/// A segment of a `SolvingSetup`.
class ANVIL_HOST_API SolvingBone : public SubjectBone {
  H_DECLARE_RUNTIME_CLASS(SolvingBone)
public:
  explicit SolvingBone(const HString& i_rName = HString());
};
