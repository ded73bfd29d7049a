#include "plugin/host/SubjectManager.h"
#include "plugin/host/Character.h"
#include "plugin/host/Database.h"
#include "plugin/host/Marker.h"
#include <vector>

namespace {
// Subjects are the characters at the top of the scene, in scene order.
std::vector<Character*> subjects(bool i_selectedOnly) {
  std::vector<Character*> result;
  Module* pRoot = g_db->getRoot();
  for (int i = 0; i < pRoot->getNumChildren(); ++i) {
    Module* p = pRoot->getChild(i);
    if (p->isKindOf(&Character::s_classCharacter) && (!i_selectedOnly || p->isSelected()))
      result.push_back(static_cast<Character*>(p));
  }
  return result;
}

Character* at(const std::vector<Character*>& i_rList, int i_index) {
  return (i_index >= 0 && size_t(i_index) < i_rList.size()) ? i_rList[size_t(i_index)] : nullptr;
}
} // namespace

int SubjectManager::getNumSubjects() const {
  return static_cast<int>(subjects(false).size());
}
Character* SubjectManager::getSubject(int i_index) const {
  return at(subjects(false), i_index);
}
int SubjectManager::getNumSelectedSubjects() const {
  return static_cast<int>(subjects(true).size());
}
Character* SubjectManager::getSelectedSubject(int i_index) const {
  return at(subjects(true), i_index);
}

bool SubjectManager::subjectsHaveAnimation() const {
  std::vector<Module*> modules;
  for (Character* pSubject : subjects(false)) {
    modules.clear();
    pSubject->collect(modules);
    for (Module* p : modules)
      if (p->isKindOf(&Node::s_classNode) && !p->isKindOf(&Marker::s_classMarker) &&
          static_cast<Node*>(p)->isAnimated())
        return true;
  }
  return false;
}
