#pragma once
// The solved numeric form of a subject that the solver works on: every expression evaluated.

#include "River/CoreOstraTypes/IOptional.h"
#include "River/CoreOstraTypes/NameHash.h"
#include "River/CoreOstraTypes/SubjectEnums.h"
#include "River/CoreOstraTypes/VRotationObservationRecord.h"

#include <array>
#include <cstdint>
#include <string>
#include <vector>

namespace CoreOstraTypes {

class VSubject {
public:
  struct VJoint : VJointTypeBase {
    std::string m_Name;
    EJointType m_JointType = EDummy;
    std::array<double, 3> m_JointOrientation{}; ///< angle-axis, radians
    std::vector<double> m_Covariance;
    std::vector<double> m_Mean;
    std::vector<double> m_RangeCentringState; ///< empty: no value
    std::vector<double> m_RangeMatrix;        ///< empty: no value
    bool operator==(const VJoint&) const = default;
    static constexpr const char* FlowClassName = "Joint";
    template <class S, class V> static void FlowFields(S& s, V&& v) {
      v("Name", "", s.m_Name);
      v("JointType", "", s.m_JointType);
      v("JointOrientation", "", s.m_JointOrientation);
      v("Covariance", "", s.m_Covariance);
      v("Mean", "", s.m_Mean);
      v("RangeCentringState", "", s.m_RangeCentringState);
      v("RangeMatrix", "", s.m_RangeMatrix);
    }
  };

  struct VSegment {
    std::string m_Name;
    std::uint32_t m_SegmentIndex = 0;
    ZMT::IOptional<std::uint32_t> m_ParentSegmentIndex; ///< unset for the root
    std::uint32_t m_TreeDepth = 0;
    std::array<double, 3> m_PreRotation{};
    std::array<double, 3> m_PreTranslation{};
    std::array<double, 3> m_InversePostRotation{};
    std::array<double, 3> m_InversePostTranslation{};
    std::array<double, 6> m_Bounds{};
    VJoint m_Joint;
    bool operator==(const VSegment&) const = default;
    static constexpr const char* FlowClassName = "Segment";
    template <class S, class V> static void FlowFields(S& s, V&& v) {
      v("Name", "", s.m_Name);
      v("SegmentIndex", "", s.m_SegmentIndex);
      v("ParentSegmentIndex", "", s.m_ParentSegmentIndex);
      v("TreeDepth", "", s.m_TreeDepth);
      v("PreRotation", "", s.m_PreRotation);
      v("PreTranslation", "", s.m_PreTranslation);
      v("InversePostRotation", "", s.m_InversePostRotation);
      v("InversePostTranslation", "", s.m_InversePostTranslation);
      v("Bounds", "", s.m_Bounds);
      v("Joint", "", s.m_Joint);
    }
  };

  struct VMarker {
    std::string m_Name;
    std::uint32_t m_MarkerId = InvalidId;
    double m_Radius = 0.0;
    bool m_Missing = false;
    double m_ViewAngle = 0.0;
    bool operator==(const VMarker&) const = default;
    static constexpr const char* FlowClassName = "Marker";
    template <class S, class V> static void FlowFields(S& s, V&& v) {
      v("Name", "", s.m_Name);
      v("MarkerId", "", s.m_MarkerId);
      v("Radius", "", s.m_Radius);
      v("Missing", "", s.m_Missing);
      v("ViewAngle", "", s.m_ViewAngle);
    }
  };

  using VRotationObservation = VRotationObservationRecord;

  struct VTarget : VTargetTypeBase {
    ETargetType m_Type = EBadTargetType;
    double m_Weight = 1.0;
    ERotationCalibrationBehaviourType m_RotationCalibrationBehaviour = EOther;
    std::vector<double> m_RotationTargetOrientation; ///< empty or 3
    std::uint32_t m_NumberOfDegreesOfFreedom = 0;
    std::vector<std::uint32_t> m_MarkerIndices;
    std::vector<std::uint32_t> m_RotationObservationIndices;
    std::vector<std::uint32_t> m_SegmentIndices;
    std::vector<double> m_State;
    std::vector<double> m_Covariance;                 ///< on the residuals
    std::vector<std::array<double, 3>> m_ViewNormals; ///< empty: no occlusion modelling
    bool operator==(const VTarget&) const = default;
    static constexpr const char* FlowClassName = "Target";
    template <class S, class V> static void FlowFields(S& s, V&& v) {
      v("Type", "", s.m_Type);
      v("Weight", "", s.m_Weight);
      v("RotationCalibrationBehaviour", "", s.m_RotationCalibrationBehaviour);
      v("RotationTargetOrientation", "", s.m_RotationTargetOrientation);
      v("NumberOfDegreesOfFreedom", "", s.m_NumberOfDegreesOfFreedom);
      v("MarkerIndices", "", s.m_MarkerIndices);
      v("RotationObservationIndices", "", s.m_RotationObservationIndices);
      v("SegmentIndices", "", s.m_SegmentIndices);
      v("State", "", s.m_State);
      v("Covariance", "", s.m_Covariance);
      v("ViewNormals", "", s.m_ViewNormals);
    }
  };

  std::string m_Name;
  std::uint32_t m_SubjectId = InvalidId;
  std::vector<VSegment> m_Segments; ///< depth first
  std::vector<VMarker> m_Markers;
  std::vector<VRotationObservation> m_Rotations;
  std::vector<VTarget> m_Targets;

  bool operator==(const VSubject&) const = default;
  static constexpr const char* FlowClassName = "Subject";
  template <class S, class V> static void FlowFields(S& s, V&& v) {
    v("Name", "", s.m_Name);
    v("SubjectId", "", s.m_SubjectId);
    v("Segments", "", s.m_Segments);
    v("Markers", "", s.m_Markers);
    v("Rotations", "", s.m_Rotations);
    v("Targets", "", s.m_Targets);
  }
};

} // namespace CoreOstraTypes
