#include "KmrExportOptionsCmd.h"
#include "SubjectExportOptions.h"
#include "exporters/subject/KmrExporter.h"

KmrExportOptionsCmd::KmrExportOptionsCmd()
    : Command("kmrExportOptions", "Set Kmr Export Options", "") {
  SubjectExportOptions::declare(*this, true);
}

bool KmrExportOptionsCmd::doCommand(const CommandArgList& i_rArgs) {
  return SubjectExportOptions::apply<KmrExporter>(i_rArgs, ".kmr");
}
