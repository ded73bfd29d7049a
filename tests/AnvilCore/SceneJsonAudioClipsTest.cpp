// The "audio" and "clips" sections of scene files.
#include "AnvilCore/io/SceneJson.h"
#include "WavTestFile.h"
#include "plugin/host/AudioSource.h"
#include "plugin/host/Database.h"
#include "plugin/host/HTimeManager.h"
#include "plugin/host/NLEClip.h"
#include <filesystem>
#include <gtest/gtest.h>
#include <unistd.h>

namespace {
class SceneAudioClipsTest : public ::testing::Test {
protected:
  void SetUp() override {
    g_db->clearScene();
    m_dir = std::filesystem::temp_directory_path() /
            ("anvil-scene-audio-" + std::to_string(::getpid()));
    std::filesystem::create_directories(m_dir / "sound");
    AudioTest::writeWav((m_dir / "sound" / "take.wav").string(), 8000,
                        {std::vector<int16_t>{1, 2, 3, 4}});
  }
  void TearDown() override {
    g_db->clearScene();
    g_db->getTimeManager()->setFrameRate(120.0);
    g_db->getTimeManager()->setTimecodeMode(ETimecodeMode30Hz);
    std::filesystem::remove_all(m_dir);
  }
  bool read(const std::string& i_text) {
    m_error.clear();
    return AnvilCore::readSceneJson(i_text, (m_dir / "scene.json").string(), m_error);
  }
  /// A file that must fail: the error names the path, and the scene keeps nothing of it.
  void expectRefused(const std::string& i_text, const std::string& i_words) {
    EXPECT_FALSE(read(i_text));
    EXPECT_NE(m_error.find(i_words), std::string::npos) << m_error;
    EXPECT_TRUE(g_db->getModules().empty());
    EXPECT_EQ(g_db->getHeadClip(), nullptr);
  }
  std::filesystem::path m_dir;
  std::string m_error;
};

AudioSource* audio(const char* i_pName) {
  TSimpleArray<Module*> found = g_db->getModulesWithName(i_pName, &AudioSource::s_classAudioSource);
  return found.getCount() == 1 ? static_cast<AudioSource*>(found[0]) : nullptr;
}
} // namespace

TEST_F(SceneAudioClipsTest, ReadsSourcesAndClips) {
  ASSERT_TRUE(read(R"({
    "time": {"frameRate": 100, "timecodeMode": 3},
    "audio": [
      {"name": "Synth", "sampleRate": 1000, "channels": [[1, -2, 3], [4, 5, -32768]],
       "startFrame": 10, "selected": true},
      {"name": "Take", "file": "sound/take.wav"}
    ],
    "clips": [
      {"name": "Warmup", "range": [0, 99], "startOffset": 5},
      {"name": "Run", "range": [100, 499], "timecode": "10:00:01:00", "active": true}
    ]})"))
      << m_error;
  AudioSource* pSynth = audio("Synth");
  ASSERT_NE(pSynth, nullptr);
  EXPECT_EQ(pSynth->getSampleRate(), 1000);
  EXPECT_EQ(pSynth->getChannel(1), (std::vector<int16_t>{4, 5, -32768}));
  EXPECT_EQ(pSynth->getStartTime(), 10 * 1350000);
  EXPECT_TRUE(pSynth->isSelected());
  AudioSource* pTake = audio("Take");
  ASSERT_NE(pTake, nullptr);
  EXPECT_EQ(pTake->getSampleRate(), 8000);
  EXPECT_EQ(pTake->getChannel(0), (std::vector<int16_t>{1, 2, 3, 4}));

  const NLEClip* pWarmup = g_db->getHeadClip();
  ASSERT_NE(pWarmup, nullptr);
  EXPECT_EQ(pWarmup->getName(), "Warmup");
  EXPECT_EQ(pWarmup->getStartOffset(), 5 * 1350000);
  const NLEClip* pRun = pWarmup->getNext();
  ASSERT_NE(pRun, nullptr);
  EXPECT_EQ(g_db->getActiveClip(), pRun);
  EXPECT_EQ(pRun->getRange(), HTimeRange(100 * 1350000, 499 * 1350000));
  const ZMT::ITimecode<135000000> tc = g_db->getTimeManager()->getTimecode(pRun->getStartTime());
  EXPECT_EQ(tc.m_hours, 10);
  EXPECT_EQ(tc.m_seconds, 1);
  EXPECT_EQ(tc.m_frames, 0);
  EXPECT_EQ(tc.m_subframes, 0u);
}

TEST_F(SceneAudioClipsTest, RefusesBadSectionsWhole) {
  expectRefused(R"({"audio": [{"name": "A", "file": "sound/take.wav", "channels": [[1]]}]})",
                "/audio/0: expected one of \"file\" or \"channels\"");
  expectRefused(R"({"audio": [{"name": "A", "file": "sound/none.wav"}]})",
                "/audio/0/file: cannot read audio file");
  expectRefused(R"({"audio": [{"name": "A", "sampleRate": 8000, "channels": [[1, 2], [3]]}]})",
                "/audio/0/channels/1: expected 2 samples");
  expectRefused(R"({"audio": [{"name": "A", "sampleRate": 8000, "channels": [[40000]]}]})",
                "/audio/0/channels/0/0: sample outside");
  expectRefused(R"({"audio": [{"name": "A", "sampleRate": 0, "channels": [[1]]}]})",
                "/audio/0/sampleRate");
  expectRefused(R"({"clips": [{"name": "A", "range": [0, 9], "active": true},
                              {"name": "B", "range": [0, 9], "active": true}]})",
                "/clips/1/active: only one clip can be active");
  expectRefused(R"({"clips": [{"name": "A", "range": [0, 9]}, {"name": "A", "range": [0, 9]}]})",
                "/clips/1/name");
  expectRefused(R"({"clips": [{"name": "A", "range": [9, 0]}]})", "/clips/0/range");
  expectRefused(R"({"time": {"frameRate": 100, "timecodeMode": 3},
                    "clips": [{"name": "A", "range": [0, 9], "timecode": "01:00:00:25"}]})",
                "is not a timecode of this timecode mode");
  expectRefused(R"({"time": {"frameRate": 100, "timecodeMode": 6},
                    "clips": [{"name": "A", "range": [0, 9], "timecode": "01:00:00:00"}]})",
                "has no timecode");
  expectRefused(R"({"clips": [{"name": "A", "range": [0, 9], "timecode": "1h"}]})",
                "expected a timecode");
  // A good audio section does not survive a bad clip section.
  expectRefused(R"({"audio": [{"name": "A", "sampleRate": 8000, "channels": [[1]]}],
                    "clips": [{"name": "A", "range": [0, 9], "startOffset": 1, "timecode": "00:00:00:00"}]})",
                "not both");
}
