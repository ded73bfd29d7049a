#include "ExportDriver.h"
#include "plugin/host/AudioSource.h"
#include "plugin/host/Character.h"
#include "plugin/host/Database.h"
#include "plugin/host/FileExporter.h"
#include "plugin/host/HTimeManager.h"
#include "plugin/host/Marker.h"
#include "plugin/host/OperationStack.h"
#include "plugin/host/OpticalCamera.h"
#include "plugin/host/VideoCamera.h"
#include <cerrno>
#include <cstdio>
#include <cstring>
#include <filesystem>
#include <unistd.h>

namespace AnvilCore {

int dataTypeOf(const Module* i_pModule) {
  if (i_pModule->isKindOf(&Marker::s_classMarker)) return EDataMarkers;
  if (i_pModule->isKindOf(&Character::s_classCharacter)) return EDataSubjects;
  if (i_pModule->isKindOf(&AudioSource::s_classAudioSource)) return EDataAudio;
  if (i_pModule->isKindOf(&OpticalCamera::s_classOpticalCamera)) return EDataOpticalCameras;
  if (i_pModule->isKindOf(&VideoCamera::s_classVideoCamera)) return EDataVideoCameras;
  if (i_pModule->isKindOf(&Node::s_classNode)) return EDataNodes;
  return 0;
}

namespace {
bool selectedOrUnderSelection(const Module* i_pModule) {
  for (const Module* p = i_pModule; p; p = p->getParent())
    if (p->isSelected()) return true;
  return false;
}

std::string temporarySibling(const std::string& i_path) {
  const std::filesystem::path path(i_path);
  return (path.parent_path() /
          ("." + path.filename().string() + ".anvil-" + std::to_string(::getpid()) + ".tmp"))
      .string();
}
} // namespace

EExportStatus runExport(FileExporter& i_rExporter, const ExportRequest& i_rRequest,
                        std::string& o_rError) {
  const std::string temp = temporarySibling(i_rRequest.path);
  // Probe that the output's folder takes a new file before the exporter runs.
  if (FILE* pProbe = std::fopen(temp.c_str(), "wb")) {
    std::fclose(pProbe);
  } else {
    o_rError = "cannot create '" + i_rRequest.path + "': " + std::strerror(errno);
    return EExportStatus::ECannotOpen;
  }

  FILE* pStream = i_rExporter.openFile(HString(temp), i_rExporter.isBinary());
  i_rExporter.setStream(pStream);
  i_rExporter.setFilePath(HString(i_rRequest.path));

  TSimpleArray<Module*>& modules = i_rExporter.moduleList();
  modules.removeAll();
  const int mask = i_rExporter.getDataType();
  const bool selectedOnly =
      i_rRequest.selectedOnly || g_db->getFileExporterMgr()->getExportSelectedOnly();
  for (Module* p : g_db->getModules()) {
    if (!(dataTypeOf(p) & mask)) continue;
    if (selectedOnly && !selectedOrUnderSelection(p)) continue;
    modules.add(p);
  }
  i_rExporter.setTimeRange(i_rRequest.range ? *i_rRequest.range
                                            : g_db->getTimeManager()->getAnimRange());

  g_theOperationStack.setLabel(HString(std::filesystem::path(i_rRequest.path).filename().string()));
  i_rExporter.reset();
  bool ok = i_rExporter.write();
  g_theOperationStack.endTask();

  long written = 0;
  bool streamFailed = false;
  if (pStream) {
    streamFailed = std::fflush(pStream) != 0 || std::ferror(pStream);
    written = std::ftell(pStream);
  }
  i_rExporter.closeFile(pStream);
  i_rExporter.setStream(nullptr);

  std::error_code ec;
  if (!ok || streamFailed) {
    std::filesystem::remove(temp, ec);
    if (streamFailed) o_rError = "error writing '" + i_rRequest.path + "'";
    return EExportStatus::EWriteFailed;
  }
  // A stream left empty means the exporter wrote the output path by its own means.
  if (written > 0) {
    std::filesystem::rename(temp, i_rRequest.path, ec);
    if (ec) {
      o_rError = "cannot replace '" + i_rRequest.path + "': " + ec.message();
      std::filesystem::remove(temp, ec);
      return EExportStatus::ECannotOpen;
    }
  } else {
    std::filesystem::remove(temp, ec);
  }
  return EExportStatus::EOk;
}

} // namespace AnvilCore
