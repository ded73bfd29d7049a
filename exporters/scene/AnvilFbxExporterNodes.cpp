// The node road of the FBX exporter: a host node's name under the namespace mode, the kind of
// FBX node it becomes, its transform and its animation curves.
#include "AnvilFbxExporter.h"
#include "FbxHiddenModules.h"
#include "FbxTransforms.h"
#include "fbx/FbxAnimation.h"
#include "fbx/FbxScene.h"
#include "plugin/host/Character.h"
#include "plugin/host/Database.h"
#include "plugin/host/HTimeManager.h"
#include "plugin/host/LabelingBone.h"
#include "plugin/host/LabelingCluster.h"
#include "plugin/host/LabelingConstraint.h"
#include "plugin/host/LabelingSetup.h"
#include "plugin/host/Light.h"
#include "plugin/host/Marker.h"
#include "plugin/host/NLEClip.h"
#include "plugin/host/OperationStack.h"
#include "plugin/host/OpticalCamera.h"
#include "plugin/host/RetargetingBone.h"
#include "plugin/host/RetargetingSetup.h"
#include "plugin/host/SolvingBone.h"
#include "plugin/host/SolvingConstraint.h"
#include "plugin/host/SolvingSetup.h"
#include "plugin/host/VideoCamera.h"
#include <filesystem>
#include <memory>

using namespace AnvilFbx;

namespace {
constexpr double kInchesPerMillimetre = 0.0393701;
constexpr double kCentimetresPerMillimetre = 0.1;

// Counters of the process: actors are numbered from 1, clashing names from 0.
int s_actorCounter = 1;
int s_uniqueCounter = 0;

#define IS(Module, Class) (Module)->isKindOf(&Class::s_class##Class)

bool isBone(const Module* i_pModule) {
  return IS(i_pModule, SolvingBone) || IS(i_pModule, LabelingBone) ||
         IS(i_pModule, RetargetingBone);
}
bool isLabelingPart(const Module* i_pModule) {
  return IS(i_pModule, LabelingSetup) || IS(i_pModule, LabelingBone) ||
         IS(i_pModule, LabelingConstraint) || IS(i_pModule, LabelingCluster);
}
bool isSetup(const Module* i_pModule) {
  return IS(i_pModule, LabelingSetup) || IS(i_pModule, SolvingSetup) ||
         IS(i_pModule, RetargetingSetup);
}
bool propWithoutSolving(const Module* i_pModule) {
  const Character* pCharacter = IS(i_pModule, Character) ? static_cast<const Character*>(i_pModule)
                                                         : i_pModule->getCharacterParent();
  return pCharacter && pCharacter->isProp() &&
         !const_cast<Character*>(pCharacter)->getSolvingSetup(false);
}

FbxDouble3 toDouble3(const Vec3& i_rV) {
  return {i_rV.x, i_rV.y, i_rV.z};
}
FbxVector4 eulerXYZ(const AnvilRotation& i_rRotation) {
  Vec3 degrees;
  i_rRotation.getAsEuler(AnvilRotation::XYZ, degrees);
  return {degrees.x, degrees.y, degrees.z, 0.0};
}

// The unique name of an actor for a name and a namespace.
HString uniqueName(const FbxScene& i_rScene, const HString& i_rName, const HString& i_rNamespace,
                   int i_mode) {
  const bool bare = i_mode == 2 || i_mode == 3 || i_rNamespace.IsEmpty();
  HString name =
      bare ? i_rName : HString().Format("%s:%s", i_rNamespace.GetStr(), i_rName.GetStr());
  while (i_rScene.FindSrcObject(name.GetStr())) {
    const int n = s_uniqueCounter++;
    if (i_mode == 2 || i_rNamespace.IsEmpty())
      name.Format("%s:%2.2d", i_rName.GetStr(), n);
    else
      name.Format("%s:%s:%2.2d", i_rNamespace.GetStr(), i_rName.GetStr(), n);
  }
  return name;
}
} // namespace

// Solving parts of a subject that is retargeted never reach the file.
bool endsBranch(const Module* i_pModule) {
  if (!IS(i_pModule, SolvingBone) && !IS(i_pModule, SolvingConstraint)) return false;
  Character* pCharacter = i_pModule->getCharacterParent();
  return pCharacter && pCharacter->getRetargetingSetup(false);
}

