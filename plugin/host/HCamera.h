#pragma once
#include "Node.h"

/// Base of the scene's cameras. A camera is a node: its world transform is where it stands, and
/// it looks along its local -Z with +Y up.
class ANVIL_HOST_API HCamera : public Node {
  H_DECLARE_RUNTIME_CLASS(HCamera)
public:
  explicit HCamera(const HString& i_rName = HString());

  /// Places the camera: world position (mm) and a rotation vector (axis times angle in radians)
  /// taking camera axes to world axes. Sets the node's static transform.
  void setPose(const Vec3& i_rPosition, const Vec3& i_rRotationVector);
  /// The rotation of a rotation vector; identity for the zero vector.
  static AnvilRotation rotationOfVector(const Vec3& i_rRotationVector);
};
