#pragma once
// A subject's state frame by frame and the records around it: dynamic parameters, poses,
// health, settings, templates, clusters, associations, presets, quality and smart objects.

#include "River/CoreOstraTypes/Colour.h"
#include "River/CoreOstraTypes/NameHash.h"
#include "River/CoreOstraTypes/VSubjectParametrised.h"

#include <array>
#include <cstdint>
#include <map>
#include <string>
#include <vector>

namespace CoreOstraTypes {

/// The values of a subject's dynamic parameters, in the order of the parametrised subject's.
struct VSubjectDynamicParameters {
  static constexpr const char* FlowClassName = "SubjectDynamicParameters";
  std::vector<double> m_SubjectDynamicParameters;
  std::uint32_t m_SubjectId = InvalidId;
  bool operator==(const VSubjectDynamicParameters&) const = default;
  template <class S, class V> static void FlowFields(S& s, V&& v) {
    v("SubjectDynamicParameters", "Parameter values", s.m_SubjectDynamicParameters);
    v("SubjectId", "Subject", s.m_SubjectId);
  }
};

struct VSubjectHealth {
  static constexpr const char* FlowClassName = "SubjectHealth";
  std::uint32_t m_SubjectId = InvalidId;
  std::vector<double> m_ReconErrorsSquared; ///< per marker, square millimetres
  bool operator==(const VSubjectHealth&) const = default;
  template <class S, class V> static void FlowFields(S& s, V&& v) {
    v("SubjectId", "Subject", s.m_SubjectId);
    v("ReconErrorsSquared", "Squared fit error of each marker", s.m_ReconErrorsSquared);
  }
};

/// A rigid pose: rotation as a quaternion (x, y, z, w), then translation in millimetres.
struct VSubjectPoseRecord {
  static constexpr const char* FlowClassName = "Pose";
  std::array<double, 4> m_Rotation{0.0, 0.0, 0.0, 1.0};
  std::array<double, 3> m_Translation{};
  bool operator==(const VSubjectPoseRecord&) const = default;
  template <class S, class V> static void FlowFields(S& s, V&& v) {
    v("Rotation", "Quaternion x, y, z, w", s.m_Rotation);
    v("Translation", "Millimetres", s.m_Translation);
  }
};

/// Where each segment and marker of a subject is in the world in one frame; a marker the solve
/// did not place holds the largest finite double in all three coordinates.
struct VSubjectWorldPose {
  static constexpr const char* FlowClassName = "SubjectWorldPose";
  std::vector<VSubjectPoseRecord> m_Segments;
  std::vector<std::array<double, 3>> m_Markers;
  std::uint32_t m_SubjectId = InvalidId;
  bool operator==(const VSubjectWorldPose&) const = default;
  template <class S, class V> static void FlowFields(S& s, V&& v) {
    v("Segments", "World pose of each segment", s.m_Segments);
    v("Markers", "World position of each marker", s.m_Markers);
    v("SubjectId", "Subject", s.m_SubjectId);
  }
};

/// Each segment's pose relative to its parent in one frame.
struct VSubjectLocalPose {
  static constexpr const char* FlowClassName = "SubjectLocalPose";
  std::vector<VSubjectPoseRecord> m_Segments;
  std::uint32_t m_SubjectId = InvalidId;
  bool operator==(const VSubjectLocalPose&) const = default;
  template <class S, class V> static void FlowFields(S& s, V&& v) {
    v("Segments", "Local pose of each segment", s.m_Segments);
    v("SubjectId", "Subject", s.m_SubjectId);
  }
};

struct VSubjectSettings {
  static constexpr const char* FlowClassName = "SubjectSettings";
  std::uint32_t m_SubjectId = InvalidId;
  bool m_Enabled = true;
  std::map<std::string, std::string> m_Settings; ///< setting name to value, as text
  bool operator==(const VSubjectSettings&) const = default;
  template <class S, class V> static void FlowFields(S& s, V&& v) {
    v("SubjectId", "Subject", s.m_SubjectId);
    v("Enabled", "The subject takes part in processing", s.m_Enabled);
    v("Settings", "Settings by name", s.m_Settings);
  }
};

/// The labelling template a subject was made from.
struct VSubjectTemplate {
  static constexpr const char* FlowClassName = "SubjectTemplate";
  std::uint32_t m_SubjectId = InvalidId;
  std::string m_Name;
  VSubjectParametrised m_Template;
  bool operator==(const VSubjectTemplate&) const = default;
  template <class S, class V> static void FlowFields(S& s, V&& v) {
    v("SubjectId", "Subject", s.m_SubjectId);
    v("Name", "Template name", s.m_Name);
    v("Template", "The template subject", s.m_Template);
  }
};

/// Markers of a subject that the labeller treats as one rigid group.
struct VLabellingCluster {
  static constexpr const char* FlowClassName = "LabellingCluster";
  std::uint32_t m_SubjectId = InvalidId;
  std::string m_Name;
  std::vector<std::uint32_t> m_MarkerIndices;
  bool operator==(const VLabellingCluster&) const = default;
  template <class S, class V> static void FlowFields(S& s, V&& v) {
    v("SubjectId", "Subject", s.m_SubjectId);
    v("Name", "Cluster name", s.m_Name);
    v("MarkerIndices", "Markers of the cluster", s.m_MarkerIndices);
  }
};

/// A link from a subject to another (a prop held, a retarget source).
struct VSubjectAssociation {
  static constexpr const char* FlowClassName = "SubjectAssociation";
  std::uint32_t m_SubjectId = InvalidId;
  std::uint32_t m_AssociatedSubjectId = InvalidId;
  std::uint32_t m_Kind = 0;
  bool operator==(const VSubjectAssociation&) const = default;
  template <class S, class V> static void FlowFields(S& s, V&& v) {
    v("SubjectId", "Subject", s.m_SubjectId);
    v("AssociatedSubjectId", "The other subject", s.m_AssociatedSubjectId);
    v("Kind", "What the link means", s.m_Kind);
  }
};

struct VObjectPreset {
  static constexpr const char* FlowClassName = "ObjectPreset";
  std::map<std::string, std::string> m_Parameters;
  std::uint32_t m_SubjectId = InvalidId;
  bool operator==(const VObjectPreset&) const = default;
  template <class S, class V> static void FlowFields(S& s, V&& v) {
    v("Parameters", "Preset values by name", s.m_Parameters);
    v("SubjectId", "Subject", s.m_SubjectId);
  }
};

struct VObjectQuality {
  static constexpr const char* FlowClassName = "FlowObjectQuality";
  std::uint32_t m_SubjectId = InvalidId;
  double m_Quality = 0.0; ///< 0 to 1
  bool operator==(const VObjectQuality&) const = default;
  template <class S, class V> static void FlowFields(S& s, V&& v) {
    v("SubjectId", "Subject", s.m_SubjectId);
    v("Quality", "Tracking quality from 0 to 1", s.m_Quality);
  }
};

/// An object with active markers that switch on in clusters.
struct VSmartObject {
  static constexpr const char* FlowClassName = "SmartObject";
  std::uint32_t m_SubjectId = InvalidId;
  Colour m_ColourRGBA = DefaultColour;
  std::vector<std::vector<std::uint32_t>> m_SmartClusters; ///< marker indices per cluster
  std::vector<std::array<double, 3>> m_AdditionalMarkerPositions;
  bool m_MarkersOnWhileCharging = false;
  bool operator==(const VSmartObject&) const = default;
  template <class S, class V> static void FlowFields(S& s, V&& v) {
    v("SubjectId", "Subject", s.m_SubjectId);
    v("ColourRGBA", "Display colour", s.m_ColourRGBA);
    v("SmartClusters", "Markers of each cluster", s.m_SmartClusters);
    v("AdditionalMarkerPositions", "Markers beyond the subject's, in millimetres",
      s.m_AdditionalMarkerPositions);
    v("MarkersOnWhileCharging", "Markers light while charging", s.m_MarkersOnWhileCharging);
  }
};

} // namespace CoreOstraTypes