bool AnvilFbxExporter::isHidden(const Module* i_pModule) const {
  return FbxHiddenModules::isHidden(m_hidden, i_pModule);
}

bool AnvilFbxExporter::keepKey(int64_t i_time) const {
  if (!HTimeManager::getInstance()->isOnframe(i_time, m_sampleStep)) return false;
  return !m_rangeOnly || (i_time >= m_rangeStart && i_time <= m_rangeEnd);
}

HString AnvilFbxExporter::nodeName(const Node* i_pNode) const {
  HString full = i_pNode->getFullPathString();
  full.Replace('/', ':');
  full.Replace('\\', ':');
  // The path starts at the scene's root, which has no name.
  while (!full.IsEmpty() && full[0] == ':')
    full = full.Mid(1);
  switch (m_options.m_namespaceMode) {
  case FbxExportOptions::ENamespaceFull:
    return full;
  case FbxExportOptions::ENamespaceShort: {
    Character* pCharacter = i_pNode->getCharacterParent();
    if (!pCharacter) return full;
    HString name = pCharacter->getName() + ":";
    if (m_options.m_exportLabelingSetups) {
      const Node* setups[] = {pCharacter->getLabelingSetup(false),
                              pCharacter->getSolvingSetup(false),
                              pCharacter->getRetargetingSetup(false)};
      for (const Node* pSetup : setups)
        if (pSetup && i_pNode->isDescendedFrom(pSetup)) name += pSetup->getName() + ":";
    }
    return name + i_pNode->getName();
  }
  case FbxExportOptions::ENamespaceNone: {
    const int colon = full.ReverseFind(':');
    return colon < 0 ? full : full.Mid(colon + 1);
  }
  case FbxExportOptions::ENamespaceUseName:
    return i_pNode->getName();
  }
  return full;
}

void AnvilFbxExporter::warnNameCollisions(const Node* i_pNode) const {
  const HString& name = i_pNode->getName();
  if (m_options.m_namespaceMode == FbxExportOptions::ENamespaceNone ||
      m_options.m_namespaceMode == FbxExportOptions::ENamespaceUseName) {
    int count = 0;
    const TSimpleArray<Module*> same = g_db->getModulesWithName(name, nullptr);
    for (const Module* p : same)
      if (!isHidden(p)) ++count;
    if (count > 1)
      g_db->logWarning("There are multiple modules in the scene with the name %s. This may result "
                       "in a number being added to the name on import to resolve name ambiguity "
                       "in applications that do not use hierarchy to resolve name uniqueness.",
                       name.GetStr());
    return;
  }
  if (m_options.m_namespaceMode != FbxExportOptions::ENamespaceShort) return;
  Character* pCharacter = i_pNode->getCharacterParent();
  if (!pCharacter) return;
  struct Scope {
    const Node* m_pSetup;
    const char* m_pKind;
    bool m_applies;
  };
  const Scope scopes[] = {{pCharacter->getLabelingSetup(false), "LabelingSetup",
                           m_options.m_exportLabelingSetups || pCharacter->isProp()},
                          {pCharacter->getSolvingSetup(false), "SolvingSetup", true},
                          {pCharacter->getRetargetingSetup(false), "RetargetingSetup", true}};
  bool underSetup = false;
  // Hidden modules are out of the file, so they clash with nothing.
  auto visibleHits = [&](const Module* i_pScope) {
    TSimpleArray<Module*> hits;
    i_pScope->getDescendantsWithName(name, hits);
    int count = 0;
    for (const Module* p : hits)
      if (!isHidden(p) && !endsBranch(p)) ++count;
    return count;
  };
  auto check = [&](const Module* i_pScope, const char* i_pKind) {
    if (visibleHits(i_pScope) > 1)
      g_db->logWarning("There are multiple descendants of the %s of %s with the name %s. "
                       "Applications importing this FBX may add a number to the name of one of "
                       "these modules if they don't use hierarchy to resolve uniqueness. To avoid "
                       "this, export with full namespaces.",
                       i_pKind, pCharacter->getName().GetStr(), name.GetStr());
  };
  for (const Scope& scope : scopes) {
    if (!scope.m_pSetup || !i_pNode->isDescendedFrom(scope.m_pSetup)) continue;
    underSetup = true;
    if (scope.m_applies) check(scope.m_pSetup, scope.m_pKind);
  }
  if (!underSetup) {
    if (visibleHits(pCharacter) > 1)
      g_db->logWarning("There are multiple descendants of the %s with the name %s. Applications "
                       "importing this FBX may add a number to the name of one of these modules "
                       "if they don't use hierarchy to resolve uniqueness. To avoid this, export "
                       "with full namespaces.",
                       pCharacter->getName().GetStr(), name.GetStr());
  }
}

