#include "AnvilFileExporterCommandsPlugin.h"

AnvilFileExporterCommandsPlugin* AnvilFileExporterCommandsPlugin::createInstance() {
  return new AnvilFileExporterCommandsPlugin();
}

bool AnvilFileExporterCommandsPlugin::loadCommands() {
  // Option commands join here, in the host's order, as their exporters gain them.
  return true;
}
