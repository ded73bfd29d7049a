// The "cameras" section of the scene file: optical cameras with their hardware, mask and
// calibration, reference video cameras, and the calibrated volume's floor.
#include "SceneJson.h"
#include "SceneJsonNodes.h"
#include "plugin/host/CalibrationMgr.h"
#include "plugin/host/Database.h"
#include "plugin/host/OpticalCamera.h"
#include "plugin/host/VideoCamera.h"
#include <climits>

using namespace CoreOstraTypes;

namespace AnvilCore {
namespace {

Vec3 vector3(const nlohmann::json& i_rValue, const std::string& i_path) {
  const std::vector<double> v = json::numbers(i_rValue, i_path, 3);
  return Vec3(v[0], v[1], v[2]);
}

std::int32_t int32(const nlohmann::json& i_rValue, const std::string& i_path) {
  const int64_t value = json::integer(i_rValue, i_path);
  if (value < INT32_MIN || value > INT32_MAX) json::fail(i_path, "out of the 32-bit range");
  return static_cast<std::int32_t>(value);
}

// [a, b] of whole numbers.
std::pair<std::int32_t, std::int32_t> intPair(const nlohmann::json& i_rValue,
                                              const std::string& i_path) {
  json::array(i_rValue, i_path);
  if (i_rValue.size() != 2) json::fail(i_path, "expected two whole numbers");
  return {int32(i_rValue[0], i_path + "/0"), int32(i_rValue[1], i_path + "/1")};
}

VCameraMaskGrid readMask(const nlohmann::json& i_rValue, const std::string& i_path) {
  json::onlyKeys(i_rValue, i_path, {"data", "tileSize", "gridSize"});
  VCameraMaskGrid mask;
  if (auto* p = json::optional(i_rValue, "data")) mask.m_Data = json::string(*p, i_path + "/data");
  std::tie(mask.m_TileWidth, mask.m_TileHeight) =
      intPair(json::member(i_rValue, i_path, "tileSize"), i_path + "/tileSize");
  std::tie(mask.m_GridWidth, mask.m_GridHeight) =
      intPair(json::member(i_rValue, i_path, "gridSize"), i_path + "/gridSize");
  return mask;
}

VCameraLensDistortion readDistortion(const nlohmann::json& i_rValue, const std::string& i_path) {
  json::onlyKeys(i_rValue, i_path, {"model", "radial", "centre"});
  VCameraLensDistortion distortion;
  const std::string model =
      json::string(json::member(i_rValue, i_path, "model"), i_path + "/model");
  size_t count = 2;
  if (model == "Ostra3Parameter") {
    distortion.m_Model = ECameraDistortionModel::Ostra3Parameter;
    count = 3;
  } else if (model != "Ostra2Parameter") {
    json::fail(i_path + "/model",
               "unknown model \"" + model + "\" (Ostra2Parameter or Ostra3Parameter)");
  }
  distortion.m_RadialParameters =
      json::numbers(json::member(i_rValue, i_path, "radial"), i_path + "/radial", count);
  if (auto* p = json::optional(i_rValue, "centre")) {
    const std::vector<double> centre = json::numbers(*p, i_path + "/centre", 2);
    distortion.m_RadialDistortionCentre = {centre[0], centre[1]};
  }
  return distortion;
}

VCameraCalibrationDetail readDetail(const nlohmann::json& i_rValue, const std::string& i_path) {
  json::onlyKeys(i_rValue, i_path, {"type", "startTemp", "endTemp", "startTime", "endTime", "id"});
  VCameraCalibrationDetail detail;
  if (auto* p = json::optional(i_rValue, "type")) {
    const std::string type = json::string(*p, i_path + "/type");
    bool known = false;
    for (int value = 0; value <= 5 && !known; ++value) {
      detail.m_Type = static_cast<ECameraCalibrationType>(value);
      known = type == CameraCalibrationTypeName(detail.m_Type);
    }
    if (!known) json::fail(i_path + "/type", "unknown calibration type \"" + type + "\"");
  }
  if (auto* p = json::optional(i_rValue, "startTemp"))
    detail.m_StartTemperature = int32(*p, i_path + "/startTemp");
  if (auto* p = json::optional(i_rValue, "endTemp"))
    detail.m_EndTemperature = int32(*p, i_path + "/endTemp");
  auto time = [&](const char* i_pKey, std::uint64_t& o_rTime) {
    if (auto* p = json::optional(i_rValue, i_pKey)) {
      const int64_t ms = json::integer(*p, i_path + "/" + i_pKey);
      if (ms < 0) json::fail(i_path + "/" + i_pKey, "a time is milliseconds since 1970, >= 0");
      o_rTime = std::uint64_t(ms);
    }
  };
  time("startTime", detail.m_StartTime);
  time("endTime", detail.m_EndTime);
  if (auto* p = json::optional(i_rValue, "id"))
    if (!CameraCalibrationIdFromText(json::string(*p, i_path + "/id"), detail.m_Id))
      json::fail(i_path + "/id", "expected 8-4-4-4-12 hex digits");
  return detail;
}

void readCalibration(const nlohmann::json& i_rValue, const std::string& i_path,
                     OpticalCamera& io_rCamera) {
  using namespace json;
  onlyKeys(i_rValue, i_path,
           {"name", "position", "orientation", "focalLength", "principalPoint", "distortion",
            "imageError"});
  io_rCamera.setCalibrated(true);
  if (auto* p = optional(i_rValue, "name"))
    io_rCamera.setCalibrationName(HString(string(*p, i_path + "/name")));
  io_rCamera.setCalibrationPose(
      vector3(member(i_rValue, i_path, "position"), i_path + "/position"),
      vector3(member(i_rValue, i_path, "orientation"), i_path + "/orientation"));
  const double focal = number(member(i_rValue, i_path, "focalLength"), i_path + "/focalLength");
  if (focal <= 0.0) fail(i_path + "/focalLength", "a focal length must be positive");
  io_rCamera.setFocalLengthInPixels(focal);
  const std::vector<double> principal =
      numbers(member(i_rValue, i_path, "principalPoint"), i_path + "/principalPoint", 2);
  io_rCamera.setPrincipalPoint({principal[0], principal[1]});
  if (auto* p = optional(i_rValue, "distortion"))
    io_rCamera.setDistortion(readDistortion(*p, i_path + "/distortion"));
  if (auto* p = optional(i_rValue, "imageError"))
    io_rCamera.setImageError(number(*p, i_path + "/imageError"));
}

void readOptical(const nlohmann::json& i_rValue, const std::string& i_path,
                 SceneJsonContext& io_rContext) {
  using namespace json;
  onlyKeys(i_rValue, i_path,
           {"name", "number", "deviceUrn", "deviceName", "type", "displayType", "sensorSize",
            "sensorSizeMM", "pixelAspectRatio", "dv", "sdi", "mask", "calibration",
            "calibrationDetail", "intrinsicsDetail"});
  const std::string name = json::name(member(i_rValue, i_path, "name"), i_path + "/name");
  checkUniqueName(io_rContext.root.get(), name, i_path + "/name");
  auto pCamera = std::make_unique<OpticalCamera>(HString(name));
  pCamera->setCameraNumber(int32(member(i_rValue, i_path, "number"), i_path + "/number"));
  pCamera->setDeviceURN(
      HString(string(member(i_rValue, i_path, "deviceUrn"), i_path + "/deviceUrn")));
  auto text = [&](const char* i_pKey, void (OpticalCamera::*i_set)(const HString&)) {
    if (auto* p = optional(i_rValue, i_pKey))
      (pCamera.get()->*i_set)(HString(string(*p, i_path + "/" + i_pKey)));
  };
  text("deviceName", &OpticalCamera::setDeviceName);
  text("type", &OpticalCamera::setCameraType);
  text("displayType", &OpticalCamera::setDisplayType);
  const auto sensor = intPair(member(i_rValue, i_path, "sensorSize"), i_path + "/sensorSize");
  if (sensor.first <= 0 || sensor.second <= 0)
    fail(i_path + "/sensorSize", "a sensor has a positive size");
  pCamera->setSensorSize(sensor.first, sensor.second);
  if (auto* p = optional(i_rValue, "sensorSizeMM")) {
    const std::vector<double> size = numbers(*p, i_path + "/sensorSizeMM", 2);
    pCamera->setSensorSizeMM(size[0], size[1]);
  }
  if (auto* p = optional(i_rValue, "pixelAspectRatio"))
    pCamera->setPixelAspectRatio(number(*p, i_path + "/pixelAspectRatio"));
  if (auto* p = optional(i_rValue, "dv")) pCamera->setDV(boolean(*p, i_path + "/dv"));
  if (auto* p = optional(i_rValue, "sdi")) pCamera->setSDI(boolean(*p, i_path + "/sdi"));
  if (auto* p = optional(i_rValue, "mask")) pCamera->setMaskGrid(readMask(*p, i_path + "/mask"));
  if (auto* p = optional(i_rValue, "calibration"))
    readCalibration(*p, i_path + "/calibration", *pCamera);
  if (auto* p = optional(i_rValue, "calibrationDetail"))
    pCamera->setCalibrationDetail(readDetail(*p, i_path + "/calibrationDetail"));
  if (auto* p = optional(i_rValue, "intrinsicsDetail"))
    pCamera->setIntrinsicsCalibrationDetail(readDetail(*p, i_path + "/intrinsicsDetail"));
  io_rContext.root->addChild(pCamera.release());
}

void readVideo(const nlohmann::json& i_rValue, const std::string& i_path,
               SceneJsonContext& io_rContext) {
  using namespace json;
  onlyKeys(i_rValue, i_path, {"name", "file", "position", "orientation"});
  const std::string name = json::name(member(i_rValue, i_path, "name"), i_path + "/name");
  checkUniqueName(io_rContext.root.get(), name, i_path + "/name");
  auto pCamera = std::make_unique<VideoCamera>(HString(name));
  if (auto* p = optional(i_rValue, "file"))
    pCamera->setVideoFile(HString(string(*p, i_path + "/file")));
  Vec3 position, rotationVector;
  if (auto* p = optional(i_rValue, "position")) position = vector3(*p, i_path + "/position");
  if (auto* p = optional(i_rValue, "orientation"))
    rotationVector = vector3(*p, i_path + "/orientation");
  pCamera->setPose(position, rotationVector);
  io_rContext.root->addChild(pCamera.release());
}

void readCameras(const nlohmann::json& i_rValue, const std::string& i_path,
                 SceneJsonContext& io_rContext) {
  using namespace json;
  onlyKeys(i_rValue, i_path, {"volume", "optical", "video"});
  if (auto* p = optional(i_rValue, "volume")) {
    const std::string path = i_path + "/volume";
    onlyKeys(*p, path, {"floorExtents"});
    const nlohmann::json& extents = member(*p, path, "floorExtents");
    array(extents, path + "/floorExtents");
    if (extents.size() != 4) fail(path + "/floorExtents", "expected [minX, maxX, minYZ, maxYZ]");
    HVolumeProperties volume;
    std::int32_t* fields[] = {&volume.m_FloorMinX, &volume.m_FloorMaxX, &volume.m_FloorMinYZ,
                              &volume.m_FloorMaxYZ};
    for (size_t i = 0; i < 4; ++i)
      *fields[i] = int32(extents[i], path + "/floorExtents/" + std::to_string(i));
    io_rContext.commits.push_back(
        [volume] { g_db->getCalibrationMgr()->setVolumeProperties(volume); });
  }
  if (auto* p = optional(i_rValue, "optical"))
    for (size_t i = 0; i < array(*p, i_path + "/optical").size(); ++i)
      readOptical((*p)[i], i_path + "/optical/" + std::to_string(i), io_rContext);
  if (auto* p = optional(i_rValue, "video"))
    for (size_t i = 0; i < array(*p, i_path + "/video").size(); ++i)
      readVideo((*p)[i], i_path + "/video/" + std::to_string(i), io_rContext);
}

} // namespace
ANVIL_REGISTER_SCENE_SECTION("cameras", 50, readCameras)
} // namespace AnvilCore
