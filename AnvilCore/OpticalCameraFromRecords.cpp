#include "OpticalCameraFromRecords.h"
#include "plugin/host/OpticalCamera.h"

namespace AnvilCore {

std::unique_ptr<OpticalCamera> opticalCameraFromRecords(const std::string& i_rName, int i_number,
                                                        const CameraRecords& i_rRecords) {
  auto pCamera = std::make_unique<OpticalCamera>(HString(i_rName));
  const CoreOstraTypes::VCameraHardware& hardware = i_rRecords.hardware;
  pCamera->setCameraNumber(i_number);
  pCamera->setDeviceURN(HString(hardware.m_DeviceURN));
  pCamera->setDeviceName(HString(hardware.m_DeviceName));
  pCamera->setCameraType(HString(hardware.m_Type));
  pCamera->setDisplayType(HString(hardware.m_DisplayType));
  pCamera->setSensorSize(hardware.m_SensorWidth, hardware.m_SensorHeight);
  pCamera->setPixelAspectRatio(hardware.m_PixelAspectRatio);
  if (i_rRecords.pMask) pCamera->setMaskGrid(*i_rRecords.pMask);
  if (i_rRecords.pDetails) {
    pCamera->setCalibrationDetail(i_rRecords.pDetails->m_Calibration);
    pCamera->setIntrinsicsCalibrationDetail(i_rRecords.pDetails->m_IntrinsicsCalibration);
  }
  const CoreOstraTypes::VCameraCalibration* pCalibration = i_rRecords.pCalibration;
  if (pCalibration && pCalibration->m_FocalLength > 0.0) {
    const auto& p = pCalibration->m_Position;
    const auto& r = pCalibration->m_Orientation;
    pCamera->setCalibrated(true);
    pCamera->setCalibrationName(HString(pCalibration->m_Name));
    pCamera->setCalibrationPose(Vec3(p[0], p[1], p[2]), Vec3(r[0], r[1], r[2]));
    pCamera->setFocalLengthInPixels(pCalibration->m_FocalLength);
    pCamera->setPrincipalPoint(
        {pCalibration->m_PrincipalPoint[0], pCalibration->m_PrincipalPoint[1]});
    pCamera->setDistortion(pCalibration->m_LensDistortionCalibration);
    pCamera->setImageError(pCalibration->m_ImageError);
  }
  return pCamera;
}

} // namespace AnvilCore
