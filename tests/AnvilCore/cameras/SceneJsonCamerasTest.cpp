#include "AnvilCore/io/SceneJson.h"
#include "plugin/host/CalibrationMgr.h"
#include "plugin/host/Database.h"
#include "plugin/host/OpticalCamera.h"
#include "plugin/host/VideoCamera.h"
#include <gtest/gtest.h>

using namespace CoreOstraTypes;

namespace {

const char* const kScene = R"({
  "format": "anvil-scene", "version": 1,
  "cameras": {
    "volume": {"floorExtents": [-3000, 3000, -2000, 2000]},
    "optical": [
      {"name": "Cam 1", "number": 1, "deviceUrn": "cam:501", "type": "T", "displayType": "D",
       "sensorSize": [1024, 768], "sensorSizeMM": [10.24, 7.68], "dv": true, "sdi": true,
       "mask": {"data": "0:12", "tileSize": [16, 16], "gridSize": [64, 48]},
       "calibration": {"position": [1, 2, 3], "orientation": [0, 0, 1.5], "focalLength": 900,
                       "principalPoint": [512, 384], "imageError": 0.2,
                       "distortion": {"model": "Ostra3Parameter", "radial": [0.1, 0.2, 0.3],
                                      "centre": [510, 380]}},
       "calibrationDetail": {"type": "WandWave", "startTemp": 25, "startTime": 1000,
                             "id": "00000000-0000-0000-0000-0000000000ff"}},
      {"name": "Cam 2", "number": 2, "deviceUrn": "cam:502", "sensorSize": [1024, 768]}
    ],
    "video": [{"name": "Ref", "file": "ref.avi", "position": [0, -5000, 1500]}]
  }
})";

TEST(SceneJsonCameras, ReadsOpticalAndVideoCamerasAndTheFloor) {
  g_db->clearScene();
  std::string error;
  ASSERT_TRUE(AnvilCore::readSceneJson(kScene, "scene.json", error)) << error;
  EXPECT_EQ(g_db->getCalibrationMgr()->getVolumeProperties(),
            (HVolumeProperties{-3000, 3000, -2000, 2000}));
  ASSERT_EQ(g_db->getNumOpticalCameras(), 2);
  const OpticalCamera* pCam = g_db->getOpticalCamera(0);
  EXPECT_TRUE(pCam->isDV());
  EXPECT_TRUE(pCam->isSDI());
  EXPECT_DOUBLE_EQ(pCam->getFocalLength(), 9.0);
  EXPECT_EQ(pCam->getCalibrationOrientation(), Vec3(0.0, 0.0, 1.5));
  EXPECT_EQ(pCam->getDistortion().m_RadialParameters.size(), 3u);
  EXPECT_EQ(pCam->getCalibrationDetail().m_Id[15], 0xFF);
  EXPECT_TRUE(pCam->isCalibrationTimeSet());
  EXPECT_FALSE(g_db->getOpticalCamera(1)->isCalibrated());
  const VideoCamera* pVideo = nullptr;
  for (Module* p : g_db->getModules())
    if (p->isKindOf(&VideoCamera::s_classVideoCamera)) pVideo = static_cast<VideoCamera*>(p);
  ASSERT_NE(pVideo, nullptr);
  EXPECT_EQ(pVideo->getVideoFile(), "ref.avi");
  EXPECT_EQ(pVideo->getConstWSPos(), Vec3(0.0, -5000.0, 1500.0));
}

TEST(SceneJsonCameras, AnErrorNamesItsPathAndLeavesTheSceneAlone) {
  g_db->clearScene();
  std::string text = kScene;
  text.replace(text.find("\"Ostra3Parameter\""), 17, "\"Fisheye\"");
  std::string error;
  EXPECT_FALSE(AnvilCore::readSceneJson(text, "scene.json", error));
  EXPECT_NE(error.find("/cameras/optical/0/calibration/distortion/model"), std::string::npos)
      << error;
  EXPECT_EQ(g_db->getNumOpticalCameras(), 0);
  EXPECT_EQ(g_db->getCalibrationMgr()->getVolumeProperties(), HVolumeProperties{});
}

} // namespace
