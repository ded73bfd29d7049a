#include "XcpReader.h"
#include "ISceneReader.h"
#include "River/CoreOstraTypes/VCameraCalibration.h"
#include "plugin/host/CalibrationMgr.h"
#include "plugin/host/Database.h"
#include "plugin/host/OpticalCamera.h"
#include <algorithm>
#include <cerrno>
#include <climits>
#include <cmath>
#include <cstdio>
#include <cstring>
#include <ctime>
#include <memory>
#include <optional>
#include <rapidxml/rapidxml.hpp>
#include <vector>

using namespace CoreOstraTypes;

namespace AnvilCore {

std::array<double, 3> rotationVectorOfQuaternion(const std::array<double, 4>& i_rQ) {
  const double n = std::sqrt(i_rQ[0] * i_rQ[0] + i_rQ[1] * i_rQ[1] + i_rQ[2] * i_rQ[2]);
  std::array<double, 3> v{i_rQ[0], i_rQ[1], i_rQ[2]};
  // The writer keeps tiny vectors as they are, with w exactly 1.
  if (n > 0.0 && !(i_rQ[3] == 1.0 && n < 2.220446049250313e-15)) {
    const double scale = 2.0 * std::atan2(n, i_rQ[3]) / n;
    v = {i_rQ[0] * scale, i_rQ[1] * scale, i_rQ[2] * scale};
  }
  if (CameraOrientationQuaternion(v) == i_rQ) return v;
  // The forward formula rounds; a neighbour a few units in the last place away usually gives
  // the quaternion back exactly, so that documents survive reading and writing unchanged.
  constexpr int kSteps = 3;
  auto step = [](double i_value, int i_count) {
    for (; i_count > 0; --i_count)
      i_value = std::nextafter(i_value, HUGE_VAL);
    for (; i_count < 0; ++i_count)
      i_value = std::nextafter(i_value, -HUGE_VAL);
    return i_value;
  };
  for (int i = -kSteps; i <= kSteps; ++i)
    for (int j = -kSteps; j <= kSteps; ++j)
      for (int k = -kSteps; k <= kSteps; ++k) {
        const std::array<double, 3> candidate{step(v[0], i), step(v[1], j), step(v[2], k)};
        if (CameraOrientationQuaternion(candidate) == i_rQ) return candidate;
      }
  return v;
}

namespace {

using Element = rapidxml::xml_node<char>;

struct XcpError {
  std::string message;
};

// Attribute access of one element, with messages that name the element and the attribute.
class ElementReader {
public:
  ElementReader(const Element* i_pElement, std::string i_where)
      : m_pElement(i_pElement), m_where(std::move(i_where)) {}

