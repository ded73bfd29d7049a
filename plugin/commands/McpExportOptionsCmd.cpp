#include "McpExportOptionsCmd.h"
#include "ExportOptionsCommand.h"
#include "exporters/mcp/AnvilMCPExporter.h"

using namespace ExportOptionsCommand;

namespace {
enum EMcpOption : uint64_t {
  EExportCameras,
  EExportSubjects,
  EExportCameraData,
  EExportSubjectMotion,
};
} // namespace

McpExportOptionsCmd::McpExportOptionsCmd()
    : Command("mcpExportOptions", "Set MCP Export Options", "") {
  declareOptions(*this, {{"exportCameras", Variable::EBool},
                         {"exportSubjects", Variable::EBool},
                         {"exportCameraData", Variable::EBool},
                         {"exportSubjectMotion", Variable::EBool}});
}

bool McpExportOptionsCmd::doCommand(const CommandArgList& i_rArgs) {
  return applyOptions<AnvilMCPExporter>(
      i_rArgs, ".mcp", "Could not find MCP exporter.",
      [](AnvilMCPExporter& io_rExporter, uint64_t i_id, const Variable& i_rValue) {
        switch (i_id) {
        case EExportCameras:
          io_rExporter.setExportCameras(boolValue(i_rValue, io_rExporter.getExportCameras()));
          break;
        case EExportSubjects:
          io_rExporter.setExportSubjects(boolValue(i_rValue, io_rExporter.getExportSubjects()));
          break;
        case EExportCameraData:
          io_rExporter.setExportCamerasDynamicData(
              boolValue(i_rValue, io_rExporter.getExportCamerasDynamicData()));
          break;
        case EExportSubjectMotion:
          io_rExporter.setExportSubjectsDynamicData(
              boolValue(i_rValue, io_rExporter.getExportSubjectsDynamicData()));
          break;
        default:
          break;
        }
        return true;
      });
}
