// The host's scene model: arrays, strings, rotations, transforms, the clock and scene rotation.
#include "../support/HostFixture.h"
#include "plugin/host/HString.h"
#include "plugin/host/TSimpleArray.h"
#include <algorithm>
#include <cmath>
#include <cstring>
#include <gtest/gtest.h>
#include <map>
#include <random>
#include <vector>

using namespace HostTest;

namespace {
void expectNear(const Vec3& a, const Vec3& b, double tol = 1e-9) {
  EXPECT_NEAR(a.x, b.x, tol);
  EXPECT_NEAR(a.y, b.y, tol);
  EXPECT_NEAR(a.z, b.z, tol);
}
} // namespace

TEST(HostArrays, GrowByStepAndKeepElements) {
  TSimpleArray<int> array(16);
  for (int i = 0; i < 16; ++i)
    array.add(i * 3);
  EXPECT_EQ(array.getCapacity(), 16);
  array.add(99);
  EXPECT_EQ(array.getCapacity(), 32);
  EXPECT_EQ(array.getCount(), 17);
  for (int i = 0; i < 16; ++i)
    EXPECT_EQ(array[i], i * 3);
  EXPECT_EQ(array[16], 99);
  array.removeAt(0);
  EXPECT_EQ(array[0], 3);
  EXPECT_EQ(array.find(99), 15);
  array.setCount(0);
  EXPECT_TRUE(array.isEmpty());

  TArray<HString> strings(2);
  for (int i = 0; i < 5; ++i)
    strings.add(HString(std::string(20, char('a' + i))));
  TArray<HString> copy = strings;
  EXPECT_EQ(copy.getCount(), 5);
  EXPECT_EQ(copy[4], HString(std::string(20, 'e')));
  EXPECT_EQ(HOutOfMemory().what(), std::string("E1224: Out of memory in TSimpleArray::addSpace"));
}

TEST(HostStrings, EditingOperations) {
  HString s("Walker\\LFHD\\x");
  EXPECT_EQ(s.Replace("\\", ":"), 2);
  EXPECT_EQ(s, "Walker:LFHD:x");
  EXPECT_EQ(s.ReverseFind(':'), 11);
  EXPECT_EQ(s.Left(6), "Walker");
  EXPECT_EQ(s.Right(1), "x");
  EXPECT_EQ(s.Mid(7), "LFHD:x");
  EXPECT_EQ(s.Mid(40), "");
  EXPECT_EQ(HString("ScEnE").MakeLower(), "scene");
  HString f;
  f.Format("%s=%05.1f", "rate", 2.25);
  EXPECT_EQ(f, "rate=002.2");
  EXPECT_EQ(HString(nullptr), HString::EMPTY_STRING);
}

TEST(HostRotation, EulerRoundTripInEveryOrder) {
  const Vec3 angles[] = {{10, 20, 30}, {-75, 40, 170}, {0, -89, 45}, {120, 5, -60}};
  const int middleAxis[6] = {1, 2, 0, 2, 0, 1};
  for (int order = 0; order < 6; ++order) {
    for (const Vec3& in : angles) {
      AnvilRotation r;
      r.setAsEuler(AnvilRotation::RotOrder(order), in);
      Vec3 out;
      r.getAsEuler(AnvilRotation::RotOrder(order), out);
      AnvilRotation back;
      back.setAsEuler(AnvilRotation::RotOrder(order), out);
      // The same rotation (angles may differ by equivalent sets near the limits).
      const Vec3 v(0.3, -1.2, 2.5);
      expectNear(r.rotate(v), back.rotate(v), 1e-9);
      // Angles come back as given while the middle one stays inside (-90, 90).
      if (std::fabs(in[middleAxis[order]]) < 80) expectNear(in, out, 1e-9);
    }
  }
}

TEST(HostRotation, OrderMeansFirstAxisAppliedFirst) {
  AnvilRotation r;
  r.setAsEuler(AnvilRotation::XYZ, Vec3(90, 90, 0));
  // X first takes +Y to +Z, then Y takes +Z to +X.
  expectNear(r.rotate(Vec3(0, 1, 0)), Vec3(1, 0, 0));
  r.setAsEuler(AnvilRotation::YXZ, Vec3(90, 90, 0));
  // Y first leaves +Y alone, then X takes +Y to +Z.
  expectNear(r.rotate(Vec3(0, 1, 0)), Vec3(0, 0, 1));
  const AnvilRotation q(Vec3(1, 1, 0), 73.0);
  expectNear((q * q.inverse()).rotate(Vec3(4, 5, 6)), Vec3(4, 5, 6));
  double m[9];
  q.getMatrix(m);
  AnvilRotation fromMatrix;
  fromMatrix.setMatrix(m);
  expectNear(fromMatrix.rotate(Vec3(1, 2, 3)), q.rotate(Vec3(1, 2, 3)));
}

