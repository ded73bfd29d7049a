#pragma once
#include "Node.h"

/// Base of the scene's cameras. A camera is a node: its world transform is where it stands, and
/// it looks along its local -Z with +Y up.
class ANVIL_HOST_API HCamera : public Node {
  H_DECLARE_RUNTIME_CLASS(HCamera)
public:
  explicit HCamera(const HString& i_rName = HString());
};
