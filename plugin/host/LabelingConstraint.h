#pragma once
#include "SubjectConstraint.h"

/// A target of a `LabelingSetup`, under the `LabelingBone` it ties its markers to.
class ANVIL_HOST_API LabelingConstraint : public SubjectConstraint {
  H_DECLARE_RUNTIME_CLASS(LabelingConstraint)
public:
  explicit LabelingConstraint(const HString& i_rName = HString());
};
