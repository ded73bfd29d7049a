#pragma once
// Base of the FBX objects and the manager that makes them. Objects made while a scene lives
// belong to that scene and die with it.
#include <cstdint>
#include <memory>
#include <string>
#include <vector>

namespace AnvilFbx {

class FbxScene;

class FbxObject {
public:
  virtual ~FbxObject() = default;
  FbxObject(const FbxObject&) = delete;
  FbxObject& operator=(const FbxObject&) = delete;

  const char* GetName() const { return m_name.c_str(); }
  const std::string& name() const { return m_name; }
  void SetName(const char* i_pName) { m_name = i_pName ? i_pName : ""; }
  /// The id the file gives the object: unique and never 0 within one scene.
  int64_t GetUniqueID() const { return m_id; }
  FbxScene* GetScene() const { return m_pScene; }

protected:
  explicit FbxObject(const char* i_pName) : m_name(i_pName ? i_pName : "") {}

private:
  friend class FbxManager;
  friend class FbxScene;
  std::string m_name;
  int64_t m_id = 0;
  FbxScene* m_pScene = nullptr;
};

class FbxManager {
public:
  static FbxManager* Create() { return new FbxManager(); }
  /// Destroys the manager and every object it still holds.
  void Destroy() { delete this; }

  /// Takes ownership of a new object: it joins the newest live scene, or the manager when there
  /// is none.
  template <typename T> T* adopt(std::unique_ptr<T> i_pObject) {
    T* p = i_pObject.get();
    registerObject(std::move(i_pObject));
    return p;
  }

private:
  friend class FbxScene;
  FbxManager() = default;
  ~FbxManager();
  void registerObject(std::unique_ptr<FbxObject> i_pObject);
  void sceneDestroyed(FbxScene* i_pScene);

  std::vector<FbxScene*> m_scenes;
  std::vector<std::unique_ptr<FbxObject>> m_loose;
  int64_t m_nextId = 1000000;
};

} // namespace AnvilFbx
