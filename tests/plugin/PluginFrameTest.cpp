// The module's entry functions and its two plug-in objects.
#include "plugin/AnvilFileExporterCommandsPlugin.h"
#include "plugin/AnvilFileExportersPlugin.h"
#include "plugin/PluginEntry.h"
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
  pSecond->deleteThis();
}

TEST(PluginEntry, ExportersLoadInTheHostsOrder) {
  const std::vector<std::string> hostOrder = {"c3d", "csm", "trc", "fbx", "kmf", "kmt",
                                              "kms", "kmr", "xcp", "usd", "mcp"};
  auto* pPlugin = static_cast<ExporterPluginBase*>(getPlugin(0));
  ASSERT_TRUE(pPlugin->loadExporters());
  ASSERT_GT(pPlugin->getNumExporters(), 0);
  size_t next = 0;
  for (int i = 0; i < pPlugin->getNumExporters(); ++i) {
    FileExporter* pExporter = pPlugin->getExporter(i);
    const std::string ext = pExporter->getExtension().GetStr();
    while (next < hostOrder.size() && hostOrder[next] != ext)
      ++next;
    ASSERT_LT(next, hostOrder.size()) << ext << " is out of the host's order";
    EXPECT_TRUE(pExporter->recognize(HString("take." + ext)));
    EXPECT_FALSE(pExporter->recognize(HString("take." + ext + "x")));
    EXPECT_FALSE(pExporter->recognize(HString("take.TRC")));
    EXPECT_EQ(pExporter->getRuntimeClass(), &FileExporter::s_classFileExporter);
    ++next;
  }
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
