#pragma once
#include "HostExport.h"
#include "River/CoreOstraTypes/VCameraCalibration.h"
#include "River/CoreOstraTypes/VCameraCalibrationDetails.h"
#include "River/CoreOstraTypes/VCameraHardware.h"
#include "River/CoreOstraTypes/VCameraMaskGrid.h"

class OpticalCamera;

/// Fills the camera records of the record library from a scene camera. Each call overwrites the
/// whole output record.
class ANVIL_HOST_API HCameraConverter {
public:
  static void convertOpticalCameraToVCameraHardware(const OpticalCamera& i_rCamera,
                                                    CoreOstraTypes::VCameraHardware& o_rHardware);
  /// The calibration as the camera holds it; call only for a calibrated camera.
  static void
  convertOpticalCameraToVCameraCalibration(const OpticalCamera& i_rCamera,
                                           CoreOstraTypes::VCameraCalibration& o_rCalibration);
  static void convertOpticalCameraToVCameraCalibrationDetails(
      const OpticalCamera& i_rCamera, CoreOstraTypes::VCameraCalibrationDetails& o_rDetails);
  static void convertOpticalCameraToVCameraMask(const OpticalCamera& i_rCamera,
                                                CoreOstraTypes::VCameraMaskGrid& o_rMask);
};
