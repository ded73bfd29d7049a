// Every exporter, on a disk that fills up at any point of its file, keeps the old file, leaves no
// temporary file behind and says which file failed and why.
#include "AnvilCore/ExportDriver.h"
#include "AnvilCore/demo/DemoScene.h"
#include "RunExport.h"
#include "Utils/UtilsFileSystem/ReplacingFile.h"
#include "plugin/AnvilFileExportersPlugin.h"
#include "plugin/host/Database.h"
#include "plugin/host/FileExporter.h"

#include <gtest/gtest.h>

#include <cerrno>
#include <filesystem>
#include <fstream>

namespace {

namespace fs = std::filesystem;

class ExportFailureTest : public ::testing::Test {
protected:
  void SetUp() override {
    g_db->clearScene();
    AnvilCore::buildDemoScene();
    m_pPlugin = AnvilFileExportersPlugin::createInstance();
    ASSERT_TRUE(m_pPlugin->loadExporters());
    m_dir = fs::path(ExportTest::tempPath("failures"));
    fs::remove(m_dir);
    fs::create_directories(m_dir);
  }
  void TearDown() override {
    UtilsFileSystem::ClearWriteFault();
    for (int i = 0; i < m_pPlugin->getNumExporters(); ++i)
      m_pPlugin->getExporter(i)->deleteThis();
    m_pPlugin->deleteThis();
    fs::remove_all(m_dir);
  }

  std::vector<std::string> leftovers() const {
    std::vector<std::string> names;
    for (const auto& entry : fs::directory_iterator(m_dir))
      if (entry.path().filename().string().find(".anvil-") != std::string::npos)
        names.push_back(entry.path().filename().string());
    return names;
  }

  AnvilFileExportersPlugin* m_pPlugin = nullptr;
  fs::path m_dir;
};

TEST_F(ExportFailureTest, AFullDiskAnywhereKeepsTheOldFileAndSaysWhy) {
  for (int i = 0; i < m_pPlugin->getNumExporters(); ++i) {
    FileExporter& exporter = *m_pPlugin->getExporter(i);
    const std::string ext = exporter.getExtension().GetStr();
    SCOPED_TRACE(ext);
    const std::string path = (m_dir / ("demo." + ext)).string();

    // The whole file, to know where a fault can strike.
    AnvilCore::ExportRequest request;
    request.path = path;
    std::string error;
    ASSERT_EQ(AnvilCore::runExport(exporter, request, error), AnvilCore::EExportStatus::EOk)
        << error;
    const auto size = fs::file_size(path);
    ASSERT_GT(size, 0u);

    for (const std::uint64_t budget : {std::uint64_t(0), size / 3, size / 2}) {
      SCOPED_TRACE(budget);
      std::ofstream(path, std::ios::trunc) << "precious";
      error.clear();
      UtilsFileSystem::InjectWriteFault(budget, ENOSPC);
      const AnvilCore::EExportStatus status = AnvilCore::runExport(exporter, request, error);
      UtilsFileSystem::ClearWriteFault();
      EXPECT_EQ(status, AnvilCore::EExportStatus::EWriteFailed);
      EXPECT_EQ(ExportTest::readText(path), "precious");
      EXPECT_EQ(leftovers(), std::vector<std::string>{});
      EXPECT_NE(error.find(path), std::string::npos) << error;
      EXPECT_NE(error.find("disk full"), std::string::npos) << error;
    }
  }
}

TEST_F(ExportFailureTest, AFolderThatCannotTakeTheFileFailsBeforeWriting) {
  for (int i = 0; i < m_pPlugin->getNumExporters(); ++i) {
    FileExporter& exporter = *m_pPlugin->getExporter(i);
    const std::string ext = exporter.getExtension().GetStr();
    SCOPED_TRACE(ext);
    AnvilCore::ExportRequest request;
    request.path = (m_dir / "missing" / ("demo." + ext)).string();
    std::string error;
    EXPECT_EQ(AnvilCore::runExport(exporter, request, error),
              AnvilCore::EExportStatus::ECannotOpen);
    EXPECT_NE(error.find("does not exist"), std::string::npos) << error;

    // A folder where the file should be is refused, not replaced.
    request.path = (m_dir / ("folder." + ext)).string();
    fs::create_directories(request.path);
    EXPECT_EQ(AnvilCore::runExport(exporter, request, error),
              AnvilCore::EExportStatus::ECannotOpen);
    EXPECT_TRUE(fs::is_directory(request.path));
    EXPECT_NE(error.find("it is a folder"), std::string::npos) << error;
  }
}

} // namespace
