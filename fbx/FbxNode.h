#pragma once
// Nodes of the scene tree with their transform properties, and the attributes that say what a
// node is: null, skeleton, marker or camera.
#include "fbx/FbxObject.h"
#include <array>
#include <string>
#include <utility>
#include <vector>

namespace AnvilFbx {

class FbxAnimCurve;
class FbxAnimCurveNode;
class FbxAnimLayer;
class FbxFileTexture;
class FbxNode;

using FbxDouble3 = std::array<double, 3>;
using FbxVector4 = std::array<double, 4>;

/// Curve channel names of a three-component property.
inline constexpr const char* FBXSDK_CURVENODE_COMPONENT_X = "X";
inline constexpr const char* FBXSDK_CURVENODE_COMPONENT_Y = "Y";
inline constexpr const char* FBXSDK_CURVENODE_COMPONENT_Z = "Z";

enum EFbxRotationOrder {
  eEulerXYZ = 0,
  eEulerXZY = 1,
  eEulerYZX = 2,
  eEulerYXZ = 3,
  eEulerZXY = 4,
  eEulerZYX = 5,
};

/// An animatable three-component property of a node ("Lcl Translation" and its kin).
class FbxAnimatableDouble3 {
public:
  FbxAnimatableDouble3(FbxNode* i_pOwner, const char* i_pName, FbxDouble3 i_default)
      : m_pOwner(i_pOwner), m_pName(i_pName), m_value(i_default) {}
  void Set(const FbxDouble3& i_rValue) { m_value = i_rValue; }
  const FbxDouble3& Get() const { return m_value; }
  const char* GetName() const { return m_pName; }
  /// The curve of one channel ("X", "Y", "Z") on a layer; with `i_create` the curve node and
  /// curve are made when missing, otherwise null.
  FbxAnimCurve* GetCurve(FbxAnimLayer* i_pLayer, const char* i_pChannel, bool i_create = false);
  /// The curve node of this property on a layer, or null.
  FbxAnimCurveNode* GetCurveNode(const FbxAnimLayer* i_pLayer) const;

private:
  FbxNode* m_pOwner;
  const char* m_pName;
  FbxDouble3 m_value;
  std::vector<std::pair<const FbxAnimLayer*, FbxAnimCurveNode*>> m_curveNodes;
};

/// Limits of one transform channel; only the active flag is kept.
class FbxLimits {
public:
  void SetActive(bool i_active) { m_active = i_active; }
  bool GetActive() const { return m_active; }

private:
  bool m_active = false;
};

class FbxNodeAttribute : public FbxObject {
public:
  enum EType { eNull, eSkeleton, eMarker, eCamera };
  virtual EType GetAttributeType() const = 0;

protected:
  using FbxObject::FbxObject;
};

class FbxNull : public FbxNodeAttribute {
public:
  static FbxNull* Create(FbxManager* i_pManager, const char* i_pName);
  EType GetAttributeType() const override { return eNull; }

private:
  using FbxNodeAttribute::FbxNodeAttribute;
};

class FbxSkeleton : public FbxNodeAttribute {
public:
  enum EType { eRoot = 0, eLimb = 1, eLimbNode = 2, eEffector = 3 };
  static FbxSkeleton* Create(FbxManager* i_pManager, const char* i_pName);
  FbxNodeAttribute::EType GetAttributeType() const override { return eSkeleton; }
  void SetSkeletonType(EType i_type) { m_type = i_type; }
  EType GetSkeletonType() const { return m_type; }

private:
  using FbxNodeAttribute::FbxNodeAttribute;
  EType m_type = eRoot;
};

class FbxMarker : public FbxNodeAttribute {
public:
  enum EType { eStandard = 0, eOptical = 1, eEffectorFK = 2, eEffectorIK = 3 };
  static FbxMarker* Create(FbxManager* i_pManager, const char* i_pName);
  FbxNodeAttribute::EType GetAttributeType() const override { return eMarker; }
  void SetType(EType i_type) { m_type = i_type; }
  EType GetType() const { return m_type; }

private:
  using FbxNodeAttribute::FbxNodeAttribute;
  EType m_type = eStandard;
};

class FbxCamera : public FbxNodeAttribute {
public:
  enum EApertureMode { eHorizAndVert = 0, eHorizontal = 1, eVertical = 2, eFocalLength = 3 };
  enum EApertureFormat { eCustomAperture = 0, e35mmFullAperture = 5 };
  enum EFormat { eCustomFormat = 0 };
  enum EAspectRatioMode { eWindowSize = 0, eFixedRatio = 1, eFixedResolution = 2 };

