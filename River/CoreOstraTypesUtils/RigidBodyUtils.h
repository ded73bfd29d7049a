#pragma once
// Rigid bodies: packing body and marker data into an ERigidBody target, the test that a subject
// is a rigid body, and the edits that attach a rigid body to a subject or take one away. Every
// refusal is logged on channel "RigidBodyUtils" and leaves the records untouched.
//
// Layout of an ERigidBody target with M markers:
//   State       3 * (M + 2): orientation (angle-axis), position, then each marker's position
//   Covariance  36 + 9 * M:  6 by 6 body block, then each marker's 3 by 3 block (row-major)
//   ViewNormals M triples or empty

#include "River/CoreOstraTypes/VSubject.h"
#include "River/CoreOstraTypes/VSubjectApplicationData.h"
#include "River/CoreOstraTypes/VSubjectParametrised.h"

#include <array>
#include <string>
#include <vector>

namespace CoreOstraTypesUtils {

inline constexpr const char* RigidBodyUtilsChannel = "RigidBodyUtils";

using RigidVector = std::array<double, 3>;
using RigidCovariance = std::array<double, 9>; ///< 3 by 3, row-major
/// Diagonal of a marker covariance that has no content.
inline constexpr double DefaultRigidBodyMarkerVariance = 5.0;

/// Unpacks an ERigidBody target. A marker covariance that is all zero (or a target without
/// covariance) comes back as diag(5, 5, 5), with a warning per marker.
bool ReadRigidBodyInformation(const CoreOstraTypes::VSubject::VTarget& target,
                              RigidVector& o_rOrientation, RigidVector& o_rPosition,
                              std::vector<RigidVector>& o_rMarkerPositions,
                              std::vector<RigidCovariance>& o_rMarkerCovariances);

/// Packs body and marker data into an ERigidBody target; the body's 6 by 6 covariance block is
/// kept as it was (zeros when the target had less).
bool WriteRigidBodyInformation(CoreOstraTypes::VSubject::VTarget& io_rTarget,
                               const RigidVector& orientation, const RigidVector& position,
                               const std::vector<RigidVector>& markerPositions,
                               const std::vector<RigidCovariance>& markerCovariances,
                               const std::vector<RigidVector>& viewNormals);
/// As above for a parametrised target: the state is written as number expressions.
bool WriteRigidBodyInformation(CoreOstraTypes::VSubjectParametrised::VTarget& io_rTarget,
                               const RigidVector& orientation, const RigidVector& position,
                               const std::vector<RigidVector>& markerPositions,
                               const std::vector<RigidCovariance>& markerCovariances,
                               const std::vector<RigidVector>& viewNormals);
/// Replaces the marker positions and covariances of a well-formed ERigidBody target, one per
/// marker of the target; the body triples and view normals stay.
bool WriteRigidBodyMarkers(CoreOstraTypes::VSubject::VTarget& io_rTarget,
                           const std::vector<RigidVector>& markerPositions,
                           const std::vector<RigidCovariance>& markerCovariances);

/// Whether the subject is a rigid body: at least 3 markers, a free root joint and dummy joints
/// below it, and either one ERigidBody target or several targets on the root with at least 3
/// markers among them. Each broken rule is logged.
bool IsRigidBody(const CoreOstraTypes::VSubject& subject);
bool IsRigidBody(const CoreOstraTypes::VSubjectParametrised& subject);

/// Turns a rigid body of point targets on its root (its many-target form) into one ERigidBody
/// target with an identity body offset, the points' states as marker positions and the
/// covariances of Gaussian points as marker blocks (zero otherwise). Succeeds without change,
/// saying so, when the subject already has its one ERigidBody target. The application data of
/// the subject must be rebuilt afterwards.
bool ConvertToRigidBodyTarget(CoreOstraTypes::VSubject& io_rSubject);

/// The reverse: one ELocalPointToWorldPointGaussian target per marker of the ERigidBody target,
/// on its segment, with the body offset applied to each position and covariance.
bool ConvertToPointTargets(CoreOstraTypes::VSubject& io_rSubject);

/// Attaches the rigid body `body` (a rigid-body subject with one ERigidBody target on a segment
/// with a free joint) to `io_rSubject` as a new segment under the segment named `parentName`,
/// with its markers and target appended. The application data of both must match their
/// subjects; the body's entries are appended to `io_rAppData`.
bool AddRigidBody(CoreOstraTypes::VSubject& io_rSubject,
                  CoreOstraTypes::VSubjectApplicationData& io_rAppData,
                  const CoreOstraTypes::VSubject& body,
                  const CoreOstraTypes::VSubjectApplicationData& bodyAppData,
                  const std::string& parentName);
bool AddRigidBody(CoreOstraTypes::VSubjectParametrised& io_rSubject,
                  CoreOstraTypes::VSubjectApplicationData& io_rAppData,
                  const CoreOstraTypes::VSubjectParametrised& body,
                  const CoreOstraTypes::VSubjectApplicationData& bodyAppData,
                  const std::string& parentName);

/// Removes ERigidBody target `targetIndex` with its markers; its segment goes too when it is a
/// non-root segment with a free joint that nothing else hangs on. Marker and segment indices of
/// what remains are renumbered. `pAppData`, when given, is edited alike.
bool RemoveRigidBody(CoreOstraTypes::VSubject& io_rSubject, std::size_t targetIndex,
                     CoreOstraTypes::VSubjectApplicationData* pAppData = nullptr);
bool RemoveRigidBody(CoreOstraTypes::VSubjectParametrised& io_rSubject, std::size_t targetIndex,
                     CoreOstraTypes::VSubjectApplicationData* pAppData = nullptr);

} // namespace CoreOstraTypesUtils
