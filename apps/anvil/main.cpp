// anvil: loads the export module, reads scenes and exports them.
#include "CheckCommand.h"
#include "CommandOptions.h"
#include "SchemaCommand.h"
#include "Subcommands.h"
#include <CLI/CLI.hpp>
#include <iostream>

int main(int argc, char** argv) {
  using namespace anvil;
  CLI::App app{"anvil: export motion-capture scenes with the AnvilFileExport module"};
  app.require_subcommand(1);
  CommonArgs common;
  app.add_option("--module", common.modulePath, "Path of libAnvilFileExport.so");
  app.add_option("--user-setup", common.userSetupPath,
                 "User setup file (default $XDG_CONFIG_HOME/anvil/usersetup.ini)");
  app.add_flag("-v,--verbose", common.verbose, "Show informational log lines");

  ExportArgs exportArgs;
  CLI::App* pExport = app.add_subcommand("export", "Load inputs into one scene and export it");
  pExport->add_option("inputs", exportArgs.inputs, "'demo' or scene files")->required();
  pExport
      ->add_option("-o,--output", exportArgs.outputs,
                   "Output file; the extension picks the exporter")
      ->required();
  pExport->add_option("--range", exportArgs.range, "Frames to export, FIRST:LAST");
  pExport->add_flag("--selected", exportArgs.selectedOnly, "Export only selected modules");
  pExport
      ->add_option("-c,--command", exportArgs.commandLines,
                   "Option command line run before exporting, e.g. 'c3dExportOptions -real false'")
      ->allow_extra_args(false);
  pExport->add_option("--script", exportArgs.scripts, "File of option command lines")
      ->allow_extra_args(false);
  pExport->add_option("--module", common.modulePath, "Path of libAnvilFileExport.so");
  pExport->add_option("--user-setup", common.userSetupPath, "User setup file");
  pExport->add_flag("--save-setup", exportArgs.saveSetup,
                    "Keep the options of this run in the user setup file for later runs");

  bool extensionsOnly = false;
  CLI::App* pFormats = app.add_subcommand("formats", "List the registered exporters");
  pFormats->add_flag("--extensions", extensionsOnly, "Print only the extensions, space-separated");
  pFormats->add_option("--module", common.modulePath, "Path of libAnvilFileExport.so");

  std::vector<std::string> infoInputs;
  CLI::App* pInfo = app.add_subcommand("info", "Summarise a scene");
  pInfo
      ->add_option("inputs", infoInputs,
                   "'demo', scene files or subject files (.kmt .kmf .kms .kmr)")
      ->required();

  std::vector<std::string> checkInputs;
  bool checkJson = false;
  CLI::App* pCheck = app.add_subcommand(
      "check", "Check the subjects of subject files and scenes; exit 1 when a check fails");
  pCheck
      ->add_option("inputs", checkInputs,
                   "Subject files (.kmt .kmf .kms .kmr), 'demo' or scene files")
      ->required();
  pCheck->add_flag("--json", checkJson, "Print the messages as a JSON array");

  std::string schemaLanguage, schemaOutput;
  CLI::App* pSchema = app.add_subcommand("schema", "Write the XSD of a file language");
  pSchema->add_option("language", schemaLanguage, "'kmt'")->required();
  pSchema->add_option("-o,--output", schemaOutput, "Output file")->required();

  CLI::App* pCommands =
      app.add_subcommand("commands", "List the option commands and their options");
  pCommands->add_option("--module", common.modulePath, "Path of libAnvilFileExport.so");

  try {
    app.parse(argc, argv);
  } catch (const CLI::ParseError& e) {
    if (e.get_exit_code() == 0) return app.exit(e);
    app.exit(e);
    return EExitUsage;
  }

  installLogSink(common.verbose);
  if (pExport->parsed()) return runExport(common, exportArgs);
  if (pFormats->parsed()) return runFormats(common, extensionsOnly);
  if (pInfo->parsed()) return runInfo(common, infoInputs);
  if (pCommands->parsed()) return runCommandsListing(common.modulePath);
  if (pSchema->parsed()) return runSchema(schemaLanguage, schemaOutput);
  if (pCheck->parsed()) return runCheck(checkInputs, checkJson, std::cout);
  return EExitUsage;
}
