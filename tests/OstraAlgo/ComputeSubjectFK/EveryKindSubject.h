#pragma once
// A random subject with, besides its point targets, one target of every other kind (and both
// Gaussian forms) on random segments.

#include "RandomSubject.h"

#include "OstraAlgo/KinematicAlgo/VCalibratedTargets.h"

namespace KinematicTest {

inline Eigen::Vector3d RandomVector(std::mt19937& gen, double scale) {
  std::uniform_real_distribution<double> u(-1.0, 1.0);
  return Eigen::Vector3d(u(gen), u(gen), u(gen)) * scale;
}

// GCC 12 warns that Eigen's two-double packet copy of the 1x1 covariance below reads past its
// eight bytes; that copy runs only for two or more coefficients.
#pragma GCC diagnostic push
#pragma GCC diagnostic ignored "-Warray-bounds"
inline std::shared_ptr<VSubjectCalibrated> SubjectWithEveryKind(int segments, std::mt19937& gen) {
  auto subject = RandomSubject(segments, gen);
  const auto parent = [&] { return std::uint32_t(100 + gen() % std::uint32_t(segments)); };
  auto covariancePoint = std::make_shared<VTargetPositionWithCovariance>(parent());
  Eigen::Matrix3d m = Eigen::Matrix3d::Random();
  covariancePoint->SetCovariance(m * m.transpose() + Eigen::Matrix3d::Identity());
  covariancePoint->SetPositionInParent(RandomVector(gen, 80));
  subject->AddTarget(covariancePoint, true);
  for (int gaussian = 0; gaussian < 2; ++gaussian) {
    auto plane = std::make_shared<VTargetSegmentPlane>(parent());
    plane->SetPositionInParent(RandomVector(gen, 80));
    plane->SetDirectionInParent(RandomVector(gen, 1).normalized());
    if (gaussian) plane->SetResidualCovariance(Eigen::MatrixXd::Constant(1, 1, 4.0));
    subject->AddTarget(plane, false);
    auto ray = std::make_shared<VTargetSegmentRay>(parent());
    ray->SetPositionInParent(RandomVector(gen, 80));
    ray->SetDirectionInParent(RandomVector(gen, 1).normalized());
    if (gaussian) ray->SetResidualCovariance((Eigen::MatrixXd(2, 2) << 3, 1, 1, 2).finished());
    subject->AddTarget(ray, false);
  }
  auto direction = std::make_shared<VTargetDirection>(parent());
  direction->SetDirectionInParent(RandomVector(gen, 1).normalized());
  subject->AddTarget(direction, false);
  auto orientation = std::make_shared<VTargetOrientation>(parent());
  orientation->SetOrientationInParent(Exp(RandomVector(gen, 1.5)));
  subject->AddTarget(orientation, false);
  auto body = std::make_shared<VTargetRigidBody>(parent());
  body->SetBodyPoseInParent(RandomPose(gen, 60));
  for (int i = 0; i < 4; ++i) {
    auto member = std::make_shared<VTargetPosition>(body->ParentIdentifier());
    member->SetPositionInParent(RandomVector(gen, 40));
    body->AddMember(member);
  }
  subject->AddTarget(body, false);
  return subject;
}
#pragma GCC diagnostic pop

} // namespace KinematicTest
