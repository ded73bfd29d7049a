#pragma once
#include "Node.h"

class LabelingSetup;
class RetargetingSetup;
class SolvingSetup;

/// One subject: markers and bones are its descendants.
class ANVIL_HOST_API Character : public Node {
  H_DECLARE_RUNTIME_CLASS(Character)
public:
  explicit Character(const HString& i_rName = HString());

  /// A prop is a rigid subject rather than a skeleton.
  bool isProp() const { return m_prop; }
  void setProp(bool i_prop) { m_prop = i_prop; }

  /// The subject's setups: its first child of each kind. With `i_create`, a missing one is made
  /// (named after the subject) and added; otherwise null when there is none.
  LabelingSetup* getLabelingSetup(bool i_create);
  SolvingSetup* getSolvingSetup(bool i_create);
  RetargetingSetup* getRetargetingSetup(bool i_create);

private:
  bool m_prop = false;
};