bool AnvilFbxExporter::exportChildren(const Pass& i_rPass, Node* i_pNode, FbxNode* i_pParent,
                                      HString& io_rNamespace) {
  for (int i = 0; i < i_pNode->getNumNodeChildren(); ++i)
    if (!exportNode(i_rPass, i_pNode->getNodeChild(i), i_pParent, io_rNamespace)) return false;
  return true;
}

bool AnvilFbxExporter::exportNode(const Pass& i_rPass, Node* i_pNode, FbxNode* i_pParent,
                                  HString& io_rNamespace) {
  if (isHidden(i_pNode)) return true;
  if (s_doProgress) g_theOperationStack.stepTask();
  const auto found = m_nodes.find(i_pNode);
  FbxNode* pExisting = found == m_nodes.end() ? nullptr : found->second;
  if (!isInModsList(i_pNode) || pExisting) {
    if (pExisting) setUpNode(i_rPass, pExisting, i_pNode, pExisting->GetParent());
    return exportChildren(i_rPass, i_pNode, pExisting ? pExisting : i_pParent, io_rNamespace);
  }

  // Parts that give no node of their own.
  const bool labelingOff = !m_options.m_exportLabelingSetups;
  if (labelingOff && isLabelingPart(i_pNode) && !propWithoutSolving(i_pNode))
    return exportChildren(i_rPass, i_pNode, i_pParent, io_rNamespace);
  if (endsBranch(i_pNode)) return true;
  if (labelingOff && isSetup(i_pNode))
    return exportChildren(i_rPass, i_pNode, i_pParent, io_rNamespace);
  if (IS(i_pNode, Character) && m_options.m_collapseSubjects)
    return exportChildren(i_rPass, i_pNode, i_pParent, io_rNamespace);

  FbxNode* pParent = i_pParent;
  if (isBone(i_pNode) && pParent) {
    Module* pUp = i_pNode->getParent();
    if (pUp && IS(pUp, ParameterizedSetup) && pUp->getCharacterParent()) {
      const auto character = m_nodes.find(pUp->getCharacterParent());
      pParent = character == m_nodes.end() ? nullptr : character->second;
    }
  }
  HString name;
  if (IS(i_pNode, Character)) {
    name = i_pNode->getName();
  } else {
    warnNameCollisions(i_pNode);
    name = nodeName(i_pNode);
  }
  FbxNode* pNode = createFbxNode(i_pNode, name);
  if (isBone(i_pNode) && !pParent && !m_options.m_collapseSubjects)
    pParent = createActor(io_rNamespace);
  setUpNode(i_rPass, pNode, i_pNode, pParent);
  return exportChildren(i_rPass, i_pNode, pNode, io_rNamespace);
}

FbxNode* AnvilFbxExporter::createActor(HString& io_rNamespace) {
  io_rNamespace.Format("Actor_%d", s_actorCounter++);
  const HString name =
      uniqueName(*m_pScene, io_rNamespace, io_rNamespace, int(m_options.m_namespaceMode));
  FbxNode* pActor = FbxNode::Create(m_pManager, name.GetStr());
  pActor->SetNodeAttribute(FbxNull::Create(m_pManager, name.GetStr()));
  const Pass none{nullptr, nullptr};
  setUpNode(none, pActor, nullptr, nullptr);
  return pActor;
}

