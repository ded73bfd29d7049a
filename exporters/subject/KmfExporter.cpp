#include "KmfExporter.h"
#include "SubspaceCopy.h"
#include "plugin/host/AnvilSubjectCoreTypesConversion.h"
#include "plugin/host/Character.h"
#include "plugin/host/LabelingBone.h"
#include "plugin/host/LabelingSetup.h"

KmfExporter* KmfExporter::createInstance() {
  return new KmfExporter();
}

KmfExporter::KmfExporter()
    : SubjectFileExporter({"kmf", "Ostra Labeling Setup File", "KMFExporter", "LabelingSetup",
                           "LabelingBone", "KMF", &LabelingSetup::s_classLabelingSetup,
                           &LabelingBone::s_classLabelingBone, 0, false, true}) {}

void KmfExporter::fetchSubspace(Character&, const AnvilSubjectCoreTypesConversion& i_rConversion,
                                CoreOstraTypes::VSubjectDynamicSubspace& o_rSubspace) {
  const LabelingSetup* pSetup = i_rConversion.getCharacterInScene()->getLabelingSetup(false);
  if (!pSetup) return;
  copySubspace(pSetup->getSubspace(), o_rSubspace);
}
