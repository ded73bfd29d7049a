#include "KmfExportOptionsCmd.h"
#include "SubjectExportOptions.h"
#include "exporters/subject/KmfExporter.h"

KmfExportOptionsCmd::KmfExportOptionsCmd()
    : Command("kmfExportOptions", "Set Kmf Export Options", "") {
  SubjectExportOptions::declare(*this, false);
}

bool KmfExportOptionsCmd::doCommand(const CommandArgList& i_rArgs) {
  return SubjectExportOptions::apply<KmfExporter>(i_rArgs, ".kmf");
}