FbxNode* AnvilFbxExporter::createFbxNode(Node* i_pNode, const HString& i_rName) {
  const char* pName = i_rName.GetStr();
  FbxNode* pNode = FbxNode::Create(m_pManager, pName);
  FbxNodeAttribute* pAttribute = nullptr;
  if (IS(i_pNode, Character)) {
    pAttribute = FbxNull::Create(m_pManager, pName);
  } else if (IS(i_pNode, OpticalCamera)) {
    const auto* pHost = static_cast<const OpticalCamera*>(i_pNode);
    FbxCamera* pCamera = FbxCamera::Create(m_pManager, pName);
    const bool sdi = pHost->isSDI();
    pCamera->SetApertureMode(FbxCamera::eFocalLength);
    pCamera->FocalLength = sdi ? pHost->getFocalLengthInPixels() : pHost->getFocalLength();
    pCamera->SetFormat(FbxCamera::eCustomFormat);
    pCamera->SetAspect(FbxCamera::eFixedResolution, pHost->getSensorWidth(),
                       pHost->getSensorHeight());
    pCamera->SetPixelRatio(pHost->getPixelAspectRatio());
    const double width = sdi ? pHost->getSensorWidth() : pHost->getSensorWidthMM();
    const double height = sdi ? pHost->getSensorHeight() : pHost->getSensorHeightMM();
    pCamera->SetApertureWidth(width * kInchesPerMillimetre);
    pCamera->SetApertureHeight(height * kInchesPerMillimetre);
    if (IS(i_pNode, VideoCamera)) {
      // The video's frames as images: <folder>/<base>/<base>.0000.jpg.
      const std::filesystem::path video(
          static_cast<const VideoCamera*>(i_pNode)->getVideoFile().GetString());
      const std::string base = video.stem().string();
      const std::string file =
          video.parent_path().generic_string() + "/" + base + "/" + base + ".0000.jpg";
      FbxFileTexture* pTexture =
          FbxFileTexture::Create(m_pManager, (i_pNode->getName() + "_Texture").GetStr());
      pTexture->SetFileName(file.c_str());
      pTexture->SetTextureUse(FbxFileTexture::eStandard);
      pTexture->SetMappingType(FbxFileTexture::eUV);
      pTexture->SetMaterialUse(FbxFileTexture::eDefaultMaterial);
      pCamera->SetBackgroundTexture(pTexture);
      pCamera->ViewFrustumBackPlaneMode = true;
      pCamera->BackPlaneDistance = 3900.0;
      pCamera->SetBackgroundAlphaTreshold(0.9);
      const HPoint2 p = sdi ? pHost->getPrincipalPoint() : pHost->getPrincipalPointMM();
      pCamera->BackPlaneOffsetX = (width * 0.5 - p.x) * kInchesPerMillimetre;
      pCamera->BackPlaneOffsetY = (height * 0.5 - p.y) * -kInchesPerMillimetre;
      pCamera->ShowBackplate = true;
    }
    pAttribute = pCamera;
  } else if (IS(i_pNode, HCamera)) {
    FbxCamera* pCamera = FbxCamera::Create(m_pManager, pName);
    pCamera->SetApertureFormat(FbxCamera::e35mmFullAperture);
    pAttribute = pCamera;
  } else if (IS(i_pNode, Light)) {
    // No light attribute: a light travels as a plain camera.
    pAttribute = FbxCamera::Create(m_pManager, pName);
  } else if (isBone(i_pNode)) {
    FbxSkeleton* pSkeleton = FbxSkeleton::Create(m_pManager, pName);
    pSkeleton->SetSkeletonType(FbxSkeleton::eLimbNode);
    pAttribute = pSkeleton;
  } else if (IS(i_pNode, Marker)) {
    FbxMarker* pMarker = FbxMarker::Create(m_pManager, pName);
    pMarker->SetType(FbxMarker::eStandard);
    pAttribute = pMarker;
  } else {
    pAttribute = FbxNull::Create(m_pManager, pName);
  }
  pNode->SetNodeAttribute(pAttribute);
  m_nodes[i_pNode] = pNode;
  return pNode;
}

