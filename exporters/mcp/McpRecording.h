#pragma once
// One MCP export: the store, the item lists and the writer of a single `write`.
#include "AnvilMCPExporter.h"
#include "Flow2/Flow2Types/IFlowHandles.h"
#include <array>
#include <string>
#include <vector>

class McpRecording {
public:
  explicit McpRecording(const McpExportOptions& i_rOptions) : m_options(i_rOptions) {}
  /// Records the scene to `i_rPath`; false, with the reason logged, when the file can't be
  /// written. A failed recording leaves any earlier file at the path untouched.
  bool write(const std::string& i_rPath);

private:
  using Items = std::vector<ZMT::IFlowItemHandle>;

  McpExportOptions m_options;
  std::vector<std::string> m_cameraNames;
  std::array<Items, 4> m_cameras;
  std::array<Items, 12> m_subjects;
};
