#pragma once
// Builds a character's setups from subject records: the road of subject files and of the demo.
#include "River/CoreOstraTypes/VSubjectApplicationData.h"
#include "River/CoreOstraTypes/VSubjectDynamicSubspace.h"
#include "River/CoreOstraTypes/VSubjectParametrised.h"
#include <memory>
#include <string>
#include <vector>

class Character;
class ParameterizedSetup;

namespace AnvilCore {

enum class ESetupKind { ELabeling, ESolving, ERetargeting };

/// The three records of one subject.
struct SubjectRecords {
  CoreOstraTypes::VSubjectParametrised subject;
  CoreOstraTypes::VSubjectApplicationData application;
  CoreOstraTypes::VSubjectDynamicSubspace subspace;
};

/// A setup of `i_kind` named `i_rName`: one bone per segment (pre transform evaluated at the
/// subject's parameters, joint at its bind pose or at zero), and, for labeling and solving
/// setups, one constraint per target (a rigid-body target of a labeling setup becomes a
/// `LabelingCluster` with one `LabelingConstraint` per marker). Records are kept on the bones,
/// constraints and setup so that converting the setup back gives the same records. Null, with
/// the reasons in `o_rErrors`, when an expression does not evaluate or an index is out of range.
std::unique_ptr<ParameterizedSetup> buildSetup(ESetupKind i_kind, const std::string& i_rName,
                                               const SubjectRecords& i_rRecords,
                                               std::vector<std::string>& o_rErrors);

/// Builds all three setups of `i_rRecords` and adds them to the top-level character named after
/// the subject, made when there is none (a character that has setups already loses them).
/// Top-level markers named "<subject>:<marker>" join the character as "<marker>". The scene is
/// untouched on failure. Returns the character, or null with the reasons in `o_rErrors`.
Character* addSubjectToScene(const SubjectRecords& i_rRecords, std::vector<std::string>& o_rErrors);

} // namespace AnvilCore
