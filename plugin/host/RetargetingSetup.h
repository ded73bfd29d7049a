#pragma once
#include "ParameterizedSetup.h"
#include "TSimpleArray.h"

class RetargetingBone;

/// The skeleton that motion is retargeted onto; it has no constraints. Its node scale is the
/// retargeting scale that `SubjectScaler` removes.
class ANVIL_HOST_API RetargetingSetup : public ParameterizedSetup {
  H_DECLARE_RUNTIME_CLASS(RetargetingSetup)
public:
  explicit RetargetingSetup(const HString& i_rName = HString());
  using ParameterizedSetup::getRootBone;
  /// The root bone: the setup's first RetargetingBone child, or null.
  RetargetingBone* getRootBone() const;
  /// The bones of the tree, depth first: all of them with `i_includeRoot`, else all but the root.
  void getBones(TSimpleArray<RetargetingBone*>& o_rBones, bool i_includeRoot) const;
  const HRuntimeClass* getBoneClass() const override;
  bool hasConstraints() const override { return false; }
};
