#include "SubjectJointPose.h"
#include "River/CoreOstraTypesUtils/AngleAxis.h"
#include <Eigen/Geometry>
#include <cmath>

namespace AnvilCore {

using CoreOstraTypes::VJointTypeBase;
using Matrix = Eigen::Matrix3d;

namespace {
Matrix matrixOf(const AnvilRotation& i_rRotation) {
  double m[9];
  i_rRotation.getMatrix(m);
  Matrix result;
  for (int r = 0; r < 3; ++r)
    for (int c = 0; c < 3; ++c)
      result(r, c) = m[3 * r + c];
  return result;
}

AnvilRotation rotationOf(const Matrix& i_rMatrix) {
  double m[9];
  for (int r = 0; r < 3; ++r)
    for (int c = 0; c < 3; ++c)
      m[3 * r + c] = i_rMatrix(r, c);
  AnvilRotation result;
  result.setMatrix(m);
  return result;
}

Matrix axisRotation(const Eigen::Vector3d& i_rAxis, double i_angle) {
  return Eigen::AngleAxisd(i_angle, i_rAxis).toRotationMatrix();
}

double param(const std::vector<double>& i_rParams, size_t i_index) {
  return i_index < i_rParams.size() ? i_rParams[i_index] : 0.0;
}
} // namespace

AnvilRotation rotationFromAngleAxis(const std::array<double, 3>& i_rAngleAxis) {
  return rotationOf(CoreOstraTypesUtils::AngleAxisToRotation(i_rAngleAxis));
}

std::array<double, 3> angleAxisFromRotation(const AnvilRotation& i_rRotation) {
  return CoreOstraTypesUtils::RotationToAngleAxis(matrixOf(i_rRotation));
}

void jointToBoneMotion(const CoreOstraTypes::VSubjectParametrised::VJoint& i_rJoint,
                       const AnvilRotation& i_rPreRotation, const std::vector<double>& i_rParams,
                       Vec3& o_rTranslation, AnvilRotation& o_rRotation) {
  const Matrix a = CoreOstraTypesUtils::AngleAxisToRotation(i_rJoint.m_JointOrientation);
  Matrix r = Matrix::Identity();
  Eigen::Vector3d t = Eigen::Vector3d::Zero();
  const auto& p = i_rParams;
  switch (i_rJoint.m_JointType) {
  case VJointTypeBase::EFree:
    r = CoreOstraTypesUtils::AngleAxisToRotation({param(p, 0), param(p, 1), param(p, 2)});
    t = Eigen::Vector3d(param(p, 3), param(p, 4), param(p, 5));
    break;
  case VJointTypeBase::EBall:
    r = CoreOstraTypesUtils::AngleAxisToRotation({param(p, 0), param(p, 1), param(p, 2)});
    break;
  case VJointTypeBase::EHardySpicer:
    r = axisRotation(Eigen::Vector3d::UnitZ(), param(p, 0)) *
        axisRotation(Eigen::Vector3d::UnitY(), param(p, 1));
    break;
  case VJointTypeBase::EHinge:
    r = axisRotation(Eigen::Vector3d::UnitZ(), param(p, 0));
    break;
  case VJointTypeBase::ESlider:
    t = Eigen::Vector3d(0.0, 0.0, param(p, 0));
    break;
  default:
    break;
  }
  o_rRotation = rotationOf(a * r * a.transpose());
  const Eigen::Vector3d moved = matrixOf(i_rPreRotation) * (a * t);
  o_rTranslation = Vec3(moved.x(), moved.y(), moved.z());
}

std::vector<double> boneMotionToJoint(const CoreOstraTypes::VSubjectParametrised::VJoint& i_rJoint,
                                      const AnvilRotation& i_rPreRotation,
                                      const Vec3& i_rTranslation,
                                      const AnvilRotation& i_rRotation) {
  const Matrix a = CoreOstraTypesUtils::AngleAxisToRotation(i_rJoint.m_JointOrientation);
  const Matrix r = a.transpose() * matrixOf(i_rRotation) * a;
  const Eigen::Vector3d t = a.transpose() * matrixOf(i_rPreRotation).transpose() *
                            Eigen::Vector3d(i_rTranslation.x, i_rTranslation.y, i_rTranslation.z);
  const auto rv = CoreOstraTypesUtils::RotationToAngleAxis(r);
  switch (i_rJoint.m_JointType) {
  case VJointTypeBase::EFree:
    return {rv[0], rv[1], rv[2], t.x(), t.y(), t.z()};
  case VJointTypeBase::EBall:
    return {rv[0], rv[1], rv[2]};
  case VJointTypeBase::EHardySpicer:
    return {std::atan2(-r(0, 1), r(1, 1)), std::atan2(-r(2, 0), r(2, 2))};
  case VJointTypeBase::EHinge:
    return {rv[2]};
  case VJointTypeBase::ESlider:
    return {t.z()};
  default:
    return {};
  }
}

} // namespace AnvilCore
