#include "AnvilCore/ExportDriver.h"
#include "AnvilCore/demo/DemoScene.h"
#include "plugin/host/Database.h"
#include "plugin/host/HCameraConverter.h"
#include "plugin/host/Marker.h"
#include "plugin/host/OpticalCamera.h"
#include "plugin/host/VideoCamera.h"
#include <cmath>
#include <gtest/gtest.h>

using namespace CoreOstraTypes;

namespace {

TEST(CameraHost, DataTypeBitsAndDatabaseQueries) {
  g_db->clearScene();
  auto* pMarker = new Marker("m");
  auto* pVideo = new VideoCamera("video");
  auto* pFirst = new OpticalCamera("first");
  auto* pSecond = new OpticalCamera("second");
  g_db->addToScene(pMarker, false, nullptr, false, false);
  g_db->addToScene(pVideo, false, nullptr, false, false);
  g_db->addToScene(pFirst, false, nullptr, false, false);
  g_db->addChild(pFirst, pSecond); // nested cameras count too, after their parent
  EXPECT_EQ(AnvilCore::dataTypeOf(pFirst), 64);
  EXPECT_EQ(AnvilCore::dataTypeOf(pVideo), 128);
  EXPECT_EQ(AnvilCore::dataTypeOf(pMarker), 1);
  ASSERT_EQ(g_db->getNumOpticalCameras(), 2);
  EXPECT_EQ(g_db->getOpticalCamera(0), pFirst);
  EXPECT_EQ(g_db->getOpticalCamera(1), pSecond);
  EXPECT_EQ(g_db->getOpticalCamera(2), nullptr);
  EXPECT_EQ(g_db->getOpticalCamera(-1), nullptr);
  g_db->removeFromScene(pFirst, false, false, false);
  EXPECT_EQ(g_db->getNumOpticalCameras(), 0);
}

TEST(CameraHost, MillimetreQueriesFollowTheSensorSize) {
  OpticalCamera camera("c");
  camera.setSensorSize(2000, 1000);
  camera.setFocalLengthInPixels(1500.0);
  camera.setPrincipalPoint({1000.0, 500.0});
  EXPECT_EQ(camera.getFocalLength(), 0.0); // size in millimetres unknown
  camera.setSensorSizeMM(10.0, 4.0);
  EXPECT_DOUBLE_EQ(camera.getFocalLength(), 7.5);
  EXPECT_EQ(camera.getPrincipalPointMM(), (HPoint2{5.0, 2.0}));
  EXPECT_EQ(camera.getPrincipalPoint(), (HPoint2{1000.0, 500.0}));
}

TEST(CameraHost, DetailFlagsAndConversions) {
  OpticalCamera camera("c");
  camera.setDeviceURN("cam:7");
  EXPECT_FALSE(camera.isCalibrationTempSet());
  EXPECT_FALSE(camera.isCalibrationTimeSet());
  VCameraCalibrationDetail lens;
  lens.m_EndTime = 5;
  camera.setIntrinsicsCalibrationDetail(lens);
  EXPECT_FALSE(camera.isCalibrationTempSet());
  EXPECT_TRUE(camera.isCalibrationTimeSet());

  VCameraCalibrationDetails details;
  HCameraConverter::convertOpticalCameraToVCameraCalibrationDetails(camera, details);
  EXPECT_EQ(details.m_DeviceURN, "cam:7");
  EXPECT_EQ(details.m_IntrinsicsCalibration, lens);

  camera.setCalibrationPose(Vec3(1.0, 2.0, 3.0), Vec3(0.0, M_PI / 2.0, 0.0));
  VCameraCalibration calibration;
  HCameraConverter::convertOpticalCameraToVCameraCalibration(camera, calibration);
  EXPECT_EQ(calibration.m_Position, (std::array<double, 3>{1.0, 2.0, 3.0}));
  EXPECT_EQ(calibration.m_Orientation, (std::array<double, 3>{0.0, M_PI / 2.0, 0.0}));
  // The node stands at the calibrated pose: a quarter turn about Y takes -Z to -X.
  Vec3 translation, scale;
  AnvilRotation rotation;
  camera.getConstLocalTransform(translation, rotation, scale);
  const Vec3 view = rotation.rotate(Vec3(0.0, 0.0, -1.0));
  EXPECT_NEAR(view.x, -1.0, 1e-12);
  EXPECT_NEAR(view.z, 0.0, 1e-12);
  EXPECT_EQ(translation, Vec3(1.0, 2.0, 3.0));
}

TEST(CameraHost, DemoCamerasLookAtTheVolumeCentre) {
  AnvilCore::buildDemoScene();
  const int count = g_db->getNumOpticalCameras();
  ASSERT_GE(count, 8);
  ASSERT_LE(count, 12);
  int uncalibrated = 0, threeParameter = 0;
  for (int i = 0; i < count; ++i) {
    const OpticalCamera* pCamera = g_db->getOpticalCamera(i);
    uncalibrated += !pCamera->isCalibrated();
    threeParameter += pCamera->isCalibrated() &&
                      pCamera->getDistortion().m_Model == ECameraDistortionModel::Ostra3Parameter;
    const Vec3 toCentre = Vec3(0.0, 0.0, 1000.0) - pCamera->getConstWSPos();
    const double distance =
        std::sqrt(toCentre.x * toCentre.x + toCentre.y * toCentre.y + toCentre.z * toCentre.z);
    const Vec3 view = pCamera->getConstWSRot().rotate(Vec3(0.0, 0.0, -1.0));
    EXPECT_NEAR(view.x, toCentre.x / distance, 1e-9) << pCamera->getName().GetStr();
    EXPECT_NEAR(view.y, toCentre.y / distance, 1e-9);
    EXPECT_NEAR(view.z, toCentre.z / distance, 1e-9);
  }
  EXPECT_EQ(uncalibrated, 1);
  EXPECT_GE(threeParameter, 2);
}

} // namespace
