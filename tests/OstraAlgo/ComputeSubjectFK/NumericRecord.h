#pragma once
// The solved record of a parametrised subject record whose expressions are all plain numbers,
// as the demo's records and baked conversions are. Throws std::invalid_argument on any other
// expression text.

#include "River/CoreOstraTypes/VSubject.h"
#include "River/CoreOstraTypes/VSubjectParametrised.h"

#include <stdexcept>
#include <string>

namespace KinematicTest {

using CoreOstraTypes::VSubject;
using CoreOstraTypes::VSubjectParametrised;

inline double Number(const std::string& text) {
  size_t used = 0;
  const double value = std::stod(text, &used);
  if (used != text.size()) throw std::invalid_argument("not a plain number: " + text);
  return value;
}

inline std::array<double, 3> Numbers(const std::array<std::string, 3>& texts) {
  return {Number(texts[0]), Number(texts[1]), Number(texts[2])};
}

// The solved record of a parametrised record whose expressions are all plain numbers.
inline VSubject Solved(const VSubjectParametrised& p) {
  VSubject s;
  s.m_Name = p.m_Name;
  s.m_SubjectId = p.m_SubjectId;
  for (const auto& segment : p.m_Segments) {
    VSubject::VSegment out;
    out.m_Name = segment.m_Name;
    out.m_SegmentIndex = segment.m_SegmentIndex;
    out.m_ParentSegmentIndex = segment.m_ParentSegmentIndex;
    out.m_TreeDepth = segment.m_TreeDepth;
    out.m_PreRotation = Numbers(segment.m_PreRotation);
    out.m_PreTranslation = Numbers(segment.m_PreTranslation);
    out.m_InversePostRotation = segment.m_InversePostRotation;
    out.m_InversePostTranslation = segment.m_InversePostTranslation;
    out.m_Joint.m_Name = segment.m_Joint.m_Name;
    out.m_Joint.m_JointType = segment.m_Joint.m_JointType;
    out.m_Joint.m_JointOrientation = segment.m_Joint.m_JointOrientation;
    s.m_Segments.push_back(out);
  }
  for (const auto& marker : p.m_Markers)
    s.m_Markers.push_back(
        {marker.m_Name, marker.m_MarkerId, marker.m_Radius, marker.m_Missing, marker.m_ViewAngle});
  for (const auto& target : p.m_Targets) {
    VSubject::VTarget out;
    out.m_Type = target.m_Type;
    out.m_MarkerIndices = target.m_MarkerIndices;
    out.m_SegmentIndices = target.m_SegmentIndices;
    for (const auto& text : target.m_StateExpressions)
      out.m_State.push_back(Number(text));
    s.m_Targets.push_back(out);
  }
  return s;
}

} // namespace KinematicTest
