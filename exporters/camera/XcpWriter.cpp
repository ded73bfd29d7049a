#include "XcpWriter.h"
#include "DebugServices/AssertFail.h"
#include "Utils/UtilsFileSystem/ReplacingFile.h"
#include "XcpText.h"
#include <climits>
#include <cstdlib>
#include <iterator>
#include <new>
#include <rapidxml/rapidxml.hpp>
#include <rapidxml/rapidxml_print.hpp>

using namespace CoreOstraTypes;

namespace {
// "major.minor" of the document's format.
std::string versionText(int i_major, int i_minor) {
  return std::to_string(i_major) + "." + std::to_string(i_minor);
}
} // namespace

std::int32_t XcpDeviceIdOfURN(const std::string& i_rURN) {
  const size_t colon = i_rURN.find(':');
  const std::string text = colon == std::string::npos ? i_rURN : i_rURN.substr(colon + 1);
  const long long value = std::strtoll(text.c_str(), nullptr, 10);
  if (value > INT32_MAX) return INT32_MAX;
  if (value < INT32_MIN) return INT32_MIN;
  return static_cast<std::int32_t>(value);
}

XcpWriter::XcpWriter(bool i_runningUserIds)
    : m_pDocumentInfo(new (std::nothrow) Document), m_runningUserIds(i_runningUserIds) {
  ANVIL_ASSERT(m_pDocumentInfo);
  if (!m_pDocumentInfo) return;
  Element* pDeclaration = m_pDocumentInfo->allocate_node(rapidxml::node_declaration);
  m_pDocumentInfo->append_node(pDeclaration);
  setAttribute(pDeclaration, "version", "1.0");
  setAttribute(pDeclaration, "encoding", "UTF-8");
  m_pRoot = appendElement(m_pDocumentInfo.get(), "Cameras");
  // The root's attributes exist from the start so that their order never depends on calls.
  setAttribute(m_pRoot, "VERSION", versionText(1, 0));
  setAttribute(m_pRoot, "SOURCE", "");
  setAttribute(m_pRoot, "UP_AXIS", "");
  setAttribute(m_pRoot, "FLOOR_EXTENTS", XcpText::Integers({0, 0, 0, 0}));
}

XcpWriter::~XcpWriter() = default;

XcpWriter::Element* XcpWriter::appendElement(Element* i_pParent, const char* i_pName) {
  Element* pElement = m_pDocumentInfo->allocate_node(rapidxml::node_element, i_pName);
  i_pParent->append_node(pElement);
  return pElement;
}

void XcpWriter::setAttribute(Element* i_pElement, const char* i_pName,
                             const std::string& i_rValue) {
  char* pValue = m_pDocumentInfo->allocate_string(i_rValue.c_str(), i_rValue.size() + 1);
  if (rapidxml::xml_attribute<char>* pOld = i_pElement->first_attribute(i_pName)) {
    pOld->value(pValue, i_rValue.size());
    return;
  }
  i_pElement->append_attribute(
      m_pDocumentInfo->allocate_attribute(i_pName, pValue, 0, i_rValue.size()));
}

void XcpWriter::setSource(const std::string& i_rSource) {
  if (m_pRoot) setAttribute(m_pRoot, "SOURCE", i_rSource);
}

void XcpWriter::setUpAxis(const std::string& i_rAxis) {
  if (m_pRoot) setAttribute(m_pRoot, "UP_AXIS", i_rAxis);
}

void XcpWriter::setFloorExtents(std::int32_t i_minX, std::int32_t i_maxX, std::int32_t i_minYZ,
                                std::int32_t i_maxYZ) {
  if (m_pRoot)
    setAttribute(m_pRoot, "FLOOR_EXTENTS", XcpText::Integers({i_minX, i_maxX, i_minYZ, i_maxYZ}));
}

void XcpWriter::addCamera(const XcpCameraRecord& i_rCamera, int i_frame) {
  if (!m_pRoot) return;
  ++m_cameraCount;
  const VCameraHardware& hardware = i_rCamera.m_Hardware;
  Element* pCamera = appendElement(m_pRoot, "Camera");
  setAttribute(pCamera, "DEVICEID", std::to_string(i_rCamera.m_DeviceId));
  setAttribute(pCamera, "DEVICEURN", hardware.m_DeviceURN);
  setAttribute(pCamera, "USERID",
               std::to_string(m_runningUserIds ? m_cameraCount : i_rCamera.m_UserId));
  setAttribute(pCamera, "NAME", i_rCamera.m_Name);
  setAttribute(pCamera, "TYPE", hardware.m_Type);
  setAttribute(pCamera, "DISPLAY_TYPE", hardware.m_DisplayType);
  setAttribute(pCamera, "ISDV", i_rCamera.m_IsDV ? "2" : "0");
  setAttribute(pCamera, "SENSOR", "");
  setAttribute(pCamera, "SENSOR_SIZE",
               XcpText::Integers({hardware.m_SensorWidth, hardware.m_SensorHeight}));
  setAttribute(pCamera, "PIXEL_ASPECT_RATIO", XcpText::Numbers({hardware.m_PixelAspectRatio}));
  setAttribute(pCamera, "ACTIVE_THRESHOLD", "1");
  setAttribute(pCamera, "SYSTEM", i_rCamera.m_System);

  if (i_rCamera.m_MaskPresent) {
    const VCameraMaskGrid& mask = i_rCamera.m_Mask;
    Element* pGrid = appendElement(pCamera, "ThresholdGrid");
    setAttribute(pGrid, "BIT_DEPTH", "1");
    setAttribute(pGrid, "DATA", mask.m_Data);
    setAttribute(pGrid, "GRID_SIZE", XcpText::Integers({mask.m_GridWidth, mask.m_GridHeight}));
    setAttribute(pGrid, "TILE_SIZE", XcpText::Integers({mask.m_TileWidth, mask.m_TileHeight}));
  }
  Element* pKeyFrames = appendElement(pCamera, "KeyFrames");
  if (i_rCamera.m_DetailsPresent) {
    addDetail(pCamera, pKeyFrames, "Calibration", i_rCamera.m_Details.m_Calibration);
    addDetail(pCamera, pKeyFrames, "IntrinsicsCalibration",
              i_rCamera.m_Details.m_IntrinsicsCalibration);
  }
  if (i_rCamera.m_CalibrationPresent) addKeyFrame(pKeyFrames, i_rCamera.m_Calibration, i_frame);
}

