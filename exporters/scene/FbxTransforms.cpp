#include "FbxTransforms.h"
#include "plugin/host/Database.h"
#include "plugin/host/HCamera.h"
#include "plugin/host/Light.h"
#include "plugin/host/Marker.h"

namespace FbxTransforms {

namespace {
AnvilRotation sceneRotation() {
  AnvilRotation rotation;
  if (g_db->isSceneRotated()) rotation.setMatrix(g_db->getSceneRotation());
  return rotation;
}

// The nearest node above, or null at the top of the scene.
const Node* hostParent(const Node* i_pNode) {
  const Module* pParent = i_pNode->getParent();
  if (!pParent || pParent == g_db->getRoot() || !pParent->isKindOf(&Node::s_classNode))
    return nullptr;
  return static_cast<const Node*>(pParent);
}

Frame worldOf(const Node* i_pNode) {
  return Frame{i_pNode->getConstWSRot(), i_pNode->getConstWSPos()};
}

Frame inverse(const Frame& i_rFrame) {
  const AnvilRotation r = i_rFrame.m_rotation.inverse();
  const Vec3 t = r.rotate(i_rFrame.m_translation);
  return Frame{r, Vec3(-t.x, -t.y, -t.z)};
}

bool movesAbove(const Node* i_pNode) {
  for (const Node* p = i_pNode; p; p = hostParent(p))
    if (p->isAnimated()) return true;
  return false;
}
} // namespace

AnvilFbx::EFbxRotationOrder rotationOrder(AnvilRotation::RotOrder i_order) {
  switch (i_order) {
  case AnvilRotation::XYZ:
    return AnvilFbx::eEulerXYZ;
  case AnvilRotation::XZY:
    return AnvilFbx::eEulerXZY;
  case AnvilRotation::YXZ:
    return AnvilFbx::eEulerYXZ;
  case AnvilRotation::YZX:
    return AnvilFbx::eEulerYZX;
  case AnvilRotation::ZXY:
    return AnvilFbx::eEulerZXY;
  case AnvilRotation::ZYX:
    return AnvilFbx::eEulerZYX;
  }
  return AnvilFbx::eEulerXYZ;
}

Frame parentCorrection(const Node* i_pNode, const Node* i_pFbxParentHost) {
  const Node* pHostParent = hostParent(i_pNode);
  // Same parent: the same frame. At the top both are "no parent", but the host's top is turned
  // by the scene rotation and the FBX root is not.
  if (pHostParent && pHostParent == i_pFbxParentHost) return Frame{};
  const Frame host = pHostParent ? worldOf(pHostParent) : Frame{sceneRotation(), Vec3()};
  const Frame fbx = i_pFbxParentHost ? worldOf(i_pFbxParentHost) : Frame{};
  const Frame toFbx = inverse(fbx);
  return Frame{toFbx.m_rotation * host.m_rotation, toFbx.apply(host.m_translation)};
}

AnvilRotation postRotation(const Node* i_pNode) {
  AnvilRotation post = i_pNode->getPostRotation().inverse();
  if (i_pNode->isKindOf(&HCamera::s_classHCamera) || i_pNode->isKindOf(&Light::s_classLight)) {
    // FBX looks along +X; turning it -90 degrees about Y gives the host's -Z.
    post = AnvilRotation(Vec3(0.0, 1.0, 0.0), -90.0) * post;
  }
  return post;
}

MarkerSpace::MarkerSpace(const Node* i_pFbxParentHost)
    : m_pParent(i_pFbxParentHost), m_scene(sceneRotation()) {
  m_static = !m_pParent || !movesAbove(m_pParent);
  m_identity = !m_pParent && !g_db->isSceneRotated();
  if (!m_static) return;
  const Frame toParent = m_pParent ? inverse(worldOf(m_pParent)) : Frame{};
  (toParent.m_rotation * m_scene).getMatrix(m_matrix);
  m_offset = toParent.m_translation;
}

Vec3 MarkerSpace::local(const Vec3& i_rTrackValue, long long i_time) const {
  if (m_identity) return i_rTrackValue;
  if (m_static) {
    const double* m = m_matrix;
    const Vec3& v = i_rTrackValue;
    return Vec3(m[0] * v.x + m[1] * v.y + m[2] * v.z + m_offset.x,
                m[3] * v.x + m[4] * v.y + m[5] * v.z + m_offset.y,
                m[6] * v.x + m[7] * v.y + m[8] * v.z + m_offset.z);
  }
  const Vec3 world = m_scene.rotate(i_rTrackValue);
  return inverse(Frame{m_pParent->getWSRot(i_time), m_pParent->getWSPos(i_time)}).apply(world);
}

Vec3 markerLocal(const Marker* i_pMarker, long long i_time, const Node* i_pFbxParentHost) {
  return MarkerSpace(i_pFbxParentHost).local(i_pMarker->m_track.evaluate(i_time, Vec3()), i_time);
}

} // namespace FbxTransforms
