#include "plugin/host/SubjectScaler.h"
#include "plugin/host/Character.h"
#include "plugin/host/Database.h"
#include "plugin/host/RetargetingSetup.h"
#include "plugin/host/SubjectManager.h"

int SubjectScaler::unscaleRetargetingSubjects() {
  int count = 0;
  SubjectManager* pSubjects = g_db->getSubjectManager();
  for (int i = 0; i < pSubjects->getNumSubjects(); ++i) {
    RetargetingSetup* pSetup = pSubjects->getSubject(i)->getRetargetingSetup(false);
    if (!pSetup) continue;
    Vec3 pos, scale;
    AnvilRotation rot;
    pSetup->getConstLocalTransform(pos, rot, scale);
    pSetup->setStaticTransform(pos, rot, Vec3(1.0, 1.0, 1.0));
    pSetup->m_scaleTrack.clear();
    ++count;
  }
  return count;
}
