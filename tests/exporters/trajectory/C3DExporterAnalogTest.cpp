// Audio sources as analog channels, and the TIMECODE group of the active clip.
#include "C3DExportFixture.h"

namespace {
// A ramp on channel 0 and its negation on channel 1, so every sample says where it came from.
AudioSource* addRampSource(const HString& i_rName, int i_rate, int i_samples) {
  std::vector<int16_t> up(static_cast<size_t>(i_samples)), down(up.size());
  for (int i = 0; i < i_samples; ++i) {
    up[size_t(i)] = int16_t(i);
    down[size_t(i)] = int16_t(-i);
  }
  AudioSource* pSource = new AudioSource(i_rName);
  EXPECT_TRUE(pSource->setSamples(i_rate, {up, down}));
  g_db->addChild(nullptr, pSource);
  return pSource;
}
} // namespace

TEST_F(C3DExportTest, AudioOnlySceneWritesAnalogChannels) {
  addRampSource("Mic", 1000, 2000);
  AudioSource* pRoom = new AudioSource("Room");
  ASSERT_TRUE(pRoom->setSamples(500, {std::vector<int16_t>(1000, 0)}));
  g_db->addChild(nullptr, pRoom);
  m_pExporter->setRealFormat(false);
  ASSERT_TRUE(exportRange(0, 11));
  const C3DTest::File f = file();
  ASSERT_TRUE(f.ok()) << f.error;

  EXPECT_EQ(m_pExporter->getAnalogRate(), 1000);
  EXPECT_EQ(m_pExporter->getAnalogChannels(), 3);
  EXPECT_EQ(f.u16(2), 0);
  EXPECT_EQ(f.u16(4), 25); // (3 * 1000) / 120, truncated
  EXPECT_EQ(f.u16(18), 8); // 1000 / 120, truncated
  EXPECT_EQ(f.find("POINT", "LABELS")->dims, (std::vector<int>{64, 0}));
  EXPECT_EQ(f.paramInt("ANALOG", "USED"), 3);
  EXPECT_EQ(f.find("ANALOG", "LABELS")->dims, (std::vector<int>{4, 3}));
  EXPECT_EQ(f.paramText("ANALOG", "LABELS"), "Mic Mic Room");
  EXPECT_EQ(f.find("ANALOG", "DESCRIPTIONS")->dims, (std::vector<int>{32, 3}));
  EXPECT_EQ(f.paramStrings("ANALOG", "DESCRIPTIONS"),
            (std::vector<std::string>{"Audio", "Audio", "Audio"}));
  EXPECT_DOUBLE_EQ(f.paramReal("ANALOG", "GEN_SCALE"), 1.0);
  const C3DTest::Parameter* pScale = f.find("ANALOG", "SCALE");
  ASSERT_NE(pScale, nullptr);
  EXPECT_EQ(pScale->dims, std::vector<int>{3});
  for (int c = 0; c < 3; ++c)
    EXPECT_DOUBLE_EQ(f.real(pScale->dataOffset + size_t(c) * 4), 1.0);
  EXPECT_EQ(f.paramInts("ANALOG", "OFFSET"), (std::vector<int>{-32768, -32768, -32768}));
  EXPECT_DOUBLE_EQ(f.paramReal("ANALOG", "RATE"), 1000.0);

  // Per frame: 8 samples, each the three channels in source order, as (sample - 32768).
  const size_t frameSize = 8 * 3 * 2;
  ASSERT_EQ(f.bytes.size(), dataStart(f) + 12 * frameSize);
  for (int fr = 0; fr < 12; ++fr)
    for (int s = 0; s < 8; ++s) {
      const size_t at = dataStart(f) + size_t(fr) * frameSize + size_t(s) * 6;
      const int k = 8 * fr + s;
      ASSERT_EQ(f.u16(at), uint16_t(k - 32768)) << fr << " " << s;
      ASSERT_EQ(f.u16(at + 2), uint16_t(-k - 32768));
      ASSERT_EQ(f.u16(at + 4), uint16_t(-32768));
    }
}

TEST_F(C3DExportTest, FloatAnalogFollowsTheMarkers) {
  addMarker("A", nullptr, {0, 1});
  addRampSource("Mic", 1000, 2000);
  ASSERT_TRUE(exportRange(0, 1));
  const C3DTest::File f = file();
  const size_t frameSize = 4 * 4 + 8 * 2 * 4;
  ASSERT_EQ(f.bytes.size(), dataStart(f) + 2 * frameSize);
  const size_t analog = dataStart(f) + frameSize + 16; // second frame, after its marker
  EXPECT_DOUBLE_EQ(f.real(analog), 8.0 + 32768.0);
  EXPECT_DOUBLE_EQ(f.real(analog + 4), -8.0 + 32768.0);
  EXPECT_DOUBLE_EQ(f.real(analog + 8), 9.0 + 32768.0);
}

