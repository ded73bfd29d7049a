#pragma once
// The passes that follow the walk over the XML: expressions are checked, then joints, post
// transforms, T-pose constraints and direction targets take their final form.

#include "River/CoreOstraKMTIO/Declaration.h"
#include "River/CoreOstraTypesUtils/ExpressionParsers.h"

#include <string>
#include <vector>

namespace CoreOstraKMTIO::Detail {

/// Defines the parameters and evaluates every pre transform, mass, mass centre, inertia and
/// target state expression. False when any fails; each failure adds its message.
bool CheckExpressions(VReadContext& context,
                      CoreOstraTypesUtils::VDynamicExpressionParserSimple& parser,
                      std::vector<std::string>& o_rErrors);

/// Post transforms by era, joint orientations from axes, T-pose constraints and the unit length
/// of direction targets.
void CompleteJointsAndTargets(VReadContext& context,
                              CoreOstraTypesUtils::VDynamicExpressionParserSimple& parser,
                              std::vector<std::string>& o_rErrors,
                              std::vector<std::string>& o_rWarnings);

/// Whether elements nest deeper than `limit` levels; a quick scan that needs no parse.
bool NestsDeeperThan(const char* pText, std::size_t limit);

} // namespace CoreOstraKMTIO::Detail
