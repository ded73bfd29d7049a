#pragma once
#include "HCamera.h"
#include "River/CoreOstraTypes/VCameraCalibrationDetails.h"
#include "River/CoreOstraTypes/VCameraLensDistortion.h"
#include "River/CoreOstraTypes/VCameraMaskGrid.h"

/// A point on a sensor or an image: pixels, or millimetres where a name says so.
struct HPoint2 {
  double x = 0.0;
  double y = 0.0;
  bool operator==(const HPoint2&) const = default;
};

/// A motion-capture camera: its hardware, its threshold mask and, once calibrated, its pose and
/// lens. Lengths on the sensor are pixels unless a name ends in "MM"; millimetre queries answer 0
/// while the sensor's size in millimetres is unknown (0).
class ANVIL_HOST_API OpticalCamera : public HCamera {
  H_DECLARE_RUNTIME_CLASS(OpticalCamera)
public:
  explicit OpticalCamera(const HString& i_rName = HString());

  /// The number users know the camera by, from 1. Not necessarily unique in a scene.
  int getCameraNumber() const { return m_cameraNumber; }
  void setCameraNumber(int i_number) { m_cameraNumber = i_number; }

  // Hardware.
  const HString& getDeviceURN() const { return m_deviceURN; }
  void setDeviceURN(const HString& i_rURN) { m_deviceURN = i_rURN; }
  const HString& getDeviceName() const { return m_deviceName; }
  void setDeviceName(const HString& i_rName) { m_deviceName = i_rName; }
  const HString& getCameraType() const { return m_type; }
  void setCameraType(const HString& i_rType) { m_type = i_rType; }
  const HString& getDisplayType() const { return m_displayType; }
  void setDisplayType(const HString& i_rType) { m_displayType = i_rType; }
  /// True for a camera that sends its video over SDI.
  bool isSDI() const { return m_sdi; }
  void setSDI(bool i_sdi) { m_sdi = i_sdi; }
  /// True for a camera that records digital video beside its centroids.
  bool isDV() const { return m_dv; }
  void setDV(bool i_dv) { m_dv = i_dv; }

  // Sensor.
  int getSensorWidth() const { return m_sensorWidth; }
  int getSensorHeight() const { return m_sensorHeight; }
  void setSensorSize(int i_width, int i_height);
  double getSensorWidthMM() const { return m_sensorWidthMM; }
  double getSensorHeightMM() const { return m_sensorHeightMM; }
  void setSensorSizeMM(double i_width, double i_height);
  double getPixelAspectRatio() const { return m_pixelAspectRatio; }
  void setPixelAspectRatio(double i_ratio) { m_pixelAspectRatio = i_ratio; }

  const CoreOstraTypes::VCameraMaskGrid& getMaskGrid() const { return m_mask; }
  void setMaskGrid(const CoreOstraTypes::VCameraMaskGrid& i_rMask) { m_mask = i_rMask; }

  // Calibration. The values below are meaningful only while `isCalibrated()`.
  bool isCalibrated() const { return m_calibrated; }
  void setCalibrated(bool i_calibrated) { m_calibrated = i_calibrated; }
  const HString& getCalibrationName() const { return m_calibrationName; }
  void setCalibrationName(const HString& i_rName) { m_calibrationName = i_rName; }
  /// Sets the calibrated pose and places the node there: world position (mm) and a rotation
  /// vector (axis times angle in radians) taking camera axes to world axes.
  void setCalibrationPose(const Vec3& i_rPosition, const Vec3& i_rRotationVector);
  const Vec3& getCalibrationPosition() const { return m_position; }
  const Vec3& getCalibrationOrientation() const { return m_orientation; }
  double getFocalLengthInPixels() const { return m_focalLength; }
  void setFocalLengthInPixels(double i_pixels) { m_focalLength = i_pixels; }
  /// Focal length in millimetres, through the sensor's pixel width.
  double getFocalLength() const;
  HPoint2 getPrincipalPoint() const { return m_principalPoint; }
  void setPrincipalPoint(const HPoint2& i_rPixels) { m_principalPoint = i_rPixels; }
  /// Principal point in millimetres from the sensor's corner.
  HPoint2 getPrincipalPointMM() const;
  const CoreOstraTypes::VCameraLensDistortion& getDistortion() const { return m_distortion; }
  void setDistortion(const CoreOstraTypes::VCameraLensDistortion& i_r) { m_distortion = i_r; }
  /// Mean reprojection error of the calibration, pixels.
  double getImageError() const { return m_imageError; }
  void setImageError(double i_pixels) { m_imageError = i_pixels; }

  // How the calibration was made: the whole calibration and the lens alone.
  const CoreOstraTypes::VCameraCalibrationDetail& getCalibrationDetail() const {
    return m_calibrationDetail;
  }
  void setCalibrationDetail(const CoreOstraTypes::VCameraCalibrationDetail& i_r) {
    m_calibrationDetail = i_r;
  }
  const CoreOstraTypes::VCameraCalibrationDetail& getIntrinsicsCalibrationDetail() const {
    return m_intrinsicsDetail;
  }
  void setIntrinsicsCalibrationDetail(const CoreOstraTypes::VCameraCalibrationDetail& i_r) {
    m_intrinsicsDetail = i_r;
  }
  /// True when either record holds a start or end temperature.
  bool isCalibrationTempSet() const;
  /// True when either record holds a start or end time.
  bool isCalibrationTimeSet() const;

private:
  int m_cameraNumber = 0;
  HString m_deviceURN;
  HString m_deviceName;
  HString m_type;
  HString m_displayType;
  bool m_sdi = false;
  bool m_dv = false;
  int m_sensorWidth = 0;
  int m_sensorHeight = 0;
  double m_sensorWidthMM = 0.0;
  double m_sensorHeightMM = 0.0;
  double m_pixelAspectRatio = 1.0;
  CoreOstraTypes::VCameraMaskGrid m_mask;
  bool m_calibrated = false;
  HString m_calibrationName;
  Vec3 m_position;
  Vec3 m_orientation;
  double m_focalLength = 0.0;
  HPoint2 m_principalPoint;
  CoreOstraTypes::VCameraLensDistortion m_distortion;
  double m_imageError = 0.0;
  CoreOstraTypes::VCameraCalibrationDetail m_calibrationDetail;
  CoreOstraTypes::VCameraCalibrationDetail m_intrinsicsDetail;
};
