#pragma once
// Comparison of two calibrated subjects through their compute subjects: whether their joint
// statistics agree, and whether they put their point targets in the same world places.

#include "OstraAlgo/KinematicAlgo/ICalibrated.h"

#include <Eigen/Core>

#include <memory>
#include <random>
#include <string>
#include <vector>

namespace ComputeSubject {

using SubjectPtr = std::shared_ptr<const KinematicAlgo::ISubjectCalibrated>;

/// True when b's working priors whiten what a's colour: a standard normal z over the whole
/// joint state, coloured through a and whitened through b, comes back within `tolerance` in
/// every element. False when the parameter or target counts differ. When it fails and
/// `o_pReport` is given, it names the first segment whose joint differs.
bool SameJointStatistics(const SubjectPtr& a, const SubjectPtr& b, double tolerance,
                         std::mt19937& gen, std::string* o_pReport = nullptr);

/// True when, for each pair of states, every point target of a lies within `tolerance` of the
/// corresponding point target of b. False when the numbers of states or of targets differ, when
/// a target is a point in one and not in the other, or when a state has the wrong size. Stops at
/// the first pair with a difference.
bool SameMarkerPositions(const SubjectPtr& a, const std::vector<Eigen::VectorXd>& statesA,
                         const SubjectPtr& b, const std::vector<Eigen::VectorXd>& statesB,
                         double tolerance);

/// As above with `count` states of a used for both: a's prior mean, then samples of its priors.
bool SameMarkerPositions(const SubjectPtr& a, const SubjectPtr& b, double tolerance,
                         std::uint32_t count, std::mt19937& gen);

} // namespace ComputeSubject
