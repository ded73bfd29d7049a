#include "UsdExportOptionsCmd.h"
#include "ExportOptionsCommand.h"
#include "exporters/scene/USDExporter.h"

using namespace ExportOptionsCommand;

namespace {
enum EUsdOption : uint64_t {
  EUpAxis,
  ERotateToFacePositive,
  EUnscaleRetargeting,
};
} // namespace

UsdExportOptionsCmd::UsdExportOptionsCmd()
    : Command("usdExportOptions", "Set Usd Export Options", "") {
  declareOptions(*this, {{"upAxis", Variable::EString},
                         {"rotateToFacePositive", Variable::EBool},
                         {"unscaleRetargeting", Variable::EBool}});
}

bool UsdExportOptionsCmd::doCommand(const CommandArgList& i_rArgs) {
  return applyOptions<USDExporter>(
      i_rArgs, ".usd", "Could not find USD exporter.",
      [](USDExporter& io_rExporter, uint64_t i_id, const Variable& i_rValue) {
        int axis = 0;
        switch (i_id) {
        case EUpAxis:
          if (upAxisValue(i_rValue, axis))
            io_rExporter.setDesiredUpAxis(USDExporter::EUpAxis(axis));
          break;
        case ERotateToFacePositive:
          io_rExporter.setRotateToFacePostive(
              boolValue(i_rValue, io_rExporter.getRotateToFacePostive()));
          break;
        case EUnscaleRetargeting:
          io_rExporter.setUnscaleRetargetingSubjects(
              boolValue(i_rValue, io_rExporter.getUnscaleRetargetingSubjects()));
          break;
        default:
          break;
        }
        return true;
      });
}
