#include "FbxHiddenModules.h"
#include "plugin/host/Character.h"
#include "plugin/host/Database.h"
#include "plugin/host/LabelingBone.h"
#include "plugin/host/LabelingCluster.h"
#include "plugin/host/LabelingConstraint.h"
#include "plugin/host/LabelingSetup.h"
#include "plugin/host/SubjectManager.h"

namespace FbxHiddenModules {

namespace {
// A prop without a solving setup is tracked by its labeling setup: that one stays.
bool keptForProp(const Module* i_pModule) {
  Character* pCharacter = i_pModule->getCharacterParent();
  return pCharacter && pCharacter->isProp() && !pCharacter->getSolvingSetup(false);
}
} // namespace

std::set<const Module*> labelingSetups(bool i_hide) {
  std::set<const Module*> hidden;
  if (!i_hide) return hidden;
  SubjectManager* pSubjects = g_db->getSubjectManager();
  for (int i = 0; i < pSubjects->getNumSubjects(); ++i) {
    Character* pSubject = pSubjects->getSubject(i);
    LabelingSetup* pSetup = pSubject->getLabelingSetup(false);
    if (!pSetup || (pSubject->isProp() && !pSubject->getSolvingSetup(false))) continue;
    hidden.insert(pSetup);
  }
  for (int i = g_db->getNumLabelingBones() - 1; i >= 0; --i)
    if (!keptForProp(g_db->getLabelingBone(i))) hidden.insert(g_db->getLabelingBone(i));
  for (int i = g_db->getNumLabelingConstraints() - 1; i >= 0; --i)
    if (!keptForProp(g_db->getLabelingConstraint(i))) hidden.insert(g_db->getLabelingConstraint(i));
  for (int i = g_db->getNumLabelingClusters() - 1; i >= 0; --i)
    if (!keptForProp(g_db->getLabelingCluster(i))) hidden.insert(g_db->getLabelingCluster(i));
  return hidden;
}

bool isHidden(const std::set<const Module*>& i_rHidden, const Module* i_pModule) {
  if (i_rHidden.empty()) return false;
  for (const Module* p = i_pModule; p; p = p->getParent())
    if (i_rHidden.count(p)) return true;
  return false;
}

} // namespace FbxHiddenModules