  static FbxCamera* Create(FbxManager* i_pManager, const char* i_pName);
  FbxNodeAttribute::EType GetAttributeType() const override { return eCamera; }

  /// Sets the film format and its film size in inches.
  void SetApertureFormat(EApertureFormat i_format);
  void SetApertureMode(EApertureMode i_mode) { m_apertureMode = i_mode; }
  void SetFormat(EFormat i_format) { m_format = i_format; }
  void SetAspect(EAspectRatioMode i_mode, double i_width, double i_height);
  void SetPixelRatio(double i_ratio) { PixelAspectRatio = i_ratio; }
  void SetApertureWidth(double i_inches) { FilmWidth = i_inches; }
  void SetApertureHeight(double i_inches) { FilmHeight = i_inches; }
  void SetBackgroundAlphaTreshold(double i_value) { BackgroundAlphaTreshold = i_value; }
  /// Connects a texture as the background image, replacing any earlier one.
  void SetBackgroundTexture(FbxFileTexture* i_pTexture) { m_pBackground = i_pTexture; }

  EApertureMode GetApertureMode() const { return m_apertureMode; }
  EApertureFormat GetApertureFormat() const { return m_apertureFormat; }
  EAspectRatioMode GetAspectRatioMode() const { return m_aspectMode; }
  double GetAspectWidth() const { return m_aspectWidth; }
  double GetAspectHeight() const { return m_aspectHeight; }
  FbxFileTexture* GetBackgroundTexture() const { return m_pBackground; }
  /// Field of view in degrees, horizontal and vertical, from the focal length and film size.
  double horizontalFieldOfView() const;
  double verticalFieldOfView() const;

  double FocalLength = 35.0; ///< millimetres
  double FilmWidth = 0.816;  ///< inches
  double FilmHeight = 0.612; ///< inches
  double PixelAspectRatio = 1.0;
  double BackPlaneDistance = 4000.0;
  double BackPlaneOffsetX = 0.0;         ///< inches
  double BackPlaneOffsetY = 0.0;         ///< inches
  bool ViewFrustumBackPlaneMode = false; ///< the back plane is drawn
  bool ShowBackplate = false;
  double BackgroundAlphaTreshold = 0.5;

private:
  using FbxNodeAttribute::FbxNodeAttribute;
  EApertureMode m_apertureMode = eVertical;
  EApertureFormat m_apertureFormat = eCustomAperture;
  EFormat m_format = eCustomFormat;
  EAspectRatioMode m_aspectMode = eWindowSize;
  double m_aspectWidth = 320.0;
  double m_aspectHeight = 200.0;
  FbxFileTexture* m_pBackground = nullptr;
};

/// An image file used as a texture (a camera's background).
class FbxFileTexture : public FbxObject {
public:
  enum ETextureUse { eStandard = 0 };
  enum EMappingType { eNull = 0, eUV = 6 };
  enum EMaterialUse { eModelMaterial = 0, eDefaultMaterial = 1 };
  static FbxFileTexture* Create(FbxManager* i_pManager, const char* i_pName);
  void SetFileName(const char* i_pPath) { m_fileName = i_pPath ? i_pPath : ""; }
  const std::string& GetFileName() const { return m_fileName; }
  void SetTextureUse(ETextureUse i_use) { m_use = i_use; }
  void SetMappingType(EMappingType i_type) { m_mapping = i_type; }
  void SetMaterialUse(EMaterialUse i_use) { m_materialUse = i_use; }
  ETextureUse GetTextureUse() const { return m_use; }
  EMappingType GetMappingType() const { return m_mapping; }
  EMaterialUse GetMaterialUse() const { return m_materialUse; }

private:
  using FbxObject::FbxObject;
  std::string m_fileName;
  ETextureUse m_use = eStandard;
  EMappingType m_mapping = eUV;
  EMaterialUse m_materialUse = eModelMaterial;
};

class FbxNode : public FbxObject {
public:
  enum EPivotSet { eSourcePivot = 0, eDestinationPivot = 1 };
  enum EPivotState { ePivotActive = 0, ePivotReference = 1 };
  enum ETransformInheritType { eInheritRrSs = 0, eInheritRSrs = 1, eInheritRrs = 2 };