void AnvilFbxExporter::setUpNode(const Pass& i_rPass, FbxNode* i_pFbx, Node* i_pHost,
                                 FbxNode* i_pParent) {
  i_pFbx->GetTranslationLimits().SetActive(false);
  i_pFbx->GetRotationLimits().SetActive(false);
  i_pFbx->GetScalingLimits().SetActive(false);
  i_pFbx->SetRotationActive(true);
  i_pFbx->SetPivotState(FbxNode::eSourcePivot, FbxNode::ePivotActive);
  i_pFbx->SetRotationOrder(FbxNode::eSourcePivot,
                           i_pHost ? FbxTransforms::rotationOrder(i_pHost->getRotationOrder())
                                   : eEulerXYZ);
  i_pFbx->SetUseRotationSpaceForLimitOnly(FbxNode::eSourcePivot, false);
  i_pFbx->SetQuaternionInterpolation(FbxNode::eSourcePivot, 1);
  i_pFbx->SetTransformationInheritType(FbxNode::eInheritRrSs);
  i_pFbx->SetRotationPivot(FbxNode::eSourcePivot, {0.0, 0.0, 0.0, 1.0});
  FbxNode* pParent = i_pParent ? i_pParent : m_pScene->GetRootNode();
  if (i_pFbx->GetParent() != pParent) pParent->AddChild(i_pFbx);
  m_hostOf[i_pFbx] = i_pHost;

  if (!i_pHost) {
    i_pFbx->SetPreRotation(FbxNode::eSourcePivot, {0.0, 0.0, 0.0, 1.0});
    i_pFbx->SetVisibility(false);
    i_pFbx->LclTranslation.Set({0.0, 0.0, 0.0});
    i_pFbx->LclRotation.Set({0.0, 0.0, 0.0});
    i_pFbx->LclScaling.Set({1.0, 1.0, 1.0});
    return;
  }
  const auto parentHost = m_hostOf.find(pParent);
  const FbxTransforms::Frame frame = FbxTransforms::parentCorrection(
      i_pHost, parentHost == m_hostOf.end() ? nullptr : parentHost->second);
  i_pFbx->SetPreRotation(FbxNode::eSourcePivot,
                         eulerXYZ(frame.m_rotation * i_pHost->getPreRotation()));
  i_pFbx->SetPostRotation(FbxNode::eSourcePivot, eulerXYZ(FbxTransforms::postRotation(i_pHost)));
  i_pFbx->SetVisibility(i_pHost->isVisible());

  Vec3 t, s;
  AnvilRotation r;
  i_pHost->getConstLocalTransform(t, r, s);
  Vec3 translation = frame.apply(i_pHost->getPreTranslation() + t);
  const auto* pMarker = IS(i_pHost, Marker) ? static_cast<const Marker*>(i_pHost) : nullptr;
  if (pMarker && !pMarker->m_track.isEmpty()) {
    // A marker's track is its world position: its first key, in the FBX parent's space.
    translation =
        FbxTransforms::markerLocal(pMarker, pMarker->m_track.getKeyTime(0), m_hostOf[pParent]);
  }
  translation *= kCentimetresPerMillimetre;
  Vec3 euler;
  r.getAsEuler(i_pHost->getRotationOrder(), euler);
  i_pFbx->LclTranslation.Set(toDouble3(translation));
  i_pFbx->LclRotation.Set(toDouble3(euler));
  i_pFbx->LclScaling.Set(toDouble3(s));
  if (i_rPass.m_pLayer) writeCurves(i_rPass, i_pFbx, i_pHost);
}

