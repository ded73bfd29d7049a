#pragma once
#include "AnvilCore/commands/CommandRegistry.h"
#include "plugin/host/Command.h"
#include "plugin/host/Database.h"
#include "plugin/host/FileExporter.h"
#include <gtest/gtest.h>
#include <string>
#include <vector>

/// Gives each option command test a fresh exporter manager, a command registry filled from the
/// command plug-in, and the log lines of the test.
class OptionCommandTest : public ::testing::Test {
protected:
  void SetUp() override;
  void TearDown() override;

  /// Registers a new exporter (owned by the manager).
  void addExporter(FileExporter* i_pExporter);
  /// Parses and runs one script line; false when it does not parse or the command fails.
  bool run(const std::string& i_line);
  /// The log lines so far as "error: text" / "warning: text".
  const std::vector<std::string>& log() const { return m_log; }

  /// Checks a command's description, category and options (names and types, in order; all
  /// of arity 1 and optional).
  void expectDeclaration(const char* i_pName, const char* i_pDescription,
                         const std::vector<std::pair<const char*, Variable::VarType>>& i_options);

  AnvilCore::CommandRegistry m_registry;
  std::vector<std::string> m_log;
};

/// `OptionCommandTest` with one live exporter of type `TExporter` registered.
template <typename TExporter> class ExporterCommandTest : public OptionCommandTest {
protected:
  void SetUp() override {
    OptionCommandTest::SetUp();
    m_pExporter = TExporter::createInstance();
    addExporter(m_pExporter);
  }
  TExporter* m_pExporter = nullptr;
};
