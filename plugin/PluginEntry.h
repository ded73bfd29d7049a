#pragma once
#include "plugin/host/Plugin.h"

/// The plain functions the host looks up in the module.
extern "C" {
__attribute__((visibility("default"))) unsigned int apiVersion();
__attribute__((visibility("default"))) bool isDebug();
__attribute__((visibility("default"))) unsigned int getNumPlugins();
__attribute__((visibility("default"))) DruCorePluginBase* getPlugin(int i_index);
__attribute__((visibility("default"))) bool isAxiom();
}

/// The module's API version; a host refuses any other.
constexpr unsigned int kAnvilFileExportApiVersion = 0x80000;
