// The demo's subject exported as a KMT, imported and exported again gives the same bytes, and
// its exact joint axes are written exactly.
#include "AnvilCore/demo/DemoScene.h"
#include "AnvilCore/io/ISceneReader.h"
#include "SubjectExporterFixture.h"
#include <filesystem>

namespace SubjectTest {
namespace {

TEST(SubjectDemoRoundTrip, DemoToKmtToKmtIsByteIdentical) {
  HostTest::resetScene(100.0, 10);
  AnvilCore::buildDemoScene();
  ExporterPtr<KmtExporter> pKmt(KmtExporter::createInstance());
  // Same file name in two folders: the subject takes its name from the file.
  const std::filesystem::path first = ExportTest::tempPath("demo-first"),
                              second = ExportTest::tempPath("demo-second");
  std::filesystem::create_directories(first);
  std::filesystem::create_directories(second);
  const std::string firstFile = (first / "Walker.kmt").string(),
                    secondFile = (second / "Walker.kmt").string();
  const std::string firstText = ExportTest::exportText(*pKmt, firstFile);
  ASSERT_NE(firstText.find("<JointHinge"), std::string::npos);
  ASSERT_NE(firstText.find("<JointHardySpicer"), std::string::npos);
  EXPECT_NE(firstText.find("AXIS=\"0 1 0\""), std::string::npos);
  EXPECT_EQ(firstText.find("e-16"), std::string::npos) << "no rounding noise in the axes";
  EXPECT_EQ(firstText.find("e-17"), std::string::npos);
  EXPECT_EQ(firstText.find("\"-0 "), std::string::npos);

  g_db->clearScene();
  HostTest::resetScene(100.0, 10);
  std::string error;
  AnvilCore::ISceneReader* pReader = AnvilCore::SceneReaderRegistry::instance().find(firstFile);
  ASSERT_NE(pReader, nullptr);
  ASSERT_TRUE(pReader->read(firstFile, error)) << error;
  EXPECT_EQ(ExportTest::exportText(*pKmt, secondFile), firstText);
  g_db->clearScene();
}

} // namespace
} // namespace SubjectTest
