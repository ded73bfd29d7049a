#include "TrcExportOptionsCmd.h"
#include "ExportOptionsCommand.h"
#include "exporters/trajectory/TrcExporter.h"

using namespace ExportOptionsCommand;

namespace {
enum ETrcOption : uint64_t {
  EWriteSubjectNames,
  ERemoveLeadingUnderscore,
  EWriteUnlabeled,
  ECollapseSubjects,
};
} // namespace

TrcExportOptionsCmd::TrcExportOptionsCmd()
    : Command("trcExportOptions", "Set TRC Export Options", "") {
  declareOptions(*this, {{"writeSubjectNames", Variable::EBool},
                         {"removeLeadingUnderscore", Variable::EBool},
                         {"writeUnlabeled", Variable::EBool},
                         {"collapseSubjects", Variable::EBool}});
}

bool TrcExportOptionsCmd::doCommand(const CommandArgList& i_rArgs) {
  return applyOptions<TrcExporter>(
      i_rArgs, ".trc", "Could not find TRC exporter.",
      [](TrcExporter& io_rExporter, uint64_t i_id, const Variable& i_rValue) {
        switch (i_id) {
        case EWriteSubjectNames:
          io_rExporter.setWriteSubjects(boolValue(i_rValue, io_rExporter.getWriteSubjects()));
          break;
        case ERemoveLeadingUnderscore:
          io_rExporter.setRemoveLeadingUnderscores(
              boolValue(i_rValue, io_rExporter.getRemoveLeadingUnderscores()));
          break;
        case EWriteUnlabeled:
          io_rExporter.setWriteUnlabelled(boolValue(i_rValue, io_rExporter.getWriteUnlabelled()));
          break;
        case ECollapseSubjects:
          io_rExporter.setCollapseSubjects(boolValue(i_rValue, io_rExporter.getCollapseSubjects()));
          break;
        default:
          break;
        }
        return true;
      });
}
