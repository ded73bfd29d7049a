#include "AnvilCore/io/XcpReader.h"
#include "plugin/host/CalibrationMgr.h"
#include "plugin/host/Database.h"
#include "plugin/host/OpticalCamera.h"
#include <gtest/gtest.h>

using namespace CoreOstraTypes;

namespace {

const std::string kDocument = R"(<?xml version="1.0" encoding="UTF-8"?>
<Cameras VERSION="2.0" SOURCE="elsewhere" UP_AXIS="Y" FLOOR_EXTENTS="-10 10 -20 20">
  <Camera DEVICEID="12" DEVICEURN="cam:12" USERID="3" NAME="A" TYPE="T" DISPLAY_TYPE="D" ISDV="2"
          SENSOR="" SENSOR_SIZE="640 480" PIXEL_ASPECT_RATIO="1.5" ACTIVE_THRESHOLD="1" SYSTEM="ZR">
    <ThresholdGrid BIT_DEPTH="1" DATA="x" GRID_SIZE="40 30" TILE_SIZE="16 16"/>
    <Calibration START_TEMP="20" TYPE="AutoBumpHeal" ID="00112233-4455-6677-8899-aabbccddeeff"/>
    <KeyFrames>
      <KeyFrame FRAME="0" FOCAL_LENGTH="800" PRINCIPAL_POINT="320 240" POSITION="1 2 3"
                ORIENTATION="0 0 0 1" OSTRA_RADIAL2="Ostra3Parameter 319 241 0.1 0.2 0.3"
                IMAGE_ERROR="0.25"/>
    </KeyFrames>
  </Camera>
  <Camera DEVICEURN="cam:13" USERID="0" NAME="B" SENSOR_SIZE="640 480"><KeyFrames/></Camera>
</Cameras>
)";

class XcpReaderTest : public ::testing::Test {
protected:
  void SetUp() override { g_db->clearScene(); }
  // Reads a changed copy of the document and expects the error to contain `i_rExpected`.
  void expectError(const std::string& i_rFrom, const std::string& i_rTo,
                   const std::string& i_rExpected) {
    std::string text = kDocument;
    const size_t at = text.find(i_rFrom);
    ASSERT_NE(at, std::string::npos) << i_rFrom;
    text.replace(at, i_rFrom.size(), i_rTo);
    std::string error;
    EXPECT_FALSE(AnvilCore::readXcpDocument(text, "bad.xcp", error));
    EXPECT_NE(error.find(i_rExpected), std::string::npos) << error;
    EXPECT_EQ(error.rfind("bad.xcp: ", 0), 0u) << error;
    EXPECT_EQ(g_db->getNumOpticalCameras(), 0);
    EXPECT_TRUE(g_db->isZUp());
  }
};

TEST_F(XcpReaderTest, ReadsCamerasFloorAndUpAxis) {
  std::string error;
  ASSERT_TRUE(AnvilCore::readXcpDocument(kDocument, "cams.xcp", error)) << error;
  EXPECT_FALSE(g_db->isZUp());
  EXPECT_EQ(g_db->getCalibrationMgr()->getVolumeProperties(),
            (HVolumeProperties{-10, 10, -20, 20}));
  ASSERT_EQ(g_db->getNumOpticalCameras(), 2);
  const OpticalCamera* pA = g_db->getOpticalCamera(0);
  EXPECT_EQ(pA->getCameraNumber(), 4);
  EXPECT_TRUE(pA->isDV());
  EXPECT_EQ(pA->getDeviceURN(), "cam:12");
  EXPECT_EQ(pA->getSensorWidth(), 640);
  EXPECT_EQ(pA->getPixelAspectRatio(), 1.5);
  EXPECT_EQ(pA->getMaskGrid().m_GridWidth, 40);
  ASSERT_TRUE(pA->isCalibrated());
  EXPECT_EQ(pA->getFocalLengthInPixels(), 800.0);
  EXPECT_EQ(pA->getCalibrationPosition(), Vec3(1.0, 2.0, 3.0));
  EXPECT_EQ(pA->getCalibrationOrientation(), Vec3());
  EXPECT_EQ(pA->getDistortion().m_Model, ECameraDistortionModel::Ostra3Parameter);
  EXPECT_EQ(pA->getDistortion().m_RadialParameters, (std::vector<double>{0.1, 0.2, 0.3}));
  EXPECT_EQ(pA->getDistortion().m_RadialDistortionCentre, (std::array<double, 2>{319.0, 241.0}));
  EXPECT_EQ(pA->getCalibrationDetail().m_Type, ECameraCalibrationType::AutoBumpHeal);
  EXPECT_EQ(pA->getCalibrationDetail().m_StartTemperature, 20);
  EXPECT_EQ(pA->getCalibrationDetail().m_Id[15], 0xFF);
  EXPECT_TRUE(pA->isCalibrationTempSet());
  EXPECT_FALSE(g_db->getOpticalCamera(1)->isCalibrated());
}

