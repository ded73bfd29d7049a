#pragma once
#include "exporters/trajectory/c3d/C3DFormat.h"
#include <array>
#include <cstdint>
#include <string>
#include <vector>

/// Builds C3D files byte by byte for tests and benchmarks, in any processor form, with integer
/// or float frames. Parameters are written in the order POINT, ANALOG, SUBJECTS, extras.
struct C3DTestFile {
  C3D::EProcessor processor = C3D::EProcessorIntel;
  float scale = -1.0f; ///< negative: float frames; positive: 16-bit integers times the scale
  int firstFrame = 1;
  float rate = 100.0f;
  std::string units = "mm";
  std::vector<std::string> labels;
  /// frames[f][p] = x, y, z, residual (negative: a gap)
  std::vector<std::vector<std::array<float, 4>>> frames;
  std::vector<std::string> subjectPrefixes; ///< written as SUBJECTS:LABEL_PREFIXES when set
  std::vector<std::string> subjectNames;    ///< SUBJECTS:NAMES, when set

  int analogSamplesPerFrame = 0;
  std::vector<std::string> analogLabels;
  std::vector<int> analogOffsets;
  /// Per frame, samplesPerFrame * channels raw values, sample by sample.
  std::vector<std::vector<int>> analog;
  /// Per frame, as `analog`, for float files: used instead of `analog` when set.
  std::vector<std::vector<float>> analogReal;
  float analogRate = 0.0f;     ///< ANALOG:RATE when not 0 (else rate times samples per frame)
  float parameterScale = 0.0f; ///< POINT:SCALE when not 0 (else `scale`, as in the header)

  struct Extra {
    int group; ///< 1 POINT, 2 ANALOG, 3 SUBJECTS, 4 TRIAL
    std::string name;
    int type;
    std::vector<int> dims;
    std::vector<uint8_t> data; ///< already in the file's byte order
  };
  std::vector<Extra> extras;
  bool writeUsed = true; ///< POINT:USED (a test may leave it out or falsify it with an extra)

  std::vector<uint8_t> build() const;

  /// Encodings of this file's processor form.
  std::vector<uint8_t> word(int i_value) const;
  std::vector<uint8_t> real(float i_value) const;
  /// A marker moving on a line, one per label, for `i_frames` frames (no gaps).
  void fillLinear(int i_points, int i_frames);
};
