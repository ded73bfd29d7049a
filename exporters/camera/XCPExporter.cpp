#include "XCPExporter.h"
#include "XcpWriter.h"
#include "plugin/host/CalibrationMgr.h"
#include "plugin/host/Database.h"
#include "plugin/host/HCameraConverter.h"
#include "plugin/host/OpticalCamera.h"
#include <map>

XCPExporter* XCPExporter::createInstance() {
  return new XCPExporter();
}

XCPExporter::XCPExporter() : FileExporter(false, "xcp", true) {}

bool XCPExporter::recognize(const HString& i_rFilename) {
  return extractExtension(i_rFilename) == "xcp";
}

namespace {
XcpCameraRecord recordOf(const OpticalCamera& i_rCamera) {
  XcpCameraRecord record;
  HCameraConverter::convertOpticalCameraToVCameraHardware(i_rCamera, record.m_Hardware);
  record.m_DeviceId = XcpDeviceIdOfURN(record.m_Hardware.m_DeviceURN);
  record.m_CalibrationPresent = i_rCamera.isCalibrated();
  if (record.m_CalibrationPresent)
    HCameraConverter::convertOpticalCameraToVCameraCalibration(i_rCamera, record.m_Calibration);
  record.m_DetailsPresent = i_rCamera.isCalibrationTempSet() || i_rCamera.isCalibrationTimeSet();
  if (record.m_DetailsPresent)
    HCameraConverter::convertOpticalCameraToVCameraCalibrationDetails(i_rCamera, record.m_Details);
  HCameraConverter::convertOpticalCameraToVCameraMask(i_rCamera, record.m_Mask);
  record.m_UserId = i_rCamera.getCameraNumber() - 1;
  record.m_IsDV = i_rCamera.isDV();
  record.m_Name = i_rCamera.getName().GetString();
  return record;
}
} // namespace

bool XCPExporter::write() {
  XcpWriter writer(false);
  // One camera per number, in number order; the first camera of a number wins.
  std::map<int, const OpticalCamera*> cameras;
  for (int i = 0; i < g_db->getNumOpticalCameras(); ++i) {
    const OpticalCamera* pCamera = g_db->getOpticalCamera(i);
    cameras.emplace(pCamera->getCameraNumber(), pCamera);
  }
  writer.setSource("HarrowPost");
  writer.setUpAxis(g_db->isZUp() ? "Z" : "Y");
  const HVolumeProperties& volume = g_db->getCalibrationMgr()->getVolumeProperties();
  writer.setFloorExtents(volume.m_FloorMinX, volume.m_FloorMaxX, volume.m_FloorMinYZ,
                         volume.m_FloorMaxYZ);
  for (const auto& [number, pCamera] : cameras)
    writer.addCamera(recordOf(*pCamera), 0);
  return writer.save(m_filePath.GetString());
}
