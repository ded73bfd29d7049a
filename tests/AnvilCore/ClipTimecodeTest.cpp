// Clips of the database and timecode of the scene clock.
#include "plugin/host/Database.h"
#include "plugin/host/HTimeManager.h"
#include "plugin/host/NLEClip.h"
#include <gtest/gtest.h>

namespace {
using Timecode = ZMT::ITimecode<135000000>;

std::string text(const Timecode& i_tc) {
  char buffer[32];
  std::snprintf(buffer, sizeof buffer, "%02d:%02d:%02d:%02d", i_tc.m_hours, i_tc.m_minutes,
                i_tc.m_seconds, i_tc.m_frames);
  return buffer;
}

class ClipTimecodeTest : public ::testing::Test {
protected:
  void SetUp() override { g_db->clearScene(); }
  void TearDown() override {
    g_db->clearScene();
    time()->setFrameRate(120.0);
    time()->setTimecodeMode(ETimecodeMode30Hz);
  }
  static HTimeManager* time() { return g_db->getTimeManager(); }
};
} // namespace

TEST_F(ClipTimecodeTest, ClipListAndActiveClip) {
  EXPECT_EQ(g_db->getHeadClip(), nullptr);
  NLEClip* pA = new NLEClip("A", HTimeRange(0, 100), 7);
  NLEClip* pB = new NLEClip("B", HTimeRange(100, 200));
  g_db->addClip(pA);
  g_db->addClip(pB);
  EXPECT_EQ(g_db->getHeadClip(), pA);
  EXPECT_EQ(pA->getNext(), pB);
  EXPECT_EQ(pB->getNext(), nullptr);
  EXPECT_EQ(pA->getStartTime(), 7);
  EXPECT_TRUE(pA->isKindOf(&NLEClip::s_classNLEClip));

  g_db->setActiveClip(pB, false, false, false);
  EXPECT_EQ(g_db->getActiveClip(), pB);
  NLEClip stranger("C", HTimeRange(0, 1));
  g_db->setActiveClip(&stranger, false, false, false);
  EXPECT_EQ(g_db->getActiveClip(), nullptr);
  g_db->setActiveClip(pA, false, false, false);
  g_db->clearScene();
  EXPECT_EQ(g_db->getActiveClip(), nullptr);
  EXPECT_EQ(g_db->getHeadClip(), nullptr);
}

TEST_F(ClipTimecodeTest, TimecodeOfEachModeWithSubframes) {
  time()->setFrameRate(100.0);
  time()->setTimecodeMode(ETimecodeModePal);
  ASSERT_TRUE(time()->isTimecodeSupported());
  const HTime ten = time()->timecodeToTime(10, 0, 0, 0);
  EXPECT_EQ(ten, HTime(10) * 3600 * kTicksPerSecond);
  Timecode tc = time()->getTimecode(ten + 2 * time()->getTicksPerFrame());
  EXPECT_EQ(tc.m_standard, uint32_t(ZMT::ETimecodePal));
  EXPECT_EQ(text(tc), "10:00:00:00");
  EXPECT_EQ(tc.m_subframes, 2700000u);
  EXPECT_EQ(tc.m_subframeUnit, 1350000u);
  EXPECT_TRUE(tc.isValid());

  // 30 Hz: an hour is 108000 frames; a time before midnight wraps into the previous day.
  time()->setFrameRate(120.0);
  time()->setTimecodeMode(ETimecodeMode30Hz);
  EXPECT_EQ(text(time()->getTimecode(HTime(108000) * 4500000)), "01:00:00:00");
  EXPECT_EQ(text(time()->getTimecode(-1)), "23:59:59:29");
  EXPECT_EQ(time()->getTimecode(-1).m_subframes, 4499999u);
  EXPECT_EQ(time()->getTimecode(0).m_subframeUnit, 1125000u);

  time()->setTimecodeMode(ETimecodeModeFilm);
  EXPECT_EQ(time()->getTimecode(0).m_standard, uint32_t(ZMT::ETimecodeFilm));
  time()->setTimecodeMode(ETimecodeModeNtscFilm);
  EXPECT_EQ(time()->getTimecode(5630625 * 25).m_frames, 1);

  time()->setTimecodeMode(ETimecodeModeNone);
  EXPECT_FALSE(time()->isTimecodeSupported());
  EXPECT_FALSE(time()->getTimecode(0).isValid());
  EXPECT_EQ(time()->timecodeToTime(0, 0, 0, 0), -1);
}

TEST_F(ClipTimecodeTest, DropFrameSkipsTwoLabelsAMinuteButEveryTenth) {
  time()->setFrameRate(30000.0 / 1001.0);
  time()->setTimecodeMode(ETimecodeModeNtscDrop);
  const int64_t tpf = Timecode::ticksPerFrame(ZMT::ETimecodeNtscDrop);
  EXPECT_EQ(tpf, 4504500);
  EXPECT_EQ(text(time()->getTimecode(1799 * tpf)), "00:00:59:29");
  EXPECT_EQ(text(time()->getTimecode(1800 * tpf)), "00:01:00:02");
  EXPECT_EQ(text(time()->getTimecode(17982 * tpf)), "00:10:00:00");
  EXPECT_EQ(time()->timecodeToTime(0, 1, 0, 1), -1); // a skipped label
  // Every frame's label leads back to the frame.
  for (int64_t frame = 0; frame < 40000; frame += 7) {
    const Timecode tc = time()->getTimecode(frame * tpf);
    ASSERT_TRUE(tc.isValid()) << frame;
    ASSERT_EQ(time()->timecodeToTime(tc.m_hours, tc.m_minutes, tc.m_seconds, tc.m_frames),
              frame * tpf)
        << frame;
  }
}

TEST_F(ClipTimecodeTest, ValidityRules) {
  Timecode tc;
  EXPECT_FALSE(tc.isValid()); // no standard
  tc.m_standard = ZMT::ETimecodeNtscDrop;
  tc.m_minutes = 1;
  tc.m_frames = 1;
  EXPECT_FALSE(tc.isValid());
  tc.m_minutes = 10;
  EXPECT_TRUE(tc.isValid());
  tc.m_seconds = 1;
  tc.m_minutes = 1;
  EXPECT_TRUE(tc.isValid());
  tc.m_standard = ZMT::ETimecodePal;
  tc.m_frames = 25;
  EXPECT_FALSE(tc.isValid());
  tc.m_frames = 24;
  tc.m_subframes = 5400000;
  EXPECT_FALSE(tc.isValid());
  tc.m_subframes = 5399999;
  EXPECT_TRUE(tc.isValid());
  tc.m_hours = 24;
  EXPECT_FALSE(tc.isValid());
  EXPECT_EQ(Timecode::ticksPerFrame(ZMT::ETimecodeFilm), 5625000);
  EXPECT_EQ(Timecode::ticksPerFrame(ZMT::ETimecodeFilmNtsc), 5630625);
  EXPECT_EQ(Timecode::ticksPerFrame(ZMT::ETimecodeNtscFull), 4500000);
  EXPECT_EQ(Timecode::ticksPerFrame(ZMT::ETimecodeNtsc), 4504500);
}
