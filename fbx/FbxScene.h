#pragma once
// The scene: its root node, global settings, document information and the objects made while it
// lives.
#include "fbx/FbxObject.h"
#include "fbx/FbxTime.h"
#include <string>
#include <unordered_map>

namespace AnvilFbx {

class FbxAnimStack;
class FbxNode;

/// Up, front and coordinate axes with their signs (0 X, 1 Y, 2 Z).
class FbxAxisSystem {
public:
  enum EPreDefinedAxisSystem { eMayaZUp = 0, eMayaYUp = 1 };
  FbxAxisSystem() : FbxAxisSystem(eMayaYUp) {}
  explicit FbxAxisSystem(EPreDefinedAxisSystem i_system);
  int m_upAxis, m_upSign, m_frontAxis, m_frontSign, m_coordAxis, m_coordSign;
};

class FbxGlobalSettings {
public:
  void SetAxisSystem(const FbxAxisSystem& i_rSystem) { m_axisSystem = i_rSystem; }
  const FbxAxisSystem& GetAxisSystem() const { return m_axisSystem; }
  void SetTimeMode(FbxTime::EMode i_mode) { m_timeMode = i_mode; }
  FbxTime::EMode GetTimeMode() const { return m_timeMode; }
  void SetCustomFrameRate(double i_rate) { m_customFrameRate = i_rate; }
  double GetCustomFrameRate() const { return m_customFrameRate; }
  /// Centimetres per file unit.
  double GetUnitScaleFactor() const { return 1.0; }

private:
  FbxAxisSystem m_axisSystem;
  FbxTime::EMode m_timeMode = FbxTime::eFrames30;
  double m_customFrameRate = 0.0;
};

class FbxDocumentInfo : public FbxObject {
public:
  static FbxDocumentInfo* Create(FbxManager* i_pManager, const char* i_pName);
  std::string mTitle, mSubject, mAuthor, mRevision, mKeywords, mComment;

private:
  using FbxObject::FbxObject;
};

class FbxScene : public FbxObject {
public:
  static FbxScene* Create(FbxManager* i_pManager, const char* i_pName);
  /// Destroys the scene with every object made while it lived.
  void Destroy();

  FbxNode* GetRootNode() const { return m_pRoot; }
  FbxGlobalSettings& GetGlobalSettings() { return m_settings; }
  const FbxGlobalSettings& GetGlobalSettings() const { return m_settings; }
  void SetSceneInfo(FbxDocumentInfo* i_pInfo) { m_pInfo = i_pInfo; }
  FbxDocumentInfo* GetSceneInfo() const { return m_pInfo; }
  /// The node of that name in the scene, or null.
  FbxNode* FindSrcObject(const char* i_pName) const;

  /// Every object of the scene, in creation order.
  const std::vector<std::unique_ptr<FbxObject>>& objects() const { return m_objects; }
  /// Animation stacks in creation order.
  const std::vector<FbxAnimStack*>& stacks() const { return m_stacks; }

  /// Takes ownership of an object made for this scene and gives it the scene's next id.
  template <typename T> T* add(std::unique_ptr<T> i_pObject) {
    T* p = i_pObject.get();
    addObject(std::move(i_pObject));
    return p;
  }

private:
  friend class FbxManager;
  friend class FbxNode;
  friend class FbxAnimStack;
  void addObject(std::unique_ptr<FbxObject> i_pObject);
  FbxScene(FbxManager* i_pManager, const char* i_pName);
  ~FbxScene() override = default;

  FbxManager* m_pManager;
  FbxNode* m_pRoot = nullptr;
  FbxDocumentInfo* m_pInfo = nullptr;
  FbxGlobalSettings m_settings;
  std::vector<std::unique_ptr<FbxObject>> m_objects;
  std::vector<FbxAnimStack*> m_stacks;
  std::unordered_map<std::string, FbxNode*> m_nodesByName;
  int64_t m_nextId = 1000000;
};

} // namespace AnvilFbx
