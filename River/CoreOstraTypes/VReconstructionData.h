#pragma once
// The 3D points of one frame and what is known about them: tracks, labels, labelled rotations.

#include "River/CoreOstraTypes/VTrackLabel.h"

#include <array>
#include <cstdint>
#include <vector>

namespace CoreOstraTypes {

struct VReconstruction {
  static constexpr const char* FlowClassName = "Reconstruction";
  std::array<double, 3> m_Position{}; ///< world millimetres
  bool operator==(const VReconstruction&) const = default;
  template <class S, class V> static void FlowFields(S& s, V&& v) {
    v("Position", "World position in millimetres", s.m_Position);
  }
};

struct VReconstructionSet {
  static constexpr const char* FlowClassName = "ReconstructionSet";
  std::uint32_t m_GeneratorId = 0;
  std::vector<VReconstruction> m_Reconstructions;
  bool operator==(const VReconstructionSet&) const = default;
  template <class S, class V> static void FlowFields(S& s, V&& v) {
    v("GeneratorId", "Algorithm that made the set", s.m_GeneratorId);
    v("Reconstructions", "Points of the frame", s.m_Reconstructions);
  }
};

struct VReconstructionTrackSet {
  static constexpr const char* FlowClassName = "ReconstructionTrackSet";
  std::uint32_t m_GeneratorId = 0;
  std::vector<VTrack> m_ReconstructionTracks; ///< one per reconstruction
  bool operator==(const VReconstructionTrackSet&) const = default;
  template <class S, class V> static void FlowFields(S& s, V&& v) {
    v("GeneratorId", "Algorithm that made the set", s.m_GeneratorId);
    v("ReconstructionTracks", "Track of each reconstruction", s.m_ReconstructionTracks);
  }
};

struct VReconstructionLabelSet {
  static constexpr const char* FlowClassName = "ReconstructionLabelSet";
  std::uint32_t m_GeneratorId = 0;
  std::vector<VLabel> m_ReconstructionLabels;
  bool operator==(const VReconstructionLabelSet&) const = default;
  template <class S, class V> static void FlowFields(S& s, V&& v) {
    v("GeneratorId", "Algorithm that made the set", s.m_GeneratorId);
    v("ReconstructionLabels", "Label of each reconstruction", s.m_ReconstructionLabels);
  }
};

struct VLabelledRotation {
  static constexpr const char* FlowClassName = "LabelledRotation";
  std::array<double, 4> m_Rotation{0.0, 0.0, 0.0, 1.0}; ///< quaternion x, y, z, w
  bool operator==(const VLabelledRotation&) const = default;
  template <class S, class V> static void FlowFields(S& s, V&& v) {
    v("Rotation", "World rotation as a quaternion (x, y, z, w)", s.m_Rotation);
  }
};

/// Rotations measured by devices (inertial sensors), parallel to a subject's rotation list.
struct VLabelledRotationSet {
  static constexpr const char* FlowClassName = "LabelledRotationSet";
  std::uint32_t m_GeneratorId = 0;
  std::vector<VLabelledRotation> m_LabelledRotations;
  bool operator==(const VLabelledRotationSet&) const = default;
  template <class S, class V> static void FlowFields(S& s, V&& v) {
    v("GeneratorId", "Algorithm that made the set", s.m_GeneratorId);
    v("LabelledRotations", "Rotations of the frame", s.m_LabelledRotations);
  }
};

} // namespace CoreOstraTypes
