#include "KmrExporter.h"
#include "SubspaceCopy.h"
#include "plugin/host/AnvilSubjectCoreTypesConversion.h"
#include "plugin/host/Character.h"
#include "plugin/host/Database.h"
#include "plugin/host/HTimeManager.h"
#include "plugin/host/RetargetingBone.h"
#include "plugin/host/RetargetingSetup.h"

KmrExporter* KmrExporter::createInstance() {
  return new KmrExporter();
}

KmrExporter::KmrExporter()
    : SubjectFileExporter({"kmr", "Ostra Retargeting Setup File", "KMRExporter", "RetargetingSetup",
                           "RetargetingBone", "KMR", &RetargetingSetup::s_classRetargetingSetup,
                           &RetargetingBone::s_classRetargetingBone, 2, true, false}) {}

void KmrExporter::fetchSubspace(Character& i_rCharacter, const AnvilSubjectCoreTypesConversion&,
                                CoreOstraTypes::VSubjectDynamicSubspace& o_rSubspace) {
  if (const RetargetingSetup* pSetup = i_rCharacter.getRetargetingSetup(false))
    copySubspace(pSetup->getSubspace(), o_rSubspace);
}

void KmrExporter::prepareRecords(Character& i_rCharacter,
                                 const AnvilSubjectCoreTypesConversion& i_rConversion,
                                 CoreOstraTypes::VSubjectParametrised& io_rSubject,
                                 CoreOstraTypes::VSubjectApplicationData& io_rApplication) {
  if (!getExportAsRetargetPose()) return;
  HString source;
  source.Format("%s_%i", i_rCharacter.getName().GetStr(), g_db->getTimeManager()->getFrame());
  io_rApplication.m_RetargetSourceSubject = source.GetStr();
  i_rConversion.populateBindPose(io_rSubject);
}
