#pragma once
#include "AnvilCore/io/ISceneReader.h"
#include "plugin/host/Database.h"
#include "plugin/host/Module.h"
#include <gtest/gtest.h>
#include <string>
#include <vector>

/// A clean scene per test, a temporary folder for input files, and the scene read through the
/// registered reader of a file's extension.
class SceneReaderTest : public ::testing::Test {
protected:
  void SetUp() override;
  void TearDown() override;

  /// Writes `i_bytes` to a file named `i_name` in the test's folder; returns its path.
  std::string writeFile(const std::string& i_name, const std::string& i_bytes) const;
  std::string writeFile(const std::string& i_name, const std::vector<uint8_t>& i_bytes) const;
  /// Reads a path through the registry; the error message on failure.
  bool read(const std::string& i_path, std::string& o_rError) const;
  /// The module at a "\\"-separated path below the root ("Bob\\LFHD"), or null.
  Module* find(const std::string& i_path) const;
  /// Full paths of every module of the scene, in scene order.
  std::vector<std::string> sceneListing() const;

  std::string m_folder;
};
