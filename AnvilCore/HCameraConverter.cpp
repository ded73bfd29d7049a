#include "plugin/host/HCameraConverter.h"
#include "plugin/host/OpticalCamera.h"

using namespace CoreOstraTypes;

void HCameraConverter::convertOpticalCameraToVCameraHardware(const OpticalCamera& i_rCamera,
                                                             VCameraHardware& o_rHardware) {
  o_rHardware = VCameraHardware();
  o_rHardware.m_DeviceURN = i_rCamera.getDeviceURN().GetString();
  o_rHardware.m_DeviceName = i_rCamera.getDeviceName().GetString();
  o_rHardware.m_Type = i_rCamera.getCameraType().GetString();
  o_rHardware.m_DisplayType = i_rCamera.getDisplayType().GetString();
  o_rHardware.m_SensorWidth = i_rCamera.getSensorWidth();
  o_rHardware.m_SensorHeight = i_rCamera.getSensorHeight();
  o_rHardware.m_PixelAspectRatio = i_rCamera.getPixelAspectRatio();
}

void HCameraConverter::convertOpticalCameraToVCameraCalibration(
    const OpticalCamera& i_rCamera, VCameraCalibration& o_rCalibration) {
  o_rCalibration = VCameraCalibration();
  o_rCalibration.m_Name = i_rCamera.getCalibrationName().GetString();
  const Vec3& orientation = i_rCamera.getCalibrationOrientation();
  const Vec3& position = i_rCamera.getCalibrationPosition();
  o_rCalibration.m_Orientation = {orientation.x, orientation.y, orientation.z};
  o_rCalibration.m_Position = {position.x, position.y, position.z};
  const HPoint2 principal = i_rCamera.getPrincipalPoint();
  o_rCalibration.m_PrincipalPoint = {principal.x, principal.y};
  o_rCalibration.m_LensDistortionCalibration = i_rCamera.getDistortion();
  o_rCalibration.m_FocalLength = i_rCamera.getFocalLengthInPixels();
  o_rCalibration.m_ImageError = i_rCamera.getImageError();
}

void HCameraConverter::convertOpticalCameraToVCameraCalibrationDetails(
    const OpticalCamera& i_rCamera, VCameraCalibrationDetails& o_rDetails) {
  o_rDetails.m_DeviceURN = i_rCamera.getDeviceURN().GetString();
  o_rDetails.m_Calibration = i_rCamera.getCalibrationDetail();
  o_rDetails.m_IntrinsicsCalibration = i_rCamera.getIntrinsicsCalibrationDetail();
}

void HCameraConverter::convertOpticalCameraToVCameraMask(const OpticalCamera& i_rCamera,
                                                         VCameraMaskGrid& o_rMask) {
  o_rMask = i_rCamera.getMaskGrid();
}
