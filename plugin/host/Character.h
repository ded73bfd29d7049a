#pragma once
#include "Node.h"

/// One subject: markers and bones are its descendants.
class ANVIL_HOST_API Character : public Node {
  H_DECLARE_RUNTIME_CLASS(Character)
public:
  explicit Character(const HString& i_rName = HString());

  /// A prop is a rigid subject rather than a skeleton.
  bool isProp() const { return m_prop; }
  void setProp(bool i_prop) { m_prop = i_prop; }

private:
  bool m_prop = false;
};
