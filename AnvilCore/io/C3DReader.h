#pragma once
#include "TrajectoryScene.h"
#include "exporters/trajectory/c3d/C3DFormat.h"
#include <cstddef>
#include <cstdint>
#include <map>
#include <string>
#include <vector>

namespace AnvilCore {

/// One parameter record of a C3D file, with its data as the file holds it.
struct C3DParameter {
  std::string group; ///< upper case as in the file; "" when no group record has its id
  std::string name;
  int type = 0;              ///< -1 characters, 1 byte, 2 16-bit integer, 4 float
  std::vector<int> dims;     ///< empty for a single value
  std::vector<uint8_t> data; ///< raw bytes, |type| * product of dims
  size_t offset = 0;         ///< byte offset of the record in the file
  C3D::EProcessor processor = C3D::EProcessorIntel;

  /// Number of values (product of the dimensions; 1 without dimensions).
  size_t count() const;
  /// Value `i` as an integer (bytes unsigned, 16-bit words signed, floats truncated); 0 when out
  /// of range or not a number.
  long intValue(size_t i) const;
  /// 16-bit value `i` read as unsigned (counts above 32767 are stored so); other types as
  /// `intValue`.
  long unsignedValue(size_t i) const;
  float floatValue(size_t i) const;
  /// Character data as strings: rows of dims[0] characters, trailing blanks and NULs removed.
  std::vector<std::string> strings() const;
};

/// What a C3D file holds, read and checked. Points are in the file's units; `units` names them.
struct C3DContent {
  C3D::EProcessor processor = C3D::EProcessorIntel;
  int pointCount = 0;
  int firstFrame = 0; ///< frame number of the first frame (usually 1)
  int frameCount = 0;
  double frameRate = 0.0;
  float scale = 0.0f;              ///< POINT scale; negative for float frames
  std::string units;               ///< POINT:UNITS, trimmed; empty when absent
  std::vector<std::string> labels; ///< one per point (a default when the file has none)
  /// SUBJECTS:LABEL_PREFIXES (when USES_PREFIXES is set) with the SUBJECTS:NAMES entry of the
  /// same place, or the prefix without its trailing ":" when there is none.
  std::vector<SubjectPrefix> subjectPrefixes;
  /// frameCount * pointCount entries of x, y, z, residual; a negative residual marks a gap.
  /// Left empty by a parse that does not decode them (see `decodeC3DPoints`).
  std::vector<float> points;
  size_t dataStart = 0;  ///< byte offset of the first frame
  size_t frameBytes = 0; ///< bytes of one frame: points, then analog

  int analogChannels = 0;
  int analogSamplesPerFrame = 0;
  double analogRate = 0.0;
  std::vector<std::string> analogLabels; ///< one per channel
  /// Per channel: ANALOG:OFFSET, ANALOG:SCALE times ANALOG:GEN_SCALE (1 when absent), and
  /// ANALOG:UNITS (empty when absent). The value of a channel is (reading - offset) * scale.
  std::vector<double> analogOffsets;
  std::vector<double> analogScales;
  std::vector<std::string> analogUnits;
  /// frameCount * samplesPerFrame * channels values, frame by frame, sample by sample: the raw
  /// reading minus the channel's OFFSET, at full precision (SCALE is not applied; a non-finite
  /// float reading is 0).
  std::vector<double> analog;

  /// What was read leniently (a frame count larger than the data, ...), for the log.
  std::vector<std::string> warnings;

  std::vector<C3DParameter> parameters;
  /// The parameter GROUP:NAME, or null.
  const C3DParameter* find(const std::string& i_group, const std::string& i_name) const;

  const float* point(int i_frame, int i_point) const {
    return &points[(size_t(i_frame) * size_t(pointCount) + size_t(i_point)) * 4];
  }

private:
  friend class C3DParser;
  std::map<std::string, size_t> m_index;
};

/// Reads a whole C3D file from memory: Intel, DEC and MIPS processor forms, integer and float
/// frames, labels past 255 (LABELS2, ...), long files (TRIAL:ACTUAL_*_FIELD, POINT:FRAMES,
/// POINT:DRU_*_FRAME). On failure returns false with a message naming what is wrong and the
/// byte offset where it was found; `o_rContent` is then unspecified.
/// With `i_decodePoints` false, `points` stays empty and the frames are only checked to lie in
/// the file; `decodeC3DPoints` then decodes them part by part.
bool parseC3D(const uint8_t* i_pData, size_t i_size, C3DContent& o_rContent, std::string& o_rError,
              bool i_decodePoints = true);

/// Decodes the points of frames [i_firstFrame, i_firstFrame + i_frameCount) of a file parsed
/// from `i_pData` into `o_pPoints`, laid out as `C3DContent::points`.
void decodeC3DPoints(const C3DContent& i_rContent, const uint8_t* i_pData, size_t i_firstFrame,
                     size_t i_frameCount, float* o_pPoints);
/// The same for points [i_firstPoint, i_firstPoint + i_pointCount) of each frame only.
void decodeC3DPoints(const C3DContent& i_rContent, const uint8_t* i_pData, size_t i_firstFrame,
                     size_t i_frameCount, size_t i_firstPoint, size_t i_pointCount,
                     float* o_pPoints);

} // namespace AnvilCore