TEST_F(C3DExportTest, TimecodeGroupFollowsTheActiveClip) {
  addMarker("A", nullptr, {0, 1});
  time()->setFrameRate(100.0);
  time()->setTimecodeMode(ETimecodeModePal);
  NLEClip* pClip = new NLEClip("Take 1", HTimeRange(frame(2), frame(50)));
  pClip->setStartOffset(time()->timecodeToTime(10, 0, 0, 0));
  g_db->addClip(pClip);

  ASSERT_TRUE(exportRange(0, 1));
  EXPECT_FALSE(file().hasGroup("TIMECODE")); // no active clip

  g_db->setActiveClip(pClip, false, false, false);
  ASSERT_TRUE(exportRange(0, 1));
  C3DTest::File f = file();
  ASSERT_TRUE(f.ok()) << f.error;
  ASSERT_EQ(f.groups.size(), 5u);
  EXPECT_EQ(f.groups[3], (std::pair<int, std::string>{4, "TIMECODE"}));
  EXPECT_EQ(f.groups[4].second, "TRIAL");
  EXPECT_EQ(f.find("TIMECODE", "DROP_FRAMES")->type, 1);
  EXPECT_EQ(f.u8(f.find("TIMECODE", "DROP_FRAMES")->dataOffset), 0);
  EXPECT_EQ(f.paramInt("TIMECODE", "USED"), 1);
  EXPECT_EQ(f.find("TIMECODE", "FIELD_NUMBERS")->dims, (std::vector<int>{2, 1}));
  EXPECT_EQ(f.paramInts("TIMECODE", "FIELD_NUMBERS"), (std::vector<int>{0, 0}));
  EXPECT_EQ(f.paramText("TIMECODE", "STANDARD"), "PAL");
  // 100 Hz frames in 25 fps timecode: 4 subframes, the clip starting 2 of them in.
  EXPECT_EQ(f.paramInts("TIMECODE", "SUBFRAMESPERFRAME"), std::vector<int>{4});
  EXPECT_EQ(f.paramInts("TIMECODE", "OFFSETS"), std::vector<int>{2});
  EXPECT_EQ(f.find("TIMECODE", "TIMECODES")->dims, (std::vector<int>{4, 1}));
  EXPECT_EQ(f.paramInts("TIMECODE", "TIMECODES"), (std::vector<int>{10, 0, 0, 0}));

  m_pExporter->setWriteTimeCode(false);
  ASSERT_TRUE(exportRange(0, 1));
  EXPECT_FALSE(file().hasGroup("TIMECODE"));
  m_pExporter->setWriteTimeCode(true);
  time()->setTimecodeMode(ETimecodeModeNone);
  ASSERT_TRUE(exportRange(0, 1));
  EXPECT_FALSE(file().hasGroup("TIMECODE"));
}

TEST_F(C3DExportTest, DropFrameTimecodeIsMarked) {
  addMarker("A", nullptr, {0});
  time()->setFrameRate(30000.0 / 1001.0);
  time()->setTimecodeMode(ETimecodeModeNtscDrop);
  // 1800 frames in: drop-frame counting skips 00:01:00;00 and ;01.
  NLEClip* pClip = new NLEClip("Take", HTimeRange(frame(1800), frame(1900)));
  g_db->addClip(pClip);
  g_db->setActiveClip(pClip, false, false, false);
  ASSERT_TRUE(exportRange(0, 0));
  const C3DTest::File f = file();
  EXPECT_EQ(f.u8(f.find("TIMECODE", "DROP_FRAMES")->dataOffset), 1);
  EXPECT_EQ(f.paramText("TIMECODE", "STANDARD"), "NTSC");
  EXPECT_EQ(f.paramInts("TIMECODE", "TIMECODES"), (std::vector<int>{0, 1, 0, 2}));
  EXPECT_EQ(f.paramInts("TIMECODE", "SUBFRAMESPERFRAME"), std::vector<int>{1});
  EXPECT_EQ(f.paramInts("TIMECODE", "OFFSETS"), std::vector<int>{0});
}
