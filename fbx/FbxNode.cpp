#include "FbxNode.h"
#include "FbxAnimation.h"
#include "FbxScene.h"
#include <cmath>
#include <cstring>

namespace AnvilFbx {

namespace {
constexpr double kDegreesPerRadian = 57.29577951308232;
constexpr double kMillimetresPerInch = 25.4;
} // namespace

FbxNull* FbxNull::Create(FbxManager* i_pManager, const char* i_pName) {
  return i_pManager->adopt(std::unique_ptr<FbxNull>(new FbxNull(i_pName)));
}
FbxSkeleton* FbxSkeleton::Create(FbxManager* i_pManager, const char* i_pName) {
  return i_pManager->adopt(std::unique_ptr<FbxSkeleton>(new FbxSkeleton(i_pName)));
}
FbxMarker* FbxMarker::Create(FbxManager* i_pManager, const char* i_pName) {
  return i_pManager->adopt(std::unique_ptr<FbxMarker>(new FbxMarker(i_pName)));
}
FbxCamera* FbxCamera::Create(FbxManager* i_pManager, const char* i_pName) {
  return i_pManager->adopt(std::unique_ptr<FbxCamera>(new FbxCamera(i_pName)));
}
FbxFileTexture* FbxFileTexture::Create(FbxManager* i_pManager, const char* i_pName) {
  return i_pManager->adopt(std::unique_ptr<FbxFileTexture>(new FbxFileTexture(i_pName)));
}

void FbxCamera::SetApertureFormat(EApertureFormat i_format) {
  m_apertureFormat = i_format;
  if (i_format == e35mmFullAperture) {
    FilmWidth = 0.980;
    FilmHeight = 0.735;
  }
}

void FbxCamera::SetAspect(EAspectRatioMode i_mode, double i_width, double i_height) {
  m_aspectMode = i_mode;
  m_aspectWidth = i_width;
  m_aspectHeight = i_height;
}

double FbxCamera::horizontalFieldOfView() const {
  if (FocalLength <= 0.0) return 0.0;
  return 2.0 * std::atan(FilmWidth * kMillimetresPerInch * 0.5 / FocalLength) * kDegreesPerRadian;
}

double FbxCamera::verticalFieldOfView() const {
  if (FocalLength <= 0.0) return 0.0;
  return 2.0 * std::atan(FilmHeight * kMillimetresPerInch * 0.5 / FocalLength) * kDegreesPerRadian;
}

FbxNode* FbxNode::Create(FbxManager* i_pManager, const char* i_pName) {
  FbxNode* pNode = i_pManager->adopt(std::unique_ptr<FbxNode>(new FbxNode(i_pName)));
  if (FbxScene* pScene = pNode->GetScene()) pScene->m_nodesByName.emplace(pNode->name(), pNode);
  return pNode;
}

bool FbxNode::AddChild(FbxNode* i_pChild) {
  if (!i_pChild || i_pChild == this) return false;
  if (FbxNode* pOld = i_pChild->m_pParent) std::erase(pOld->m_children, i_pChild);
  i_pChild->m_pParent = this;
  m_children.push_back(i_pChild);
  return true;
}

FbxAnimCurveNode* FbxAnimatableDouble3::GetCurveNode(const FbxAnimLayer* i_pLayer) const {
  for (const auto& [pLayer, pNode] : m_curveNodes)
    if (pLayer == i_pLayer) return pNode;
  return nullptr;
}

FbxAnimCurve* FbxAnimatableDouble3::GetCurve(FbxAnimLayer* i_pLayer, const char* i_pChannel,
                                             bool i_create) {
  if (!i_pLayer || !i_pChannel) return nullptr;
  int channel = -1;
  if (std::strcmp(i_pChannel, FBXSDK_CURVENODE_COMPONENT_X) == 0) channel = 0;
  if (std::strcmp(i_pChannel, FBXSDK_CURVENODE_COMPONENT_Y) == 0) channel = 1;
  if (std::strcmp(i_pChannel, FBXSDK_CURVENODE_COMPONENT_Z) == 0) channel = 2;
  if (channel < 0) return nullptr;
  FbxAnimCurveNode* pCurveNode = GetCurveNode(i_pLayer);
  if (!pCurveNode) {
    if (!i_create) return nullptr;
    FbxScene* pScene = i_pLayer->GetScene();
    if (!pScene) return nullptr;
    const char* pShort = std::strcmp(m_pName, "Lcl Translation") == 0 ? "T"
                         : std::strcmp(m_pName, "Lcl Rotation") == 0  ? "R"
                                                                      : "S";
    pCurveNode = pScene->add(std::unique_ptr<FbxAnimCurveNode>(new FbxAnimCurveNode(pShort)));
    pCurveNode->m_pTarget = m_pOwner;
    pCurveNode->m_pProperty = m_pName;
    pCurveNode->m_pLayer = i_pLayer;
    m_curveNodes.emplace_back(i_pLayer, pCurveNode);
    i_pLayer->m_curveNodes.push_back(pCurveNode);
  }
  pCurveNode->m_defaults = m_value;
  FbxAnimCurve*& pCurve = pCurveNode->m_curves[size_t(channel)];
  if (!pCurve && i_create) {
    pCurve = i_pLayer->GetScene()->add(std::unique_ptr<FbxAnimCurve>(new FbxAnimCurve("")));
  }
  return pCurve;
}

} // namespace AnvilFbx
