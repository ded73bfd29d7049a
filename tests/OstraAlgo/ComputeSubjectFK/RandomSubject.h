#pragma once
// Random calibrated subjects for the compute subject tests: every joint kind, turned joints,
// offset pre and post poses, and point targets on every segment.

#include "OstraAlgo/KinematicAlgo/VCalibrated.h"

#include <random>

namespace KinematicTest {

using namespace KinematicAlgo;

inline VPose RandomPose(std::mt19937& gen, double reach) {
  std::uniform_real_distribution<double> u(-1.0, 1.0);
  VPose pose;
  pose.m_Rotation = Exp(Eigen::Vector3d(u(gen), u(gen), u(gen)) * 2.0);
  pose.m_Translation = Eigen::Vector3d(u(gen), u(gen), u(gen)) * reach;
  return pose;
}

inline std::shared_ptr<VSubjectCalibrated> RandomSubject(int segments, std::mt19937& gen) {
  auto subject = std::make_shared<VSubjectCalibrated>();
  subject->SetName("Random");
  subject->ClearSegments();
  std::uniform_real_distribution<double> u(-1.0, 1.0);
  for (int i = 0; i < segments; ++i) {
    auto segment = std::make_shared<VSegmentCalibrated>();
    segment->SetName("S" + std::to_string(i));
    segment->SetIdentifier(100 + i);
    segment->SetPoseInParent(RandomPose(gen, 300.0));
    segment->SetPoseInThis(RandomPose(gen, 50.0));
    auto joint = std::make_shared<VJointCalibrated>();
    joint->SetType(i == 0 ? 0 : std::int32_t(gen() % 6));
    joint->SetRotation(Eigen::Vector3d(u(gen), u(gen), u(gen)) * 1.5);
    segment->SetJoint(joint);
    const std::int32_t parent = i == 0 ? SegmentTree::NoParent : std::int32_t(gen() % i);
    subject->Segments().Add(parent, segment);
  }
  for (int i = 0; i < segments; ++i) {
    auto target = std::make_shared<VTargetPosition>(std::uint32_t(100 + i));
    target->SetPositionInParent(Eigen::Vector3d(u(gen), u(gen), u(gen)) * 100.0);
    target->SetIdentifier(i);
    target->SetName("M" + std::to_string(i));
    subject->AddTarget(target, true);
  }
  return subject;
}

} // namespace KinematicTest