TEST_F(XcpReaderTest, MalformedDocumentsNameTheFaultAndChangeNothing) {
  expectError("</Cameras>", "", "not well-formed XML at line");
  expectError("<Cameras VERSION=\"2.0\"", "<Rig VERSION=\"2.0\"", "root element must be Cameras");
  expectError("VERSION=\"2.0\"", "VERSION=\"3.0\"", "attribute VERSION: unsupported version");
  expectError("UP_AXIS=\"Y\"", "UP_AXIS=\"X\"", "attribute UP_AXIS");
  expectError("-10 10 -20 20", "-10 10 -20", "attribute FLOOR_EXTENTS: expected 4 numbers");
  expectError("POSITION=\"1 2 3\"", "",
              "Camera 1 (NAME \"A\"), element KeyFrame, attribute "
              "POSITION: missing");
  expectError("FOCAL_LENGTH=\"800\"", "FOCAL_LENGTH=\"8o0\"", "attribute FOCAL_LENGTH");
  expectError("ORIENTATION=\"0 0 0 1\"", "ORIENTATION=\"0 0 0 0\"", "quaternion is zero");
  expectError("Ostra3Parameter", "Ostra9Parameter", "unknown distortion model");
  expectError("AutoBumpHeal", "Bump", "attribute TYPE: unknown calibration type");
  expectError("ID=\"00112233", "ID=\"zz112233", "attribute ID");
  expectError("START_TEMP=\"20\"", "START_TIME=\"2024-13-01 00:00:00.000 ST\"",
              "attribute START_TIME");
  expectError("ISDV=\"2\"", "ISDV=\"1\"", "attribute ISDV");
  expectError("USERID=\"0\" NAME=\"B\"", "NAME=\"B\"", "Camera 2 (NAME \"B\"), attribute USERID");
  expectError("GRID_SIZE=\"40 30\"", "GRID_SIZE=\"40.5 30\"", "attribute GRID_SIZE");
}

TEST_F(XcpReaderTest, TimesAreReadAsLocalTimeWithTheirDaylightFlag) {
  setenv("TZ", "CET-1CEST,M3.5.0,M10.5.0/3", 1);
  tzset();
  std::string text = kDocument;
  text.replace(
      text.find("START_TEMP=\"20\""), 15,
      "START_TIME=\"2023-07-01 14:00:00.000 DST\" END_TIME=\"2024-01-01 13:00:00.999 ST\"");
  std::string error;
  ASSERT_TRUE(AnvilCore::readXcpDocument(text, "cams.xcp", error)) << error;
  const VCameraCalibrationDetail& detail = g_db->getOpticalCamera(0)->getCalibrationDetail();
  EXPECT_EQ(detail.m_StartTime, 1688212800000ull);
  EXPECT_EQ(detail.m_EndTime, 1704110400999ull);
  unsetenv("TZ");
  tzset();
}

} // namespace
