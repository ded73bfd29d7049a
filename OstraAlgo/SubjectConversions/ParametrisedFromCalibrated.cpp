#include "OstraAlgo/SubjectConversions/ParametrisedFromCalibrated.h"

#include "DebugServices/GlobalLog.h"
#include "OstraAlgo/SubjectConversions/SkeletonParameterRecords.h"
#include "OstraAlgo/SubjectConversions/SubjectFromCalibrated.h"
#include "River/CoreOstraTypesUtils/AngleAxis.h"
#include "River/CoreOstraTypesUtils/ExpressionNumber.h"

#include <cmath>
#include <span>

namespace SubjectConversions {

using CoreOstraTypes::VSubject;
using CoreOstraTypes::VSubjectApplicationData;
using CoreOstraTypes::VSubjectParametrised;
using CoreOstraTypesUtils::FormatExpressionNumber;
using CoreOstraTypesUtils::Vector3;
using namespace KinematicAlgo;

#define CONVERSION_LOG(level, ...) ZMT_LOG(SubjectConversionChannel, level, __VA_ARGS__)

namespace {

constexpr const char* IncompatibleMessage =
    "Calibration paramenter information not compatible with input subject";

template <std::size_t N> std::array<std::string, N> Texts(const std::array<double, N>& values) {
  std::array<std::string, N> texts;
  for (std::size_t i = 0; i < N; ++i)
    texts[i] = FormatExpressionNumber(values[i]);
  return texts;
}

std::vector<std::string> Texts(const std::vector<double>& values) {
  std::vector<std::string> texts;
  texts.reserve(values.size());
  for (double v : values)
    texts.push_back(FormatExpressionNumber(v));
  return texts;
}

/// The solved record written as a parametrised one: numbers as expression texts.
VSubjectParametrised Lift(const VSubject& solved) {
  VSubjectParametrised out;
  out.m_Name = solved.m_Name;
  out.m_SubjectId = solved.m_SubjectId;
  for (const VSubject::VSegment& s : solved.m_Segments) {
    VSubjectParametrised::VSegment segment;
    segment.m_Name = s.m_Name;
    segment.m_SegmentIndex = s.m_SegmentIndex;
    segment.m_ParentSegmentIndex = s.m_ParentSegmentIndex;
    segment.m_TreeDepth = s.m_TreeDepth;
    auto& joint = segment.m_Joint;
    joint.m_Name = s.m_Joint.m_Name;
    joint.m_JointType = s.m_Joint.m_JointType;
    joint.m_JointOrientation = s.m_Joint.m_JointOrientation;
    joint.m_Covariance = s.m_Joint.m_Covariance;
    joint.m_Mean = s.m_Joint.m_Mean;
    joint.m_RangeCentringState = s.m_Joint.m_RangeCentringState;
    joint.m_RangeMatrix = s.m_Joint.m_RangeMatrix;
    segment.m_PreRotation = Texts(s.m_PreRotation);
    segment.m_PreTranslation = Texts(s.m_PreTranslation);
    segment.m_InversePostRotation = s.m_InversePostRotation;
    segment.m_InversePostTranslation = s.m_InversePostTranslation;
    segment.m_Bounds = Texts(s.m_Bounds);
    out.m_Segments.push_back(std::move(segment));
  }
  for (const VSubject::VMarker& m : solved.m_Markers) {
    VSubjectParametrised::VMarker marker;
    marker.m_Name = m.m_Name;
    marker.m_MarkerId = m.m_MarkerId;
    marker.m_Missing = m.m_Missing;
    marker.m_Radius = m.m_Radius;
    marker.m_ViewAngle = m.m_ViewAngle;
    out.m_Markers.push_back(std::move(marker));
  }
  out.m_Rotations = solved.m_Rotations;
  for (const VSubject::VTarget& t : solved.m_Targets) {
    VSubjectParametrised::VTarget target;
    target.m_Type = t.m_Type;
    target.m_Weight = t.m_Weight;
    target.m_RotationCalibrationBehaviour = t.m_RotationCalibrationBehaviour;
    target.m_RotationTargetOrientation = t.m_RotationTargetOrientation;
    target.m_NumberOfDegreesOfFreedom = t.m_NumberOfDegreesOfFreedom;
    target.m_MarkerIndices = t.m_MarkerIndices;
    target.m_RotationObservationIndices = t.m_RotationObservationIndices;
    target.m_SegmentIndices = t.m_SegmentIndices;
    target.m_StateExpressions = Texts(t.m_State);
    target.m_Covariance = t.m_Covariance;
    target.m_ViewNormals = t.m_ViewNormals;
    out.m_Targets.push_back(std::move(target));
  }
  return out;
}

bool Close(std::span<const double> a, std::span<const double> b) {
  for (std::size_t i = 0; i < a.size(); ++i)
    if (!(std::abs(a[i] - b[i]) <= 1e-9 * std::max(1.0, std::abs(b[i])))) return false;
  return true;
}

bool SameRotation(const Vector3& a, const Vector3& b) {
  const Eigen::Matrix3d ra = CoreOstraTypesUtils::AngleAxisToRotation(a);
  const Eigen::Matrix3d rb = CoreOstraTypesUtils::AngleAxisToRotation(b);
  return Close({ra.data(), 9}, {rb.data(), 9});
}

std::string Join(const std::vector<std::string>& names) {
  std::string out;
  for (const std::string& name : names)
    out += (out.empty() ? "" : ", ") + name;
  return out;
}

/// Ties the lifted record to the links; false (reasons logged) when they don't fit.
class VLinker {
public:
  VLinker(VSubjectParametrised& io_rSubject, const VSubject& solved)
      : m_rSubject(io_rSubject), m_rSolved(solved) {}

