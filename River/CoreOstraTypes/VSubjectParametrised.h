#pragma once
// The calibration-independent description of a subject: geometry as expression texts over the
// subject's parameters, plus joint template statistics. This is what subject files store.
// Cross references are indices into the vectors of the same record.

#include "River/CoreOstraTypes/IOptional.h"
#include "River/CoreOstraTypes/NameHash.h"
#include "River/CoreOstraTypes/SubjectEnums.h"
#include "River/CoreOstraTypes/VRotationObservationRecord.h"

#include <array>
#include <cstdint>
#include <string>
#include <vector>

namespace CoreOstraTypes {

class VSubjectParametrised {
public:
  struct VStaticParameter {
    enum EQuantity : std::uint32_t {
      EQuantityScalar = 0,
      EQuantityLength = 1,
      EQuantityAngle = 2,
      EQuantityMass = 3,
      EQuantityTime = 4
    };
    bool m_Advanced = false; ///< shown in advanced dialogues only
    bool m_Visible = true;
    bool m_ReadOnly = false;
    bool m_Required = false;
    std::string m_Name;
    std::string m_DefaultExpression;    ///< expression defining the value
    ZMT::IOptional<double> m_UserValue; ///< overrides the default expression when set
    ZMT::IOptional<double> m_Prior;
    EQuantity m_Quantity = EQuantityScalar;
    bool operator==(const VStaticParameter&) const = default;
    static constexpr const char* FlowClassName = "StaticParameter";
    template <class S, class V> static void FlowFields(S& s, V&& v) {
      v("Advanced", "", s.m_Advanced);
      v("Visible", "", s.m_Visible);
      v("ReadOnly", "", s.m_ReadOnly);
      v("Required", "", s.m_Required);
      v("Name", "", s.m_Name);
      v("DefaultExpression", "", s.m_DefaultExpression);
      v("UserValue", "", s.m_UserValue);
      v("Prior", "", s.m_Prior);
      v("Quantity", "", s.m_Quantity);
    }
  };

  struct VDynamicParameter {
    std::string m_Name;
    double m_Prior = 0.0; ///< value before calibration
    ZMT::IOptional<double> m_StandardDeviation;
    double m_Value = 0.0;
    bool m_Visible = true;
    bool operator==(const VDynamicParameter&) const = default;
    static constexpr const char* FlowClassName = "DynamicParameter";
    template <class S, class V> static void FlowFields(S& s, V&& v) {
      v("Name", "", s.m_Name);
      v("Prior", "", s.m_Prior);
      v("StandardDeviation", "", s.m_StandardDeviation);
      v("Value", "", s.m_Value);
      v("Visible", "", s.m_Visible);
    }
  };

  struct VJoint : VJointTypeBase {
    std::string m_Name;
    EJointType m_JointType = EDummy;
    std::array<double, 3> m_JointOrientation{}; ///< angle-axis, radians
    std::vector<double> m_Covariance;           ///< n*n row-major for n joint parameters
    std::vector<double> m_Mean;                 ///< n
    std::vector<double> m_TPoseCovariance;
    std::vector<double> m_TPoseMean;
    std::vector<double> m_RangeCentringState; ///< empty: no range modelling
    std::vector<double> m_RangeMatrix;        ///< empty: no range modelling
    std::vector<double> m_TemplateCovariance; ///< empty: no template value
    std::vector<double> m_TemplateMean;
    std::vector<double> m_TemplateRangeCentringState;
    std::vector<double> m_TemplateRangeMatrix;
    std::vector<double> m_BindPose; ///< n entries or empty
    bool operator==(const VJoint&) const = default;
    static constexpr const char* FlowClassName = "ParametrisedJoint";
    template <class S, class V> static void FlowFields(S& s, V&& v) {
      v("Name", "", s.m_Name);
      v("JointType", "", s.m_JointType);
      v("JointOrientation", "", s.m_JointOrientation);
      v("Covariance", "", s.m_Covariance);
      v("Mean", "", s.m_Mean);
      v("TPoseCovariance", "", s.m_TPoseCovariance);
      v("TPoseMean", "", s.m_TPoseMean);
      v("RangeCentringState", "", s.m_RangeCentringState);
      v("RangeMatrix", "", s.m_RangeMatrix);
      v("TemplateCovariance", "", s.m_TemplateCovariance);
      v("TemplateMean", "", s.m_TemplateMean);
      v("TemplateRangeCentringState", "", s.m_TemplateRangeCentringState);
      v("TemplateRangeMatrix", "", s.m_TemplateRangeMatrix);
      v("BindPose", "", s.m_BindPose);
    }
  };

  /// Segment pose relative to its parent: P * J * Q^-1, with P the pre transform, J the joint and
  /// Q^-1 the stored inverse post transform.
  struct VSegment {
    std::string m_Name;
    std::uint32_t m_SegmentIndex = 0;
    ZMT::IOptional<std::uint32_t> m_ParentSegmentIndex; ///< unset for the root
    std::uint32_t m_TreeDepth = 0;                      ///< root is 0
    VJoint m_Joint;
    std::array<std::string, 3> m_PreRotation;    ///< angle-axis expressions
    std::array<std::string, 3> m_PreTranslation; ///< expressions
    std::array<double, 3> m_InversePostRotation{};
    std::array<double, 3> m_InversePostTranslation{};
    std::string m_MassExpression; ///< proportion of the subject's mass
    std::array<std::string, 3> m_MassCentreExpressions;
    std::array<std::string, 3> m_RadiusOfGyrationExpressions;
    std::array<std::string, 6> m_Bounds; ///< lower x, y, z then upper x, y, z
    bool operator==(const VSegment&) const = default;
    static constexpr const char* FlowClassName = "ParametrisedSegment";
    template <class S, class V> static void FlowFields(S& s, V&& v) {
      v("Name", "", s.m_Name);
      v("SegmentIndex", "", s.m_SegmentIndex);
      v("ParentSegmentIndex", "", s.m_ParentSegmentIndex);
      v("TreeDepth", "", s.m_TreeDepth);
      v("Joint", "", s.m_Joint);
      v("PreRotation", "", s.m_PreRotation);
      v("PreTranslation", "", s.m_PreTranslation);
      v("InversePostRotation", "", s.m_InversePostRotation);
      v("InversePostTranslation", "", s.m_InversePostTranslation);
      v("MassExpression", "", s.m_MassExpression);
      v("MassCentreExpressions", "", s.m_MassCentreExpressions);
      v("RadiusOfGyrationExpressions", "", s.m_RadiusOfGyrationExpressions);
      v("Bounds", "", s.m_Bounds);
    }
  };

