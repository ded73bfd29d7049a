#pragma once
#include "HostExport.h"

class Character;

/// The scene's subjects (top-level characters) and which of them are selected.
class ANVIL_HOST_API SubjectManager {
public:
  int getNumSubjects() const;
  Character* getSubject(int i_index) const;
  int getNumSelectedSubjects() const;
  Character* getSelectedSubject(int i_index) const;
  /// True when any subject's bones carry keys.
  bool subjectsHaveAnimation() const;
};
