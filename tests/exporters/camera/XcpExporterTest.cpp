#include "exporters/camera/XCPExporter.h"
#include "exporters/camera/XcpCameraRecord.h"
#include "plugin/host/CalibrationMgr.h"
#include "plugin/host/Database.h"
#include "plugin/host/OpticalCamera.h"
#include "tests/exporters/RunExport.h"
#include <cmath>
#include <cstdlib>
#include <ctime>
#include <gtest/gtest.h>
#include <memory>

using namespace CoreOstraTypes;

namespace {

struct ExporterDeleter {
  void operator()(XCPExporter* p) const { p->deleteThis(); }
};

// Sets the process's time zone for the life of the object.
class TimeZone {
public:
  explicit TimeZone(const char* i_pZone) {
    if (const char* pOld = std::getenv("TZ")) m_old = pOld;
    setenv("TZ", i_pZone, 1);
    tzset();
  }
  ~TimeZone() {
    if (m_old.empty())
      unsetenv("TZ");
    else
      setenv("TZ", m_old.c_str(), 1);
    tzset();
  }

private:
  std::string m_old;
};

OpticalCamera* addCamera(int i_number, const char* i_pName) {
  auto* pCamera = new OpticalCamera(i_pName);
  pCamera->setCameraNumber(i_number);
  pCamera->setDeviceURN(HString("cam:") + HString(std::to_string(2100 + i_number)));
  pCamera->setCameraType("O16");
  pCamera->setDisplayType("Optical 16");
  pCamera->setSensorSize(4096, 4096);
  g_db->addToScene(pCamera, false, nullptr, false, false);
  return pCamera;
}

void calibrate(OpticalCamera& io_rCamera, const Vec3& i_rRotationVector) {
  io_rCamera.setCalibrated(true);
  io_rCamera.setCalibrationPose(Vec3(1000.0, -2000.0, 2500.5), i_rRotationVector);
  io_rCamera.setFocalLengthInPixels(3500.25);
  io_rCamera.setPrincipalPoint({2048.5, 2047.75});
  VCameraLensDistortion distortion;
  distortion.m_RadialParameters = {-0.125, 0.0625};
  io_rCamera.setDistortion(distortion);
  io_rCamera.setImageError(0.1);
}

class XcpExporterTest : public ::testing::Test {
protected:
  void SetUp() override {
    g_db->clearScene();
    g_db->getCalibrationMgr()->setVolumeProperties({-4000, 4000, -3000, 3000});
    m_pExporter.reset(XCPExporter::createInstance());
  }
  std::string exportText() {
    return ExportTest::exportText(*m_pExporter, ExportTest::tempPath("cameras.xcp"));
  }
  std::unique_ptr<XCPExporter, ExporterDeleter> m_pExporter;
  TimeZone m_utc{"UTC"};
};

const char* const kDeclaration = "<?xml version=\"1.0\" encoding=\"UTF-8\"?>\n";

TEST_F(XcpExporterTest, NoCamerasGivesTheRootWithItsAttributes) {
  EXPECT_EQ(exportText(), std::string(kDeclaration) +
                              "<Cameras VERSION=\"1.0\" SOURCE=\"HarrowPost\" UP_AXIS=\"Z\" "
                              "FLOOR_EXTENTS=\"-4000 4000 -3000 3000\"/>\n\n");
  g_db->setZUp(false);
  EXPECT_NE(exportText().find("UP_AXIS=\"Y\""), std::string::npos);
}

TEST_F(XcpExporterTest, WritesEveryElementAndAttributeInOrder) {
  OpticalCamera* pCamera = addCamera(1, "Cam & 1");
  calibrate(*pCamera, Vec3(0.0, 0.0, 0.0));
  pCamera->setDV(true);
  VCameraMaskGrid mask;
  mask.m_Data = "AAB";
  mask.m_TileWidth = 16;
  mask.m_TileHeight = 8;
  mask.m_GridWidth = 256;
  mask.m_GridHeight = 512;
  pCamera->setMaskGrid(mask);
  VCameraCalibrationDetail whole;
  whole.m_Type = ECameraCalibrationType::WandWave;
  whole.m_StartTemperature = 31;
  whole.m_StartTime = 1700000000123ull; // 2023-11-14 22:13:20.123 UTC
  whole.m_Id[0] = 0xAB;
  whole.m_Id[15] = 0x01;
  pCamera->setCalibrationDetail(whole);
  VCameraCalibrationDetail lens;
  lens.m_Type = static_cast<ECameraCalibrationType>(9);
  lens.m_EndTemperature = -5;
  pCamera->setIntrinsicsCalibrationDetail(lens);

  EXPECT_EQ(exportText(),
            std::string(kDeclaration) +
                "<Cameras VERSION=\"1.0\" SOURCE=\"HarrowPost\" UP_AXIS=\"Z\" "
                "FLOOR_EXTENTS=\"-4000 4000 -3000 3000\">\n"
                "\t<Camera DEVICEID=\"2101\" DEVICEURN=\"cam:2101\" USERID=\"0\" "
                "NAME=\"Cam &amp; 1\" TYPE=\"O16\" DISPLAY_TYPE=\"Optical 16\" ISDV=\"2\" "
                "SENSOR=\"\" SENSOR_SIZE=\"4096 4096\" PIXEL_ASPECT_RATIO=\"1\" "
                "ACTIVE_THRESHOLD=\"1\" SYSTEM=\"ZR\">\n"
                "\t\t<ThresholdGrid BIT_DEPTH=\"1\" DATA=\"AAB\" GRID_SIZE=\"256 512\" "
                "TILE_SIZE=\"16 8\"/>\n"
                "\t\t<Calibration START_TEMP=\"31\" START_TIME=\"2023-11-14 22:13:20.123 ST\" "
                "TYPE=\"WandWave\" ID=\"ab000000-0000-0000-0000-000000000001\"/>\n"
                "\t\t<IntrinsicsCalibration END_TEMP=\"-5\" TYPE=\"Unspecified\"/>\n"
                "\t\t<KeyFrames>\n"
                "\t\t\t<KeyFrame FRAME=\"0\" FOCAL_LENGTH=\"3500.25\" "
                "PRINCIPAL_POINT=\"2048.5 2047.75\" POSITION=\"1000 -2000 2500.5\" "
                "ORIENTATION=\"0 0 0 1\" OSTRA_RADIAL=\"-0.125 0.0625\" "
                "IMAGE_ERROR=\"0.10000000000000001\"/>\n"
                "\t\t</KeyFrames>\n"
                "\t</Camera>\n"
                "</Cameras>\n\n");
}

TEST_F(XcpExporterTest, SortsByCameraNumberAndKeepsTheFirstOfANumber) {
  addCamera(3, "third");
  addCamera(1, "first");
  addCamera(3, "third again");
  addCamera(2, "second");
  const std::string text = exportText();
  const size_t first = text.find("USERID=\"0\" NAME=\"first\"");
  const size_t second = text.find("USERID=\"1\" NAME=\"second\"");
  const size_t third = text.find("USERID=\"2\" NAME=\"third\"");
  ASSERT_NE(first, std::string::npos);
  ASSERT_NE(second, std::string::npos);
  ASSERT_NE(third, std::string::npos);
  EXPECT_LT(first, second);
  EXPECT_LT(second, third);
  EXPECT_EQ(text.find("third again"), std::string::npos);
}

TEST_F(XcpExporterTest, UncalibratedCameraWithoutDetailsHasAnEmptyKeyFrames) {
  addCamera(4, "bare");
  const std::string text = exportText();
  EXPECT_NE(text.find("<KeyFrames/>"), std::string::npos);
  EXPECT_EQ(text.find("Calibration"), std::string::npos);
  EXPECT_EQ(text.find("KeyFrame "), std::string::npos);
}

TEST_F(XcpExporterTest, ThreeParameterDistortionRaisesTheVersion) {
  OpticalCamera* pCamera = addCamera(1, "a");
  calibrate(*pCamera, Vec3(0.0, 0.0, M_PI / 2.0));
  calibrate(*addCamera(2, "b"), Vec3(0.0, 0.0, 0.0));
  VCameraLensDistortion distortion;
  distortion.m_Model = ECameraDistortionModel::Ostra3Parameter;
  distortion.m_RadialParameters = {0.5, -0.25, 0.125};
  distortion.m_RadialDistortionCentre = {2000.0, 2001.5};
  pCamera->setDistortion(distortion);
  const std::string text = exportText();
  EXPECT_NE(text.find("<Cameras VERSION=\"2.0\""), std::string::npos);
  EXPECT_NE(text.find("OSTRA_RADIAL2=\"Ostra3Parameter 2000 2001.5 0.5 -0.25 0.125\""),
            std::string::npos);
  EXPECT_NE(text.find("OSTRA_RADIAL=\"-0.125 0.0625\""), std::string::npos);
  // A quarter turn about Z: sin and cos of 45 degrees, to the last digit or two.
  EXPECT_NE(text.find("ORIENTATION=\"0 0 0.707106781186547"), std::string::npos) << text;
}

TEST_F(XcpExporterTest, DaylightSavingTimeIsMarked) {
  TimeZone berlin("CET-1CEST,M3.5.0,M10.5.0/3");
  VCameraCalibrationDetail detail;
  detail.m_StartTime = 1688212800000ull; // 2023-07-01 12:00:00 UTC
  detail.m_EndTime = 1704110400999ull;   // 2024-01-01 12:00:00.999 UTC
  addCamera(1, "a")->setCalibrationDetail(detail);
  const std::string text = exportText();
  EXPECT_NE(text.find("<Calibration START_TIME=\"2023-07-01 14:00:00.000 DST\" "
                      "END_TIME=\"2024-01-01 13:00:00.999 ST\" TYPE=\"NotSet\"/>"),
            std::string::npos)
      << text;
}

TEST_F(XcpExporterTest, UnwritablePathFailsWithoutAMessage) {
  std::vector<std::string> log;
  g_db->setLogSink([&](HLogLevel, const std::string& i_text) { log.push_back(i_text); });
  m_pExporter->setFilePath("/nonexistent-folder/cameras.xcp");
  EXPECT_FALSE(m_pExporter->write());
  EXPECT_TRUE(log.empty());
  g_db->setLogSink(nullptr);
}

TEST(XcpDeviceId, IsTheNumberBehindTheFirstColon) {
  EXPECT_EQ(XcpDeviceIdOfURN("cam:2101"), 2101);
  EXPECT_EQ(XcpDeviceIdOfURN("77"), 77);
  EXPECT_EQ(XcpDeviceIdOfURN("a:12:34"), 12);
  EXPECT_EQ(XcpDeviceIdOfURN("cam:serial"), 0);
  EXPECT_EQ(XcpDeviceIdOfURN("cam:99999999999"), INT32_MAX);
}

} // namespace
