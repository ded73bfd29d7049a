#pragma once
#include "AnvilRotation.h"
#include "HTime.h"
#include "HTrack.h"
#include "Module.h"
#include "Vec3.h"

struct HVec3Lerp {
  Vec3 operator()(const Vec3& a, const Vec3& b, double u) const {
    return Vec3(a.x + (b.x - a.x) * u, a.y + (b.y - a.y) * u, a.z + (b.z - a.z) * u);
  }
};
struct HRotationLerp {
  AnvilRotation operator()(const AnvilRotation& a, const AnvilRotation& b, double u) const {
    return AnvilRotation::slerp(a, b, u);
  }
};
using HVec3Track = HTrack<Vec3, HVec3Lerp>;
using HRotationTrack = HTrack<AnvilRotation, HRotationLerp>;

/// A module with a transform. The local transform maps child coordinates to the parent's:
///   p_parent = preTranslation + translation + preRotation * rotation * postRotation * (scale * p)
/// where translation, rotation and scale come from their tracks (or the static values when a
/// track has no keys). World transforms compose parents first, then the scene's own rotation
/// (see `Database::rotateScene`).
class ANVIL_HOST_API Node : public Module {
  H_DECLARE_RUNTIME_CLASS(Node)
public:
  explicit Node(const HString& i_rName = HString());

  virtual Vec3 getWSPos(HTime i_t) const;
  virtual AnvilRotation getWSRot(HTime i_t) const;
  /// World position and rotation together, at the cost of one walk up the parents.
  virtual void getWSTransform(HTime i_t, Vec3& o_rPos, AnvilRotation& o_rRot) const;
  Vec3 getLocalPos(HTime i_t) const;
  AnvilRotation getLocalRot(HTime i_t) const;
  Vec3 getLocalScale(HTime i_t) const;
  /// World position and rotation of the static (unanimated) transform.
  Vec3 getConstWSPos() const;
  AnvilRotation getConstWSRot() const;
  void getConstLocalTransform(Vec3& o_rTranslation, AnvilRotation& o_rRotation,
                              Vec3& o_rScale) const;

  AnvilRotation::RotOrder getRotationOrder() const { return m_rotationOrder; }
  void setRotationOrder(AnvilRotation::RotOrder i_order) { m_rotationOrder = i_order; }
  const Vec3& getPreTranslation() const { return m_preTranslation; }
  const AnvilRotation& getPreRotation() const { return m_preRotation; }
  const AnvilRotation& getPostRotation() const { return m_postRotation; }
  void setPreTranslation(const Vec3& i_r) { m_preTranslation = i_r; }
  void setPreRotation(const AnvilRotation& i_r) { m_preRotation = i_r; }
  void setPostRotation(const AnvilRotation& i_r) { m_postRotation = i_r; }

  /// Static local values, used where the matching track has no keys.
  void setStaticTransform(const Vec3& i_rPos, const AnvilRotation& i_rRot, const Vec3& i_rScale);
  const Vec3& getStaticPos() const { return m_staticPos; }
  const AnvilRotation& getStaticRot() const { return m_staticRot; }
  const Vec3& getStaticScale() const { return m_staticScale; }

  HVec3Track m_positionTrack;
  HRotationTrack m_rotationTrack;
  HVec3Track m_scaleTrack;

  /// True when any of the three local tracks has keys.
  bool isAnimated() const;

protected:
  /// Maps a point from this node's space to world space at time t (before the scene rotation).
  void localToParent(HTime i_t, bool i_static, Vec3& io_rPos, AnvilRotation& io_rRot) const;
  void worldTransform(HTime i_t, bool i_static, Vec3& o_rPos, AnvilRotation& o_rRot) const;

private:
  Vec3 m_preTranslation;
  AnvilRotation m_preRotation;
  AnvilRotation m_postRotation;
  AnvilRotation::RotOrder m_rotationOrder = AnvilRotation::XYZ;
  Vec3 m_staticPos;
  AnvilRotation m_staticRot;
  Vec3 m_staticScale{1.0, 1.0, 1.0};
};
