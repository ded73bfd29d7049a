#include "C3DTestFile.h"
#include "SceneReaderTestSupport.h"
#include "plugin/host/AudioSource.h"
#include "plugin/host/Character.h"
#include "plugin/host/HTimeManager.h"
#include "plugin/host/Marker.h"

namespace {

class C3DSceneReaderTest : public SceneReaderTest {};

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

} // namespace
