#pragma once
#include "plugin/host/Command.h"

/// `mcpExportOptions`: sets the MCP exporter's options on the live exporter.
/// Options (all bool): 0 exportCameras, 1 exportSubjects, 2 exportCameraData,
/// 3 exportSubjectMotion.
class McpExportOptionsCmd : public Command {
public:
  McpExportOptionsCmd();
  /// False when there is no MCP exporter ("Could not find MCP exporter." is logged).
  bool doCommand(const CommandArgList& i_rArgs) override;
};
