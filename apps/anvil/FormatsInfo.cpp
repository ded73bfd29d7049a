#include "AnvilCore/SceneSummary.h"
#include "AnvilCore/io/SceneInputs.h"
#include "ModuleLoader.h"
#include "Subcommands.h"
#include "SubjectSummary.h"
#include "plugin/host/Database.h"
#include "plugin/host/FileExporter.h"
#include <cstdio>
#include <iostream>

namespace anvil {

int runFormats(const CommonArgs& i_rCommon, bool i_extensionsOnly) {
  LoadedModule module;
  std::string error;
  if (!module.load(i_rCommon.modulePath, error)) {
    printError(error);
    return EExitUsage;
  }
  FileExporterMgr* pMgr = g_db->getFileExporterMgr();
  if (i_extensionsOnly) {
    for (int i = 0; i < pMgr->getNumExporters(); ++i)
      std::printf("%s%s", i ? " " : "", pMgr->getExporterAt(i)->getExtension().GetStr());
    std::printf("\n");
    return EExitOk;
  }
  std::printf("%-6s %-34s %-9s %s\n", "ext", "description", "data type", "editable options");
  for (int i = 0; i < pMgr->getNumExporters(); ++i) {
    FileExporter* p = pMgr->getExporterAt(i);
    std::printf("%-6s %-34s %-9d %s\n", p->getExtension().GetStr(), p->getDescription().GetStr(),
                p->getDataType(), p->hasEditableOptions() ? "yes" : "no");
  }
  return EExitOk;
}

int runInfo(const CommonArgs&, const std::vector<std::string>& i_inputs) {
  // Subject files are summarised on their own; the other inputs make the scene.
  std::vector<std::string> sceneInputs;
  int subjectExit = EExitOk;
  for (const auto& input : i_inputs) {
    if (!isSubjectFile(input)) {
      sceneInputs.push_back(input);
    } else if (runSubjectInfo(input, std::cout) != EExitOk) {
      subjectExit = EExitWriteFailed;
    }
  }
  if (sceneInputs.empty()) return subjectExit;
  std::string error;
  if (!AnvilCore::loadSceneInputs(sceneInputs, error)) {
    printError(error);
    return EExitUsage;
  }
  AnvilCore::describeScene(std::cout);
  return subjectExit;
}

} // namespace anvil
