#pragma once
#include "ParameterizedSetup.h"
#include "TSimpleArray.h"

class SolvingBone;

/// The setup a subject's motion is solved with; its bones carry `SolvingConstraint`s.
class ANVIL_HOST_API SolvingSetup : public ParameterizedSetup {
  H_DECLARE_RUNTIME_CLASS(SolvingSetup)
public:
  explicit SolvingSetup(const HString& i_rName = HString());
  using ParameterizedSetup::getRootBone;
  /// The root bone: the setup's first SolvingBone child, or null.
  SolvingBone* getRootBone() const;
  /// Every bone of the tree, depth first, the root first.
  void getBones(TSimpleArray<SolvingBone*>& o_rBones) const;
  const HRuntimeClass* getBoneClass() const override;
  bool hasConstraints() const override { return true; }
};