  const std::string& where() const { return m_where; }
  [[noreturn]] void fail(const char* i_pAttribute, const std::string& i_rMessage) const {
    throw XcpError{m_where + ", attribute " + i_pAttribute + ": " + i_rMessage};
  }
  const char* find(const char* i_pAttribute) const {
    const rapidxml::xml_attribute<char>* p = m_pElement->first_attribute(i_pAttribute);
    return p ? p->value() : nullptr;
  }
  std::string text(const char* i_pAttribute) const {
    const char* p = find(i_pAttribute);
    if (!p) fail(i_pAttribute, "missing");
    return p;
  }
  std::string text(const char* i_pAttribute, const char* i_pDefault) const {
    const char* p = find(i_pAttribute);
    return p ? p : i_pDefault;
  }
  /// Blank-separated numbers, exactly `i_count` of them unless `i_count` is 0 (any count).
  std::vector<double> numbers(const char* i_pAttribute, size_t i_count) const {
    return numbersIn(i_pAttribute, text(i_pAttribute), i_count);
  }
  std::vector<double> numbersIn(const char* i_pAttribute, const std::string& i_rText,
                                size_t i_count) const {
    std::vector<double> values;
    const char* p = i_rText.c_str();
    while (true) {
      while (*p == ' ' || *p == '\t' || *p == '\n' || *p == '\r')
        ++p;
      if (!*p) break;
      char* pEnd = nullptr;
      errno = 0;
      const double value = std::strtod(p, &pEnd);
      if (pEnd == p || (*pEnd && *pEnd != ' ' && *pEnd != '\t' && *pEnd != '\n' && *pEnd != '\r'))
        fail(i_pAttribute, "\"" + i_rText + "\" is not a list of numbers");
      if (!std::isfinite(value))
        fail(i_pAttribute, "\"" + i_rText + "\" holds a non-finite number");
      values.push_back(value);
      p = pEnd;
    }
    if (i_count && values.size() != i_count)
      fail(i_pAttribute, "expected " + std::to_string(i_count) + " numbers, found " +
                             std::to_string(values.size()));
    return values;
  }
  /// Blank-separated 32-bit integers, exactly `i_count` of them.
  std::vector<std::int32_t> integers(const char* i_pAttribute, size_t i_count) const {
    std::vector<std::int32_t> values;
    for (double value : numbers(i_pAttribute, i_count)) {
      if (value != std::floor(value) || value < INT32_MIN || value > INT32_MAX)
        fail(i_pAttribute, "expected whole numbers, found \"" + text(i_pAttribute) + "\"");
      values.push_back(static_cast<std::int32_t>(value));
    }
    return values;
  }
  std::int32_t integer(const char* i_pAttribute) const { return integers(i_pAttribute, 1)[0]; }

private:
  const Element* m_pElement;
  std::string m_where;
};

// "YYYY-MM-DD hh:mm:ss.mmm ST" (or "DST") in local time, to milliseconds since the epoch.
std::uint64_t parseLocalTime(const ElementReader& i_rReader, const char* i_pAttribute) {
  const std::string text = i_rReader.text(i_pAttribute);
  std::tm local{};
  int milliseconds = 0, consumed = 0;
  char zone[4] = {};
  const int fields = std::sscanf(text.c_str(), "%4d-%2d-%2d %2d:%2d:%2d.%3d %3s%n", &local.tm_year,
                                 &local.tm_mon, &local.tm_mday, &local.tm_hour, &local.tm_min,
                                 &local.tm_sec, &milliseconds, zone, &consumed);
  const bool daylight = std::strcmp(zone, "DST") == 0;
  if (fields != 8 || size_t(consumed) != text.size() || (!daylight && std::strcmp(zone, "ST")) ||
      local.tm_mon < 1 || local.tm_mon > 12 || local.tm_mday < 1 || local.tm_mday > 31 ||
      local.tm_hour > 23 || local.tm_min > 59 || local.tm_sec > 60 || local.tm_year < 1970)
    i_rReader.fail(i_pAttribute,
                   "expected \"YYYY-MM-DD hh:mm:ss.mmm ST\" or \"... DST\", found \"" + text +
                       "\"");
  local.tm_year -= 1900;
  local.tm_mon -= 1;
  local.tm_isdst = daylight ? 1 : 0;
  const std::time_t seconds = std::mktime(&local);
  if (seconds < 0) i_rReader.fail(i_pAttribute, "\"" + text + "\" is not a time after 1970");
  return std::uint64_t(seconds) * 1000u + std::uint64_t(milliseconds);
}

ECameraCalibrationType parseCalibrationType(const ElementReader& i_rReader) {
  const std::string name = i_rReader.text("TYPE", "NotSet");
  for (int value = 0; value <= 5; ++value) {
    const auto type = static_cast<ECameraCalibrationType>(value);
    if (name == CameraCalibrationTypeName(type)) return type;
  }
  // Kept outside the enumeration so that it is written back as "Unspecified".
  if (name == "Unspecified") return static_cast<ECameraCalibrationType>(255);
  i_rReader.fail("TYPE", "unknown calibration type \"" + name + "\"");
}

VCameraCalibrationDetail readDetail(const ElementReader& i_rReader) {
  VCameraCalibrationDetail detail;
  if (i_rReader.find("START_TEMP")) detail.m_StartTemperature = i_rReader.integer("START_TEMP");
  if (i_rReader.find("END_TEMP")) detail.m_EndTemperature = i_rReader.integer("END_TEMP");
  if (i_rReader.find("START_TIME")) detail.m_StartTime = parseLocalTime(i_rReader, "START_TIME");
  if (i_rReader.find("END_TIME")) detail.m_EndTime = parseLocalTime(i_rReader, "END_TIME");
  detail.m_Type = parseCalibrationType(i_rReader);
  if (const char* pId = i_rReader.find("ID"))
    if (!CameraCalibrationIdFromText(pId, detail.m_Id))
      i_rReader.fail("ID", std::string("expected 8-4-4-4-12 hex digits, found \"") + pId + "\"");
  return detail;
}

VCameraLensDistortion readDistortion(const ElementReader& i_rReader) {
  VCameraLensDistortion distortion;
  if (i_rReader.find("OSTRA_RADIAL")) {
    distortion.m_RadialParameters = i_rReader.numbers("OSTRA_RADIAL", 2);
    return distortion;
  }
  const std::string text = i_rReader.text("OSTRA_RADIAL2");
  const size_t blank = text.find(' ');
  const std::string model = text.substr(0, blank);
  if (model == "Ostra3Parameter") {
    distortion.m_Model = ECameraDistortionModel::Ostra3Parameter;
  } else if (model != "Ostra2Parameter") {
    i_rReader.fail("OSTRA_RADIAL2", "unknown distortion model \"" + model + "\"");
  }
  const std::vector<double> values = i_rReader.numbersIn(
      "OSTRA_RADIAL2", blank == std::string::npos ? std::string() : text.substr(blank + 1), 0);
  if (values.size() < 2)
    i_rReader.fail("OSTRA_RADIAL2", "expected the model, the centre and the coefficients");
  distortion.m_RadialDistortionCentre = {values[0], values[1]};
  distortion.m_RadialParameters.assign(values.begin() + 2, values.end());
  return distortion;
}

void readKeyFrame(const ElementReader& i_rReader, OpticalCamera& io_rCamera) {
  i_rReader.integer("FRAME");
  const std::vector<double> principal = i_rReader.numbers("PRINCIPAL_POINT", 2);
  const std::vector<double> position = i_rReader.numbers("POSITION", 3);
  const std::vector<double> q = i_rReader.numbers("ORIENTATION", 4);
  if (q[0] == 0.0 && q[1] == 0.0 && q[2] == 0.0 && q[3] == 0.0)
    i_rReader.fail("ORIENTATION", "the quaternion is zero");
  const std::array<double, 3> v = rotationVectorOfQuaternion({q[0], q[1], q[2], q[3]});
  io_rCamera.setCalibrated(true);
  io_rCamera.setFocalLengthInPixels(i_rReader.numbers("FOCAL_LENGTH", 1)[0]);
  io_rCamera.setPrincipalPoint({principal[0], principal[1]});
  io_rCamera.setCalibrationPose(Vec3(position[0], position[1], position[2]),
                                Vec3(v[0], v[1], v[2]));
  io_rCamera.setDistortion(readDistortion(i_rReader));
  io_rCamera.setImageError(i_rReader.numbers("IMAGE_ERROR", 1)[0]);
}

std::unique_ptr<OpticalCamera> readCamera(const Element* i_pElement, int i_index) {
  std::string where = "Camera " + std::to_string(i_index + 1);
  if (const auto* pName = i_pElement->first_attribute("NAME"))
    where += " (NAME \"" + std::string(pName->value()) + "\")";
  const ElementReader reader(i_pElement, where);
  auto pCamera = std::make_unique<OpticalCamera>(HString(reader.text("NAME")));
  if (pCamera->getName().IsEmpty()) reader.fail("NAME", "a camera needs a name");
  pCamera->setDeviceURN(HString(reader.text("DEVICEURN")));
  if (reader.find("DEVICEID")) reader.integer("DEVICEID");
  const std::int32_t userId = reader.integer("USERID");
  if (userId == INT32_MAX) reader.fail("USERID", "out of range");
  pCamera->setCameraNumber(userId + 1);
  pCamera->setCameraType(HString(reader.text("TYPE", "")));
  pCamera->setDisplayType(HString(reader.text("DISPLAY_TYPE", "")));
  const std::string dv = reader.text("ISDV", "0");
  if (dv != "0" && dv != "2") reader.fail("ISDV", "expected \"0\" or \"2\", found \"" + dv + "\"");
  pCamera->setDV(dv == "2");
  const std::vector<std::int32_t> sensor = reader.integers("SENSOR_SIZE", 2);
  pCamera->setSensorSize(sensor[0], sensor[1]);
  if (reader.find("PIXEL_ASPECT_RATIO"))
    pCamera->setPixelAspectRatio(reader.numbers("PIXEL_ASPECT_RATIO", 1)[0]);

  bool keyFrameRead = false;
  for (const Element* pChild = i_pElement->first_node(); pChild; pChild = pChild->next_sibling()) {
    if (pChild->type() != rapidxml::node_element) continue;
    const std::string name = pChild->name();
    const ElementReader child(pChild, where + ", element " + name);
    if (name == "ThresholdGrid") {
      VCameraMaskGrid mask;
      mask.m_Data = child.text("DATA", "");
      const std::vector<std::int32_t> grid = child.integers("GRID_SIZE", 2);
      const std::vector<std::int32_t> tile = child.integers("TILE_SIZE", 2);
      mask.m_GridWidth = grid[0];
      mask.m_GridHeight = grid[1];
      mask.m_TileWidth = tile[0];
      mask.m_TileHeight = tile[1];
      pCamera->setMaskGrid(mask);
    } else if (name == "Calibration") {
      pCamera->setCalibrationDetail(readDetail(child));
    } else if (name == "IntrinsicsCalibration") {
      pCamera->setIntrinsicsCalibrationDetail(readDetail(child));
    } else if (name == "KeyFrames") {
      for (const Element* pKey = pChild->first_node("KeyFrame"); pKey;
           pKey = pKey->next_sibling("KeyFrame")) {
        // A camera holds one calibration: the first key frame.
        if (keyFrameRead) {
          g_db->logWarning("%s: only the first key frame is kept", where.c_str());
          break;
        }
        readKeyFrame(ElementReader(pKey, where + ", element KeyFrame"), *pCamera);
        keyFrameRead = true;
      }
    }
  }
  return pCamera;
}

struct XcpScene {
  std::vector<std::unique_ptr<OpticalCamera>> cameras;
  std::optional<HVolumeProperties> volume;
  std::optional<bool> zUp;
};

XcpScene readScene(const Element* i_pRoot) {
  const ElementReader reader(i_pRoot, "element Cameras");
  const std::string version = reader.text("VERSION");
  if (version != "1.0" && version != "2.0")
    reader.fail("VERSION",
                "unsupported version \"" + version + "\" (this build reads 1.0 and 2.0)");
  XcpScene scene;
  if (const char* pAxis = reader.find("UP_AXIS")) {
    if (std::strcmp(pAxis, "Y") && std::strcmp(pAxis, "Z"))
      reader.fail("UP_AXIS", std::string("expected \"Y\" or \"Z\", found \"") + pAxis + "\"");
    scene.zUp = std::strcmp(pAxis, "Z") == 0;
  }
  if (reader.find("FLOOR_EXTENTS")) {
    const std::vector<std::int32_t> floor = reader.integers("FLOOR_EXTENTS", 4);
    scene.volume = HVolumeProperties{floor[0], floor[1], floor[2], floor[3]};
  }
  int index = 0;
  for (const Element* p = i_pRoot->first_node("Camera"); p; p = p->next_sibling("Camera"))
    scene.cameras.push_back(readCamera(p, index++));
  return scene;
}

// Line, from 1, of a position in the parse buffer; the buffer is changed in place by the parser,
// so the lines are counted in the original text. 0 when the position is outside the buffer.
int lineOf(const std::string& i_rText, const std::vector<char>& i_rBuffer, const char* i_pWhere) {
  if (!i_pWhere || i_pWhere < i_rBuffer.data() || i_pWhere >= i_rBuffer.data() + i_rBuffer.size())
    return 0;
  const size_t offset = size_t(i_pWhere - i_rBuffer.data());
  return 1 + int(std::count(i_rText.begin(), i_rText.begin() + long(offset), '\n'));
}

} // namespace

bool readXcpDocument(const std::string& i_text, const std::string& i_source,
                     std::string& o_rError) {
  std::vector<char> buffer(i_text.begin(), i_text.end());
  buffer.push_back('\0');
  rapidxml::xml_document<char> document;
  try {
    document.parse<0>(buffer.data());
  } catch (const rapidxml::parse_error& e) {
    const int line = lineOf(i_text, buffer, e.where<char>());
    o_rError = i_source + ": not well-formed XML" +
               (line ? " at line " + std::to_string(line) : std::string()) + ": " + e.what();
    return false;
  }
  const Element* pRoot = document.first_node();
  while (pRoot && pRoot->type() != rapidxml::node_element)
    pRoot = pRoot->next_sibling();
  if (!pRoot || std::strcmp(pRoot->name(), "Cameras") != 0) {
    o_rError = i_source + ": the root element must be Cameras" +
               (pRoot ? std::string(", found ") + pRoot->name() : std::string());
    return false;
  }
  XcpScene scene;
  try {
    scene = readScene(pRoot);
  } catch (const XcpError& e) {
    o_rError = i_source + ": " + e.message;
    return false;
  }
  for (auto& pCamera : scene.cameras)
    g_db->addToScene(pCamera.release(), false, nullptr, false, false);
  if (scene.volume) g_db->getCalibrationMgr()->setVolumeProperties(*scene.volume);
  if (scene.zUp) g_db->setZUp(*scene.zUp);
  return true;
}

namespace {

/// Camera calibration documents.
class XcpSceneReader : public ISceneReader {
public:
  std::vector<std::string> extensions() const override { return {"xcp"}; }
  std::string description() const override { return "Extended Camera Parameter File (cameras)"; }
  bool read(const std::string& i_path, std::string& o_rError) override {
    std::string text;
    return readWholeFile(i_path, text, o_rError) && readXcpDocument(text, i_path, o_rError);
  }
};

} // namespace
ANVIL_REGISTER_SCENE_READER(XcpSceneReader)
} // namespace AnvilCore
