// The scene road of the FBX exporter: options in force for one write, scene information, axis
// system, time mode, the scene-wide rotation, the clip loop and the save.
#include "AnvilFbxExporter.h"
#include "FbxHiddenModules.h"
#include "fbx/FbxAnimation.h"
#include "fbx/FbxExporter.h"
#include "fbx/FbxScene.h"
#include "plugin/host/Character.h"
#include "plugin/host/Database.h"
#include "plugin/host/HTimeManager.h"
#include "plugin/host/NLEClip.h"
#include "plugin/host/OperationStack.h"
#include "plugin/host/SubjectScaler.h"

using namespace AnvilFbx;

namespace {
const char* const kRevision = "1.4.0.125783h";

bool isTopLevel(const Module* i_pModule) {
  return !i_pModule->hasParent() || i_pModule->getParent() == g_db->getRoot();
}
} // namespace

bool AnvilFbxExporter::write() {
  // Labeling setups stay out of the file unless asked for.
  m_hidden = FbxHiddenModules::labelingSetups(!m_options.m_exportLabelingSetups);
  m_hostOf.clear();
  if (m_options.m_unscaleRetargetingSubjects) {
    SubjectScaler scaler;
    scaler.unscaleRetargetingSubjects();
  }
  if (!m_options.m_collapseSubjects) {
    // Parents join the list, and theirs in turn as the walk reaches them.
    for (int i = 0; i < m_modules.getCount(); ++i) {
      Module* pModule = m_modules[i];
      if (!pModule->isKindOf(&Node::s_classNode) || isTopLevel(pModule)) continue;
      Module* pParent = pModule->getParent();
      if (!isInModsList(pParent)) m_modules.add(pParent);
    }
  }

  m_pScene = FbxScene::Create(m_pManager, m_filePath.GetStr());
  auto destroyScene = [this] {
    m_lastKeyTimes = KeyTimes(); // its FBX times die with the scene's curves
    m_pScene->Destroy();
    m_pScene = nullptr;
  };
  if (!setUpScene()) {
    g_db->logError("An error occurred while creating the FBX scene");
    destroyScene();
    return false;
  }
  if (s_doProgress) g_theOperationStack.setTaskRange(0, g_db->getNumNodes());

  rotateHostScene(false);
  bool exported = true;
  NLEClip* pActive = g_db->getActiveClip();
  if (!m_options.m_exportActiveClipOnly && pActive) {
    for (NLEClip* pClip = g_db->getHeadClip(); pClip && exported; pClip = pClip->getNext()) {
      g_db->setActiveClip(pClip, false, false, false);
      exported = exportRoots(createTake(pClip), pClip, true);
    }
    g_db->setActiveClip(pActive, false, false, false);
  } else {
    exported = exportRoots(createTake(pActive), pActive, false);
  }
  // Unlike a failure leaving the host turned, every exit puts the scene back as it was.
  if (!exported) {
    g_db->logError("Unable to export nodes");
    destroyScene();
    rotateHostScene(true);
    return false;
  }
  if (m_pScene->GetRootNode()->GetChildCount() == 0) {
    g_db->logError("No nodes to export");
    destroyScene();
    rotateHostScene(true);
    return false;
  }
  const bool saved = save();
  destroyScene();
  rotateHostScene(true);
  return saved;
}

bool AnvilFbxExporter::setUpScene() {
  FbxDocumentInfo* pInfo = FbxDocumentInfo::Create(m_pManager, "SceneInfo");
  pInfo->mTitle = g_db->getSceneName().GetString();
  pInfo->mSubject = HString().Format("Original Filename: %s", m_filePath.GetStr()).GetString();
  pInfo->mAuthor = "HarrowPost";
  pInfo->mRevision = kRevision;
  pInfo->mKeywords = "Exported from HarrowPost";
  pInfo->mComment = HString().Format("HarrowPost %s FBX Exporter", kRevision).GetString();
  m_pScene->SetSceneInfo(pInfo);

  bool yUp = !g_db->isZUp();
  if (m_options.m_desiredUpAxis == FbxExportOptions::EUpAxisY) yUp = true;
  if (m_options.m_desiredUpAxis == FbxExportOptions::EUpAxisZ) yUp = false;
  m_pScene->GetGlobalSettings().SetAxisSystem(
      FbxAxisSystem(yUp ? FbxAxisSystem::eMayaYUp : FbxAxisSystem::eMayaZUp));
  return setTimeMode();
}

