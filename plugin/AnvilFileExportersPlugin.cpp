#include "AnvilFileExportersPlugin.h"
#include "exporters/camera/XCPExporter.h"
#include "exporters/mcp/AnvilMCPExporter.h"
#include "exporters/scene/AnvilFbxExporter.h"
#include "exporters/scene/USDExporter.h"
#include "exporters/subject/KmfExporter.h"
#include "exporters/subject/KmrExporter.h"
#include "exporters/subject/KmsExporter.h"
#include "exporters/subject/KmtExporter.h"
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
  m_exporters.add(AnvilFbxExporter::createInstance());
  m_exporters.add(KmfExporter::createInstance());
  m_exporters.add(KmtExporter::createInstance());
  m_exporters.add(KmsExporter::createInstance());
  m_exporters.add(KmrExporter::createInstance());
  m_exporters.add(XCPExporter::createInstance());
  m_exporters.add(USDExporter::createInstance());
  m_exporters.add(AnvilMCPExporter::createInstance());
  return true;
}
