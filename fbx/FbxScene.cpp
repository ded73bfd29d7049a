#include "FbxScene.h"
#include "FbxAnimation.h"
#include "FbxNode.h"
#include <algorithm>

namespace AnvilFbx {

namespace {
FbxTime::EMode s_globalMode = FbxTime::eFrames30;
} // namespace

double FbxTime::GetFrameRate(EMode i_mode) {
  switch (i_mode) {
  case eFrames120:
    return 120.0;
  case eFrames100:
    return 100.0;
  case eFrames60:
    return 60.0;
  case eFrames50:
    return 50.0;
  case eFrames48:
    return 48.0;
  case eFrames30:
  case eFrames30Drop:
    return 30.0;
  case eNTSCDropFrame:
  case eNTSCFullFrame:
    return 30000.0 / 1001.0;
  case ePAL:
    return 25.0;
  case eFrames24:
    return 24.0;
  case eFrames1000:
    return 1000.0;
  case eFilmFullFrame:
    return 24000.0 / 1001.0;
  case eFrames96:
    return 96.0;
  case eFrames72:
    return 72.0;
  case eFrames59dot94:
    return 60000.0 / 1001.0;
  case eFrames119dot88:
    return 120000.0 / 1001.0;
  default:
    return 0.0;
  }
}

void FbxTime::SetGlobalTimeMode(EMode i_mode, double) {
  s_globalMode = i_mode;
}

FbxTime::EMode FbxTime::GetGlobalTimeMode() {
  return s_globalMode;
}

FbxAxisSystem::FbxAxisSystem(EPreDefinedAxisSystem i_system) {
  if (i_system == eMayaZUp) {
    // Up +Z, front -Y, right-handed.
    m_upAxis = 2, m_upSign = 1, m_frontAxis = 1, m_frontSign = -1, m_coordAxis = 0, m_coordSign = 1;
  } else {
    // Up +Y, front +Z, right-handed.
    m_upAxis = 1, m_upSign = 1, m_frontAxis = 2, m_frontSign = 1, m_coordAxis = 0, m_coordSign = 1;
  }
}

FbxManager::~FbxManager() {
  while (!m_scenes.empty())
    m_scenes.back()->Destroy();
}

void FbxManager::registerObject(std::unique_ptr<FbxObject> i_pObject) {
  if (m_scenes.empty()) {
    i_pObject->m_id = m_nextId++;
    m_loose.push_back(std::move(i_pObject));
    return;
  }
  m_scenes.back()->addObject(std::move(i_pObject));
}

void FbxScene::addObject(std::unique_ptr<FbxObject> i_pObject) {
  i_pObject->m_id = m_nextId++;
  i_pObject->m_pScene = this;
  m_objects.push_back(std::move(i_pObject));
}

void FbxManager::sceneDestroyed(FbxScene* i_pScene) {
  m_scenes.erase(std::remove(m_scenes.begin(), m_scenes.end(), i_pScene), m_scenes.end());
}

FbxDocumentInfo* FbxDocumentInfo::Create(FbxManager* i_pManager, const char* i_pName) {
  return i_pManager->adopt(std::unique_ptr<FbxDocumentInfo>(new FbxDocumentInfo(i_pName)));
}

FbxScene::FbxScene(FbxManager* i_pManager, const char* i_pName)
    : FbxObject(i_pName), m_pManager(i_pManager) {}

FbxScene* FbxScene::Create(FbxManager* i_pManager, const char* i_pName) {
  auto* pScene = new FbxScene(i_pManager, i_pName);
  i_pManager->m_scenes.push_back(pScene);
  pScene->m_pRoot = FbxNode::Create(i_pManager, "RootNode");
  // The root is the file's object 0, not an object of its own; its name is free for others.
  pScene->m_nodesByName.clear();
  return pScene;
}

void FbxScene::Destroy() {
  m_pManager->sceneDestroyed(this);
  delete this;
}

FbxNode* FbxScene::FindSrcObject(const char* i_pName) const {
  const auto it = m_nodesByName.find(i_pName ? i_pName : "");
  return it == m_nodesByName.end() ? nullptr : it->second;
}

} // namespace AnvilFbx
