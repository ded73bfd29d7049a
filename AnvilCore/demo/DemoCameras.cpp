// Demo cameras: ten optical cameras on an ellipse around the walk, all looking at the centre of
// the capture volume, one of them not yet calibrated, and a reference video camera.
#include "DemoScene.h"
#include "plugin/host/CalibrationMgr.h"
#include "plugin/host/Database.h"
#include "plugin/host/OpticalCamera.h"
#include "plugin/host/VideoCamera.h"
#include <cmath>
#include <string>

using namespace CoreOstraTypes;

namespace AnvilCore {
namespace {

constexpr double kPi = 3.14159265358979323846;
constexpr int kOpticalCameras = 10;
constexpr int kUncalibrated = 10; // camera number left without a calibration
const Vec3 kVolumeCentre(0.0, 0.0, 1000.0);

Vec3 cross(const Vec3& a, const Vec3& b) {
  return Vec3(a.y * b.z - a.z * b.y, a.z * b.x - a.x * b.z, a.x * b.y - a.y * b.x);
}
Vec3 unit(const Vec3& v) {
  return v * (1.0 / std::sqrt(v.x * v.x + v.y * v.y + v.z * v.z));
}

// Rotation vector of a camera at `i_rFrom` whose -Z looks at `i_rTo`, with +Y towards world +Z.
Vec3 lookAt(const Vec3& i_rFrom, const Vec3& i_rTo) {
  const Vec3 forward = unit(i_rTo - i_rFrom);
  const Vec3 right = unit(cross(forward, Vec3(0.0, 0.0, 1.0)));
  const Vec3 up = cross(right, forward);
  const double m[9] = {right.x,    up.x,    -forward.x, right.y,   up.y,
                       -forward.y, right.z, up.z,       -forward.z};
  AnvilRotation rotation;
  rotation.setMatrix(m);
  double x, y, z, w;
  rotation.getAsQuaternion(x, y, z, w);
  const double n = std::sqrt(x * x + y * y + z * z);
  if (n == 0.0) return Vec3();
  const double angle = 2.0 * std::atan2(n, w);
  return Vec3(x, y, z) * (angle / n);
}

VCameraCalibrationDetail detail(int i_number, ECameraCalibrationType i_type, int i_hoursAgo) {
  VCameraCalibrationDetail d;
  d.m_Type = i_type;
  d.m_StartTemperature = 30 + i_number % 4;
  d.m_EndTemperature = 31 + i_number % 4;
  // 2024-03-01 09:00:00 UTC, minus whole hours, plus a few seconds per camera.
  d.m_StartTime =
      1709283600000ull - std::uint64_t(i_hoursAgo) * 3600000ull + std::uint64_t(i_number) * 1250ull;
  d.m_EndTime = d.m_StartTime + 95000ull;
  for (size_t b = 0; b < d.m_Id.size(); ++b)
    d.m_Id[b] = static_cast<std::uint8_t>((i_number * 37 + int(b) * 11 + i_hoursAgo) & 0xFF);
  return d;
}

void addOpticalCamera(int i_number) {
  auto* pCamera = new OpticalCamera(HString("Camera " + std::to_string(i_number)));
  pCamera->setCameraNumber(i_number);
  pCamera->setDeviceURN(HString("cam:" + std::to_string(40100 + i_number)));
  pCamera->setDeviceName("OC-2M rev B");
  pCamera->setCameraType("OC-2M");
  pCamera->setDisplayType("Optical 2MP");
  pCamera->setSensorSize(2048, 1088);
  pCamera->setSensorSizeMM(11.264, 5.984);
  VCameraMaskGrid mask;
  mask.m_TileWidth = 16;
  mask.m_TileHeight = 16;
  mask.m_GridWidth = 128;
  mask.m_GridHeight = 68;
  // One masked strip per camera, as run lengths of clear and masked tiles.
  mask.m_Data = "0:" + std::to_string(128 * (20 + i_number)) +
                " 1:" + std::to_string(3 + i_number) +
                " 0:" + std::to_string(128 * 68 - 128 * (20 + i_number) - 3 - i_number);
  pCamera->setMaskGrid(mask);

  const double angle = 2.0 * kPi * (i_number - 1) / kOpticalCameras + kPi / kOpticalCameras;
  const Vec3 position(7500.0 * std::cos(angle), 4500.0 * std::sin(angle),
                      2400.0 + 350.0 * (i_number % 2));
  if (i_number == kUncalibrated) {
    pCamera->setPose(position, lookAt(position, kVolumeCentre));
  } else {
    pCamera->setCalibrated(true);
    pCamera->setCalibrationName("Demo wand wave");
    pCamera->setCalibrationPose(position, lookAt(position, kVolumeCentre));
    pCamera->setFocalLengthInPixels(1740.0 + 12.5 * i_number);
    pCamera->setPrincipalPoint({1024.0 + 1.5 * (i_number % 3), 544.0 - 0.75 * (i_number % 4)});
    VCameraLensDistortion distortion;
    if (i_number % 3 == 0) {
      distortion.m_Model = ECameraDistortionModel::Ostra3Parameter;
      distortion.m_RadialParameters = {-0.118 - 0.002 * i_number, 0.061, -0.0045};
      distortion.m_RadialDistortionCentre = {1023.5 + 0.5 * i_number, 543.25};
    } else {
      distortion.m_RadialParameters = {-0.121 - 0.001 * i_number, 0.058};
    }
    pCamera->setDistortion(distortion);
    pCamera->setImageError(0.071 + 0.009 * i_number);
    pCamera->setCalibrationDetail(detail(i_number, ECameraCalibrationType::WandWave, 2));
    pCamera->setIntrinsicsCalibrationDetail(detail(i_number, ECameraCalibrationType::Legacy, 50));
  }
  g_db->addToScene(pCamera, false, nullptr, false, false);
}

void addCameras() {
  g_db->getCalibrationMgr()->setVolumeProperties({-7000, 7000, -3500, 3500});
  for (int number = 1; number <= kOpticalCameras; ++number)
    addOpticalCamera(number);
  auto* pVideo = new VideoCamera("Reference video");
  pVideo->setVideoFile("reference_video.avi");
  const Vec3 position(0.0, -6500.0, 1700.0);
  pVideo->setPose(position, lookAt(position, kVolumeCentre));
  g_db->addToScene(pVideo, false, nullptr, false, false);
}

} // namespace
ANVIL_REGISTER_DEMO_PART(20, addCameras)
} // namespace AnvilCore