  bool Prepare() {
    std::vector<std::string> errors;
    const bool ok = m_Parser.SetParameters(m_rSubject, errors);
    for (const auto& e : errors)
      CONVERSION_LOG(ZMT::ELogError, "%1%", e);
    return ok;
  }

  bool LinkSegments(const std::vector<VSkeletonParameterLink>& links);
  bool LinkMarkers(const std::vector<VMarkerParameterLink>& links);

private:
  template <std::size_t N>
  bool Values(const std::string& owner, std::span<const std::string> texts,
              std::array<double, N>& o_rValues) {
    bool ok = true;
    for (std::size_t i = 0; i < N; ++i) {
      std::string message;
      if (texts[i].empty()) {
        o_rValues[i] = 0.0;
      } else if (!m_Parser.Evaluate(texts[i], o_rValues[i], message)) {
        CONVERSION_LOG(ZMT::ELogError, "Cannot evaluate '%1%' of the link of %2%: %3%", texts[i],
                       owner, message);
        ok = false;
      }
    }
    return ok;
  }

  VSubjectParametrised& m_rSubject;
  const VSubject& m_rSolved;
  CoreOstraTypesUtils::VDynamicExpressionParserSimple m_Parser;
};

bool VLinker::LinkSegments(const std::vector<VSkeletonParameterLink>& links) {
  bool ok = true;
  std::vector<bool> linked(m_rSubject.m_Segments.size(), false);
  for (const VSkeletonParameterLink& link : links) {
    std::size_t s = 0;
    while (s < m_rSubject.m_Segments.size() && m_rSubject.m_Segments[s].m_Name != link.m_Segment)
      ++s;
    if (s == m_rSubject.m_Segments.size()) {
      CONVERSION_LOG(ZMT::ELogError, "Cannot match segment link with name: %1%", link.m_Segment);
      ok = false;
      continue;
    }
    if (linked[s]) {
      CONVERSION_LOG(ZMT::ELogError, "Segment %1% has more than one link", link.m_Segment);
      ok = false;
      continue;
    }
    linked[s] = true;
    const auto& e =
        link.m_Expressions; // pre-rotation, pre-translation, post-rotation, post-translation
    bool constantPost = true;
    for (std::size_t i = 6; i < 12; ++i) {
      CoreOstraTypesUtils::VMathNodeSimple node({}, 0.0);
      std::string message;
      if (e[i].empty()) continue;
      if (!m_Parser.EvaluateLinear(e[i], node, message) || !node.m_Parameters.empty() ||
          !node.m_Constants.empty()) {
        CONVERSION_LOG(ZMT::ELogError, "Unexpected post-transform expression: %1%", e[i]);
        constantPost = false;
      }
    }
    std::array<double, 12> v{};
    if (!constantPost || !Values<12>("segment " + link.m_Segment, e, v)) {
      ok = false;
      continue;
    }
    const VSubject::VSegment& solved = m_rSolved.m_Segments[s];
    Vector3 inverseRotation, inverseTranslation;
    CoreOstraTypesUtils::InvertAngleAxisPose({v[6], v[7], v[8]}, {v[9], v[10], v[11]},
                                             inverseRotation, inverseTranslation);
    if (!SameRotation({v[0], v[1], v[2]}, solved.m_PreRotation) ||
        !Close({v.data() + 3, 3}, solved.m_PreTranslation) ||
        !SameRotation(inverseRotation, solved.m_InversePostRotation) ||
        !Close(inverseTranslation, solved.m_InversePostTranslation)) {
      CONVERSION_LOG(ZMT::ELogError, "The link of segment %1% does not give its pose",
                     link.m_Segment);
      ok = false;
      continue;
    }
    auto& segment = m_rSubject.m_Segments[s];
    std::copy(e.begin(), e.begin() + 3, segment.m_PreRotation.begin());
    std::copy(e.begin() + 3, e.begin() + 6, segment.m_PreTranslation.begin());
  }
  std::vector<std::string> missing;
  for (std::size_t s = 0; s < linked.size(); ++s)
    if (!linked[s]) missing.push_back(m_rSubject.m_Segments[s].m_Name);
  if (!missing.empty())
    CONVERSION_LOG(ZMT::ELogWarning, "Missing expressions for segments: %1%", Join(missing));
  return ok;
}

bool VLinker::LinkMarkers(const std::vector<VMarkerParameterLink>& links) {
  bool ok = true;
  std::vector<bool> linked(m_rSubject.m_Markers.size(), false);
  for (const VMarkerParameterLink& link : links) {
    std::uint32_t m = 0;
    while (m < m_rSubject.m_Markers.size() && m_rSubject.m_Markers[m].m_Name != link.m_Marker)
      ++m;
    if (m == m_rSubject.m_Markers.size()) {
      CONVERSION_LOG(ZMT::ELogError, "Cannot match marker link with name: %1%", link.m_Marker);
      ok = false;
      continue;
    }
    if (linked[m]) {
      CONVERSION_LOG(ZMT::ELogError, "Marker %1% has more than one link", link.m_Marker);
      ok = false;
      continue;
    }
    linked[m] = true;
    std::array<double, 3> v{};
    if (!Values<3>("marker " + link.m_Marker, link.m_Expressions, v)) {
      ok = false;
      continue;
    }
    const auto places = MarkerPlaces(m_rSubject, m);
    bool same = true;
    for (const auto& [t, first] : places)
      same = same && Close(v, {m_rSolved.m_Targets[t].m_State.data() + first, 3});
    if (!same) {
      CONVERSION_LOG(ZMT::ELogError, "The link of marker %1% does not give its position",
                     link.m_Marker);
      ok = false;
      continue;
    }
    for (const auto& [t, first] : places)
      std::copy(link.m_Expressions.begin(), link.m_Expressions.end(),
                m_rSubject.m_Targets[t].m_StateExpressions.begin() + std::ptrdiff_t(first));
  }
  std::vector<std::string> missing;
  for (std::size_t m = 0; m < linked.size(); ++m)
    if (!linked[m]) missing.push_back(m_rSubject.m_Markers[m].m_Name);
  if (!missing.empty())
    CONVERSION_LOG(ZMT::ELogWarning, "Missing expressions for markers: %1%", Join(missing));
  return ok;
}

} // namespace

bool ParametrisedFromCalibrated(const ISubjectCalibrated& model,
                                const ISkeletonParameters& parameters,
                                VSubjectParametrised& o_rSubject,
                                VSubjectApplicationData* o_pAppData) {
  VSubject solved;
  VSubjectApplicationData appData;
  if (!SubjectFromCalibrated(model, solved, &appData)) return false;

  VSubjectParametrised subject = Lift(solved);
  bool ok = RecordParametersFromSkeleton(parameters.Parameters(), subject);
  if (ok) {
    VLinker linker(subject, solved);
    ok = linker.Prepare();
    ok = linker.LinkSegments(parameters.SegmentLinks()) && ok;
    ok = linker.LinkMarkers(parameters.MarkerLinks()) && ok;
  }
  if (!ok) {
    CONVERSION_LOG(ZMT::ELogError, IncompatibleMessage);
    return false;
  }
  o_rSubject = std::move(subject);
  if (o_pAppData) *o_pAppData = std::move(appData);
  return true;
}

} // namespace SubjectConversions
