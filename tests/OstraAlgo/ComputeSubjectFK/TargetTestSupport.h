#pragma once
// What the run-time target tests share: random states, target outputs, the comparison of every
// target Jacobian with central differences, and a fixture holding one model, its compute subject
// and a random state made from a fixed seed.

#include "RandomSubject.h"

#include "OstraAlgo/ComputeSubjectFK/VComputeSubject.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <memory>

namespace KinematicTest {

inline Eigen::VectorXd RandomState(std::uint32_t n, std::mt19937& gen) {
  std::uniform_real_distribution<double> u(-2.5, 2.5);
  Eigen::VectorXd x(n);
  for (auto& v : x)
    v = u(gen);
  return x;
}

inline ComputeSubject::ConstView Span(const Eigen::VectorXd& v) {
  return {v.data(), size_t(v.size())};
}

/// Values then residuals of target t at state x.
inline Eigen::VectorXd Outputs(ComputeSubject::VComputeSubject& cs, std::uint32_t t,
                               const Eigen::VectorXd& x, const Eigen::VectorXd& observation) {
  cs.Update(Span(x));
  const ComputeSubject::IComputeTarget& target = cs.Target(t);
  Eigen::VectorXd out(target.NumValues() + target.NumResiduals());
  std::copy(target.Values().begin(), target.Values().end(), out.data());
  target.Residual(Span(observation),
                  ComputeSubject::View(out.data() + target.NumValues(), target.NumResiduals()));
  return out;
}

/// An observation for `target`: a rotation (row-major) for nine values, else points within
/// `reach` of the origin.
inline Eigen::VectorXd RandomObservation(const ComputeSubject::IComputeTarget& target,
                                         std::mt19937& gen, double reach) {
  std::uniform_real_distribution<double> u(-1.0, 1.0);
  Eigen::VectorXd observation(target.ObservationSize());
  for (auto& v : observation)
    v = u(gen) * reach;
  if (target.ObservationSize() == 9) {
    const Matrix3r R = Exp(Eigen::Vector3d(u(gen), u(gen), u(gen)));
    observation = Eigen::Map<const Eigen::VectorXd>(R.data(), 9);
  }
  return observation;
}

/// Worst relative column error, over targets [first, end) (end 0: all), of the value and
/// residual Jacobians at x against central differences.
inline double WorstTargetJacobianError(ComputeSubject::VComputeSubject& cs,
                                       const Eigen::VectorXd& x, std::mt19937& gen,
                                       std::uint32_t first = 0, std::uint32_t end = 0) {
  double worst = 0.0;
  for (std::uint32_t t = first; t < (end ? end : cs.NumTargets()); ++t) {
    const ComputeSubject::IComputeTarget& target = cs.Target(t);
    const Eigen::VectorXd observation = RandomObservation(target, gen, 200);
    cs.UpdateSegments(Span(x), ComputeSubject::EChain);
    Eigen::MatrixXd analytic(target.NumValues() + target.NumResiduals(), x.size());
    target.ValueJacobian(analytic.topRows(target.NumValues()));
    target.ResidualJacobian(Span(observation), analytic.bottomRows(target.NumResiduals()));
    for (Eigen::Index i = 0; i < x.size(); ++i) {
      const double h = 1e-6 * std::max(1.0, std::abs(x[i]));
      Eigen::VectorXd plus = x, minus = x;
      plus[i] += h;
      minus[i] -= h;
      const Eigen::VectorXd numeric =
          (Outputs(cs, t, plus, observation) - Outputs(cs, t, minus, observation)) / (2 * h);
      worst = std::max(worst,
                       (analytic.col(i) - numeric).norm() / std::max(1.0, analytic.col(i).norm()));
    }
  }
  return worst;
}

/// One model made by `make` from a generator seeded with `seed`, its compute subject, and a
/// random state drawn after them from the same generator.
class ComputeTargetFixture : public ::testing::Test {
protected:
  template <class Make> void Build(std::uint32_t seed, Make&& make) {
    m_Gen.seed(seed);
    m_pModel = make(m_Gen);
    m_pCs = std::make_unique<ComputeSubject::VComputeSubject>(m_pModel);
    m_X = RandomState(m_pCs->NumParams(), m_Gen);
  }

  std::mt19937 m_Gen;
  std::shared_ptr<VSubjectCalibrated> m_pModel;
  std::unique_ptr<ComputeSubject::VComputeSubject> m_pCs;
  Eigen::VectorXd m_X;
};

} // namespace KinematicTest
