#include "AnvilFileExportersPlugin.h"
#include "exporters/camera/XCPExporter.h"
#include "exporters/trajectory/C3DExporter.h"
#include "exporters/trajectory/CsmExporter.h"
#include "exporters/trajectory/TrcExporter.h"

AnvilFileExportersPlugin* AnvilFileExportersPlugin::createInstance() {
  return new AnvilFileExportersPlugin();
}

bool AnvilFileExportersPlugin::loadExporters() {
  // The host lists exporters in this order.
  m_exporters.add(C3DExporter::createInstance());
  m_exporters.add(CsmExporter::createInstance());
  m_exporters.add(TrcExporter::createInstance());
  m_exporters.add(XCPExporter::createInstance());
  return true;
}
