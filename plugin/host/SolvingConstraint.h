#pragma once
#include "SubjectConstraint.h"

/// A target of a `SolvingSetup`, under the `SolvingBone` it ties its markers to.
class ANVIL_HOST_API SolvingConstraint : public SubjectConstraint {
  H_DECLARE_RUNTIME_CLASS(SolvingConstraint)
public:
  explicit SolvingConstraint(const HString& i_rName = HString());
};
