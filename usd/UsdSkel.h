#pragma once
// The skeleton schemas: a Skeleton with its joints and rest and bind transforms, a SkelAnimation
// with per-joint translations, rotations and scales over time, the binding of one to the other,
// and the joint topology rule (a joint's parent comes before it).

#include "usd/UsdStage.h"

#include <string>
#include <vector>

namespace AnvilUsd {

class VSkeleton {
public:
  /// Defines (or retypes) the prim at `path` as a Skeleton; invalid when the path is.
  static VSkeleton Define(VStage& stage, const std::string& path);
  explicit operator bool() const { return m_pPrim != nullptr; }
  VPrim& GetPrim() const { return *m_pPrim; }
  VAttribute& GetJointsAttr() const { return m_pPrim->Attribute("joints", true); }
  VAttribute& GetRestTransformsAttr() const { return m_pPrim->Attribute("restTransforms", true); }
  VAttribute& GetBindTransformsAttr() const { return m_pPrim->Attribute("bindTransforms", true); }

private:
  VPrim* m_pPrim = nullptr;
};

class VSkelAnimation {
public:
  static VSkelAnimation Define(VStage& stage, const std::string& path);
  explicit operator bool() const { return m_pPrim != nullptr; }
  VPrim& GetPrim() const { return *m_pPrim; }
  VAttribute& GetJointsAttr() const { return m_pPrim->Attribute("joints", true); }
  VAttribute& GetTranslationsAttr() const { return m_pPrim->Attribute("translations", false); }
  VAttribute& GetRotationsAttr() const { return m_pPrim->Attribute("rotations", false); }
  VAttribute& GetScalesAttr() const { return m_pPrim->Attribute("scales", false); }

private:
  VPrim* m_pPrim = nullptr;
};

class VSkelBindingAPI {
public:
  /// Applies the binding schema to a prim.
  static VSkelBindingAPI Apply(VPrim& prim);
  VRelationship& CreateAnimationSourceRel() const {
    return m_pPrim->Relationship("skel:animationSource");
  }

private:
  VPrim* m_pPrim = nullptr;
};

/// Parents of joints given as paths: the nearest proper ancestor path that is also a joint, or
/// -1. A token that is not a path of prim names has no parent.
class VSkelTopology {
public:
  explicit VSkelTopology(const std::vector<std::string>& paths);
  const std::vector<int>& Parents() const { return m_Parents; }
  /// False, with the reason, when a joint's parent does not come before it.
  bool Validate(std::string* o_pReason) const;

private:
  std::vector<int> m_Parents;
};

/// Scale, then rotation, then translation, for row vectors: M = S * R * T, the rotation computed
/// in float as the schema does.
Matrix4d MakeTransform(const Vec3f& translation, const Quatf& rotation, const Vec3h& scale);
/// The same for arrays of equal length; false when the lengths differ.
bool MakeTransforms(const Vec3fArray& translations, const QuatfArray& rotations,
                    const Vec3hArray& scales, Matrix4dArray& o_rTransforms);

} // namespace AnvilUsd
