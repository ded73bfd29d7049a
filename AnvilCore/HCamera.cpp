#include "plugin/host/HCamera.h"
#include "plugin/host/OpticalCamera.h"
#include "plugin/host/VideoCamera.h"
#include <cmath>

H_IMPLEMENT_RUNTIME_CLASS(HCamera, Node)
H_IMPLEMENT_RUNTIME_CLASS(OpticalCamera, HCamera)
H_IMPLEMENT_RUNTIME_CLASS(VideoCamera, HCamera)

HCamera::HCamera(const HString& i_rName) : Node(i_rName) {}

AnvilRotation HCamera::rotationOfVector(const Vec3& i_rV) {
  const double angle = std::sqrt(i_rV.x * i_rV.x + i_rV.y * i_rV.y + i_rV.z * i_rV.z);
  return angle > 0.0 ? AnvilRotation(i_rV, angle * 180.0 / M_PI) : AnvilRotation();
}

void HCamera::setPose(const Vec3& i_rPosition, const Vec3& i_rRotationVector) {
  setStaticTransform(i_rPosition, rotationOfVector(i_rRotationVector), Vec3(1.0, 1.0, 1.0));
}

VideoCamera::VideoCamera(const HString& i_rName) : HCamera(i_rName) {}
