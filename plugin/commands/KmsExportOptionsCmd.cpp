#include "KmsExportOptionsCmd.h"
#include "SubjectExportOptions.h"
#include "exporters/subject/KmsExporter.h"

KmsExportOptionsCmd::KmsExportOptionsCmd()
    : Command("kmsExportOptions", "Set Kms Export Options", "") {
  SubjectExportOptions::declare(*this, true);
}

bool KmsExportOptionsCmd::doCommand(const CommandArgList& i_rArgs) {
  return SubjectExportOptions::apply<KmsExporter>(i_rArgs, ".kms");
}
