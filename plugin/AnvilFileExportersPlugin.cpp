#include "AnvilFileExportersPlugin.h"
#include "exporters/trajectory/TrcExporter.h"

AnvilFileExportersPlugin* AnvilFileExportersPlugin::createInstance() {
  return new AnvilFileExportersPlugin();
}

bool AnvilFileExportersPlugin::loadExporters() {
  // The host lists exporters in this order.
  m_exporters.add(TrcExporter::createInstance());
  return true;
}