  struct VMarker {
    enum EMarkerStatus : std::uint32_t {
      ERequired = 0,
      EOptional = 1,
      ECalibrationOnly = 2,
      EVirtualCalibrationOnly = 3
    };
    std::string m_Name;
    std::uint32_t m_MarkerId = InvalidId;
    bool m_Missing = false;
    double m_Radius = 0.0;
    EMarkerStatus m_Status = ERequired;
    double m_ViewAngle = 0.0; ///< width of the visibility cone, radians
    bool operator==(const VMarker&) const = default;
    static constexpr const char* FlowClassName = "ParametrisedMarker";
    template <class S, class V> static void FlowFields(S& s, V&& v) {
      v("Name", "", s.m_Name);
      v("MarkerId", "", s.m_MarkerId);
      v("Missing", "", s.m_Missing);
      v("Radius", "", s.m_Radius);
      v("Status", "", s.m_Status);
      v("ViewAngle", "", s.m_ViewAngle);
    }
  };

  using VRotationObservation = VRotationObservationRecord;

  struct VTarget : VTargetTypeBase {
    std::vector<double> m_Covariance;
    std::vector<double> m_PlacementCovariance; ///< ELocalPointToWorldPoint only
    std::vector<std::uint32_t> m_MarkerIndices;
    std::vector<std::uint32_t> m_RotationObservationIndices;
    std::vector<std::uint32_t> m_SegmentIndices;
    std::vector<std::string> m_StateExpressions;
    std::vector<double> m_TemplateCovariance;
    std::vector<std::array<double, 3>> m_ViewNormals; ///< one per marker index
    ETargetType m_Type = EBadTargetType;
    double m_Weight = 1.0;
    double m_CalibrationWeight = 1.0;
    ERotationCalibrationBehaviourType m_RotationCalibrationBehaviour = EOther;
    std::vector<double> m_RotationTargetOrientation; ///< empty or 3
    std::uint32_t m_NumberOfDegreesOfFreedom = 0;
    bool operator==(const VTarget&) const = default;
    static constexpr const char* FlowClassName = "ParametrisedTarget";
    template <class S, class V> static void FlowFields(S& s, V&& v) {
      v("Covariance", "", s.m_Covariance);
      v("PlacementCovariance", "", s.m_PlacementCovariance);
      v("MarkerIndices", "", s.m_MarkerIndices);
      v("RotationObservationIndices", "", s.m_RotationObservationIndices);
      v("SegmentIndices", "", s.m_SegmentIndices);
      v("StateExpressions", "", s.m_StateExpressions);
      v("TemplateCovariance", "", s.m_TemplateCovariance);
      v("ViewNormals", "", s.m_ViewNormals);
      v("Type", "", s.m_Type);
      v("Weight", "", s.m_Weight);
      v("CalibrationWeight", "", s.m_CalibrationWeight);
      v("RotationCalibrationBehaviour", "", s.m_RotationCalibrationBehaviour);
      v("RotationTargetOrientation", "", s.m_RotationTargetOrientation);
      v("NumberOfDegreesOfFreedom", "", s.m_NumberOfDegreesOfFreedom);
    }
  };

  std::string m_Name;
  std::string m_Model;
  std::string m_ModelVersion;
  std::string m_MarkerSetName;
  std::uint32_t m_SubjectId = InvalidId;
  std::vector<VStaticParameter> m_StaticParameters;
  std::vector<VDynamicParameter> m_DynamicParameters;
  std::vector<VSegment> m_Segments; ///< depth first
  std::vector<VMarker> m_Markers;
  std::vector<VRotationObservation> m_Rotations;
  std::vector<VTarget> m_Targets;
  std::vector<ZMT::IOptional<double>> m_TPoseConstraints; ///< per joint parameter

  bool operator==(const VSubjectParametrised&) const = default;
  static constexpr const char* FlowClassName = "SubjectParametrised";
  template <class S, class V> static void FlowFields(S& s, V&& v) {
    v("SubjectId", "", s.m_SubjectId);
    v("StaticParameters", "", s.m_StaticParameters);
    v("DynamicParameters", "", s.m_DynamicParameters);
    v("Segments", "", s.m_Segments);
    v("Markers", "", s.m_Markers);
    v("Rotations", "", s.m_Rotations);
    v("Targets", "", s.m_Targets);
    v("TPoseConstraints", "", s.m_TPoseConstraints);
    v("Name", "", s.m_Name);
    v("Model", "", s.m_Model);
    v("ModelVersion", "", s.m_ModelVersion);
    v("MarkerSetName", "", s.m_MarkerSetName);
  }
};

} // namespace CoreOstraTypes
