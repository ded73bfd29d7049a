#include "SceneRotation.h"
#include "plugin/host/Character.h"
#include "plugin/host/Database.h"
#include "plugin/host/Marker.h"

Node::Node(const HString& i_rName) : Module(i_rName) {}

void Node::setStaticTransform(const Vec3& i_rPos, const AnvilRotation& i_rRot,
                              const Vec3& i_rScale) {
  m_staticPos = i_rPos;
  m_staticRot = i_rRot;
  m_staticScale = i_rScale;
}

bool Node::isAnimated() const {
  return !m_positionTrack.isEmpty() || !m_rotationTrack.isEmpty() || !m_scaleTrack.isEmpty();
}

Vec3 Node::getLocalPos(HTime i_t) const {
  return m_positionTrack.evaluate(i_t, m_staticPos);
}
AnvilRotation Node::getLocalRot(HTime i_t) const {
  return m_rotationTrack.evaluate(i_t, m_staticRot);
}
Vec3 Node::getLocalScale(HTime i_t) const {
  return m_scaleTrack.evaluate(i_t, m_staticScale);
}

void Node::getConstLocalTransform(Vec3& o_rTranslation, AnvilRotation& o_rRotation,
                                  Vec3& o_rScale) const {
  o_rTranslation = m_staticPos;
  o_rRotation = m_staticRot;
  o_rScale = m_staticScale;
}

void Node::localToParent(HTime i_t, bool i_static, Vec3& io_rPos, AnvilRotation& io_rRot) const {
  const Vec3 translation = i_static ? m_staticPos : getLocalPos(i_t);
  const AnvilRotation rotation = i_static ? m_staticRot : getLocalRot(i_t);
  const Vec3 scale = i_static ? m_staticScale : getLocalScale(i_t);
  const AnvilRotation r = m_preRotation * rotation * m_postRotation;
  const Vec3 scaled(io_rPos.x * scale.x, io_rPos.y * scale.y, io_rPos.z * scale.z);
  io_rPos = m_preTranslation + translation + r.rotate(scaled);
  io_rRot = r * io_rRot;
}

void Node::worldTransform(HTime i_t, bool i_static, Vec3& o_rPos, AnvilRotation& o_rRot) const {
  o_rPos = Vec3();
  o_rRot.makeIdentity();
  const Module* pModule = this;
  for (; pModule && pModule->hasParent(); pModule = pModule->getParent()) {
    if (pModule->isKindOf(&Node::s_classNode))
      static_cast<const Node*>(pModule)->localToParent(i_t, i_static, o_rPos, o_rRot);
  }
  AnvilCoreImpl::applySceneRotation(o_rPos, o_rRot);
}

Vec3 Node::getWSPos(HTime i_t) const {
  Vec3 pos;
  AnvilRotation rot;
  worldTransform(i_t, false, pos, rot);
  return pos;
}

AnvilRotation Node::getWSRot(HTime i_t) const {
  Vec3 pos;
  AnvilRotation rot;
  worldTransform(i_t, false, pos, rot);
  return rot;
}

void Node::getWSTransform(HTime i_t, Vec3& o_rPos, AnvilRotation& o_rRot) const {
  worldTransform(i_t, false, o_rPos, o_rRot);
}

Vec3 Node::getConstWSPos() const {
  Vec3 pos;
  AnvilRotation rot;
  worldTransform(0, true, pos, rot);
  return pos;
}

AnvilRotation Node::getConstWSRot() const {
  Vec3 pos;
  AnvilRotation rot;
  worldTransform(0, true, pos, rot);
  return rot;
}

Marker::Marker(const HString& i_rName) : Node(i_rName) {}

Vec3 Marker::getWSPos(HTime i_t) const {
  if (m_track.isEmpty()) return Node::getWSPos(i_t);
  Vec3 pos = m_track.evaluate(i_t, Vec3());
  AnvilCoreImpl::applySceneRotation(pos);
  return pos;
}

void Marker::getWSTransform(HTime i_t, Vec3& o_rPos, AnvilRotation& o_rRot) const {
  Node::getWSTransform(i_t, o_rPos, o_rRot);
  if (!m_track.isEmpty()) o_rPos = getWSPos(i_t);
}

Vec3 Marker::getWSKeyPos(int i_index) const {
  Vec3 pos = m_track.getKeyValue(i_index);
  AnvilCoreImpl::applySceneRotation(pos);
  return pos;
}

Character::Character(const HString& i_rName) : Node(i_rName) {}
