#pragma once
#include "River/CoreOstraTypes/VCameraCalibration.h"
#include "River/CoreOstraTypes/VCameraCalibrationDetails.h"
#include "River/CoreOstraTypes/VCameraHardware.h"
#include "River/CoreOstraTypes/VCameraMaskGrid.h"
#include <cstdint>
#include <string>

/// Everything one `Camera` element of a camera document is made from.
struct XcpCameraRecord {
  CoreOstraTypes::VCameraHardware m_Hardware;
  bool m_CalibrationPresent = false;
  CoreOstraTypes::VCameraCalibration m_Calibration;
  bool m_MaskPresent = true;
  CoreOstraTypes::VCameraMaskGrid m_Mask;
  bool m_DetailsPresent = false;
  CoreOstraTypes::VCameraCalibrationDetails m_Details;
  std::int32_t m_DeviceId = 0;
  std::int32_t m_UserId = 0;
  bool m_IsDV = false;
  std::string m_System = "ZR";
  std::string m_Name;

  bool operator==(const XcpCameraRecord&) const = default;
};

/// The device id of a URN: the number behind its first ":" (the whole URN when it has none).
/// Leading digits count, with an optional sign; no digits give 0, and a number beyond 32 bits
/// is clamped.
std::int32_t XcpDeviceIdOfURN(const std::string& i_rURN);
