#include "OstraAlgo/KinematicAlgo/VJointFunctional.h"

#include "OstraAlgo/KinematicAlgo/VJointFunctionalBall.h"
#include "OstraAlgo/KinematicAlgo/VJointFunctionalDummy.h"
#include "OstraAlgo/KinematicAlgo/VJointFunctionalFree.h"
#include "OstraAlgo/KinematicAlgo/VJointFunctionalHardySpicer.h"
#include "OstraAlgo/KinematicAlgo/VJointFunctionalHinge.h"
#include "OstraAlgo/KinematicAlgo/VJointFunctionalSlider.h"

namespace KinematicAlgo {

void VJointFunctional::ComposeParams(View o_rOut, ConstView a, ConstView b) const {
  for (std::uint32_t i = 0; i < NumDynamicParams(); ++i)
    o_rOut[i] = a[i] + b[i];
}

void VJointFunctional::FromNormalisedJacobian(ConstView, const JointGaussian& gaussian,
                                              Eigen::MatrixXd& o_rJacobian) const {
  o_rJacobian = gaussian.Root();
}

void VJointFunctional::ToNormalisedJacobian(ConstView, const JointGaussian& gaussian,
                                            Eigen::MatrixXd& o_rJacobian) const {
  o_rJacobian = gaussian.InverseRoot();
}

void VJointFunctionalLinear::FromNormalised(View o_rX, ConstView z,
                                            const JointGaussian& gaussian) const {
  const Eigen::Index n = NumDynamicParams();
  Eigen::Map<Eigen::VectorXd>(o_rX.data(), n) =
      gaussian.Root() * Eigen::Map<const Eigen::VectorXd>(z.data(), n) + gaussian.Mean();
}

void VJointFunctionalLinear::ToNormalised(View o_rZ, ConstView x,
                                          const JointGaussian& gaussian) const {
  const Eigen::Index n = NumDynamicParams();
  Eigen::Map<Eigen::VectorXd>(o_rZ.data(), n) =
      gaussian.InverseRoot() * (Eigen::Map<const Eigen::VectorXd>(x.data(), n) - gaussian.Mean());
}

void VJointFunctionalLinear::FromNormalisedJacobian(ConstView z, const JointGaussian& gaussian,
                                                    Eigen::MatrixXd& o_rJacobian) const {
  VJointFunctional::FromNormalisedJacobian(z, gaussian, o_rJacobian);
}

void VJointFunctionalLinear::ToNormalisedJacobian(ConstView x, const JointGaussian& gaussian,
                                                  Eigen::MatrixXd& o_rJacobian) const {
  VJointFunctional::ToNormalisedJacobian(x, gaussian, o_rJacobian);
}

std::unique_ptr<VJointFunctional> MakeJointFunctional(std::int32_t typeCode) {
  switch (static_cast<EJointKind>(typeCode)) {
  case EJointKind::EFree:
    return std::make_unique<VJointFunctionalFree>();
  case EJointKind::EBall:
    return std::make_unique<VJointFunctionalBall>();
  case EJointKind::EHardySpicer:
    return std::make_unique<VJointFunctionalHardySpicer>();
  case EJointKind::EHinge:
    return std::make_unique<VJointFunctionalHinge>();
  case EJointKind::ESlider:
    return std::make_unique<VJointFunctionalSlider>();
  case EJointKind::EDummy:
    return std::make_unique<VJointFunctionalDummy>();
  }
  return nullptr;
}

} // namespace KinematicAlgo