void XcpWriter::addDetail(Element* i_pCamera, Element* i_pBefore, const char* i_pName,
                          const VCameraCalibrationDetail& i_rDetail) {
  Element* pDetail = m_pDocumentInfo->allocate_node(rapidxml::node_element, i_pName);
  i_pCamera->insert_node(i_pBefore, pDetail);
  if (i_rDetail.m_StartTemperature != VCameraCalibrationDetail::UnsetTemperature)
    setAttribute(pDetail, "START_TEMP", std::to_string(i_rDetail.m_StartTemperature));
  if (i_rDetail.m_EndTemperature != VCameraCalibrationDetail::UnsetTemperature)
    setAttribute(pDetail, "END_TEMP", std::to_string(i_rDetail.m_EndTemperature));
  if (i_rDetail.m_StartTime != VCameraCalibrationDetail::UnsetTime)
    setAttribute(pDetail, "START_TIME", XcpText::LocalTime(i_rDetail.m_StartTime));
  if (i_rDetail.m_EndTime != VCameraCalibrationDetail::UnsetTime)
    setAttribute(pDetail, "END_TIME", XcpText::LocalTime(i_rDetail.m_EndTime));
  setAttribute(pDetail, "TYPE", CameraCalibrationTypeName(i_rDetail.m_Type));
  if (i_rDetail.m_Id != VCameraCalibrationId{})
    setAttribute(pDetail, "ID", CameraCalibrationIdText(i_rDetail.m_Id));
}

void XcpWriter::addKeyFrame(Element* i_pKeyFrames, const VCameraCalibration& i_rCalibration,
                            int i_frame) {
  Element* pKeyFrame = appendElement(i_pKeyFrames, "KeyFrame");
  const auto& principal = i_rCalibration.m_PrincipalPoint;
  const auto& position = i_rCalibration.m_Position;
  const std::array<double, 4> q = CameraOrientationQuaternion(i_rCalibration.m_Orientation);
  const VCameraLensDistortion& distortion = i_rCalibration.m_LensDistortionCalibration;
  setAttribute(pKeyFrame, "FRAME", std::to_string(i_frame));
  setAttribute(pKeyFrame, "FOCAL_LENGTH", XcpText::Numbers({i_rCalibration.m_FocalLength}));
  setAttribute(pKeyFrame, "PRINCIPAL_POINT", XcpText::Numbers({principal[0], principal[1]}));
  setAttribute(pKeyFrame, "POSITION", XcpText::Numbers({position[0], position[1], position[2]}));
  setAttribute(pKeyFrame, "ORIENTATION", XcpText::Numbers({q[0], q[1], q[2], q[3]}));
  if (distortion.m_Model == ECameraDistortionModel::Ostra2Parameter) {
    // The two-parameter form writes the first two coefficients, absent ones as 0.
    const std::vector<double>& k = distortion.m_RadialParameters;
    setAttribute(pKeyFrame, "OSTRA_RADIAL",
                 XcpText::Numbers({k.size() > 0 ? k[0] : 0.0, k.size() > 1 ? k[1] : 0.0}));
  } else {
    const auto& centre = distortion.m_RadialDistortionCentre;
    std::string text = CameraDistortionModelName(distortion.m_Model);
    text += ' ' + XcpText::Numbers({centre[0], centre[1]});
    if (!distortion.m_RadialParameters.empty())
      text += ' ' + XcpText::Numbers(distortion.m_RadialParameters);
    setAttribute(pKeyFrame, "OSTRA_RADIAL2", text);
    setAttribute(m_pRoot, "VERSION", versionText(2, 0));
  }
  setAttribute(pKeyFrame, "IMAGE_ERROR", XcpText::Numbers({i_rCalibration.m_ImageError}));
}

std::string XcpWriter::toString() const {
  std::string text;
  if (m_pDocumentInfo) rapidxml::print(std::back_inserter(text), *m_pDocumentInfo, 0);
  return text;
}

bool XcpWriter::save(const std::string& i_rPath) const {
  if (!m_pDocumentInfo) return false;
  UtilsFileSystem::VReplacingFile file;
  if (file.Open(i_rPath).IsFailure()) return false;
  const std::string text = toString();
  file.Write(text.data(), text.size());
  return file.Commit().IsSuccess();
}