  /// Makes a node; its name is registered with the scene for `FbxScene::FindSrcObject`.
  static FbxNode* Create(FbxManager* i_pManager, const char* i_pName);

  void SetNodeAttribute(FbxNodeAttribute* i_pAttribute) { m_pAttribute = i_pAttribute; }
  FbxNodeAttribute* GetNodeAttribute() const { return m_pAttribute; }
  /// Appends a child; a node that has a parent moves. False for null or itself.
  bool AddChild(FbxNode* i_pChild);
  FbxNode* GetParent() const { return m_pParent; }
  int GetChildCount() const { return int(m_children.size()); }
  FbxNode* GetChild(int i_index) const { return m_children[size_t(i_index)]; }

  FbxLimits& GetTranslationLimits() { return m_translationLimits; }
  FbxLimits& GetRotationLimits() { return m_rotationLimits; }
  FbxLimits& GetScalingLimits() { return m_scalingLimits; }
  void SetRotationActive(bool i_active) { m_rotationActive = i_active; }
  bool GetRotationActive() const { return m_rotationActive; }
  void SetPivotState(EPivotSet, EPivotState i_state) { m_pivotState = i_state; }
  void SetRotationOrder(EPivotSet, EFbxRotationOrder i_order) { m_rotationOrder = i_order; }
  EFbxRotationOrder GetRotationOrder(EPivotSet = eSourcePivot) const { return m_rotationOrder; }
  void SetUseRotationSpaceForLimitOnly(EPivotSet, bool i_value) {
    m_rotationSpaceForLimit = i_value;
  }
  void SetQuaternionInterpolation(EPivotSet, int i_mode) { m_quaternionInterpolation = i_mode; }
  int GetQuaternionInterpolation(EPivotSet = eSourcePivot) const {
    return m_quaternionInterpolation;
  }
  void SetTransformationInheritType(ETransformInheritType i_type) { m_inheritType = i_type; }
  ETransformInheritType GetTransformationInheritType() const { return m_inheritType; }
  void SetRotationPivot(EPivotSet, const FbxVector4& i_rPivot) { m_rotationPivot = i_rPivot; }
  const FbxVector4& GetRotationPivot(EPivotSet = eSourcePivot) const { return m_rotationPivot; }
  /// Pre and post rotation: Euler angles in degrees, XYZ order.
  void SetPreRotation(EPivotSet, const FbxVector4& i_rRotation) { m_preRotation = i_rRotation; }
  void SetPostRotation(EPivotSet, const FbxVector4& i_rRotation) { m_postRotation = i_rRotation; }
  const FbxVector4& GetPreRotation(EPivotSet = eSourcePivot) const { return m_preRotation; }
  const FbxVector4& GetPostRotation(EPivotSet = eSourcePivot) const { return m_postRotation; }
  void SetVisibility(bool i_visible) { m_visible = i_visible; }
  bool GetVisibility() const { return m_visible; }

  FbxAnimatableDouble3 LclTranslation{this, "Lcl Translation", {0.0, 0.0, 0.0}};
  FbxAnimatableDouble3 LclRotation{this, "Lcl Rotation", {0.0, 0.0, 0.0}};
  FbxAnimatableDouble3 LclScaling{this, "Lcl Scaling", {1.0, 1.0, 1.0}};

private:
  using FbxObject::FbxObject;
  FbxNodeAttribute* m_pAttribute = nullptr;
  FbxNode* m_pParent = nullptr;
  std::vector<FbxNode*> m_children;
  FbxLimits m_translationLimits, m_rotationLimits, m_scalingLimits;
  bool m_rotationActive = false;
  EPivotState m_pivotState = ePivotActive;
  EFbxRotationOrder m_rotationOrder = eEulerXYZ;
  bool m_rotationSpaceForLimit = false;
  int m_quaternionInterpolation = 0;
  ETransformInheritType m_inheritType = eInheritRSrs;
  FbxVector4 m_rotationPivot{0.0, 0.0, 0.0, 1.0};
  FbxVector4 m_preRotation{0.0, 0.0, 0.0, 1.0};
  FbxVector4 m_postRotation{0.0, 0.0, 0.0, 1.0};
  bool m_visible = true;
};

} // namespace AnvilFbx
