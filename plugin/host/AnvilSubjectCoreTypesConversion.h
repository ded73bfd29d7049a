#pragma once
#include "HostExport.h"
#include "River/CoreOstraTypes/VSubjectApplicationData.h"
#include "River/CoreOstraTypes/VSubjectParametrised.h"
#include <string>
#include <vector>

class Character;
class ParameterizedSetup;

/// Turns a character of the scene into subject records, from one of its setups.
class ANVIL_HOST_API AnvilSubjectCoreTypesConversion {
public:
  /// Which setup a conversion reads: 0 the labeling setup (bones, constraints and clusters), 1
  /// the solving setup (bones and constraints), 2 the retargeting setup (bones only: no markers,
  /// targets or sticks). Any other value converts nothing.
  enum EMode { ELabeling = 0, ESolving = 1, ERetargeting = 2 };
  explicit AnvilSubjectCoreTypesConversion(int i_mode);

  /// Converts the character's setup of this mode. Segments are the bones depth first; markers
  /// are the setup's marker records followed by markers that only constraints name; targets
  /// are the constraints and clusters, in their order. Expression texts that bones and
  /// constraints carry are kept, unless `i_bakeExpressions`, which writes the nodes' numbers
  /// instead. False, with each reason logged as an error, when the character is null, has no
  /// setup of the mode, the setup has not exactly one root bone, or a constraint names a bone or
  /// rotation observation the setup does not have.
  bool characterToVSubject2(Character* i_pCharacter, bool i_bakeExpressions);

  const CoreOstraTypes::VSubjectParametrised& getSubjectParametrised() const { return m_subject; }
  const CoreOstraTypes::VSubjectApplicationData& getSubjectApplicationData() const {
    return m_application;
  }
  /// The character last converted, or null.
  Character* getCharacterInScene() const { return m_pCharacter; }
  /// The reasons of the last failure.
  const std::vector<std::string>& getErrors() const { return m_errors; }

  /// Sets the bind pose of every joint of `io_rSubject` that has parameters from the pose of the
  /// setup's bone of the segment's name at the current time (see SubjectJointPose.h for the
  /// joint conventions). Segments without such a bone keep theirs. False when nothing has been
  /// converted yet.
  bool populateBindPose(CoreOstraTypes::VSubjectParametrised& io_rSubject) const;

private:
  void fail(const std::string& i_rText);

  int m_mode;
  Character* m_pCharacter = nullptr;
  ParameterizedSetup* m_pSetup = nullptr;
  CoreOstraTypes::VSubjectParametrised m_subject;
  CoreOstraTypes::VSubjectApplicationData m_application;
  std::vector<std::string> m_errors;
};
