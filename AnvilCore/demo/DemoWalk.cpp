// A planar gait model: pelvis travelling along +X with a vertical bob, legs and arms swinging in
// opposition. Good enough to look like a walk in any viewer; not a biomechanical model.
#include "DemoWalk.h"
#include <algorithm>
#include <cmath>

namespace AnvilCore {

namespace {
constexpr double kPi = 3.14159265358979323846;
constexpr double kDeg = kPi / 180.0;
constexpr double kSpeed = 1300.0;     // mm/s
constexpr double kCadence = 0.9;      // gait cycles per second
constexpr double kHipHeight = 950.0;  // mm
constexpr double kThigh = 430.0, kShank = 420.0, kUpperArm = 300.0, kForearm = 260.0;

const std::vector<std::string> kNames = {
    "LFHD", "RFHD", "LBHD", "RBHD", "C7",   "T10",  "CLAV", "STRN", "RBAK", "LSHO", "RSHO",
    "LUPA", "LELB", "LFRM", "LWRA", "LWRB", "LFIN", "RUPA", "RELB", "RFRM", "RWRA", "RWRB",
    "RFIN", "LASI", "RASI", "LPSI", "RPSI", "LTHI", "LKNE", "LTIB", "LANK", "LHEE", "LTOE",
    "RTHI", "RKNE", "RTIB", "RANK", "RHEE", "RTOE", "LMT5", "RMT5"};

// Point along a limb in the sagittal plane: `length` at `angle` from straight down, forward +X.
Vec3 swing(const Vec3& i_rFrom, double i_length, double i_angle) {
  return i_rFrom + Vec3(i_length * std::sin(i_angle), 0.0, -i_length * std::cos(i_angle));
}
Vec3 mid(const Vec3& a, const Vec3& b) { return (a + b) * 0.5; }

struct Leg {
  Vec3 hip, knee, ankle;
};
Leg leg(const Vec3& i_rHip, double i_phase) {
  const double thigh = 25.0 * kDeg * std::sin(i_phase);
  // The knee bends most during swing, just after the leg passes under the body.
  const double knee = 35.0 * kDeg * std::max(0.0, std::sin(i_phase + 0.6 * kPi));
  Leg l;
  l.hip = i_rHip;
  l.knee = swing(i_rHip, kThigh, thigh);
  l.ankle = swing(l.knee, kShank, thigh - knee - 5.0 * kDeg);
  return l;
}
} // namespace

const std::vector<std::string>& demoWalkMarkerNames() { return kNames; }

int demoWalkMarkerIndex(const std::string& i_rName) {
  auto it = std::find(kNames.begin(), kNames.end(), i_rName);
  return it == kNames.end() ? -1 : static_cast<int>(it - kNames.begin());
}

void demoWalkPose(double t, std::vector<Vec3>& o_rPositions) {
  const double phase = 2.0 * kPi * kCadence * t;
  const Vec3 root(kSpeed * t - 6500.0, 0.0, kHipHeight + 18.0 * std::sin(2.0 * phase));
  const double sway = 25.0 * std::sin(phase);
  const Vec3 pelvis = root + Vec3(0.0, sway, 0.0);
  auto at = [&](double x, double y, double z) { return pelvis + Vec3(x, y, z); };

  const Leg left = leg(at(0.0, 90.0, -60.0), phase);
  const Leg right = leg(at(0.0, -90.0, -60.0), phase + kPi);
  const Vec3 lSho = at(-10.0, 180.0, 470.0), rSho = at(-10.0, -180.0, 470.0);
  auto arm = [&](const Vec3& i_rShoulder, double i_phase, double i_side, Vec3* o_pOut) {
    const double upper = -20.0 * kDeg * std::sin(i_phase);
    const Vec3 elbow = swing(i_rShoulder, kUpperArm, upper);
    const Vec3 wrist = swing(elbow, kForearm, upper + 25.0 * kDeg);
    o_pOut[0] = mid(i_rShoulder, elbow) + Vec3(0.0, 45.0 * i_side, 0.0); // UPA
    o_pOut[1] = elbow + Vec3(-20.0, 35.0 * i_side, 0.0);                  // ELB
    o_pOut[2] = mid(elbow, wrist) + Vec3(0.0, 30.0 * i_side, 0.0);        // FRM
    o_pOut[3] = wrist + Vec3(25.0, 20.0 * i_side, 0.0);                   // WRA
    o_pOut[4] = wrist + Vec3(-25.0, 20.0 * i_side, 0.0);                  // WRB
    o_pOut[5] = swing(wrist, 80.0, upper + 30.0 * kDeg);                  // FIN
  };
  auto legMarkers = [&](const Leg& l, double i_side, Vec3* o_pOut) {
    o_pOut[0] = mid(l.hip, l.knee) + Vec3(0.0, 70.0 * i_side, 0.0);   // THI
    o_pOut[1] = l.knee + Vec3(0.0, 55.0 * i_side, 0.0);               // KNE
    o_pOut[2] = mid(l.knee, l.ankle) + Vec3(0.0, 50.0 * i_side, 0.0); // TIB
    o_pOut[3] = l.ankle + Vec3(0.0, 40.0 * i_side, 0.0);              // ANK
    o_pOut[4] = l.ankle + Vec3(-55.0, 0.0, -45.0);                    // HEE
    o_pOut[5] = l.ankle + Vec3(150.0, 0.0, -60.0);                    // TOE
  };

  o_rPositions.resize(kNames.size());
  Vec3* p = o_rPositions.data();
  const double nod = 15.0 * std::sin(2.0 * phase);
  p[0] = at(90.0, 65.0, 690.0 + nod);
  p[1] = at(90.0, -65.0, 690.0 + nod);
  p[2] = at(-70.0, 70.0, 700.0 + nod);
  p[3] = at(-70.0, -70.0, 700.0 + nod);
  p[4] = at(-70.0, 0.0, 500.0);
  p[5] = at(-95.0, 0.0, 300.0);
  p[6] = at(60.0, 0.0, 450.0);
  p[7] = at(95.0, 0.0, 300.0);
  p[8] = at(-100.0, -85.0, 380.0);
  p[9] = lSho;
  p[10] = rSho;
  arm(lSho, phase, 1.0, p + 11);
  arm(rSho, phase + kPi, -1.0, p + 17);
  p[23] = at(100.0, 125.0, 0.0);
  p[24] = at(100.0, -125.0, 0.0);
  p[25] = at(-85.0, 50.0, 30.0);
  p[26] = at(-85.0, -50.0, 30.0);
  legMarkers(left, 1.0, p + 27);
  legMarkers(right, -1.0, p + 33);
  p[39] = left.ankle + Vec3(90.0, 45.0, -55.0);
  p[40] = right.ankle + Vec3(90.0, -45.0, -55.0);
}

} // namespace AnvilCore
