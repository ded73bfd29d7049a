// Host services: the user setup store and the export driver's promises about output files.
#include "../support/HostFixture.h"
#include "AnvilCore/ExportDriver.h"
#include "plugin/host/FileExporter.h"
#include "plugin/host/HInterface.h"
#include <filesystem>
#include <fstream>
#include <gtest/gtest.h>
#include <sstream>
#include <unistd.h>

using namespace HostTest;
namespace fs = std::filesystem;

namespace {
fs::path scratch(const std::string& i_name) {
  const fs::path dir =
      fs::temp_directory_path() / ("anvil-host-test-" + std::to_string(::getpid()));
  fs::create_directories(dir);
  return dir / i_name;
}

std::string slurp(const fs::path& i_path) {
  std::ifstream in(i_path);
  std::ostringstream s;
  s << in.rdbuf();
  return s.str();
}

// Writes a fixed text, records what the host handed it, and fails on request.
class ProbeExporter : public FileExporter {
public:
  ProbeExporter() : FileExporter(false, "probe", false) {}
  int getDataType() override { return m_dataType; }
  bool write() override {
    seen.clear();
    for (Module* p : m_modules)
      seen.push_back(p->getName().GetStr());
    std::fputs("partial", m_pFile);
    if (fail) g_db->logError("probe failed");
    return !fail;
  }
  int m_dataType = EDataMarkers;
  bool fail = false;
  std::vector<std::string> seen;
};
} // namespace

TEST(UserSetup, PersistsTypedValuesAndKeepsDefaults) {
  const fs::path path = scratch("setup/usersetup.ini");
  fs::remove_all(path.parent_path());
  HInterface store;
  std::string error;
  ASSERT_TRUE(store.load(path.string(), error)) << error; // a missing file is an empty store
  const HString& scope = HString::EMPTY_STRING;
  EXPECT_EQ(store.getUserSetupInt("S", "K", 7, scope), 7);
  store.setUserSetupBool("C3DExporter", "Real", false, scope);
  store.setUserSetupDouble("C3DExporter", "Rate", 0.1, scope);
  store.setUserSetupInt("TRCExporter", "WriteUnlabelled", 1, scope);
  store.setUserSetupString("FBXExporter", "Version", "2019", scope);
  store.setUserSetupString("FBXExporter", "NamespaceMode", "short", scope);
  ASSERT_TRUE(store.save(error)) << error;

  HInterface reread;
  ASSERT_TRUE(reread.load(path.string(), error)) << error;
  EXPECT_FALSE(reread.getUserSetupBool("C3DExporter", "Real", true, scope));
  EXPECT_EQ(reread.getUserSetupDouble("C3DExporter", "Rate", 0.0, scope), 0.1);
  EXPECT_EQ(reread.getUserSetupInt("TRCExporter", "WriteUnlabelled", 0, scope), 1);
  EXPECT_EQ(reread.getUserSetupString("FBXExporter", "Version", "x", scope), "2019");
  // A value of the wrong type falls back to the default.
  EXPECT_EQ(reread.getUserSetupInt("FBXExporter", "NamespaceMode", 3, scope), 3);
  EXPECT_TRUE(reread.getUserSetupBool("FBXExporter", "NamespaceMode", true, scope));

  std::ofstream(path) << "[A]\nkey=1\nthis line is wrong\n";
  EXPECT_FALSE(reread.load(path.string(), error));
  EXPECT_NE(error.find(":3:"), std::string::npos) << error;
}

TEST(ExportDriver, FillsModuleListByDataTypeAndSelection) {
  resetScene(100.0, 3);
  Character* pSubject = addSubject("Sub");
  addMarker("A", {Vec3(1, 2, 3)}, pSubject);
  Marker* pB = addMarker("B", {Vec3(1, 2, 3)});
  g_db->addToScene(new Node("Bone"), false, pSubject, false, false);

  ProbeExporter probe;
  AnvilCore::ExportRequest request;
  request.path = scratch("list.probe").string();
  std::string error;
  ASSERT_EQ(AnvilCore::runExport(probe, request, error), AnvilCore::EExportStatus::EOk) << error;
  EXPECT_EQ(probe.seen, (std::vector<std::string>{"A", "B"}));

  probe.m_dataType = EDataMarkers | EDataSubjects | EDataNodes;
  ASSERT_EQ(AnvilCore::runExport(probe, request, error), AnvilCore::EExportStatus::EOk);
  EXPECT_EQ(probe.seen, (std::vector<std::string>{"Sub", "A", "Bone", "B"}));

  // Selecting a subject selects what lies under it.
  pSubject->setSelected(true);
  request.selectedOnly = true;
  ASSERT_EQ(AnvilCore::runExport(probe, request, error), AnvilCore::EExportStatus::EOk);
  EXPECT_EQ(probe.seen, (std::vector<std::string>{"Sub", "A", "Bone"}));
  pB->setSelected(true);
  ASSERT_EQ(AnvilCore::runExport(probe, request, error), AnvilCore::EExportStatus::EOk);
  EXPECT_EQ(probe.seen.size(), 4u);
}

TEST(ExportDriver, FailedWriteLeavesNoFileAndKeepsTheOldOne) {
  resetScene(100.0, 3);
  addMarker("A", {Vec3(1, 2, 3)});
  LogCapture log;
  ProbeExporter probe;
  probe.fail = true;
  AnvilCore::ExportRequest request;
  request.path = scratch("fail.probe").string();
  fs::remove(request.path);
  std::string error;
  EXPECT_EQ(AnvilCore::runExport(probe, request, error), AnvilCore::EExportStatus::EWriteFailed);
  EXPECT_FALSE(fs::exists(request.path));
  EXPECT_EQ(log.errors(), std::vector<std::string>{"probe failed"});

  std::ofstream(request.path) << "precious";
  EXPECT_EQ(AnvilCore::runExport(probe, request, error), AnvilCore::EExportStatus::EWriteFailed);
  EXPECT_EQ(slurp(request.path), "precious");
  for (const auto& entry : fs::directory_iterator(fs::path(request.path).parent_path()))
    EXPECT_EQ(entry.path().filename().string().find(".anvil-"), std::string::npos)
        << "temporary file left behind: " << entry.path();

  probe.fail = false;
  EXPECT_EQ(AnvilCore::runExport(probe, request, error), AnvilCore::EExportStatus::EOk);
  EXPECT_EQ(slurp(request.path), "partial");

  request.path = "/nonexistent-folder/x.probe";
  EXPECT_EQ(AnvilCore::runExport(probe, request, error), AnvilCore::EExportStatus::ECannotOpen);
  EXPECT_NE(error.find("/nonexistent-folder/x.probe"), std::string::npos);
}
