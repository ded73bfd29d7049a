#pragma once
// What one camera saw in one frame: centroids, their tracks, labels, weights and assignments,
// edge pairs and greyscale blobs. Each record lists its fields for serialisation in FlowFields,
// in the order they are written.

#include <array>
#include <cstdint>
#include <string>
#include <vector>

#include "River/CoreOstraTypes/VTrackLabel.h"

namespace CoreOstraTypes {

struct VCentroid {
  static constexpr const char* FlowClassName = "Centroid";
  std::array<double, 2> m_Position{}; ///< pixels
  double m_Radius = 0.0;              ///< pixels
  double m_Score = 0.0;               ///< circularity, 0 to 1
  std::uint32_t m_PixelCount = 0;
  std::uint32_t m_Threshold = 0;
  std::uint32_t m_GeneratorId = 0;
  bool operator==(const VCentroid&) const = default;
  template <class S, class V> static void FlowFields(S& s, V&& v) {
    v("Position", "Centre in pixels", s.m_Position);
    v("Radius", "Radius in pixels", s.m_Radius);
    v("Score", "Circularity score", s.m_Score);
    v("PixelCount", "Pixels above the threshold", s.m_PixelCount);
    v("Threshold", "Grey level threshold", s.m_Threshold);
    v("GeneratorId", "Algorithm that made the centroid", s.m_GeneratorId);
  }
};

struct VCentroidSet {
  static constexpr const char* FlowClassName = "CentroidSet";
  std::string m_DeviceURN;
  std::uint32_t m_GeneratorId = 0;
  double m_CircularityThreshold = 0.0;
  std::vector<VCentroid> m_Centroids;
  bool operator==(const VCentroidSet&) const = default;
  template <class S, class V> static void FlowFields(S& s, V&& v) {
    v("DeviceURN", "Camera", s.m_DeviceURN);
    v("GeneratorId", "Algorithm that made the set", s.m_GeneratorId);
    v("CircularityThreshold", "Lowest score kept", s.m_CircularityThreshold);
    v("Centroids", "Centroids of the frame", s.m_Centroids);
  }
};

struct VCentroidTrackSet {
  static constexpr const char* FlowClassName = "CentroidTrackSet";
  std::string m_DeviceURN;
  std::uint32_t m_GeneratorId = 0;
  std::vector<VTrack> m_CentroidTracks; ///< one per centroid of the frame's set
  bool operator==(const VCentroidTrackSet&) const = default;
  template <class S, class V> static void FlowFields(S& s, V&& v) {
    v("DeviceURN", "Camera", s.m_DeviceURN);
    v("GeneratorId", "Algorithm that made the set", s.m_GeneratorId);
    v("CentroidTracks", "Track of each centroid", s.m_CentroidTracks);
  }
};

struct VCentroidLabelSet {
  static constexpr const char* FlowClassName = "CentroidLabelSet";
  std::string m_DeviceURN;
  std::vector<VLabel> m_CentroidLabels;
  bool operator==(const VCentroidLabelSet&) const = default;
  template <class S, class V> static void FlowFields(S& s, V&& v) {
    v("DeviceURN", "Camera", s.m_DeviceURN);
    v("CentroidLabels", "Label of each centroid", s.m_CentroidLabels);
  }
};

struct VCentroidWeightSet {
  static constexpr const char* FlowClassName = "CentroidWeightSet";
  std::string m_DeviceURN;
  std::vector<float> m_CentroidWeights;
  bool operator==(const VCentroidWeightSet&) const = default;
  template <class S, class V> static void FlowFields(S& s, V&& v) {
    v("DeviceURN", "Camera", s.m_DeviceURN);
    v("CentroidWeights", "Weight of each centroid in reconstruction", s.m_CentroidWeights);
  }
};

/// For each centroid, the reconstruction it took part in; all ones for none.
struct VCentroidAssignmentSet {
  static constexpr const char* FlowClassName = "CentroidAssignmentSet";
  std::string m_DeviceURN;
  std::vector<std::uint32_t> m_ReconstructionIndices;
  bool operator==(const VCentroidAssignmentSet&) const = default;
  template <class S, class V> static void FlowFields(S& s, V&& v) {
    v("DeviceURN", "Camera", s.m_DeviceURN);
    v("ReconstructionIndices", "Reconstruction of each centroid", s.m_ReconstructionIndices);
  }
};

/// Where the reconstructions of the last frame are expected to be seen by a camera.
struct VCentroidAssignmentPredictionSet {
  static constexpr const char* FlowClassName = "CentroidAssignmentPredictionSet";
  std::string m_DeviceURN;
  std::vector<std::array<double, 2>> m_Predictions; ///< pixels, one per reconstruction
  bool operator==(const VCentroidAssignmentPredictionSet&) const = default;
  template <class S, class V> static void FlowFields(S& s, V&& v) {
    v("DeviceURN", "Camera", s.m_DeviceURN);
    v("Predictions", "Predicted image position of each reconstruction", s.m_Predictions);
  }
};

struct VEdgePair {
  static constexpr const char* FlowClassName = "EdgePair";
  std::array<float, 2> m_Position{}; ///< pixels, the left edge
  float m_Length = 0.0f;             ///< pixels to the right edge
  bool operator==(const VEdgePair&) const = default;
  template <class S, class V> static void FlowFields(S& s, V&& v) {
    v("Position", "Left edge in pixels", s.m_Position);
    v("Length", "Distance to the right edge", s.m_Length);
  }
};

struct VEdgePairSet {
  static constexpr const char* FlowClassName = "EdgePairSet";
  std::string m_DeviceURN;
  std::vector<VEdgePair> m_EdgePairs;
  bool operator==(const VEdgePairSet&) const = default;
  template <class S, class V> static void FlowFields(S& s, V&& v) {
    v("DeviceURN", "Camera", s.m_DeviceURN);
    v("EdgePairs", "Edge pairs of the frame", s.m_EdgePairs);
  }
};

struct VGreyscaleBlob {
  static constexpr const char* FlowClassName = "GreyscaleBlob";
  std::uint32_t m_FirstLineIndex = 0; ///< into the set's lines; a blob runs to the next one's
  bool operator==(const VGreyscaleBlob&) const = default;
  template <class S, class V> static void FlowFields(S& s, V&& v) {
    v("FirstLineIndex", "First line of the blob", s.m_FirstLineIndex);
  }
};

struct VGreyscaleLine {
  static constexpr const char* FlowClassName = "GreyscaleLine";
  std::array<std::uint16_t, 2> m_Position{}; ///< column and row of the first pixel
  std::uint32_t m_FirstPixelIndex = 0;       ///< into the set's pixels
  std::uint16_t m_Length = 0;
  std::uint16_t m_Padding = 0;
  bool operator==(const VGreyscaleLine&) const = default;
  template <class S, class V> static void FlowFields(S& s, V&& v) {
    v("Position", "Column and row of the first pixel", s.m_Position);
    v("FirstPixelIndex", "First pixel of the line", s.m_FirstPixelIndex);
    v("Length", "Pixels in the line", s.m_Length);
    v("Padding", "", s.m_Padding);
  }
};

struct VGreyscaleBlobSet {
  static constexpr const char* FlowClassName = "GreyscaleBlobSet";
  std::string m_DeviceURN;
  std::vector<VGreyscaleBlob> m_GreyscaleBlobs;
  std::vector<VGreyscaleLine> m_GreyscaleLines;
  std::vector<std::uint8_t> m_GreyscalePixels;
  bool operator==(const VGreyscaleBlobSet&) const = default;
  template <class S, class V> static void FlowFields(S& s, V&& v) {
    v("DeviceURN", "Camera", s.m_DeviceURN);
    v("GreyscaleBlobs", "Blobs of the frame", s.m_GreyscaleBlobs);
    v("GreyscaleLines", "Lines of all blobs", s.m_GreyscaleLines);
    v("GreyscalePixels", "Grey levels of all lines", s.m_GreyscalePixels);
  }
};

} // namespace CoreOstraTypes
