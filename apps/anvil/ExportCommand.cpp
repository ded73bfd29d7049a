#include "AnvilCore/ExportDriver.h"
#include "AnvilCore/io/SceneInputs.h"
#include "CommandOptions.h"
#include "ModuleLoader.h"
#include "Subcommands.h"
#include "plugin/host/Database.h"
#include "plugin/host/FileExporter.h"
#include "plugin/host/HInterface.h"
#include "plugin/host/HTimeManager.h"
#include <charconv>
#include <cstdio>

namespace anvil {

namespace {
bool parseFrame(const std::string& i_text, long long& o_rFrame) {
  const char* end = i_text.data() + i_text.size();
  auto [ptr, ec] = std::from_chars(i_text.data(), end, o_rFrame);
  return ec == std::errc() && ptr == end;
}

// "FIRST:LAST" in frames at the scene's rate.
bool parseRange(const std::string& i_text, HTimeRange& o_rRange, std::string& o_rError) {
  const size_t colon = i_text.find(':');
  long long first = 0, last = 0;
  if (colon == std::string::npos || !parseFrame(i_text.substr(0, colon), first) ||
      !parseFrame(i_text.substr(colon + 1), last)) {
    o_rError = "--range '" + i_text + "': expected FIRST:LAST frame numbers";
    return false;
  }
  if (last < first) {
    o_rError = "--range '" + i_text + "': the last frame comes before the first";
    return false;
  }
  const int64_t tpf = g_db->getTimeManager()->getTicksPerFrame();
  o_rRange = HTimeRange(first * tpf, last * tpf);
  return true;
}

std::string knownExtensions() {
  std::string text;
  FileExporterMgr* pMgr = g_db->getFileExporterMgr();
  for (int i = 0; i < pMgr->getNumExporters(); ++i)
    text += (i ? ", ." : ".") + std::string(pMgr->getExporterAt(i)->getExtension().GetStr());
  return text;
}
} // namespace

int runExport(const CommonArgs& i_rCommon, const ExportArgs& i_rArgs) {
  std::string error;
  const std::string setupPath =
      i_rCommon.userSetupPath.empty() ? HInterface::defaultPath() : i_rCommon.userSetupPath;
  if (!g_interface.load(setupPath, error)) {
    printError(error);
    return EExitUsage;
  }
  LoadedModule module;
  if (!module.load(i_rCommon.modulePath, error)) {
    printError(error);
    return EExitUsage;
  }
  FileExporterMgr* pMgr = g_db->getFileExporterMgr();
  // Every output must have an exporter before anything is read or written.
  std::vector<FileExporter*> exporters;
  for (const std::string& output : i_rArgs.outputs) {
    FileExporter* pExporter = pMgr->findForFile(HString(output));
    if (!pExporter) {
      printError(output + ": no exporter for this extension (known: " + knownExtensions() + ")");
      return EExitUsage;
    }
    exporters.push_back(pExporter);
  }
  // Options start from the user setup; script commands change them for this run only, unless
  // --save-setup asks to keep them.
  for (int i = 0; i < pMgr->getNumExporters(); ++i)
    pMgr->getExporterAt(i)->loadUserSetup();
  if (const int code = runExportCommands(module, i_rArgs.scripts, i_rArgs.commandLines);
      code != EExitOk)
    return code;

  if (!AnvilCore::loadSceneInputs(i_rArgs.inputs, error)) {
    printError(error);
    return EExitUsage;
  }
  AnvilCore::ExportRequest request;
  request.selectedOnly = i_rArgs.selectedOnly;
  if (!i_rArgs.range.empty()) {
    HTimeRange range;
    if (!parseRange(i_rArgs.range, range, error)) {
      printError(error);
      return EExitUsage;
    }
    request.range = range;
  }

  int exitCode = EExitOk;
  for (size_t i = 0; i < i_rArgs.outputs.size(); ++i) {
    request.path = i_rArgs.outputs[i];
    error.clear();
    const AnvilCore::EExportStatus status = AnvilCore::runExport(*exporters[i], request, error);
    if (status == AnvilCore::EExportStatus::EOk) {
      exporters[i]->saveUserSetup();
      g_db->logInfo("wrote %s", request.path.c_str());
      continue;
    }
    printError(error.empty() ? request.path + ": export failed; nothing written"
                             : error + "; nothing written");
    exitCode = EExitWriteFailed;
  }
  if (i_rArgs.saveSetup && !g_interface.save(error)) g_db->logWarning("%s", error.c_str());
  return exitCode;
}

} // namespace anvil