void AnvilFbxExporter::writeCurves(const Pass& i_rPass, FbxNode* i_pFbx, Node* i_pHost) {
  FbxAnimLayer* pLayer = i_rPass.m_pLayer;
  HTimeManager* pTime = HTimeManager::getInstance();
  const HTime offset = i_rPass.m_pClip ? i_rPass.m_pClip->getStartOffset() : 0;
  const char* const kAxes[] = {FBXSDK_CURVENODE_COMPONENT_X, FBXSDK_CURVENODE_COMPONENT_Y,
                               FBXSDK_CURVENODE_COMPONENT_Z};
  auto fbxTime = [&](HTime i_t) {
    FbxTime time;
    time.SetSecondDouble(pTime->getTimeInSeconds(i_t + offset));
    return time;
  };
  // The keys of a track that the take keeps and their FBX times, shared with the track before
  // when both have the same key times.
  auto keyTimes = [&](const std::vector<HTime>& i_rTimes) -> const KeyTimes& {
    KeyTimes& last = m_lastKeyTimes;
    if (last.m_pLayer == pLayer && last.m_pFbxTimes && last.m_hostTimes == i_rTimes) return last;
    last.m_pLayer = pLayer;
    last.m_hostTimes = i_rTimes;
    last.m_kept.clear();
    for (size_t k = 0; k < i_rTimes.size(); ++k)
      if (keepKey(i_rTimes[k])) last.m_kept.push_back(int(k));
    last.m_pFbxTimes = std::make_shared<FbxKeyTimes>(last.m_kept.size());
    for (size_t i = 0; i < last.m_kept.size(); ++i)
      (*last.m_pFbxTimes)[i] = fbxTime(i_rTimes[size_t(last.m_kept[i])]).Get();
    return last;
  };
  // Three curves of a property, one key per kept key of the track, values from `i_value`. The
  // values are gathered column by column into arrays that the curves take over.
  auto writeVector = [&](FbxAnimatableDouble3& io_rProperty, const std::vector<HTime>& i_rTimes,
                         auto i_value, FbxAnimCurve** o_ppCurves) {
    const KeyTimes& times = keyTimes(i_rTimes);
    const size_t count = times.m_kept.size();
    FbxKeyValues columns[3] = {FbxKeyValues(count), FbxKeyValues(count), FbxKeyValues(count)};
    for (size_t i = 0; i < count; ++i) {
      const Vec3 v = i_value(times.m_kept[i]);
      columns[0][i] = float(v.x);
      columns[1][i] = float(v.y);
      columns[2][i] = float(v.z);
    }
    for (int a = 0; a < 3; ++a) {
      o_ppCurves[a] = io_rProperty.GetCurve(pLayer, kAxes[a], true);
      o_ppCurves[a]->KeyModifyBegin();
      o_ppCurves[a]->addKeys(times.m_pFbxTimes, std::move(columns[a]),
                             FbxAnimCurveDef::eInterpolationLinear);
      o_ppCurves[a]->KeyModifyEnd();
    }
  };

  FbxAnimCurve* curves[3];
  const auto* pMarker = IS(i_pHost, Marker) ? static_cast<const Marker*>(i_pHost) : nullptr;
  FbxNode* pParent = i_pFbx->GetParent();
  const Node* pParentHost = m_hostOf.count(pParent) ? m_hostOf[pParent] : nullptr;
  if (pMarker && !pMarker->m_track.isEmpty()) {
    const std::vector<HTime>& times = pMarker->m_track.times();
    const FbxTransforms::MarkerSpace space(pParentHost);
    writeVector(
        i_pFbx->LclTranslation, times,
        [&](int k) {
          return space.local(pMarker->m_track.getKeyValue(k), times[size_t(k)]) *
                 kCentimetresPerMillimetre;
        },
        curves);
  } else if (!i_pHost->m_positionTrack.isEmpty()) {
    const std::vector<HTime>& times = i_pHost->m_positionTrack.times();
    const FbxTransforms::Frame frame = FbxTransforms::parentCorrection(i_pHost, pParentHost);
    const Vec3 pre = i_pHost->getPreTranslation();
    writeVector(
        i_pFbx->LclTranslation, times,
        [&](int k) {
          return frame.apply(pre + i_pHost->m_positionTrack.getKeyValue(k)) *
                 kCentimetresPerMillimetre;
        },
        curves);
  }
  if (!i_pHost->m_rotationTrack.isEmpty()) {
    const std::vector<HTime>& times = i_pHost->m_rotationTrack.times();
    const AnvilRotation::RotOrder order = i_pHost->getRotationOrder();
    writeVector(
        i_pFbx->LclRotation, times,
        [&](int k) {
          Vec3 euler;
          i_pHost->m_rotationTrack.getKeyValue(k).getAsEuler(order, euler);
          return euler;
        },
        curves);
    if (m_options.m_unrollAnimationCurves) {
      FbxAnimCurveFilterUnroll filter;
      filter.SetRotationOrder(FbxTransforms::rotationOrder(order));
      if (!filter.Apply(curves, 3))
        g_db->logWarning("Unroll filter failed during export of %s", i_pHost->getName().GetStr());
    }
  }
  if (!i_pHost->m_scaleTrack.isEmpty()) {
    const std::vector<HTime>& times = i_pHost->m_scaleTrack.times();
    writeVector(
        i_pFbx->LclScaling, times,
        [&](int k) { return i_pHost->m_scaleTrack.getKeyValue(k) * 1.0; }, curves);
  }
}
