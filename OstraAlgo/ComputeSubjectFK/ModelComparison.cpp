#include "OstraAlgo/ComputeSubjectFK/ModelComparison.h"

#include "OstraAlgo/ComputeSubjectFK/VComputeSubject.h"

namespace ComputeSubject {

namespace {
View Span(Eigen::VectorXd& v) {
  return {v.data(), size_t(v.size())};
}
ConstView Span(const Eigen::VectorXd& v) {
  return {v.data(), size_t(v.size())};
}
} // namespace

bool SameJointStatistics(const SubjectPtr& a, const SubjectPtr& b, double tolerance,
                         std::mt19937& gen, std::string* o_pReport) {
  VComputeSubject ca(a), cb(b);
  if (ca.NumParams() != cb.NumParams() || ca.NumTargets() != cb.NumTargets()) return false;
  std::normal_distribution<double> normal;
  Eigen::VectorXd z(ca.NumJointParams()), x(z.size()), back(z.size());
  for (auto& v : z)
    v = normal(gen);
  ca.ColourState(Span(x), Span(z));
  cb.WhitenState(Span(back), Span(x));
  const Eigen::VectorXd difference = (z - back).cwiseAbs();
  if (difference.size() == 0 || tolerance > difference.maxCoeff()) return true;
  if (o_pReport) {
    Eigen::Index worst;
    difference.maxCoeff(&worst);
    for (std::uint32_t s = 0; s < ca.NumSegments(); ++s) {
      const VComputeSegment& segment = ca.Segment(s);
      if (std::uint32_t(worst) < segment.FirstParam() + segment.NumParams()) {
        *o_pReport = "Segment " + segment.Segment().Name() + ", joint " + segment.Joint()->Name() +
                     " differs";
        break;
      }
    }
  }
  return false;
}

bool SameMarkerPositions(const SubjectPtr& a, const std::vector<Eigen::VectorXd>& statesA,
                         const SubjectPtr& b, const std::vector<Eigen::VectorXd>& statesB,
                         double tolerance) {
  VComputeSubject ca(a), cb(b);
  if (statesA.size() != statesB.size() || ca.NumTargets() != cb.NumTargets()) return false;
  for (size_t k = 0; k < statesA.size(); ++k) {
    if (statesA[k].size() != Eigen::Index(ca.NumParams()) ||
        statesB[k].size() != Eigen::Index(cb.NumParams()))
      return false;
    ca.Update(Span(statesA[k]));
    cb.Update(Span(statesB[k]));
    for (std::uint32_t t = 0; t < ca.NumTargets(); ++t) {
      const auto* pa = ca.PositionTarget(t);
      const auto* pb = cb.PositionTarget(t);
      if (!pa != !pb) return false;
      if (pa && !((pa->WorldPosition() - pb->WorldPosition()).norm() < tolerance)) return false;
    }
  }
  return true;
}

bool SameMarkerPositions(const SubjectPtr& a, const SubjectPtr& b, double tolerance,
                         std::uint32_t count, std::mt19937& gen) {
  VComputeSubject ca(a);
  std::vector<Eigen::VectorXd> states(count, Eigen::VectorXd::Zero(ca.NumParams()));
  for (std::uint32_t k = 0; k < count; ++k) {
    if (k == 0)
      ca.PriorMeanState(Span(states[k]));
    else
      ca.SampleState(Span(states[k]), gen);
  }
  return SameMarkerPositions(a, states, b, states, tolerance);
}

} // namespace ComputeSubject
