// The module's entry functions and its two plug-in objects.
#include "plugin/AnvilFileExporterCommandsPlugin.h"
#include "plugin/AnvilFileExportersPlugin.h"
#include "plugin/PluginEntry.h"
#include "plugin/host/Command.h"
#include "plugin/host/FileExporter.h"
#include <gtest/gtest.h>
#include <string>
#include <vector>

TEST(PluginEntry, ApiAndPluginObjects) {
  EXPECT_EQ(apiVersion(), 0x80000u);
  EXPECT_FALSE(isDebug());
  EXPECT_FALSE(isAxiom());
  EXPECT_EQ(getNumPlugins(), 2u);
  EXPECT_EQ(getPlugin(2), nullptr);
  EXPECT_EQ(getPlugin(-1), nullptr);

  DruCorePluginBase* pFirst = getPlugin(0);
  DruCorePluginBase* pAgain = getPlugin(0);
  ASSERT_NE(pFirst, nullptr);
  EXPECT_NE(pFirst, pAgain); // a new object on every call
  EXPECT_EQ(pFirst->getRuntimeClass(), &ExporterPluginBase::s_classExporterPluginBase);
  EXPECT_EQ(pFirst->getPluginName(), "File Exporters");
  EXPECT_EQ(pFirst->getPluginVendor(), "Ostra");
  EXPECT_EQ(pFirst->getPluginDate(), "Jun 30 2020");
  EXPECT_EQ(pFirst->getPluginApiText(), "2.00");
  pFirst->deleteThis();
  pAgain->deleteThis();

  DruCorePluginBase* pSecond = getPlugin(1);
  ASSERT_NE(pSecond, nullptr);
  EXPECT_TRUE(pSecond->isKindOf(&CommandPluginBase::s_classCommandPluginBase));
  EXPECT_FALSE(pSecond->isKindOf(&ExporterPluginBase::s_classExporterPluginBase));
  EXPECT_EQ(pSecond->getPluginName(), "File Exporter Commands");
  auto* pCommands = static_cast<CommandPluginBase*>(pSecond);
  EXPECT_TRUE(pCommands->loadCommands());
  EXPECT_TRUE(pCommands->unloadCommands());
  // The commands belong to whoever loaded them, as the exporters do.
  for (int i = 0; i < pCommands->getNumCommands(); ++i)
    pCommands->getCommand(i)->unref();
  pSecond->deleteThis();
}

namespace {
// The host lists exporters and commands in exactly this order; the lists grow as formats land
// (mcp takes its place between these).
const std::vector<std::string> kExporterOrder = {"c3d", "csm", "trc", "fbx", "kmf", "kmt",
                                                 "kms", "kmr", "xcp", "usd", "mcp"};
const std::vector<std::string> kCommandOrder = {
    "c3dExportOptions", "fbxExportOptions", "mcpExportOptions",
    "trcExportOptions", "kmtExportOptions", "kmfExportOptions",
    "kmsExportOptions", "kmrExportOptions", "usdExportOptions"};
} // namespace

TEST(PluginEntry, CommandsLoadInTheHostsOrder) {
  auto* pPlugin = static_cast<CommandPluginBase*>(getPlugin(1));
  ASSERT_TRUE(pPlugin->loadCommands());
  std::vector<std::string> names;
  for (int i = 0; i < pPlugin->getNumCommands(); ++i) {
    names.push_back(pPlugin->getCommand(i)->getName().GetStr());
    pPlugin->getCommand(i)->unref();
  }
  pPlugin->deleteThis();
  EXPECT_EQ(names, kCommandOrder);
}

TEST(PluginEntry, ExportersLoadInTheHostsOrder) {
  auto* pPlugin = static_cast<ExporterPluginBase*>(getPlugin(0));
  ASSERT_TRUE(pPlugin->loadExporters());
  std::vector<std::string> extensions;
  for (int i = 0; i < pPlugin->getNumExporters(); ++i) {
    FileExporter* pExporter = pPlugin->getExporter(i);
    const std::string ext = pExporter->getExtension().GetStr();
    extensions.push_back(ext);
    EXPECT_TRUE(pExporter->recognize(HString("take." + ext)));
    EXPECT_FALSE(pExporter->recognize(HString("take." + ext + "x")));
    EXPECT_FALSE(pExporter->recognize(HString("take.TRC")));
    EXPECT_EQ(pExporter->getRuntimeClass(), &FileExporter::s_classFileExporter);
  }
  EXPECT_EQ(extensions, kExporterOrder);
  // The exporters belong to whoever loaded them; the plug-in frees only its array.
  std::vector<FileExporter*> exporters;
  for (int i = 0; i < pPlugin->getNumExporters(); ++i)
    exporters.push_back(pPlugin->getExporter(i));
  pPlugin->deleteThis();
  for (FileExporter* p : exporters)
    p->deleteThis();
}

TEST(PluginEntry, ExtensionExtraction) {
  EXPECT_EQ(FileExporter::extractExtension("a/b.c/take.c3d"), "c3d");
  EXPECT_EQ(FileExporter::extractExtension("a/b.c/take"), "");
  EXPECT_EQ(FileExporter::extractExtension("take.tar.gz"), "gz");
}
