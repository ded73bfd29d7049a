#pragma once
#include "plugin/host/FileExporter.h"
#include <cstdint>

/// The four MCP flags, copied whole by `getOptions` and `setOptions`.
struct McpExportOptions {
  bool m_exportCameras = true;
  bool m_exportSubjects = true;
  bool m_exportCameraDynamicData = true;
  bool m_exportSubjectDynamicData = true;
};
static_assert(sizeof(McpExportOptions) == sizeof(std::uint32_t));

/// Records the scene as an MCP file: the cameras' and subjects' items once, then one state per
/// frame of the play range with those items, the frame's timecode and its dynamic items.
class AnvilMCPExporter : public FileExporter {
public:
  static AnvilMCPExporter* createInstance();
  void deleteThis() override { delete this; }

  bool getOptions(void* o_pOptions) override;
  bool setOptions(void* i_pOptions) override;
  FILE* openFile(const HString& i_rPath, bool i_binary) override;
  void closeFile(FILE* i_pFile) override;
  int getDataType() override { return 197; }
  HString getDescription() override { return "MCP"; }
  bool recognize(const HString& i_rFilename) override;
  bool hasEditableOptions() override { return true; }
  void loadUserSetup() override;
  void saveUserSetup() const override;
  /// Writes the file through its own stream (temporary sibling, then rename); false when it
  /// can't be opened or written, and the file is then left as it was.
  bool write() override;

  bool getExportCameras() const { return m_options.m_exportCameras; }
  void setExportCameras(bool i_value) { m_options.m_exportCameras = i_value; }
  bool getExportSubjects() const { return m_options.m_exportSubjects; }
  void setExportSubjects(bool i_value) { m_options.m_exportSubjects = i_value; }
  bool getExportCamerasDynamicData() const { return m_options.m_exportCameraDynamicData; }
  void setExportCamerasDynamicData(bool i_value) { m_options.m_exportCameraDynamicData = i_value; }
  bool getExportSubjectsDynamicData() const { return m_options.m_exportSubjectDynamicData; }
  void setExportSubjectsDynamicData(bool i_value) {
    m_options.m_exportSubjectDynamicData = i_value;
  }

private:
  AnvilMCPExporter();

  McpExportOptions m_options;
};
