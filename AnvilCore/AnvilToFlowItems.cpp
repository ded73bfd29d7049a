#include "AnvilToFlowItems.h"
#include "Flow2/Flow2Types/FlowCatalogue.h"
#include "plugin/host/AnvilSubjectCoreTypesConversion.h"
#include "plugin/host/Character.h"
#include "plugin/host/Database.h"
#include "plugin/host/HTimeManager.h"
#include "plugin/host/LabelingSetup.h"
#include "plugin/host/Marker.h"
#include "plugin/host/OpticalCamera.h"
#include "plugin/host/SubjectBone.h"
#include "plugin/host/SubjectManager.h"
#include <cmath>
#include <limits>

namespace Cat = ZMT::Catalogue;

namespace AnvilCore::FlowItems {

namespace {
// Diameter of the markers whose images the centroid sets describe.
constexpr double kMarkerDiameter = 14.0;

bool isTopLevelCharacter(const Module* i_pModule) {
  return i_pModule && i_pModule->isKindOf(&Character::s_classCharacter) && i_pModule->hasParent() &&
         !i_pModule->getParent()->hasParent();
}

void rotationMatrix(const Vec3& i_rVector, double o_m[9]) {
  const double angle =
      std::sqrt(i_rVector.x * i_rVector.x + i_rVector.y * i_rVector.y + i_rVector.z * i_rVector.z);
  if (angle == 0.0) {
    AnvilRotation().getMatrix(o_m);
    return;
  }
  const Vec3 axis(i_rVector.x / angle, i_rVector.y / angle, i_rVector.z / angle);
  AnvilRotation(axis, angle * 180.0 / M_PI).getMatrix(o_m);
}

CoreOstraTypes::VSubjectPoseRecord poseOf(const AnvilRotation& i_rRotation, const Vec3& i_rAt) {
  CoreOstraTypes::VSubjectPoseRecord pose;
  i_rRotation.getAsQuaternion(pose.m_Rotation[0], pose.m_Rotation[1], pose.m_Rotation[2],
                              pose.m_Rotation[3]);
  pose.m_Translation = {i_rAt.x, i_rAt.y, i_rAt.z};
  return pose;
}
} // namespace

std::string trajectoryLabel(const Marker& i_rMarker) {
  const Module* pParent = i_rMarker.hasParent() ? i_rMarker.getParent() : nullptr;
  if (isTopLevelCharacter(pParent))
    return pParent->getName().GetString() + ":" + i_rMarker.getName().GetString();
  return i_rMarker.getName().GetString();
}

TakeConverter& TakeConverter::forTick(ZMT::IFlowStoreHandle& io_rStore, std::int64_t i_tick) {
  static TakeConverter s_take;
  if (!s_take.m_store || s_take.m_store.Get() != io_rStore.Get() || i_tick <= s_take.m_lastTick)
    s_take.build(io_rStore);
  s_take.m_lastTick = i_tick;
  return s_take;
}

void TakeConverter::release() {
  m_table.Reset();
  m_orientation.Reset();
  m_store = {};
  m_markers.clear();
  m_labelScores.clear();
  m_subjects.clear();
  m_cameras.clear();
}

void TakeConverter::finishIfLast(std::int64_t i_tick) {
  if (i_tick >= g_db->getTimeManager()->getPlayRange().getEnd()) release();
}

void TakeConverter::build(ZMT::IFlowStoreHandle& io_rStore) {
  release();
  m_store = io_rStore;

  // Trajectories: every marker of the scene in scene order; the track id is the index.
  auto* pTable = ZMT::CreateFlowItem<Cat::VFlowParametersItem>(m_store, m_table);
  if (pTable) {
    pTable->m_Targets.clear();
    pTable->m_Tags.clear();
  }
  for (Module* pModule : g_db->getModules()) {
    if (!pModule->isKindOf(&Marker::s_classMarker)) continue;
    const auto* pMarker = static_cast<const Marker*>(pModule);
    if (pTable) pTable->m_Tags[std::int32_t(m_markers.size())] = trajectoryLabel(*pMarker);
    m_markers.push_back(pMarker);
    m_labelScores.push_back(pMarker->isUnlabeled() ? 0.0f : 1.0f);
  }

  // Subjects with animated bones: their labeling bones, and their markers in the order of the
  // subject's marker list.
  SubjectManager* pSubjects = g_db->getSubjectManager();
  for (int i = 0; i < pSubjects->getNumSubjects(); ++i) {
    Character* pCharacter = pSubjects->getSubject(i);
    const LabelingSetup* pSetup = pCharacter->getLabelingSetup(false);
    if (!pSetup) continue;
    Subject subject;
    subject.id = std::uint32_t(i + 1);
    std::vector<SubjectBone*> bones;
    pSetup->collectBones(bones);
    bool animated = false;
    for (const SubjectBone* pBone : bones) {
      animated |= pBone->isAnimated();
      subject.bones.push_back(pBone);
    }
    if (!animated) continue;
    AnvilSubjectCoreTypesConversion conversion(AnvilSubjectCoreTypesConversion::ELabeling);
    if (conversion.characterToVSubject2(pCharacter, false))
      for (const auto& marker : conversion.getSubjectParametrised().m_Markers) {
        const Marker* pFound = nullptr;
        for (int c = 0; c < pCharacter->getNumChildren() && !pFound; ++c) {
          const Module* pChild = pCharacter->getChild(c);
          if (pChild->isKindOf(&Marker::s_classMarker) && pChild->getName() == marker.m_Name)
            pFound = static_cast<const Marker*>(pChild);
        }
        subject.markers.push_back(pFound);
      }
    m_subjects.push_back(std::move(subject));
  }

  for (int i = 0; i < g_db->getNumOpticalCameras(); ++i) {
    const OpticalCamera* pCamera = g_db->getOpticalCamera(i);
    if (!pCamera->isCalibrated() || pCamera->isDV() || !(pCamera->getFocalLengthInPixels() > 0))
      continue;
    Camera camera;
    camera.urn = pCamera->getDeviceURN().GetString();
    rotationMatrix(pCamera->getCalibrationOrientation(), camera.rotation);
    const Vec3& at = pCamera->getCalibrationPosition();
    camera.position[0] = at.x;
    camera.position[1] = at.y;
    camera.position[2] = at.z;
    camera.focal = pCamera->getFocalLengthInPixels();
    camera.principal[0] = pCamera->getPrincipalPoint().x;
    camera.principal[1] = pCamera->getPrincipalPoint().y;
    camera.width = pCamera->getSensorWidth();
    camera.height = pCamera->getSensorHeight();
    m_cameras.push_back(std::move(camera));
  }
}

void TakeConverter::convert(ZMT::IFlowState& io_rState, std::int64_t i_tick,
                            const DynamicFlags& i_rFlags) {
  m_positions.clear();
  m_tracks.clear();
  if (i_rFlags.trajectories || i_rFlags.forSolving || i_rFlags.cameras)
    for (size_t m = 0; m < m_markers.size(); ++m) {
      const int key = m_markers[m]->m_track.findKey(i_tick);
      if (key < 0) continue;
      const Vec3 p = m_markers[m]->getWSKeyPos(key);
      m_positions.push_back({p.x, p.y, p.z});
      m_tracks.push_back(std::uint32_t(m));
    }
  if (i_rFlags.cameras) addCentroids(io_rState, i_tick);
  if (i_rFlags.subjectPoses) addSubjectPoses(io_rState, i_tick, true);
  if (i_rFlags.subjectLocalPoses) addSubjectPoses(io_rState, i_tick, false);
  if (i_rFlags.trajectories) addTrajectories(io_rState, i_tick, false);
  if (i_rFlags.forSolving) addTrajectories(io_rState, i_tick, true);
  if (i_rFlags.orientation) addOrientation(io_rState);
}

namespace {
template <class TSet, class TTracks, class TLabels>
void fillTrajectories(ZMT::IFlowStoreHandle& io_rStore, ZMT::IFlowState& io_rState,
                      const std::vector<std::array<double, 3>>& i_rPositions,
                      const std::vector<std::uint32_t>& i_rTracks,
                      const std::vector<float>& i_rScores) {
  ZMT::IFlowItemHandle set, tracks, labels;
  auto* pSet = ZMT::CreateFlowItem<TSet>(io_rStore, set);
  auto* pTracks = ZMT::CreateFlowItem<TTracks>(io_rStore, tracks);
  auto* pLabels = ZMT::CreateFlowItem<TLabels>(io_rStore, labels);
  if (!pSet || !pTracks || !pLabels) return;
  pSet->m_GeneratorId = pTracks->m_GeneratorId = pLabels->m_GeneratorId = 0;
  const size_t count = i_rPositions.size();
  pSet->m_Reconstructions.resize(count);
  pTracks->m_ReconstructionTracks.resize(count);
  pLabels->m_ReconstructionLabels.resize(count);
  for (size_t i = 0; i < count; ++i) {
    pSet->m_Reconstructions[i].m_Position = i_rPositions[i];
    pTracks->m_ReconstructionTracks[i] = {i_rTracks[i], 1.0f, 0};
    pLabels->m_ReconstructionLabels[i] = {i_rScores[i_rTracks[i]], 0};
  }
  const ZMT::VFlowTimestamp time = io_rState.GetTime();
  io_rState.AddItem(set, time);
  io_rState.AddItem(tracks, time);
  io_rState.AddItem(labels, time);
}
} // namespace

void TakeConverter::addTrajectories(ZMT::IFlowState& io_rState, std::int64_t, bool i_forSolving) {
  if (i_forSolving)
    fillTrajectories<Cat::VFlowReconstructionSetForSolving,
                     Cat::VFlowReconstructionTrackSetForSolving,
                     Cat::VFlowReconstructionLabelSetForSolving>(m_store, io_rState, m_positions,
                                                                 m_tracks, m_labelScores);
  else
    fillTrajectories<Cat::VFlowReconstructionSet, Cat::VFlowReconstructionTrackSet,
                     Cat::VFlowReconstructionLabelSet>(m_store, io_rState, m_positions, m_tracks,
                                                       m_labelScores);
  if (m_table) io_rState.AddItem(m_table, io_rState.GetTime());
}

void TakeConverter::addSubjectPoses(ZMT::IFlowState& io_rState, std::int64_t i_tick, bool i_world) {
  constexpr double kUnplaced = std::numeric_limits<double>::max();
  for (const Subject& subject : m_subjects) {
    ZMT::IFlowItemHandle item;
    if (i_world) {
      auto* pPose = ZMT::CreateFlowItem<Cat::VFlowSubjectWorldPose>(m_store, item);
      if (!pPose) return;
      pPose->m_SubjectId = subject.id;
      pPose->m_Segments.resize(subject.bones.size());
      for (size_t b = 0; b < subject.bones.size(); ++b) {
        Vec3 position;
        AnvilRotation rotation;
        subject.bones[b]->getWSTransform(i_tick, position, rotation);
        pPose->m_Segments[b] = poseOf(rotation, position);
      }
      pPose->m_Markers.resize(subject.markers.size());
      for (size_t m = 0; m < subject.markers.size(); ++m) {
        const Marker* pMarker = subject.markers[m];
        const int key = pMarker ? pMarker->m_track.findKey(i_tick) : -1;
        if (key < 0) {
          pPose->m_Markers[m] = {kUnplaced, kUnplaced, kUnplaced};
          continue;
        }
        const Vec3 p = pMarker->getWSKeyPos(key);
        pPose->m_Markers[m] = {p.x, p.y, p.z};
      }
    } else {
      auto* pPose = ZMT::CreateFlowItem<Cat::VFlowSubjectLocalPose>(m_store, item);
      if (!pPose) return;
      pPose->m_SubjectId = subject.id;
      pPose->m_Segments.resize(subject.bones.size());
      for (size_t b = 0; b < subject.bones.size(); ++b)
        pPose->m_Segments[b] =
            poseOf(subject.bones[b]->getLocalRot(i_tick), subject.bones[b]->getLocalPos(i_tick));
    }
    io_rState.AddItem(item, io_rState.GetTime());
  }
}

void TakeConverter::addCentroids(ZMT::IFlowState& io_rState, std::int64_t) {
  // The camera looks down its -Z axis with +Y up; image rows grow downwards.
  for (const Camera& camera : m_cameras) {
    ZMT::IFlowItemHandle item;
    auto* pSet = ZMT::CreateFlowItem<Cat::VFlowCentroidSet>(m_store, item);
    if (!pSet) return;
    pSet->m_DeviceURN = camera.urn;
    pSet->m_GeneratorId = 0;
    pSet->m_CircularityThreshold = 0.0;
    pSet->m_Centroids.clear();
    const double* r = camera.rotation;
    for (const auto& p : m_positions) {
      const double d[3] = {p[0] - camera.position[0], p[1] - camera.position[1],
                           p[2] - camera.position[2]};
      // World to camera axes: the transpose of camera-to-world.
      const double x = r[0] * d[0] + r[3] * d[1] + r[6] * d[2];
      const double y = r[1] * d[0] + r[4] * d[1] + r[7] * d[2];
      const double z = r[2] * d[0] + r[5] * d[1] + r[8] * d[2];
      if (!(z < -1.0)) continue; // behind or at the lens
      const double u = camera.principal[0] + camera.focal * x / -z;
      const double v = camera.principal[1] - camera.focal * y / -z;
      if (!(u >= 0.0 && u < camera.width && v >= 0.0 && v < camera.height)) continue;
      CoreOstraTypes::VCentroid centroid;
      centroid.m_Position = {u, v};
      centroid.m_Radius = camera.focal * kMarkerDiameter * 0.5 / -z;
      centroid.m_Score = 1.0;
      centroid.m_PixelCount = std::uint32_t(M_PI * centroid.m_Radius * centroid.m_Radius + 0.5);
      pSet->m_Centroids.push_back(centroid);
    }
    io_rState.AddItem(item, io_rState.GetTime());
  }
}

void TakeConverter::addOrientation(ZMT::IFlowState& io_rState) {
  if (!m_orientation) {
    auto* pOrientation = ZMT::CreateFlowItem<Cat::VFlowSceneOrientation>(m_store, m_orientation);
    if (!pOrientation) return;
    // Z up is the identity; Y up turns world Z onto Y, a quarter turn about -X.
    const double h = std::sqrt(0.5);
    pOrientation->m_Orientation = g_db->isZUp() ? std::array<double, 4>{0.0, 0.0, 0.0, 1.0}
                                                : std::array<double, 4>{-h, 0.0, 0.0, h};
  }
  io_rState.AddItem(m_orientation, io_rState.GetTime());
}

} // namespace AnvilCore::FlowItems
