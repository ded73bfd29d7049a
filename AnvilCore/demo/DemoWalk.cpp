// The demo walker: a 20-segment skeleton with a gait of swinging limbs. Good enough to look like
// a walk in any viewer; not a biomechanical model.
#include "DemoWalk.h"
#include "River/CoreOstraTypesUtils/ExpressionNumber.h"
#include "River/CoreOstraTypesUtils/JointAxes.h"
#include <algorithm>
#include <cmath>

namespace AnvilCore {

using namespace CoreOstraTypes;

namespace {
constexpr double kPi = 3.14159265358979323846;
constexpr double kDeg = kPi / 180.0;
constexpr double kSpeed = 1300.0;    // mm/s
constexpr double kCadence = 0.9;     // gait cycles per second
constexpr double kHipHeight = 950.0; // mm
constexpr double kThigh = 430.0, kShank = 420.0, kUpperArm = 300.0, kForearm = 260.0;

const std::vector<std::string> kNames = {
    "LFHD", "RFHD", "LBHD", "RBHD", "C7",   "T10",  "CLAV", "STRN", "RBAK", "LSHO", "RSHO",
    "LUPA", "LELB", "LFRM", "LWRA", "LWRB", "LFIN", "RUPA", "RELB", "RFRM", "RWRA", "RWRB",
    "RFIN", "LASI", "RASI", "LPSI", "RPSI", "LTHI", "LKNE", "LTIB", "LANK", "LHEE", "LTOE",
    "RTHI", "RKNE", "RTIB", "RANK", "RHEE", "RTOE", "LMT5", "RMT5"};

using JointType = VJointTypeBase::EJointType;
enum EAxes { ENone, EAboutY, EFootPair, EShoulderPair };

struct SegmentShape {
  const char* name;
  int parent; // index, -1 for the root
  JointType type;
  EAxes axes;
  double x, y, z; // pre-translation in the parent, mm
};

// Left side first, the right mirrors it in Y.
const SegmentShape kSegments[] = {
    {"Pelvis", -1, VJointTypeBase::EFree, ENone, 0, 0, 0},
    {"LFemur", 0, VJointTypeBase::EBall, ENone, 0, 90, -60},
    {"LTibia", 1, VJointTypeBase::EHinge, EAboutY, 0, 0, -kThigh},
    {"LFoot", 2, VJointTypeBase::EHardySpicer, EFootPair, 0, 0, -kShank},
    {"LToes", 3, VJointTypeBase::EHinge, EAboutY, 130, 0, -40},
    {"RFemur", 0, VJointTypeBase::EBall, ENone, 0, -90, -60},
    {"RTibia", 5, VJointTypeBase::EHinge, EAboutY, 0, 0, -kThigh},
    {"RFoot", 6, VJointTypeBase::EHardySpicer, EFootPair, 0, 0, -kShank},
    {"RToes", 7, VJointTypeBase::EHinge, EAboutY, 130, 0, -40},
    {"Thorax", 0, VJointTypeBase::EBall, ENone, 0, 0, 100},
    {"Neck", 9, VJointTypeBase::EBall, ENone, -30, 0, 380},
    {"Head", 10, VJointTypeBase::EBall, ENone, 20, 0, 110},
    {"LClavicle", 9, VJointTypeBase::EHardySpicer, EShoulderPair, -10, 20, 340},
    {"LHumerus", 12, VJointTypeBase::EBall, ENone, 0, 160, 30},
    {"LRadius", 13, VJointTypeBase::EHinge, EAboutY, 0, 0, -kUpperArm},
    {"LHand", 14, VJointTypeBase::EHardySpicer, EFootPair, 0, 0, -kForearm},
    {"RClavicle", 9, VJointTypeBase::EHardySpicer, EShoulderPair, -10, -20, 340},
    {"RHumerus", 16, VJointTypeBase::EBall, ENone, 0, -160, 30},
    {"RRadius", 17, VJointTypeBase::EHinge, EAboutY, 0, 0, -kUpperArm},
    {"RHand", 18, VJointTypeBase::EHardySpicer, EFootPair, 0, 0, -kForearm},
};
constexpr int kSegmentCount = sizeof(kSegments) / sizeof(kSegments[0]);

struct MarkerSpec {
  const char* segment;
  double x, y, z; // place on the segment, mm
};
// One per name of kNames, in that order.
const MarkerSpec kMarkers[] = {
    {"Head", 100, 65, 100},       {"Head", 100, -65, 100},    {"Head", -60, 70, 110},
    {"Head", -60, -70, 110},      {"Thorax", -70, 0, 400},    {"Thorax", -95, 0, 200},
    {"Thorax", 60, 0, 350},       {"Thorax", 95, 0, 200},     {"Thorax", -100, -85, 280},
    {"LClavicle", 0, 160, 60},    {"RClavicle", 0, -160, 60}, {"LHumerus", 0, 45, -150},
    {"LHumerus", -20, 35, -300},  {"LRadius", 0, 30, -130},   {"LRadius", 25, 20, -260},
    {"LRadius", -25, 20, -260},   {"LHand", 0, 0, -80},       {"RHumerus", 0, -45, -150},
    {"RHumerus", -20, -35, -300}, {"RRadius", 0, -30, -130},  {"RRadius", 25, -20, -260},
    {"RRadius", -25, -20, -260},  {"RHand", 0, 0, -80},       {"Pelvis", 100, 125, 0},
    {"Pelvis", 100, -125, 0},     {"Pelvis", -85, 50, 30},    {"Pelvis", -85, -50, 30},
    {"LFemur", 0, 70, -215},      {"LFemur", 0, 55, -430},    {"LTibia", 0, 50, -210},
    {"LFoot", 0, 40, 0},          {"LFoot", -55, 0, -45},     {"LToes", 20, 0, -20},
    {"RFemur", 0, -70, -215},     {"RFemur", 0, -55, -430},   {"RTibia", 0, -50, -210},
    {"RFoot", 0, -40, 0},         {"RFoot", -55, 0, -45},     {"RToes", 20, 0, -20},
    {"LFoot", 90, 45, -55},       {"RFoot", 90, -45, -55}};
static_assert(sizeof(kMarkers) / sizeof(kMarkers[0]) == 41);

std::array<double, 3> orientation(EAxes i_axes) {
  std::array<double, 3> result{};
  switch (i_axes) {
  case EAboutY:
    CoreOstraTypesUtils::JointOrientationFromAxis({0, 1, 0}, result);
    break;
  case EFootPair: // flexion about Y, then inversion about X
    CoreOstraTypesUtils::JointOrientationFromAxisPair({0, 1, 0, 1, 0, 0}, result);
    break;
  case EShoulderPair: // elevation about X, then protraction about Z
    CoreOstraTypesUtils::JointOrientationFromAxisPair({1, 0, 0, 0, 0, 1}, result);
    break;
  default:
    break;
  }
  return result;
}

std::array<std::string, 3> texts(double x, double y, double z) {
  using CoreOstraTypesUtils::FormatExpressionNumber;
  return {FormatExpressionNumber(x), FormatExpressionNumber(y), FormatExpressionNumber(z)};
}

int segmentIndex(const char* i_pName) {
  for (int i = 0; i < kSegmentCount; ++i)
    if (std::string(kSegments[i].name) == i_pName) return i;
  return -1;
}
} // namespace

const std::vector<std::string>& demoWalkMarkerNames() {
  return kNames;
}

int demoWalkMarkerIndex(const std::string& i_rName) {
  auto it = std::find(kNames.begin(), kNames.end(), i_rName);
  return it == kNames.end() ? -1 : static_cast<int>(it - kNames.begin());
}

SubjectRecords demoWalkRecords() {
  SubjectRecords records;
  VSubjectParametrised& subject = records.subject;
  subject.m_Name = "Walker";
  subject.m_SubjectId = NameHash(subject.m_Name);
  subject.m_Model = "DemoWalker";
  subject.m_MarkerSetName = "DemoFullBody";
  records.application.m_SubjectId = subject.m_SubjectId;
  records.application.m_Colour = {40, 120, 220, 255};
  for (int i = 0; i < kSegmentCount; ++i) {
    const SegmentShape& shape = kSegments[i];
    VSubjectParametrised::VSegment segment;
    segment.m_Name = shape.name;
    segment.m_SegmentIndex = static_cast<uint32_t>(i);
    if (shape.parent >= 0) {
      segment.m_ParentSegmentIndex = static_cast<uint32_t>(shape.parent);
      segment.m_TreeDepth = subject.m_Segments[size_t(shape.parent)].m_TreeDepth + 1;
    }
    segment.m_Joint.m_Name =
        std::string(shape.parent >= 0 ? kSegments[shape.parent].name : "World") + "_" + shape.name;
    segment.m_Joint.m_JointType = shape.type;
    segment.m_Joint.m_JointOrientation = orientation(shape.axes);
    segment.m_PreTranslation = texts(shape.x, shape.y, shape.z);
    segment.m_PreRotation = texts(0, 0, 0);
    subject.m_Segments.push_back(segment);
    VSubjectApplicationData::VSegment app;
    app.m_Context = shape.name[0] == 'L' ? "Left" : (shape.name[0] == 'R' ? "Right" : "");
    records.application.m_Segments.push_back(app);
  }
  for (size_t m = 0; m < kNames.size(); ++m) {
    VSubjectParametrised::VMarker marker;
    marker.m_Name = kNames[m];
    marker.m_MarkerId = NameHash(marker.m_Name);
    marker.m_Radius = 7.0;
    subject.m_Markers.push_back(marker);
    records.application.m_Markers.emplace_back();
    VSubjectParametrised::VTarget target;
    target.m_Type = VTargetTypeBase::ELocalPointToWorldPoint;
    target.m_MarkerIndices = {static_cast<uint32_t>(m)};
    target.m_SegmentIndices = {static_cast<uint32_t>(segmentIndex(kMarkers[m].segment))};
    const auto state = texts(kMarkers[m].x, kMarkers[m].y, kMarkers[m].z);
    target.m_StateExpressions.assign(state.begin(), state.end());
    target.m_ViewNormals = {{0.0, 0.0, 0.0}};
    subject.m_Targets.push_back(target);
    VSubjectApplicationData::VTarget appTarget;
    appTarget.m_Name = kNames[m];
    records.application.m_Targets.push_back(appTarget);
  }
  // Sticks between the head markers and down the left shank, for viewers that draw them.
  auto stick = [&](const char* a, const char* b) {
    VSubjectApplicationData::VStick s;
    s.m_MarkerIndexA = static_cast<uint32_t>(demoWalkMarkerIndex(a));
    s.m_MarkerIndexB = static_cast<uint32_t>(demoWalkMarkerIndex(b));
    records.application.m_Sticks.push_back(s);
  };
  stick("LFHD", "RFHD");
  stick("LBHD", "RBHD");
  stick("LKNE", "LANK");
  return records;
}

void demoWalkJoints(double t, std::vector<std::vector<double>>& o_rParams) {
  const double phase = 2.0 * kPi * kCadence * t;
  o_rParams.assign(kSegmentCount, {});
  auto& p = o_rParams;
  // Pelvis: rotation vector (a little yaw), then position.
  p[0] = {0.0,
          0.0,
          3.0 * kDeg * std::sin(phase),
          kSpeed * t - 6500.0,
          25.0 * std::sin(phase),
          kHipHeight + 18.0 * std::sin(2.0 * phase)};
  auto leg = [&](int i_first, double i_phase) {
    const double thigh = 25.0 * kDeg * std::sin(i_phase); // forward swing
    // The knee bends most during swing, just after the leg passes under the body.
    const double knee = 35.0 * kDeg * std::max(0.0, std::sin(i_phase + 0.6 * kPi)) + 5.0 * kDeg;
    p[size_t(i_first)] = {0.0, -thigh, 0.0};
    p[size_t(i_first) + 1] = {knee};
    p[size_t(i_first) + 2] = {0.8 * (thigh - knee), 3.0 * kDeg * std::sin(i_phase)};
    p[size_t(i_first) + 3] = {-12.0 * kDeg * std::max(0.0, -std::sin(i_phase))};
  };
  leg(1, phase);
  leg(5, phase + kPi);
  p[9] = {0.0, 0.0, -4.0 * kDeg * std::sin(phase)};
  p[10] = {0.0, 3.0 * kDeg * std::sin(2.0 * phase), 0.0};
  p[11] = {0.0, 4.0 * kDeg * std::sin(2.0 * phase), 0.0};
  auto arm = [&](int i_first, double i_phase) {
    const double upper = -20.0 * kDeg * std::sin(i_phase); // forward swing
    p[size_t(i_first)] = {2.0 * kDeg * std::sin(2.0 * i_phase), 0.0};
    p[size_t(i_first) + 1] = {0.0, -upper, 0.0};
    p[size_t(i_first) + 2] = {-25.0 * kDeg};
    p[size_t(i_first) + 3] = {-5.0 * kDeg, 0.0};
  };
  arm(12, phase);
  arm(16, phase + kPi);
}

} // namespace AnvilCore
