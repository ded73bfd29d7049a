#pragma once
// A joint functional: the stateless mathematics of one joint kind. It turns joint parameters
// into the joint's transform J (in the joint's own axes: hinge and slider along Z, Hardy-Spicer
// about Z then Y) and back, differentiates J, and does statistics of samples on the joint's
// manifold. It never sees the segment or the tree. Sizes of views are the caller's
// responsibility: a view shorter than NumDynamicParams() is a caller bug.

#include "OstraAlgo/KinematicAlgo/JointGaussian.h"
#include "OstraAlgo/KinematicAlgo/JointJacobian.h"
#include "OstraAlgo/KinematicAlgo/RotationMath.h"

#include <array>
#include <cstdint>
#include <memory>
#include <span>
#include <string>

namespace KinematicAlgo {

using ConstView = std::span<const double>;
using View = std::span<double>;
/// Samples of joint parameters, one column per sample. Statistics may overwrite them.
using SampleMatrix = Eigen::Ref<Eigen::MatrixXd>;
/// Spatial velocity and acceleration, each (rotation part, translation part).
using JointRates = std::array<Vector6d, 2>;

class VJointFunctional {
public:
  virtual ~VJointFunctional() = default;
  /// A fresh, independent instance of the same kind.
  virtual std::unique_ptr<VJointFunctional> Clone() const = 0;

  virtual std::uint32_t NumDynamicParams() const = 0;
  virtual std::uint32_t NumRotationParams() const = 0;
  virtual std::uint32_t NumTranslationParams() const = 0;
  virtual std::uint32_t NumStaticParams() const = 0;

  /// J of the parameters.
  virtual void ComputePose(ConstView dynamic, ConstView statics, VPose& o_rPose) const = 0;
  /// Parameters of a transform; false when this joint can't make `pose` within `tolerance`
  /// (what is tested depends on the kind).
  virtual bool ComputeParams(View o_rDynamic, View o_rStatic, const VPose& pose,
                             double tolerance) const = 0;
  /// dJ/dθ_i for each parameter, in the joint's axes. m_FirstParam is left untouched.
  virtual void ComputeJacobian(ConstView dynamic, ConstView statics,
                               JointJacobian& o_rJacobian) const = 0;
  virtual void ComputeStaticJacobian() const {}
  /// Spatial velocity and acceleration from `derivatives` = {θ, θ', θ''}.
  virtual void ComputeRates(std::span<const ConstView> derivatives, ConstView statics,
                            JointRates& o_rRates) const = 0;

  /// a = weighted combination of a and b on the joint's manifold.
  virtual void Blend(View io_rA, ConstView b, double wa, double wb) const = 0;
  /// Brings parameters to their canonical range.
  virtual void NormaliseParams(View io_rParams) const = 0;
  /// Group sum of a and b; element-wise a + b unless the kind has a group of its own.
  virtual void ComposeParams(View o_rOut, ConstView a, ConstView b) const;

  /// Mean on the manifold and covariance of the residuals around it. Too few samples give zeros.
  virtual void MeanAndCovariance(SampleMatrix samples, Eigen::MatrixXd& o_rCovariance,
                                 Eigen::VectorXd& o_rMean) const = 0;
  /// Centre and range matrix: the range is the covariance-form shape of the smallest covering
  /// ellipsoid (or interval), so `centre ⊕ root(range) u` with |u| <= 1 covers the samples.
  virtual void CentreAndRange(SampleMatrix samples, Eigen::MatrixXd& o_rRange,
                              Eigen::VectorXd& o_rCentre) const = 0;

  /// x = mean ⊕ (root z).
  virtual void FromNormalised(View o_rX, ConstView z, const JointGaussian& gaussian) const = 0;
  /// z = inverse root (x ⊖ mean).
  virtual void ToNormalised(View o_rZ, ConstView x, const JointGaussian& gaussian) const = 0;
  /// dx/dz of FromNormalised at z (n x n).
  virtual void FromNormalisedJacobian(ConstView z, const JointGaussian& gaussian,
                                      Eigen::MatrixXd& o_rJacobian) const;
  /// dz/dx of ToNormalised at x (n x n).
  virtual void ToNormalisedJacobian(ConstView x, const JointGaussian& gaussian,
                                    Eigen::MatrixXd& o_rJacobian) const;

  /// Replaces the parameters by those of pose ∘ J(params); false if the joint can't make it.
  virtual bool PreMultiply(const VPose& pose, ConstView statics, View io_rParams,
                           double tolerance) const = 0;

  /// Display name ("Free", "Hinge", "Rotated_Hinge", ...).
  virtual const std::string& Name() const = 0;
};

/// Defaults shared by every kind without static parameters; holds the display name.
class VJointFunctionalDynamic : public VJointFunctional {
public:
  explicit VJointFunctionalDynamic(std::string name) : m_Name(std::move(name)) {}
  std::uint32_t NumStaticParams() const override { return 0; }
  const std::string& Name() const override { return m_Name; }

protected:
  std::string m_Name;
};

/// Whitening of the linear kinds (Hinge, Hardy-Spicer, Slider): x = root z + mean.
class VJointFunctionalLinear : public VJointFunctionalDynamic {
public:
  using VJointFunctionalDynamic::VJointFunctionalDynamic;
  void FromNormalised(View o_rX, ConstView z, const JointGaussian& gaussian) const override;
  void ToNormalised(View o_rZ, ConstView x, const JointGaussian& gaussian) const override;
  void FromNormalisedJacobian(ConstView z, const JointGaussian& gaussian,
                              Eigen::MatrixXd& o_rJacobian) const override;
  void ToNormalisedJacobian(ConstView x, const JointGaussian& gaussian,
                            Eigen::MatrixXd& o_rJacobian) const override;
};

/// Joint type codes of the calibrated model and of the subject records.
enum class EJointKind : std::int32_t {
  EFree = 0,
  EBall = 1,
  EHardySpicer = 2,
  EHinge = 3,
  ESlider = 4,
  EDummy = 5
};

/// The functional of a joint type code; null for a code out of range.
std::unique_ptr<VJointFunctional> MakeJointFunctional(std::int32_t typeCode);

} // namespace KinematicAlgo
