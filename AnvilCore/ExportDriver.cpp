#include "ExportDriver.h"
#include "Utils/UtilsFileSystem/ReplacingFile.h"
#include "plugin/host/AudioSource.h"
#include "plugin/host/Character.h"
#include "plugin/host/Database.h"
#include "plugin/host/FileExporter.h"
#include "plugin/host/HTimeManager.h"
#include "plugin/host/Marker.h"
#include "plugin/host/OperationStack.h"
#include "plugin/host/OpticalCamera.h"
#include "plugin/host/VideoCamera.h"
#include <cstdio>
#include <filesystem>

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

} // namespace

EExportStatus runExport(FileExporter& i_rExporter, const ExportRequest& i_rRequest,
                        std::string& o_rError) {
  // The stream goes to a temporary sibling that replaces the output only when all went well.
  UtilsFileSystem::VReplacingFile output;
  if (output.Open(i_rRequest.path).IsFailure()) {
    o_rError = "cannot create '" + i_rRequest.path + "': " + output.Reason();
    return EExportStatus::ECannotOpen;
  }
  FILE* pStream = output.File();
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
  UtilsFileSystem::ClearLastReplaceFailure();
  const bool ok = i_rExporter.write();
  g_theOperationStack.endTask();
  i_rExporter.setStream(nullptr);

  if (!ok) {
    // The exporter may have stopped because its stream failed, or, writing by path, failed
    // quietly: the file layer knows why.
    std::fflush(pStream);
    const int streamError = output.WriteError();
    output.Abandon();
    const UtilsFileSystem::VReplaceFailure& failure = UtilsFileSystem::LastReplaceFailure();
    if (streamError)
      o_rError = "error writing '" + i_rRequest.path + "': " +
                 UtilsFileSystem::DescribeError(streamError);
    else if (!failure.m_Reason.empty())
      o_rError = "error writing '" + failure.m_Target + "': " + failure.m_Reason;
    return EExportStatus::EWriteFailed;
  }
  // A stream left empty means the exporter wrote the output path by its own means.
  if (output.Size() == 0 && !std::ferror(pStream)) {
    output.Abandon();
    return EExportStatus::EOk;
  }
  if (output.Commit().IsFailure()) {
    o_rError = "error writing '" + i_rRequest.path + "': " + output.Reason();
    return EExportStatus::EWriteFailed;
  }
  return EExportStatus::EOk;
}

} // namespace AnvilCore
