#include "AnvilMCPExporter.h"
#include "McpRecording.h"
#include "plugin/host/Database.h"
#include "plugin/host/HInterface.h"
#include <cstdio>
#include <cstring>

namespace {
const char* const kSection = "MCPExporter";
} // namespace

AnvilMCPExporter* AnvilMCPExporter::createInstance() {
  return new AnvilMCPExporter();
}

AnvilMCPExporter::AnvilMCPExporter() : FileExporter(false, "mcp", true) {}

bool AnvilMCPExporter::getOptions(void* o_pOptions) {
  std::memcpy(o_pOptions, &m_options, sizeof(m_options));
  return true;
}

bool AnvilMCPExporter::setOptions(void* i_pOptions) {
  std::memcpy(&m_options, i_pOptions, sizeof(m_options));
  return true;
}

FILE* AnvilMCPExporter::openFile(const HString& i_rPath, bool i_binary) {
  return std::fopen(i_rPath.GetStr(), i_binary ? "wb" : "w");
}

void AnvilMCPExporter::closeFile(FILE* i_pFile) {
  if (i_pFile) std::fclose(i_pFile);
}

bool AnvilMCPExporter::recognize(const HString& i_rFilename) {
  return extractExtension(i_rFilename) == "mcp";
}

void AnvilMCPExporter::loadUserSetup() {
  const HString& scope = HString::EMPTY_STRING;
  McpExportOptions& o = m_options;
  o.m_exportCameras =
      g_interface.getUserSetupBool(kSection, "ExportCameras", o.m_exportCameras, scope);
  o.m_exportSubjects =
      g_interface.getUserSetupBool(kSection, "ExportSubjects", o.m_exportSubjects, scope);
  o.m_exportCameraDynamicData = g_interface.getUserSetupBool(kSection, "ExportCameraDynamicData",
                                                             o.m_exportCameraDynamicData, scope);
  o.m_exportSubjectDynamicData = g_interface.getUserSetupBool(kSection, "ExportSubjectDynamicData",
                                                              o.m_exportSubjectDynamicData, scope);
}

void AnvilMCPExporter::saveUserSetup() const {
  const HString& scope = HString::EMPTY_STRING;
  g_interface.setUserSetupBool(kSection, "ExportCameras", m_options.m_exportCameras, scope);
  g_interface.setUserSetupBool(kSection, "ExportSubjects", m_options.m_exportSubjects, scope);
  g_interface.setUserSetupBool(kSection, "ExportCameraDynamicData",
                               m_options.m_exportCameraDynamicData, scope);
  g_interface.setUserSetupBool(kSection, "ExportSubjectDynamicData",
                               m_options.m_exportSubjectDynamicData, scope);
}

bool AnvilMCPExporter::write() {
  McpRecording recording(m_options);
  return recording.write(m_filePath.GetString());
}