TEST(HostTransforms, ComposeThroughParents) {
  resetScene(100.0, 3);
  auto* pParent = new Node("Parent");
  pParent->setPreTranslation(Vec3(0, 0, 100));
  pParent->setStaticTransform(Vec3(10, 0, 0), AnvilRotation(Vec3(0, 0, 1), 90), Vec3(1, 1, 1));
  g_db->addToScene(pParent, false, nullptr, false, false);
  auto* pChild = new Node("Child");
  pChild->setPreRotation(AnvilRotation(Vec3(1, 0, 0), 90));
  pChild->setStaticTransform(Vec3(5, 0, 0), AnvilRotation(), Vec3(2, 2, 2));
  g_db->addChild(pParent, pChild);
  auto* pGrandChild = new Node("GrandChild");
  pGrandChild->setStaticTransform(Vec3(0, 1, 0), AnvilRotation(), Vec3(1, 1, 1));
  g_db->addChild(pChild, pGrandChild);

  // Child origin: parent maps (5,0,0) by Rz(90) to (0,5,0), plus (10,0,100).
  expectNear(pChild->getWSPos(0), Vec3(10, 5, 100));
  // Grandchild: (0,1,0) scaled by 2, rotated by Rx(90) to (0,0,2), then Rz(90) leaves it.
  expectNear(pGrandChild->getWSPos(0), Vec3(10, 5, 102));
  expectNear(pGrandChild->getConstWSPos(), Vec3(10, 5, 102));
  EXPECT_EQ(pGrandChild->getPartialPathString(), "Parent\\Child\\GrandChild");
  EXPECT_EQ(pGrandChild->getFullPathString(), "\\Parent\\Child\\GrandChild");
  EXPECT_TRUE(pGrandChild->isDescendedFrom(pParent));
  EXPECT_EQ(g_db->getNumNodes(), 3);
}

TEST(HostTransforms, TracksInterpolateAndHoldEnds) {
  resetScene(100.0, 10);
  const int64_t tpf = g_db->getTimeManager()->getTicksPerFrame();
  auto* pNode = new Node("N");
  pNode->m_positionTrack.setKey(2 * tpf, Vec3(0, 0, 0));
  pNode->m_positionTrack.setKey(4 * tpf, Vec3(10, -20, 4));
  pNode->m_rotationTrack.setKey(2 * tpf, AnvilRotation());
  pNode->m_rotationTrack.setKey(4 * tpf, AnvilRotation(Vec3(0, 0, 1), 90));
  g_db->addToScene(pNode, false, nullptr, false, false);
  expectNear(pNode->getLocalPos(3 * tpf), Vec3(5, -10, 2));
  expectNear(pNode->getLocalPos(0), Vec3(0, 0, 0));
  expectNear(pNode->getLocalPos(9 * tpf), Vec3(10, -20, 4));
  expectNear(pNode->getWSRot(3 * tpf).rotate(Vec3(1, 0, 0)),
             Vec3(std::cos(M_PI / 4), std::sin(M_PI / 4), 0));

  Marker* pMarker = addMarker("M", {Vec3(0, 0, 0), std::nullopt, Vec3(2, 4, 6)});
  int index = -1;
  EXPECT_FALSE(pMarker->m_track.hasKeyAt(tpf, index));
  EXPECT_TRUE(pMarker->m_track.hasKeyAt(2 * tpf, index));
  EXPECT_EQ(index, 1);
  expectNear(pMarker->getWSPos(tpf), Vec3(1, 2, 3));
  // The one-walk form answers exactly what the two calls do, for a node and a tracked marker.
  for (const Node* pWhich : {static_cast<const Node*>(pNode), static_cast<const Node*>(pMarker)}) {
    Vec3 position;
    AnvilRotation rotation;
    pWhich->getWSTransform(3 * tpf, position, rotation);
    EXPECT_EQ(position, pWhich->getWSPos(3 * tpf));
    double q[2][4];
    rotation.getAsQuaternion(q[0][0], q[0][1], q[0][2], q[0][3]);
    pWhich->getWSRot(3 * tpf).getAsQuaternion(q[1][0], q[1][1], q[1][2], q[1][3]);
    for (int i = 0; i < 4; ++i)
      EXPECT_EQ(q[0][i], q[1][i]);
  }
  int first = -1;
  EXPECT_EQ(pMarker->m_track.getKeysInRange(HTimeRange(tpf, 5 * tpf), first), 1);
  EXPECT_EQ(first, 1);
}