bool AnvilFbxExporter::setTimeMode() {
  HTimeManager* pTime = HTimeManager::getInstance();
  const double rate = pTime->getFrameRate();
  const int r = int(rate);
  FbxGlobalSettings& settings = m_pScene->GetGlobalSettings();
  FbxTime::EMode mode = FbxTime::eFrames120;
  auto fail = [](const char* i_pText) {
    g_db->logError("%s", i_pText);
    return false;
  };
  const int timecodeMode = pTime->getTimecodeMode();
  switch (timecodeMode) {
  case 0:
    if (r == 30)
      mode = FbxTime::eFrames30;
    else if (r == 60)
      mode = FbxTime::eFrames60;
    else if (r == 120)
      mode = FbxTime::eFrames120;
    else
      return fail("30Hz may only be exported at 30, 60, or 120.");
    break;
  case 1:
    if (r == 29 || r == 30)
      mode = FbxTime::eNTSCFullFrame;
    else if (r == 59 || r == 60)
      mode = FbxTime::eFrames59dot94;
    else if (r == 119 || r == 120) {
      mode = FbxTime::eCustom;
      settings.SetCustomFrameRate(rate);
    } else
      return fail("NTSC may only be exported at 29.97, 59.94, 119.88.");
    break;
  case 2:
    mode = FbxTime::eNTSCDropFrame;
    g_db->logInfo("NTSC drop may only be exported at 29.97 drop.");
    break;
  case 3:
    if (r == 25)
      mode = FbxTime::ePAL;
    else if (r == 50)
      mode = FbxTime::eFrames50;
    else if (r == 100)
      mode = FbxTime::eFrames100;
    else
      return fail("PAL may only be exported at 25, 50, or 100.");
    break;
  case 4:
    if (r == 24)
      mode = FbxTime::eFrames24;
    else if (r == 48)
      mode = FbxTime::eFrames48;
    else if (r == 96)
      mode = FbxTime::eFrames96;
    else if (r == 120)
      mode = FbxTime::eFrames120;
    else
      return fail("Film may only be exported at 24, 48, 96, or 120.");
    break;
  case 5: {
    const int rounded = int(rate + 0.5);
    if (rounded == 24)
      mode = FbxTime::eFilmFullFrame;
    else if (rounded == 60)
      mode = FbxTime::eFrames59dot94;
    else if (rounded == 120)
      mode = FbxTime::eFrames119dot88;
    else
      return fail("NTSC Film may only be exported at 23.98, 59.94, or 119.88.");
    break;
  }
  case 6: {
    static const std::pair<int, FbxTime::EMode> kModes[] = {
        {24, FbxTime::eFrames24}, {30, FbxTime::eFrames30},   {48, FbxTime::eFrames48},
        {50, FbxTime::eFrames50}, {60, FbxTime::eFrames60},   {72, FbxTime::eFrames72},
        {96, FbxTime::eFrames96}, {100, FbxTime::eFrames100}, {120, FbxTime::eFrames120}};
    bool found = false;
    for (const auto& [rate6, mode6] : kModes)
      if (r == rate6) {
        mode = mode6;
        found = true;
        break;
      }
    if (!found) {
      mode = FbxTime::eCustom;
      settings.SetCustomFrameRate(rate);
      FbxTime::SetGlobalTimeMode(FbxTime::eCustom, rate);
      g_db->logWarning("Play rate of %i is a custom FBX rate. Data may not export as expected.", r);
    }
    break;
  }
  default:
    mode = FbxTime::eFrames120;
    g_db->logWarning("Play rate of %i is not supported by FBX. FBX file has been exported at 120 "
                     "fps. You may be able to change the rate to match the the Harrow Post scene "
                     "once in Motion Builder.",
                     r);
    break;
  }
  settings.SetTimeMode(mode);
  FbxTime::SetGlobalTimeMode(mode, settings.GetCustomFrameRate());
  // Keys are kept on the clock's frames; an unknown timecode mode samples at the nominal rate.
  const bool supported = timecodeMode >= 0 && timecodeMode <= 6;
  m_sampleStep = supported ? pTime->getTicksPerFrame()
                           : int64_t(135000000.0 / HFrameRate(rate).getBaseFrameRate());
  return true;
}

