#pragma once
// The parameters of a calibrated skeleton as the static and dynamic parameters of a subject
// record, and back; shared by the two conversions between the calibrated model and the
// parametrised record.

#include "OstraAlgo/KinematicAlgo/VSkeletonParameters.h"

#include "River/CoreOstraTypes/VSubjectParametrised.h"
#include "River/CoreOstraTypesUtils/ExpressionParsers.h"

#include <cstddef>
#include <cstdint>
#include <string>
#include <utility>
#include <vector>

namespace SubjectConversions {

/// Static skeleton parameters become static parameters (expression, the value as user value,
/// prior, advanced, read-only, "used" as visible), the others dynamic parameters (value, prior,
/// a non-zero standard deviation, "used" as visible), each list in the skeleton's order.
/// False, with the reasons logged on "SubjectConversion", when a name is empty or used twice,
/// or a dynamic parameter has an expression (a record's dynamic parameters have none);
/// `io_rSubject` is then untouched.
bool RecordParametersFromSkeleton(const std::vector<KinematicAlgo::VSkeletonParameter>& parameters,
                                  CoreOstraTypes::VSubjectParametrised& io_rSubject);

/// The record's static parameters, then its dynamic ones, as skeleton parameters: the inverse
/// of RecordParametersFromSkeleton. A static parameter without a user value takes the value the
/// record gives it (its expression, else its prior, else 0).
std::vector<KinematicAlgo::VSkeletonParameter>
SkeletonParametersFromRecord(const CoreOstraTypes::VSubjectParametrised& subject);

/// True when `text` names a parameter of the parser's subject (static or dynamic); an empty or
/// unparsable text names none.
bool NamesParameter(CoreOstraTypesUtils::VDynamicExpressionParserSimple& parser,
                    const std::string& text);

/// Where `marker`'s position sits in the targets that place it, as (target, first of its three
/// state entries): the origin of a single-marker target (point, plane, ray), a rigid body's
/// member at 6 + 3i. Targets in order.
std::vector<std::pair<std::size_t, std::size_t>>
MarkerPlaces(const CoreOstraTypes::VSubjectParametrised& subject, std::uint32_t marker);

} // namespace SubjectConversions
