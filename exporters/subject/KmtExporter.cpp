#include "KmtExporter.h"
#include "plugin/host/LabelingBone.h"
#include "plugin/host/LabelingSetup.h"

KmtExporter* KmtExporter::createInstance() {
  return new KmtExporter();
}

// A template holds no subspace, and reports its failures in KMF terms.
KmtExporter::KmtExporter()
    : SubjectFileExporter({"kmt", "Ostra Labeling Setup File", "KMTExporter", "LabelingSetup",
                           "LabelingBone", "KMF", &LabelingSetup::s_classLabelingSetup,
                           &LabelingBone::s_classLabelingBone, 0, false, true}) {}
