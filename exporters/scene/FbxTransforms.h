#pragma once
// Transform arithmetic of the FBX export: rotation orders, the correction between a node's host
// parent and its FBX parent, the camera's viewing axis, and markers' world tracks in their FBX
// parent's space.
#include "fbx/FbxNode.h"
#include "plugin/host/AnvilRotation.h"
#include "plugin/host/Vec3.h"

class Marker;
class Node;

namespace FbxTransforms {

/// The FBX rotation order of a host rotation order.
AnvilFbx::EFbxRotationOrder rotationOrder(AnvilRotation::RotOrder i_order);

/// A rigid transform that takes points of one frame to another.
struct Frame {
  AnvilRotation m_rotation;
  Vec3 m_translation;
  Vec3 apply(const Vec3& i_rPoint) const { return m_rotation.rotate(i_rPoint) + m_translation; }
};

/// From the node's host parent frame to its FBX parent's frame: identity when the FBX parent
/// stands for the host parent; otherwise the static world frames of both, the host's world
/// turned by the scene rotation now in force and the FBX root's world left as it is.
Frame parentCorrection(const Node* i_pNode, const Node* i_pFbxParentHost);

/// The FBX post rotation: the inverse of the host's, and for cameras and lights (which look
/// along their local -Z) the turn that makes FBX's viewing axis +X point the same way.
AnvilRotation postRotation(const Node* i_pNode);

/// A marker's world position at a time in the space of its FBX parent's host node (null for the
/// FBX root), in millimetres.
Vec3 markerLocal(const Marker* i_pMarker, long long i_time, const Node* i_pFbxParentHost);

/// The same for many keys: the parent's frame is evaluated once when nothing above it moves.
class MarkerSpace {
public:
  explicit MarkerSpace(const Node* i_pFbxParentHost);
  Vec3 local(const Vec3& i_rTrackValue, long long i_time) const;

private:
  const Node* m_pParent;
  bool m_static = true;
  bool m_identity = false; // no parent and no scene rotation: track values as they are
  AnvilRotation m_scene;
  // Scene rotation and world-to-parent folded into one row-major matrix and offset, when static.
  double m_matrix[9] = {1, 0, 0, 0, 1, 0, 0, 0, 1};
  Vec3 m_offset;
};

} // namespace FbxTransforms
