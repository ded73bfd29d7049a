#include "plugin/host/OpticalCamera.h"

OpticalCamera::OpticalCamera(const HString& i_rName) : HCamera(i_rName) {}

void OpticalCamera::setSensorSize(int i_width, int i_height) {
  m_sensorWidth = i_width;
  m_sensorHeight = i_height;
}

void OpticalCamera::setSensorSizeMM(double i_width, double i_height) {
  m_sensorWidthMM = i_width;
  m_sensorHeightMM = i_height;
}

void OpticalCamera::setCalibrationPose(const Vec3& i_rPosition, const Vec3& i_rRotationVector) {
  m_position = i_rPosition;
  m_orientation = i_rRotationVector;
  setPose(i_rPosition, i_rRotationVector);
}

namespace {
// Millimetres per pixel along one sensor axis; 0 while either size is unknown.
double pixelPitch(double i_sizeMM, int i_sizePixels) {
  return (i_sizeMM > 0.0 && i_sizePixels > 0) ? i_sizeMM / i_sizePixels : 0.0;
}
} // namespace

double OpticalCamera::getFocalLength() const {
  return m_focalLength * pixelPitch(m_sensorWidthMM, m_sensorWidth);
}

HPoint2 OpticalCamera::getPrincipalPointMM() const {
  return {m_principalPoint.x * pixelPitch(m_sensorWidthMM, m_sensorWidth),
          m_principalPoint.y * pixelPitch(m_sensorHeightMM, m_sensorHeight)};
}

bool OpticalCamera::isCalibrationTempSet() const {
  return m_calibrationDetail.hasTemperature() || m_intrinsicsDetail.hasTemperature();
}

bool OpticalCamera::isCalibrationTimeSet() const {
  return m_calibrationDetail.hasTime() || m_intrinsicsDetail.hasTime();
}
