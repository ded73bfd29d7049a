#pragma once
// A small scene for the FBX exporter: a subject with a marker and a solving bone, a camera, a
// light and an unlabelled marker; exported through the host's driver and read back.
#include "../../fbx/FbxTestReader.h"
#include "../../support/HostFixture.h"
#include "../RunExport.h"
#include "exporters/scene/AnvilFbxExporter.h"
#include "plugin/host/HCamera.h"
#include "plugin/host/Light.h"
#include "plugin/host/SolvingBone.h"
#include "plugin/host/SolvingSetup.h"
#include <cmath>

namespace FbxExportTest {

constexpr int64_t kFbxTicksPerSecond = 46186158000LL;
constexpr double kRate = 100.0;
constexpr int kFrames = 20;

struct SceneParts {
  Character* pSubject;
  Marker* pMarker;
  SolvingBone* pBone;
  HCamera* pCamera;
  Light* pLight;
};

/// Builds the scene: marker LFHD at (10 f, 20, 1000) mm, bone Hips turning 20 degrees a frame
/// about Z (wrapping past 180), camera moving along X, a static light.
inline SceneParts buildScene(const char* i_pMarkerName = "LFHD") {
  HostTest::resetScene(kRate, kFrames);
  g_db->setZUp(true);
  HTimeManager* pTime = g_db->getTimeManager();
  pTime->setTimecodeMode(6);
  pTime->setPlayRange(HTimeRange(5 * pTime->getTicksPerFrame(), 14 * pTime->getTicksPerFrame()));
  const int64_t tpf = pTime->getTicksPerFrame();
  SceneParts parts{};
  parts.pSubject = HostTest::addSubject("Bob");
  HostTest::Positions positions;
  for (int f = 0; f < kFrames; ++f)
    positions.push_back(Vec3(10.0 * f, 20.0, 1000.0));
  parts.pMarker = HostTest::addMarker(i_pMarkerName, positions, parts.pSubject);
  SolvingSetup* pSetup = parts.pSubject->getSolvingSetup(true);
  parts.pBone = new SolvingBone("Hips");
  parts.pBone->setPreTranslation(Vec3(0.0, 0.0, 900.0));
  g_db->addChild(pSetup, parts.pBone);
  for (int f = 0; f < kFrames; ++f)
    parts.pBone->m_rotationTrack.setKey(f * tpf, AnvilRotation(Vec3(0.0, 0.0, 1.0), 20.0 * f));
  parts.pCamera = new HCamera("Cam");
  parts.pCamera->setStaticTransform(Vec3(0.0, -5000.0, 1500.0), AnvilRotation(), Vec3(1, 1, 1));
  for (int f = 0; f < kFrames; ++f)
    parts.pCamera->m_positionTrack.setKey(f * tpf, Vec3(5.0 * f, -5000.0, 1500.0));
  g_db->addToScene(parts.pCamera, false, nullptr, false, false);
  parts.pLight = new Light("Lamp");
  parts.pLight->setStaticTransform(Vec3(0.0, 0.0, 3000.0), AnvilRotation(), Vec3(1, 1, 1));
  g_db->addToScene(parts.pLight, false, nullptr, false, false);
  return parts;
}

/// FBX ticks of a frame at the fixture's rate.
inline int64_t ticksOfFrame(int i_frame) {
  return std::llround(i_frame * double(kFbxTicksPerSecond) / kRate);
}

/// Exports through the driver; fails the test when the export fails.
inline FbxTest::File exportFbx(AnvilFbxExporter& i_rExporter, const std::string& i_rName) {
  const std::string path = ExportTest::tempPath(i_rName);
  AnvilCore::ExportRequest request;
  request.path = path;
  std::string error;
  EXPECT_EQ(AnvilCore::runExport(i_rExporter, request, error), AnvilCore::EExportStatus::EOk)
      << error;
  return FbxTest::read(path);
}

/// The values of a P row (after name, type, label, flags).
inline double pValue(const FbxTest::Node& i_rObject, const std::string& i_rName, size_t i_i = 0) {
  const FbxTest::Node* pRow = i_rObject.p(i_rName);
  if (!pRow) throw std::runtime_error("no P row " + i_rName);
  const FbxTest::Property& value = pRow->props.at(4 + i_i);
  return value.type == 'D' || value.type == 'F' ? value.real : double(value.integer);
}

} // namespace FbxExportTest