TEST(HostSceneRotation, QuarterTurnsAreExactAndUndoRestoresBits) {
  resetScene(100.0, 2);
  Character* pSubject = addSubject("S");
  Marker* pMarker = addMarker("M", {Vec3(1.1, -2.3, 3.7), Vec3(-0.0, 1e-300, 5e10)}, pSubject);
  auto* pNode = new Node("N");
  pNode->setStaticTransform(Vec3(0.1, 0.2, 0.3), AnvilRotation(Vec3(1, 2, 3), 33), Vec3(1, 1, 1));
  g_db->addToScene(pNode, false, nullptr, false, false);
  const int64_t tpf = g_db->getTimeManager()->getTicksPerFrame();

  const Vec3 before0 = pMarker->getWSPos(0), before1 = pMarker->getWSPos(tpf);
  const Vec3 nodeBefore = pNode->getWSPos(0);
  double qBefore[4], qAfter[4];
  pNode->getWSRot(0).getAsQuaternion(qBefore[0], qBefore[1], qBefore[2], qBefore[3]);

  g_db->rotateScene(90.0, 0); // Y up to Z up
  const Vec3 rotated = pMarker->getWSPos(0);
  EXPECT_EQ(rotated, Vec3(1.1, -3.7, -2.3));
  g_db->rotateScene(-90.0, 0);
  const Vec3 after0 = pMarker->getWSPos(0), after1 = pMarker->getWSPos(tpf);
  EXPECT_EQ(std::memcmp(&before0, &after0, sizeof(Vec3)), 0);
  EXPECT_EQ(std::memcmp(&before1, &after1, sizeof(Vec3)), 0);
  const Vec3 nodeAfter = pNode->getWSPos(0);
  EXPECT_EQ(std::memcmp(&nodeBefore, &nodeAfter, sizeof(Vec3)), 0);
  pNode->getWSRot(0).getAsQuaternion(qAfter[0], qAfter[1], qAfter[2], qAfter[3]);
  EXPECT_EQ(std::memcmp(qBefore, qAfter, sizeof qBefore), 0);
  EXPECT_FALSE(g_db->isSceneRotated());

  // Any angle, undone in reverse order, restores the scene too.
  g_db->rotateScene(30.0, 2);
  g_db->rotateScene(-90.0, 1);
  expectNear(
      pMarker->getWSPos(0),
      AnvilRotation(Vec3(0, 1, 0), -90).rotate(AnvilRotation(Vec3(0, 0, 1), 30).rotate(before0)));
  g_db->rotateScene(90.0, 1);
  g_db->rotateScene(-30.0, 2);
  EXPECT_EQ(pMarker->getWSPos(0), before0);
}

TEST(HostClock, TicksFramesAndRanges) {
  HTimeManager* pTime = g_db->getTimeManager();
  pTime->setFrameRate(120.0);
  EXPECT_EQ(pTime->getTicksPerFrame(), 1125000);
  EXPECT_EQ(pTime->getFrame(1125000 * 5 + 3), 5);
  EXPECT_EQ(pTime->getFrame(-1), -1);
  EXPECT_EQ(HTimeRange(0, 1125000 * 9).getNumFrames(), 10);
  EXPECT_EQ(HTimeRange(1125000 * 9, 0).getNumFrames(), -8);
  pTime->setFrameRate(30000.0 / 1001.0);
  EXPECT_EQ(pTime->getTicksPerFrame(), 4504500);
  const HTime t = (3600 + 2 * 60 + 7) * kTicksPerSecond + 5;
  EXPECT_EQ(pTime->getHours(t), 1);
  EXPECT_EQ(pTime->getMinutes(t), 2);
  EXPECT_EQ(pTime->getSeconds(t), 7);
  pTime->setFrameRate(-5.0); // refused: the rate stays
  EXPECT_EQ(pTime->getTicksPerFrame(), 4504500);
  pTime->setFrameRate(120.0);
}

