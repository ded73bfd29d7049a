#pragma once
#include <cstddef>
#include <string>
#include <vector>

namespace AnvilCore {

/// What a TRC file holds, read and checked. Positions are in the file's units.
struct TrcContent {
  double dataRate = 0.0;
  std::string units;               ///< "mm" when the file names none
  int declaredFrames = 0;          ///< NumFrames of the header; 0 when absent
  std::vector<std::string> labels; ///< one per marker, from the name line
  /// Frame number of each frame line, in file order (strictly increasing).
  std::vector<int> frameNumbers;
  /// One present position; a marker without a sample on a line has a gap there.
  struct Sample {
    int frame;  ///< index into `frameNumbers`
    int marker; ///< index into `labels`
    double x, y, z;
  };
  std::vector<Sample> samples; ///< by frame line, then by marker
  std::vector<std::string> warnings;
};

/// Reads a TRC file from memory as other programs write it: tab-separated, header names in any
/// order on line 2 with their values on line 3, marker names on line 4 every third column,
/// the X/Y/Z line (numbered from 0 or 1), optional blank lines, then one line per frame.
/// Numbers may be padded with blanks or zeros; empty or "nan" columns are gaps; a trailing tab
/// or "\r" is ignored. On failure returns false with a message naming the line (and column).
bool parseTrc(const char* i_pText, size_t i_size, TrcContent& o_rContent, std::string& o_rError);

} // namespace AnvilCore
