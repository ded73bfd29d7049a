#include "AnvilCore/ExportDriver.h"
#include "AnvilCore/SceneSummary.h"
#include "AnvilCore/io/C3DReader.h"
#include "C3DTestFile.h"
#include "SceneReaderTestSupport.h"
#include "exporters/trajectory/C3DExporter.h"
#include "plugin/host/AudioSource.h"
#include "plugin/host/Character.h"
#include "plugin/host/HTimeManager.h"
#include "plugin/host/Marker.h"
#include <cmath>
#include <fstream>
#include <iterator>
#include <sstream>

namespace {

std::string readBack(const std::string& i_path) {
  std::ifstream in(i_path, std::ios::binary);
  return {std::istreambuf_iterator<char>(in), std::istreambuf_iterator<char>()};
}

class C3DSceneReaderTest : public SceneReaderTest {
protected:
  std::vector<std::string> m_warnings;
  void captureWarnings() {
    g_db->setLogSink([this](HLogLevel i_level, const std::string& i_text) {
      if (i_level == HLogLevel::EWarning) m_warnings.push_back(i_text);
    });
  }
};

// Volts of a force plate: small values with a fractional part, as float files hold them.
double volts(int i_channel, int i_sample) {
  return 0.004 * std::sin(0.3 * i_sample + i_channel) + 0.001 * i_channel;
}

TEST_F(C3DSceneReaderTest, BuildsSubjectsMarkersGapsAudioAndTheClock) {
  C3DTestFile file;
  file.processor = C3D::EProcessorMips;
  file.scale = 0.5f;
  file.rate = 50.0f;
  file.firstFrame = 11;
  file.units = "m";
  file.fillLinear(4, 3);
  file.labels = {"Bob:LFHD", "Bob:RFHD", "*7", "Loose"};
  file.frames[1][0][3] = -1.0f;
  file.analogSamplesPerFrame = 2;
  file.analogLabels = {"Mic", "Mic", "Force"};
  for (int f = 0; f < 3; ++f)
    file.analog.push_back({f, -f, 7, f + 1, -f - 1, 8});
  std::string error;
  ASSERT_TRUE(read(writeFile("take.c3d", file.build()), error)) << error;

  auto* pBob = dynamic_cast<Character*>(find("Bob"));
  ASSERT_NE(pBob, nullptr);
  auto* pLfhd = dynamic_cast<Marker*>(find("Bob\\LFHD"));
  ASSERT_NE(pLfhd, nullptr);
  auto* pUnlabelled = dynamic_cast<Marker*>(find("*7"));
  ASSERT_NE(pUnlabelled, nullptr);
  EXPECT_TRUE(pUnlabelled->isUnlabeled());
  EXPECT_FALSE(pLfhd->isUnlabeled());
  ASSERT_NE(find("Loose"), nullptr);

  HTimeManager* pTime = g_db->getTimeManager();
  EXPECT_DOUBLE_EQ(pTime->getFrameRate(), 50.0);
  EXPECT_EQ(pTime->getAnimRange(), HTimeRange(pTime->frameToTime(11), pTime->frameToTime(13)));
  EXPECT_EQ(pTime->getPlayRange(), pTime->getAnimRange());
  // Frame 12 is a gap of LFHD; metres become millimetres.
  ASSERT_EQ(pLfhd->m_track.getNumKeys(), 2);
  EXPECT_FALSE(pLfhd->m_track.hasKeyAt(pTime->frameToTime(12)));
  const Vec3 p = pLfhd->getWSPos(pTime->frameToTime(13));
  EXPECT_DOUBLE_EQ(p.x, 2000.0);
  EXPECT_DOUBLE_EQ(p.z, 1000.0);

  auto* pMic = dynamic_cast<AudioSource*>(find("Mic"));
  auto* pForce = dynamic_cast<AudioSource*>(find("Force"));
  ASSERT_NE(pMic, nullptr);
  ASSERT_NE(pForce, nullptr);
  EXPECT_EQ(pMic->getNumChannels(), 2);
  EXPECT_EQ(pMic->getSampleRate(), 100);
  EXPECT_EQ(pMic->getStartTime(), pTime->frameToTime(11));
  EXPECT_EQ(pMic->getChannel(1), (std::vector<int16_t>{0, -1, -1, -2, -2, -3}));
  EXPECT_EQ(pForce->getChannel(0), (std::vector<int16_t>{7, 8, 7, 8, 7, 8}));
}

TEST_F(C3DSceneReaderTest, SubjectsJoinAnExistingCharacter) {
  Character* pBob = new Character("Bob");
  g_db->addToScene(pBob, false, nullptr, false, false);
  C3DTestFile file;
  file.fillLinear(3, 2);
  file.labels = {"Bob_LFHD", "Bob_LFHD", "Ann:X"};
  file.subjectPrefixes = {"Bob_"};
  file.subjectNames = {"Bob"};
  std::string error;
  ASSERT_TRUE(read(writeFile("take.c3d", file.build()), error)) << error;
  EXPECT_EQ(sceneListing(), (std::vector<std::string>{"\\Bob", "\\Bob\\LFHD", "\\Bob\\LFHD_2",
                                                      "\\Ann", "\\Ann\\X"}));
}

TEST_F(C3DSceneReaderTest, SampleFilesLoad) {
  std::string error;
  ASSERT_TRUE(read(std::string(ANVIL_TEST_DATA) + "/c3d/Eb015vr.c3d", error)) << error;
  auto* pMarker = dynamic_cast<Marker*>(find("RFT1"));
  ASSERT_NE(pMarker, nullptr);
  EXPECT_GT(pMarker->m_track.getNumKeys(), 400);
  EXPECT_DOUBLE_EQ(g_db->getTimeManager()->getFrameRate(), 50.0);
  int audio = 0;
  for (Module* pModule : g_db->getModules())
    audio += pModule->isKindOf(&AudioSource::s_classAudioSource);
  EXPECT_EQ(audio, 16);
}

TEST_F(C3DSceneReaderTest, AFailedReadLeavesTheSceneAsItWas) {
  C3DTestFile first;
  first.fillLinear(2, 5);
  std::string error;
  ASSERT_TRUE(read(writeFile("a.c3d", first.build()), error)) << error;
  const std::vector<std::string> before = sceneListing();
  const HTimeRange range = g_db->getTimeManager()->getAnimRange();

  C3DTestFile second;
  second.rate = 25.0f;
  second.fillLinear(3, 5);
  std::vector<uint8_t> bytes = second.build();
  bytes.resize(bytes.size() - 3);
  const std::string path = writeFile("b.c3d", bytes);
  EXPECT_FALSE(read(path, error));
  EXPECT_EQ(error.find(path + ": file ends inside frame 5 of 5"), 0u) << error;
  EXPECT_EQ(sceneListing(), before);
  EXPECT_DOUBLE_EQ(g_db->getTimeManager()->getFrameRate(), 100.0);
  EXPECT_EQ(g_db->getTimeManager()->getAnimRange(), range);
  EXPECT_FALSE(read(m_folder + "/missing.c3d", error));
  EXPECT_NE(error.find("cannot open"), std::string::npos);
}

TEST_F(C3DSceneReaderTest, UnitTextsAreReadByMeaning) {
  struct Case {
    const char* units;
    double x;
    bool warned;
  };
  for (const Case& c : {Case{"mete", 10000.0, true}, Case{"Centimeters", 100.0, false},
                        Case{"mill", 10.0, true}, Case{"furlong", 10.0, true}}) {
    g_db->clearScene();
    m_warnings.clear();
    captureWarnings();
    C3DTestFile file;
    file.units = c.units;
    file.fillLinear(2, 1); // M2 at x = 10 in the file's units
    std::string error;
    ASSERT_TRUE(read(writeFile("take.c3d", file.build()), error)) << error;
    auto* pMarker = dynamic_cast<Marker*>(find("M2"));
    ASSERT_NE(pMarker, nullptr);
    EXPECT_DOUBLE_EQ(pMarker->m_track.getKeyValue(0).x, c.x) << c.units;
    EXPECT_EQ(m_warnings.size(), c.warned ? 1u : 0u) << c.units;
  }
  EXPECT_NE(m_warnings.at(0).find("unknown units \"furlong\""), std::string::npos);
  EXPECT_EQ(AnvilCore::readUnit("mete").name, std::string("metres"));
  EXPECT_TRUE(AnvilCore::readUnit("MM ").millimetres == 1.0 && !AnvilCore::readUnit("MM").guessed);
  EXPECT_DOUBLE_EQ(AnvilCore::readUnit("inch").millimetres, 25.4);
  EXPECT_DOUBLE_EQ(AnvilCore::readUnit("cent").millimetres, 10.0);
  EXPECT_EQ(AnvilCore::readUnit("x").millimetres, 0.0);
}

TEST_F(C3DSceneReaderTest, FloatAnalogKeepsItsValuesScaleAndUnits) {
  C3DTestFile file;
  file.fillLinear(1, 20);
  file.analogSamplesPerFrame = 2;
  file.analogLabels = {"Fz", "Mx"};
  for (int f = 0; f < 20; ++f)
    file.analogReal.push_back({float(volts(0, 2 * f)), float(volts(1, 2 * f)),
                               float(volts(0, 2 * f + 1)), float(volts(1, 2 * f + 1))});
  file.extras.push_back({2, "SCALE", 4, {2}, {}});
  for (float v : {1000.0f, 1.0f}) {
    const auto b = file.real(v);
    file.extras.back().data.insert(file.extras.back().data.end(), b.begin(), b.end());
  }
  file.extras.push_back({2, "UNITS", -1, {1, 2}, {'N', 'V'}});
  std::string error;
  ASSERT_TRUE(read(writeFile("plate.c3d", file.build()), error)) << error;

  auto* pFz = dynamic_cast<AudioSource*>(find("Fz"));
  ASSERT_NE(pFz, nullptr);
  ASSERT_TRUE(pFz->hasMeasurements());
  const AnalogChannel& fz = pFz->getMeasurement(0);
  EXPECT_EQ(fz.units, "N");
  double largest = 0.0;
  for (int i = 0; i < 40; ++i) {
    EXPECT_DOUBLE_EQ(fz.valueAt(size_t(i)), double(float(volts(0, i))) * 1000.0);
    largest = std::max(largest, std::fabs(fz.valueAt(size_t(i))));
  }
  // The 16-bit samples span the 16-bit range and keep the shape: sample times step is the value.
  int loudest = 0;
  for (int i = 0; i < 40; ++i) {
    const int16_t sample = pFz->getChannel(0)[size_t(i)];
    loudest = std::max(loudest, std::abs(int(sample)));
    EXPECT_NEAR(sample * pFz->getSampleStep(0), fz.valueAt(size_t(i)), pFz->getSampleStep(0));
  }
  EXPECT_EQ(loudest, 32767);
  EXPECT_DOUBLE_EQ(pFz->getSampleStep(0), largest / 32767.0);

  std::ostringstream summary;
  AnvilCore::describeScene(summary);
  EXPECT_NE(summary.str().find("\"Mx\" (1 ch, 200 Hz, 40 samples; "), std::string::npos)
      << summary.str();
  EXPECT_NE(summary.str().find(" V)"), std::string::npos);
}

// Rates that are not whole numbers survive a C3D to C3D round trip, and so does the shape of
// float analog data.
TEST_F(C3DSceneReaderTest, FractionalRatesAndAnalogShapeSurviveARoundTrip) {
  for (float rate : {107.527f, 65.05f}) {
    g_db->clearScene();
    C3DTestFile file;
    file.rate = rate;
    file.fillLinear(2, 30);
    file.analogSamplesPerFrame = 1;
    for (int c = 0; c < 8; ++c)
      file.analogLabels.push_back("EMG" + std::to_string(c + 1));
    for (int f = 0; f < 30; ++f) {
      file.analogReal.emplace_back();
      for (int c = 0; c < 8; ++c)
        file.analogReal.back().push_back(float(volts(c, f)));
    }
    std::string error;
    ASSERT_TRUE(read(writeFile("take.c3d", file.build()), error)) << error;
    auto* pEmg = dynamic_cast<AudioSource*>(find("EMG3"));
    ASSERT_NE(pEmg, nullptr);
    EXPECT_EQ(pEmg->getSampleRate(), double(rate));

    C3DExporter* pExporter = C3DExporter::createInstance();
    AnvilCore::ExportRequest request;
    request.path = m_folder + "/out.c3d";
    ASSERT_EQ(AnvilCore::runExport(*pExporter, request, error), AnvilCore::EExportStatus::EOk)
        << error;
    pExporter->deleteThis();
    const std::string bytes = readBack(request.path);
    AnvilCore::C3DContent back;
    ASSERT_TRUE(AnvilCore::parseC3D(reinterpret_cast<const uint8_t*>(bytes.data()), bytes.size(),
                                    back, error))
        << error;
    EXPECT_EQ(back.find("ANALOG", "USED")->intValue(0), 8);
    EXPECT_EQ(back.find("ANALOG", "RATE")->floatValue(0), rate);
    EXPECT_EQ(back.analogChannels, 8);
    EXPECT_EQ(back.analogSamplesPerFrame, 1);
    ASSERT_EQ(back.frameCount, 30);
    // Float frames carry sample + 65536 (the writer's fixed OFFSET); the samples follow the
    // volts to within one 16-bit step of the channel.
    const double step = pEmg->getSampleStep(0);
    for (int f = 0; f < 30; ++f)
      EXPECT_NEAR((back.analog[size_t(f) * 8 + 2] - 65536.0) * step, float(volts(2, f)), step)
          << rate << " " << f;
  }
}

} // namespace