// Tracks keep their times as runs of evenly spaced keys: every query must answer as a plain
// sorted list of times would, whatever the order and spacing of the keys set.
TEST(HostTracks, RunsAnswerAsASortedListOfTimes) {
  std::mt19937 gen(3);
  for (int round = 0; round < 200; ++round) {
    HVec3Track track;
    std::map<HTime, double> reference;
    const int keys = int(gen() % 60);
    for (int k = 0; k < keys; ++k) {
      // Mostly a regular grid with gaps, sometimes a time off the grid or before the others.
      HTime t = HTime(k) * 100 + (gen() % 7 == 0 ? HTime(gen() % 90) : 0);
      if (gen() % 9 == 0) t = HTime(gen() % 6000) - 50;
      if (gen() % 5 == 0) continue;
      const double value = double(gen() % 1000);
      track.setKey(t, Vec3(value, 0, 0));
      reference[t] = value;
    }
    std::vector<HTime> times;
    for (const auto& [t, value] : reference)
      times.push_back(t);
    ASSERT_EQ(track.getNumKeys(), int(times.size()));
    ASSERT_EQ(track.times(), times);
    HVec3Track::KeyCursor cursor(track);
    for (size_t i = 0; i < times.size(); ++i, cursor.next()) {
      ASSERT_EQ(track.getKeyTime(int(i)), times[i]);
      ASSERT_EQ(track.getKeyValue(int(i)).x, reference[times[i]]);
      ASSERT_EQ(cursor.time(), times[i]);
      ASSERT_EQ(cursor.index(), int(i));
    }
    EXPECT_TRUE(cursor.atEnd());
    for (HTime t = -120; t < 6100; t += 7) {
      const auto lower = std::lower_bound(times.begin(), times.end(), t);
      ASSERT_EQ(track.lowerBound(t), size_t(lower - times.begin())) << t;
      const bool exact = lower != times.end() && *lower == t;
      ASSERT_EQ(track.findKey(t), exact ? int(lower - times.begin()) : -1);
      int first = -1;
      const auto upper = std::upper_bound(times.begin(), times.end(), t + 150);
      ASSERT_EQ(track.countInRange(t, t + 150, first), int(upper - lower));
      ASSERT_EQ(first, int(lower - times.begin()));
      if (times.empty()) continue;
      // Interpolation between the neighbours of t, held outside the keys.
      double expected;
      if (t <= times.front())
        expected = reference[times.front()];
      else if (t >= times.back())
        expected = reference[times.back()];
      else if (exact)
        expected = reference[t];
      else {
        const HTime lo = *(lower - 1), hi = *lower;
        const double u = double(t - lo) / double(hi - lo);
        expected = HVec3Lerp()(Vec3(reference[lo], 0, 0), Vec3(reference[hi], 0, 0), u).x;
      }
      ASSERT_EQ(track.evaluate(t, Vec3()).x, expected) << t;
    }
  }
  // Times far apart, near the ends of the clock, stay exact.
  HVec3Track wide;
  wide.setKey(INT64_MIN + 1, Vec3(1, 0, 0));
  wide.setKey(0, Vec3(2, 0, 0));
  wide.setKey(INT64_MAX - 1, Vec3(3, 0, 0));
  EXPECT_EQ(wide.times(), (std::vector<HTime>{INT64_MIN + 1, 0, INT64_MAX - 1}));
  EXPECT_EQ(wide.findKey(INT64_MAX - 1), 2);
  int first = -1;
  EXPECT_EQ(wide.countInRange(1, INT64_MAX, first), 1);
}

// Appending keys in one step builds the track that setting them one by one builds, also when a
// batch holds times out of order or before the last key.
TEST(HostTracks, AppendingKeysMatchesSettingThem) {
  std::mt19937 gen(8);
  for (int round = 0; round < 100; ++round) {
    HVec3Track appended, set;
    HTime t = HTime(gen() % 50);
    for (int batch = 0; batch < 5; ++batch) {
      std::vector<HTime> times;
      std::vector<Vec3> values;
      const int count = int(gen() % 20);
      for (int k = 0; k < count; ++k) {
        t += gen() % 4 == 0 ? HTime(gen() % 300) + 1 : 100;
        times.push_back(gen() % 25 == 0 ? HTime(gen() % 2000) : t);
        values.push_back(Vec3(double(gen() % 100), double(k), double(batch)));
      }
      appended.appendKeys(times.data(), values.data(), times.size());
      for (size_t k = 0; k < times.size(); ++k)
        set.setKey(times[k], values[k]);
    }
    ASSERT_EQ(appended.times(), set.times());
    for (int i = 0; i < set.getNumKeys(); ++i)
      ASSERT_EQ(appended.getKeyValue(i), set.getKeyValue(i));
  }
}
