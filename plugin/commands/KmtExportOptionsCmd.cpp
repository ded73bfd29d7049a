#include "KmtExportOptionsCmd.h"
#include "SubjectExportOptions.h"
#include "exporters/subject/KmtExporter.h"

KmtExportOptionsCmd::KmtExportOptionsCmd()
    : Command("kmtExportOptions", "Set Kmt Export Options", "") {
  SubjectExportOptions::declare(*this, false);
}

bool KmtExportOptionsCmd::doCommand(const CommandArgList& i_rArgs) {
  return SubjectExportOptions::apply<KmtExporter>(i_rArgs, ".kmt");
}
