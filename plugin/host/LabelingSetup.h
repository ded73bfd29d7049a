#pragma once
#include "ParameterizedSetup.h"
#include "TSimpleArray.h"

class LabelingBone;

/// The setup a subject is labelled with; its bones carry `LabelingConstraint`s and
/// `LabelingCluster`s.
class ANVIL_HOST_API LabelingSetup : public ParameterizedSetup {
  H_DECLARE_RUNTIME_CLASS(LabelingSetup)
public:
  explicit LabelingSetup(const HString& i_rName = HString());
  using ParameterizedSetup::getRootBone;
  /// The root bone: the setup's first LabelingBone child, or null.
  LabelingBone* getRootBone() const;
  /// Every bone of the tree, depth first, the root first.
  void getBones(TSimpleArray<LabelingBone*>& o_rBones) const;
  const HRuntimeClass* getBoneClass() const override;
  bool hasConstraints() const override { return true; }
};
