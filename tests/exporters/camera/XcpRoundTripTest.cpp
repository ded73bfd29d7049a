#include "AnvilCore/demo/DemoScene.h"
#include "AnvilCore/io/XcpReader.h"
#include "River/CoreOstraTypes/VCameraCalibration.h"
#include "exporters/camera/XCPExporter.h"
#include "plugin/host/Database.h"
#include "plugin/host/OpticalCamera.h"
#include "tests/exporters/RunExport.h"
#include <cstdlib>
#include <gtest/gtest.h>
#include <memory>
#include <random>

namespace {

struct ExporterDeleter {
  void operator()(XCPExporter* p) const { p->deleteThis(); }
};

std::string exportCameras(const std::string& i_rName) {
  std::unique_ptr<XCPExporter, ExporterDeleter> pExporter(XCPExporter::createInstance());
  return ExportTest::exportText(*pExporter, ExportTest::tempPath(i_rName));
}

bool wellFormed(const std::string& i_rName) {
  const std::string command = "xmllint --noout '" + ExportTest::tempPath(i_rName) + "'";
  return std::system(command.c_str()) == 0;
}

TEST(XcpRoundTrip, ExportImportExportGivesTheSameBytes) {
  AnvilCore::buildDemoScene();
  ASSERT_GE(g_db->getNumOpticalCameras(), 8);
  const std::string first = exportCameras("first.xcp");
  ASSERT_NE(first.find("VERSION=\"2.0\""), std::string::npos);
  EXPECT_TRUE(wellFormed("first.xcp"));

  g_db->clearScene();
  g_db->setZUp(false);
  std::string error;
  ASSERT_TRUE(AnvilCore::readXcpDocument(first, "first.xcp", error)) << error;
  EXPECT_TRUE(g_db->isZUp());
  const std::string second = exportCameras("second.xcp");
  EXPECT_EQ(second, first);
  EXPECT_TRUE(wellFormed("second.xcp"));
}

TEST(XcpRoundTrip, VersionOneDocumentStaysVersionOne) {
  g_db->clearScene();
  auto* pCamera = new OpticalCamera("solo");
  pCamera->setCameraNumber(5);
  pCamera->setCalibrated(true);
  pCamera->setCalibrationPose(Vec3(1.0, 2.0, 3.0), Vec3(1e-17, -2e-16, 0.0));
  g_db->addToScene(pCamera, false, nullptr, false, false);
  const std::string first = exportCameras("one.xcp");
  ASSERT_NE(first.find("VERSION=\"1.0\""), std::string::npos);
  g_db->clearScene();
  std::string error;
  ASSERT_TRUE(AnvilCore::readXcpDocument(first, "one.xcp", error)) << error;
  EXPECT_EQ(exportCameras("one-again.xcp"), first);
  EXPECT_TRUE(wellFormed("one-again.xcp"));
}

// The reader must find a rotation vector that the writer turns into the very same quaternion.
TEST(XcpRoundTrip, RotationVectorsComeBackToTheSameQuaternion) {
  std::mt19937_64 generator(7);
  std::uniform_real_distribution<double> component(-1.0, 1.0);
  std::uniform_real_distribution<double> angle(0.0, 2.0 * M_PI);
  int exact = 0;
  const int count = 4000;
  for (int i = 0; i < count; ++i) {
    std::array<double, 3> v{component(generator), component(generator), component(generator)};
    const double n = std::sqrt(v[0] * v[0] + v[1] * v[1] + v[2] * v[2]);
    const double a = i % 10 == 0 ? 1e-9 * angle(generator) : angle(generator);
    for (double& c : v)
      c *= a / n;
    const std::array<double, 4> q = CoreOstraTypes::CameraOrientationQuaternion(v);
    const std::array<double, 3> back = AnvilCore::rotationVectorOfQuaternion(q);
    if (CoreOstraTypes::CameraOrientationQuaternion(back) == q) ++exact;
    for (int k = 0; k < 3; ++k)
      EXPECT_NEAR(back[k], v[k], 1e-12);
  }
  EXPECT_EQ(exact, count);
}

} // namespace