void AnvilFbxExporter::rotateHostScene(bool i_undo) {
  const bool zUp = g_db->isZUp();
  const bool face = m_options.m_rotateToFacePositive;
  if (m_options.m_desiredUpAxis == FbxExportOptions::EUpAxisY && zUp) {
    if (!i_undo) {
      g_db->rotateScene(-90.0, 0);
      if (face) g_db->rotateScene(180.0, 1);
    } else {
      if (face) g_db->rotateScene(-180.0, 1);
      g_db->rotateScene(90.0, 0);
    }
  } else if (m_options.m_desiredUpAxis == FbxExportOptions::EUpAxisZ && !zUp) {
    if (!i_undo) {
      g_db->rotateScene(90.0, 0);
      if (face) g_db->rotateScene(180.0, 2);
    } else {
      if (face) g_db->rotateScene(-180.0, 2);
      g_db->rotateScene(-90.0, 0);
    }
  }
}

FbxAnimLayer* AnvilFbxExporter::createTake(const NLEClip* i_pClip) {
  // Without a clip the take is named as readers name a first take.
  const HString name = i_pClip ? i_pClip->getName() : HString("Take 001");
  FbxAnimStack* pStack = FbxAnimStack::Create(m_pScene, name.GetStr());
  FbxAnimLayer* pLayer = FbxAnimLayer::Create(m_pScene, "Base Layer");
  pStack->AddMember(pLayer);
  pStack->SetDescription(name.GetStr());
  HTimeManager* pTime = HTimeManager::getInstance();
  const HTimeRange range =
      m_options.m_exportPlayRangeOnly ? pTime->getPlayRange() : pTime->getAnimRange();
  m_rangeOnly = m_options.m_exportPlayRangeOnly;
  m_rangeStart = range.getStart();
  m_rangeEnd = range.getEnd();
  const HTime offset = i_pClip ? i_pClip->getStartOffset() : 0;
  FbxTime start, stop;
  start.SetSecondDouble(pTime->getTimeInSeconds(range.getStart() + offset));
  stop.SetSecondDouble(pTime->getTimeInSeconds(range.getEnd() + offset));
  pStack->SetReferenceTimeSpan(FbxTimeSpan(start, stop));
  pStack->SetLocalTimeSpan(FbxTimeSpan(start, stop));
  return pLayer;
}

bool AnvilFbxExporter::exportRoots(FbxAnimLayer* i_pLayer, const NLEClip* i_pClip,
                                   bool i_namespaced) {
  const Pass pass{i_pLayer, i_pClip};
  for (int i = 0; i < g_db->getNumNodes(); ++i) {
    Node* pNode = g_db->getNode(i);
    if (!isTopLevel(pNode)) continue;
    HString ns = i_namespaced ? pNode->getName() : HString();
    if (!exportNode(pass, pNode, nullptr, ns)) return false;
  }
  return true;
}

bool AnvilFbxExporter::save() {
  FbxExporter* pExporter = FbxExporter::Create(m_pManager, "");
  pExporter->SetFileExportVersion(getFBXVersionString(), 0);
  // The host's stream is a temporary sibling of the output: the file appears only when the
  // export succeeds. Without a stream the layer takes the same road by itself.
  const bool ready =
      m_pFile ? pExporter->Initialize(m_pFile) : pExporter->Initialize(m_filePath.GetStr());
  if (!ready) {
    g_db->logError("FBX Export error: %s", pExporter->GetStatus().GetErrorString());
    pExporter->Destroy();
    return false;
  }
  const bool exported = pExporter->Export(m_pScene);
  if (!exported || pExporter->GetStatus().Error())
    g_db->logError("FBX Export error: %s", pExporter->GetStatus().GetErrorString());
  pExporter->Destroy();
  return exported;
}
