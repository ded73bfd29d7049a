#pragma once
// The way back from camera records to a scene camera: the reverse of HCameraConverter.
#include "River/CoreOstraTypes/VCameraCalibration.h"
#include "River/CoreOstraTypes/VCameraCalibrationDetails.h"
#include "River/CoreOstraTypes/VCameraHardware.h"
#include "River/CoreOstraTypes/VCameraMaskGrid.h"
#include <memory>
#include <string>

class OpticalCamera;

namespace AnvilCore {

/// The records of one camera; the optional ones are null when the source has none.
struct CameraRecords {
  CoreOstraTypes::VCameraHardware hardware;
  const CoreOstraTypes::VCameraCalibration* pCalibration = nullptr;
  const CoreOstraTypes::VCameraCalibrationDetails* pDetails = nullptr;
  const CoreOstraTypes::VCameraMaskGrid* pMask = nullptr;
};

/// A camera named `i_rName` with user number `i_number`, its hardware and mask from the records.
/// It is calibrated, and placed at the calibrated pose, when a calibration with a focal length
/// above 0 is given (a focal length of 0 marks a camera that was never calibrated).
std::unique_ptr<OpticalCamera> opticalCameraFromRecords(const std::string& i_rName, int i_number,
                                                        const CameraRecords& i_rRecords);

} // namespace AnvilCore
