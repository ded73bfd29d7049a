#include "KmsExporter.h"
#include "SubspaceCopy.h"
#include "plugin/host/AnvilSubjectCoreTypesConversion.h"
#include "plugin/host/Character.h"
#include "plugin/host/Database.h"
#include "plugin/host/SolvingBone.h"
#include "plugin/host/SolvingSetup.h"

KmsExporter* KmsExporter::createInstance() {
  return new KmsExporter();
}

KmsExporter::KmsExporter()
    : SubjectFileExporter({"kms", "Ostra Solving Setup File", "KMSExporter", "SolvingSetup",
                           "SolvingBone", "KMS", &SolvingSetup::s_classSolvingSetup,
                           &SolvingBone::s_classSolvingBone, 1, true, false}) {}

void KmsExporter::checkCharacter(const Character& i_rCharacter) {
  if (i_rCharacter.isProp())
    g_db->logWarning("Harrow no longer uses KMS files for props. Please export the prop as a KMF "
                     "instead.");
}

void KmsExporter::fetchSubspace(Character& i_rCharacter, const AnvilSubjectCoreTypesConversion&,
                                CoreOstraTypes::VSubjectDynamicSubspace& o_rSubspace) {
  if (const SolvingSetup* pSetup = i_rCharacter.getSolvingSetup(false))
    copySubspace(pSetup->getSubspace(), o_rSubspace);
}

void KmsExporter::prepareRecords(Character&, const AnvilSubjectCoreTypesConversion& i_rConversion,
                                 CoreOstraTypes::VSubjectParametrised& io_rSubject,
                                 CoreOstraTypes::VSubjectApplicationData&) {
  if (getExportAsRetargetPose()) i_rConversion.populateBindPose(io_rSubject);
}
