#pragma once
// Runs one export through the host's driver into a fresh temporary file and reads it back.
#include "AnvilCore/ExportDriver.h"
#include "plugin/host/FileExporter.h"
#include <filesystem>
#include <fstream>
#include <gtest/gtest.h>
#include <memory>
#include <sstream>
#include <string>
#include <unistd.h>
#include <vector>

namespace ExportTest {

/// A file path in a per-process temporary folder, removed with the folder at exit of the test.
inline std::string tempPath(const std::string& i_rName) {
  const std::filesystem::path dir =
      std::filesystem::temp_directory_path() / ("anvil-export-test-" + std::to_string(::getpid()));
  std::filesystem::create_directories(dir);
  return (dir / i_rName).string();
}

inline std::string readText(const std::string& i_rPath) {
  std::ifstream in(i_rPath, std::ios::binary);
  std::ostringstream text;
  text << in.rdbuf();
  return text.str();
}

/// Exports to `i_rPath` and returns the file's text; fails the test when the export fails.
inline std::string exportText(FileExporter& i_rExporter, const std::string& i_rPath) {
  AnvilCore::ExportRequest request;
  request.path = i_rPath;
  std::string error;
  const AnvilCore::EExportStatus status = AnvilCore::runExport(i_rExporter, request, error);
  EXPECT_EQ(status, AnvilCore::EExportStatus::EOk) << error;
  return readText(i_rPath);
}

/// An exporter owned by a test, released with `deleteThis` as the host does.
struct Release {
  void operator()(FileExporter* i_pExporter) const { i_pExporter->deleteThis(); }
};
template <typename T> using Owned = std::unique_ptr<T, Release>;

/// The text split into lines, without their newlines.
inline std::vector<std::string> lines(const std::string& i_rText) {
  std::vector<std::string> result;
  std::istringstream in(i_rText);
  for (std::string line; std::getline(in, line);)
    result.push_back(line);
  return result;
}

} // namespace ExportTest
