#pragma once
// Scene-wide records: orientation, selection, capture volume, performance figures and drawn
// geometry.

#include "River/CoreOstraTypes/Colour.h"

#include <array>
#include <cstdint>
#include <string>
#include <vector>

namespace CoreOstraTypes {

struct VSceneOrientation {
  static constexpr const char* FlowClassName = "SceneOrientation";
  std::array<double, 4> m_Orientation{0.0, 0.0, 0.0, 1.0}; ///< quaternion x, y, z, w
  bool operator==(const VSceneOrientation&) const = default;
  template <class S, class V> static void FlowFields(S& s, V&& v) {
    v("Orientation", "Turn of the scene as a quaternion (x, y, z, w)", s.m_Orientation);
  }
};

struct VSelectionSet {
  static constexpr const char* FlowClassName = "SelectionSet";
  std::vector<std::string> m_Selections; ///< names of the selected objects
  bool operator==(const VSelectionSet&) const = default;
  template <class S, class V> static void FlowFields(S& s, V&& v) {
    v("Selections", "Selected objects", s.m_Selections);
  }
};

/// The floor area of the capture volume, in millimetres.
struct VVolumeProperties {
  static constexpr const char* FlowClassName = "VolumeProperties";
  float m_MinX = 0.0f, m_MaxX = 0.0f, m_MinY = 0.0f, m_MaxY = 0.0f;
  bool operator==(const VVolumeProperties&) const = default;
  template <class S, class V> static void FlowFields(S& s, V&& v) {
    v("MinX", "", s.m_MinX);
    v("MaxX", "", s.m_MaxX);
    v("MinY", "", s.m_MinY);
    v("MaxY", "", s.m_MaxY);
  }
};

struct VSystemPerformanceMetrics {
  static constexpr const char* FlowClassName = "SystemPerformanceMetrics";
  std::uint32_t m_WindowLength = 0; ///< frames averaged
  double m_PipelineExecution = 0.0; ///< seconds per frame
  double m_CpuUsage = 0.0;          ///< 0 to 1
  bool operator==(const VSystemPerformanceMetrics&) const = default;
  template <class S, class V> static void FlowFields(S& s, V&& v) {
    v("WindowLength", "Frames averaged", s.m_WindowLength);
    v("PipelineExecution", "Processing time per frame in seconds", s.m_PipelineExecution);
    v("CpuUsage", "Processor load from 0 to 1", s.m_CpuUsage);
  }
};

/// Kinds of drawn geometry. Values are stored in files; never renumber.
enum class EGeometryType : std::uint32_t { Points = 0, Lines = 1, Triangles = 2, Text = 3 };

struct VGeometry {
  static constexpr const char* FlowClassName = "Geometry";
  EGeometryType m_Type = EGeometryType::Points;
  std::uint32_t m_CoordSys = 0; ///< 0 world millimetres, 1 camera pixels
  std::vector<double> m_Coords; ///< three numbers per vertex
  Colour m_Color = DefaultColour;
  std::string m_Text;
  double m_TextSize = 0.0;
  bool operator==(const VGeometry&) const = default;
  template <class S, class V> static void FlowFields(S& s, V&& v) {
    v("Type", "Kind of geometry", s.m_Type);
    v("CoordSys", "Space of the coordinates", s.m_CoordSys);
    v("Coords", "Vertices, three numbers each", s.m_Coords);
    v("Color", "Colour", s.m_Color);
    v("Text", "Text drawn", s.m_Text);
    v("TextSize", "Height of the text", s.m_TextSize);
  }
};

struct VGeometrySet {
  static constexpr const char* FlowClassName = "GeometrySet";
  std::vector<VGeometry> m_Geometry;
  std::string m_DeviceURN;
  std::string m_Name;
  bool operator==(const VGeometrySet&) const = default;
  template <class S, class V> static void FlowFields(S& s, V&& v) {
    v("Geometry", "Pieces drawn", s.m_Geometry);
    v("DeviceURN", "Camera for pixel geometry", s.m_DeviceURN);
    v("Name", "Set name", s.m_Name);
  }
};

} // namespace CoreOstraTypes
