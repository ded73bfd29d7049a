#pragma once
// The run-time form of one calibrated segment: its joint functional, its folded fixed poses, and
// the poses and Jacobian blocks the last evaluation wrote.

#include "OstraAlgo/ComputeSubjectFK/JacobianType.h"

#include "OstraAlgo/KinematicAlgo/ICalibrated.h"
#include "OstraAlgo/KinematicAlgo/JointGaussian.h"
#include "OstraAlgo/KinematicAlgo/JointJacobian.h"
#include "OstraAlgo/KinematicAlgo/VJointFunctional.h"

#include <array>
#include <memory>
#include <vector>

namespace ComputeSubject {

using KinematicAlgo::ConstView;
using KinematicAlgo::JointGaussian;
using KinematicAlgo::JointJacobian;
using KinematicAlgo::Matrix3r;
using KinematicAlgo::View;
using KinematicAlgo::VPose;

class VComputeSegment {
public:
  /// Without `useRotator` the joint's fixed rotation A is folded into P and Q (P A, Q A) and the
  /// joint moves in its own axes; with it P and Q stay as the model has them and the joint is
  /// wrapped in a rotator around A. Both give the pose P A J A⁻¹ Q⁻¹ in the parent. A joint
  /// type out of range leaves the joint null; evaluation then treats it as having no parameters.
  ///
  /// With `freeSegment` the segment is placed by six free parameters instead of its joint: its
  /// pose in the parent is F Q⁻¹, F the free transform (rotation vector, translation) of its
  /// six parameters, which stand for P (A folded in); the model's joint is ignored and the
  /// priors are zero-mean. FreeParams() of the model pose with the joint at rest give the same
  /// poses as the joint form with zero parameters.
  VComputeSegment(const KinematicAlgo::ISegmentCalibrated& segment, bool useRotator,
                  bool freeSegment = false);
  VComputeSegment(const VComputeSegment& other);
  VComputeSegment& operator=(const VComputeSegment&) = delete;

  const KinematicAlgo::ISegmentCalibrated& Segment() const { return *m_pSegment; }
  /// Reads P, Q, the fixed rotation and the priors from the model segment again (the working
  /// prior returns to the dynamic one). False, with nothing changed, when the joint's type is no
  /// longer the one this segment was built with: its parameter count may differ.
  bool Reload();
  const KinematicAlgo::VJointFunctional* Joint() const { return m_pJoint.get(); }
  std::uint32_t NumParams() const { return m_NumParams; }
  /// Position in the tree and of the parent (-1 at the root).
  std::int32_t Index() const { return m_Index; }
  std::int32_t ParentIndex() const { return m_Parent; }
  /// First joint parameter in the state vector.
  std::uint32_t FirstParam() const { return m_FirstParam; }

  /// Pose in world coordinates, pose in the parent's frame, and the frame in which the joint
  /// acts (parent world ∘ P), as of the last update.
  const VPose& WorldPose() const { return m_World; }
  const VPose& LocalPose() const { return m_Local; }
  const VPose& JointFrameInWorld() const { return m_JointFrame; }
  /// P and Q as evaluated (with A folded in unless the rotator is used).
  const VPose& PoseInParent() const { return m_P; }
  /// P as the model gives it (A folded in unless the rotator is used), also in free mode, and
  /// its six free parameters (rotation vector, translation).
  const VPose& ModelPoseInParent() const { return m_ModelP; }
  const std::array<double, 6>& FreeParams() const { return m_FreeParams; }
  bool IsFree() const { return m_FreeSegment; }
  const VPose& PoseInThis() const { return m_Q; }

  /// The Jacobian blocks of the last update, by the type asked for: the segment's own block
  /// first, then one per ancestor towards the root (EChain), the own block alone (EJoint), or
  /// (EFree) one block: the derivative of the world pose with respect to the six free
  /// parameters of P, in world axes, its columns at 6 × Index() (the free layout, six per
  /// segment in tree order). Each block's m_FirstParam locates its columns.
  const std::vector<JointJacobian>& JacobianBlocks() const { return m_Blocks; }
  std::uint32_t NumJacobianBlocks() const { return m_NumBlocks; }
  /// After an EFree update: dP/d(free parameters) in the parent's axes, not transformed.
  const JointJacobian& FreeJacobian() const { return m_FreeJacobian; }

  /// The dynamic prior, its working copy (used by sampling and whitening) and the range prior.
  const JointGaussian& DynamicPrior() const { return m_DynamicPrior; }
  const JointGaussian& CurrentPrior() const { return m_CurrentPrior; }
  JointGaussian& CurrentPrior() { return m_CurrentPrior; }
  const JointGaussian& RangePrior() const { return m_RangePrior; }

private:
  friend class VComputeSubject;
  /// Places the segment in the tree.
  void Place(std::int32_t index, std::int32_t parent);
  /// Sets the first parameter and allocates `numBlocks` Jacobian blocks once.
  void SetUp(std::uint32_t firstParam, std::uint32_t numBlocks);
  /// Forward kinematics from the joint parameters; parent null at the root.
  void UpdatePose(const double* params, const VComputeSegment* parent);
  /// Jacobian blocks of `type` (EChain, EJoint or EFree, with or without "only").
  void UpdateJacobian(const double* params, const VComputeSegment* parent, std::uint32_t type);
  /// The EFree block: `params` are the segment's own (used in free mode only).
  void UpdateFreeJacobian(const double* params, const VComputeSegment* parent);
  /// Everything the segment takes from the model.
  void ReadModel();

  std::shared_ptr<KinematicAlgo::VJointFunctional> m_pJoint;
  const KinematicAlgo::ISegmentCalibrated* m_pSegment;
  std::int32_t m_Index = -1;
  std::int32_t m_Parent = -1;
  std::uint32_t m_NumParams = 0;
  std::uint32_t m_FirstParam = 0;
  std::int32_t m_JointType = -1;
  bool m_UsesRotator;
  Matrix3r m_A;
  VPose m_P;
  VPose m_Q;
  VPose m_QInverse;
  VPose m_Joint;
  VPose m_Local;
  VPose m_World;
  VPose m_JointFrame;
  JointGaussian m_DynamicPrior;
  JointGaussian m_CurrentPrior;
  JointGaussian m_RangePrior;
  JointJacobian m_Own;
  std::vector<JointJacobian> m_Blocks;
  std::uint32_t m_NumBlocks = 0;
  bool m_FreeSegment;
  VPose m_ModelP;
  std::array<double, 6> m_FreeParams{};
  JointJacobian m_FreeJacobian{6};
};

} // namespace ComputeSubject
