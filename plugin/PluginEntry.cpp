#include "PluginEntry.h"
#include "AnvilFileExporterCommandsPlugin.h"
#include "AnvilFileExportersPlugin.h"

extern "C" {
unsigned int apiVersion() {
  return kAnvilFileExportApiVersion;
}
bool isDebug() {
  return false;
}
unsigned int getNumPlugins() {
  return 2;
}
bool isAxiom() {
  return false;
}

DruCorePluginBase* getPlugin(int i_index) {
  switch (i_index) {
  case 0:
    return AnvilFileExportersPlugin::createInstance();
  case 1:
    return AnvilFileExporterCommandsPlugin::createInstance();
  default:
    return nullptr;
  }
}
}
