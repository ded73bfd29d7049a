#pragma once
// Keeping a dynamic subspace in step with its subject. A chunk names its parameters by position
// in the concatenated joint parameters, so any edit of the segments (a rigid body added or
// removed, segments reordered) leaves those positions stale. The update goes through the
// generic, joint-named form of each chunk and back.

#include "River/CoreOstraTypes/VSubjectDynamicSubspace.h"
#include "River/CoreOstraTypes/VSubjectParametrised.h"

namespace CoreOstraTypesUtils {

inline constexpr const char* SubjectDynamicSubspaceUtilsChannel = "SubjectDynamicSubspaceUtils";

/// Re-indexes `io_rSubspace`, built for `before`, for the edited subject `after`: each chunk
/// keeps its joints by name, the joint parameter count and subject id become those of `after`.
///
/// Refused, with the reason and then "Subspace update cannot be performed" logged at error level
/// on "SubjectDynamicSubspaceUtils" and the subspace left as it was, when: the subspace's joint
/// parameter count is not that of `before`; a chunk is not made of whole joints of `before`; a
/// chunk's joint is missing from `after`, named more than once there, or of another type; two
/// chunks would share a parameter; or a re-indexed chunk fails ValidateGenericDynamicSubspace.
/// A subspace without chunks is left as it is and the update succeeds.
bool UpdateDynamicSubspace(const CoreOstraTypes::VSubjectParametrised& before,
                           const CoreOstraTypes::VSubjectParametrised& after,
                           CoreOstraTypes::VSubjectDynamicSubspace& io_rSubspace);

} // namespace CoreOstraTypesUtils
