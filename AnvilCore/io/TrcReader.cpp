#include "TrcReader.h"
#include "TrajectoryScene.h"
#include "exporters/trajectory/c3d/PrintableText.h"
#include <algorithm>
#include <charconv>
#include <cmath>
#include <cstdlib>
#include <limits>
#include <map>
#include <string_view>

namespace AnvilCore {

namespace {

struct TrcError {
  std::string message;
};

std::string_view trim(std::string_view i_text) {
  while (!i_text.empty() && (i_text.front() == ' ' || i_text.front() == '\r'))
    i_text.remove_prefix(1);
  while (!i_text.empty() && (i_text.back() == ' ' || i_text.back() == '\r'))
    i_text.remove_suffix(1);
  return i_text;
}

// The fields of a line between tabs, trimmed, without the empty ones at its end; into a vector
// kept from line to line.
void splitTabs(std::string_view i_line, std::vector<std::string_view>& o_rFields) {
  o_rFields.clear();
  size_t start = 0;
  while (true) {
    const size_t tab = i_line.find('\t', start);
    o_rFields.push_back(
        trim(i_line.substr(start, tab == std::string_view::npos ? tab : tab - start)));
    if (tab == std::string_view::npos) break;
    start = tab + 1;
  }
  while (!o_rFields.empty() && o_rFields.back().empty())
    o_rFields.pop_back(); // trailing tabs
}

std::vector<std::string_view> splitTabs(std::string_view i_line) {
  std::vector<std::string_view> fields;
  splitTabs(i_line, fields);
  return fields;
}

std::string quoted(std::string_view i_text) {
  std::string text = "\"";
  text.append(i_text);
  text += '"';
  return text;
}

bool lowerEquals(std::string_view i_a, const char* i_pB) {
  size_t i = 0;
  for (; i < i_a.size() && i_pB[i]; ++i) {
    const char a = (i_a[i] >= 'A' && i_a[i] <= 'Z') ? char(i_a[i] - 'A' + 'a') : i_a[i];
    if (a != i_pB[i]) return false;
  }
  return i == i_a.size() && !i_pB[i];
}

// A number as strtod reads it. Out of range is not an error: a value below the smallest
// denormal reads as 0 (or the denormal), one above the largest double as an infinity, which the
// callers refuse (counts, rates) or take as a gap (coordinates).
bool toDouble(std::string_view i_text, double& o_rValue) {
  if (i_text.empty() || i_text.size() > 400) return false;
  // Plain decimal text goes through from_chars, which gives the value strtod gives (both round
  // correctly) at a fraction of the cost. What it does not take whole, or takes otherwise
  // (a '+' sign, hexadecimal, "inf", values out of range), strtod reads.
  const char* pBegin = i_text.data();
  const char* pEnd = pBegin + i_text.size();
  const char lead = pBegin[0] == '-' && i_text.size() > 1 ? pBegin[1] : pBegin[0];
  if ((lead >= '0' && lead <= '9') || lead == '.') {
    const auto result = std::from_chars(pBegin, pEnd, o_rValue);
    if (result.ec == std::errc() && result.ptr == pEnd) return true;
  }
  const std::string text(i_text);
  char* pStop = nullptr;
  o_rValue = std::strtod(text.c_str(), &pStop);
  return pStop != text.c_str() && *pStop == '\0';
}

bool toInt(std::string_view i_text, int& o_rValue) {
  double value;
  if (!toDouble(i_text, value) || value != std::floor(value) || std::fabs(value) > 1e9)
    return false;
  o_rValue = int(value);
  return true;
}

class TrcParser {
public:
  TrcParser(const char* i_pText, size_t i_size, TrcContent& o_rOut)
      : m_text(i_pText, i_size), m_rOut(o_rOut) {}

  void parse() {
    std::string_view line;
    if (!nextLine(line) || trim(line).substr(0, 12) != "PathFileType")
      fail("not a TRC file: it does not begin with \"PathFileType\"");
    std::string_view names, values;
    if (!nextLine(names)) failAtEnd("the header names");
    if (!nextLine(values)) failAtEnd("the header values");
    readHeader(splitTabs(names), splitTabs(values));
    if (!nextLine(line)) failAtEnd("the marker names");
    readMarkerNames(splitTabs(line));
    if (!nextLine(line)) failAtEnd("the X/Y/Z line");
    const auto coordinates = splitTabs(line);
    double number;
    if (!coordinates.empty() && toDouble(coordinates[0], number))
      fail("expected the X/Y/Z column line, found a frame");
    // Each sample takes at least six characters ("\t1\t2\t3"): no more are reserved than that.
    if (m_rOut.declaredFrames > 0)
      m_rOut.samples.reserve(std::min(size_t(m_rOut.declaredFrames) * size_t(m_markerCount),
                                      (m_text.size() - m_pos) / 6));
    m_rOut.frameNumbers.reserve(
        std::min(size_t(std::max(m_rOut.declaredFrames, 0)), m_text.size() - m_pos));
    std::vector<std::string_view> fields;
    while (nextLine(line)) {
      if (trim(line).empty()) continue;
      splitTabs(line, fields);
      readFrame(fields);
    }
    const int frames = int(m_rOut.frameNumbers.size());
    if (frames > 0 &&
        !framesFitClock(m_rOut.dataRate, m_rOut.frameNumbers.front(), m_rOut.frameNumbers.back())) {
      m_lineNumber = 0;
      fail("frames " + std::to_string(m_rOut.frameNumbers.front()) + " to " +
           std::to_string(m_rOut.frameNumbers.back()) + " at DataRate " +
           std::to_string(m_rOut.dataRate) + " lie beyond the host's clock");
    }
    if (m_rOut.declaredFrames > 0 && frames < m_rOut.declaredFrames) {
      m_lineNumber = 0;
      fail("the file ends after " + std::to_string(frames) + " of " +
           std::to_string(m_rOut.declaredFrames) + " frames (NumFrames)");
    }
    if (frames > m_rOut.declaredFrames && m_rOut.declaredFrames > 0)
      m_rOut.warnings.push_back("NumFrames is " + std::to_string(m_rOut.declaredFrames) + " but " +
                                std::to_string(frames) + " frame lines follow; all are read");
  }

private:
  bool nextLine(std::string_view& o_rLine) {
    if (m_pos >= m_text.size()) return false;
    const size_t end = m_text.find('\n', m_pos);
    o_rLine = m_text.substr(m_pos, end == std::string_view::npos ? end : end - m_pos);
    m_pos = end == std::string_view::npos ? m_text.size() : end + 1;
    ++m_lineNumber;
    return true;
  }

  [[noreturn]] void failAtEnd(const char* i_pWhat) const {
    throw TrcError{"the file ends after line " + std::to_string(m_lineNumber) + ", before " +
                   i_pWhat};
  }

  [[noreturn]] void fail(const std::string& i_message, int i_column = 0) const {
    std::string where;
    if (m_lineNumber > 0) where = "line " + std::to_string(m_lineNumber);
    if (i_column > 0) where += ", column " + std::to_string(i_column);
    throw TrcError{where.empty() ? i_message : where + ": " + i_message};
  }

  void readHeader(const std::vector<std::string_view>& i_names,
                  const std::vector<std::string_view>& i_values) {
    std::map<std::string, std::string_view, std::less<>> header;
    for (size_t i = 0; i < i_names.size(); ++i)
      header.emplace(std::string(i_names[i]),
                     i < i_values.size() ? i_values[i] : std::string_view());
    auto get = [&](const char* i_pName) -> const std::string_view* {
      const auto it = header.find(i_pName);
      return it == header.end() ? nullptr : &it->second;
    };
    const std::string_view* pRate = get("DataRate");
    if (!pRate || pRate->empty()) pRate = get("CameraRate");
    if (!pRate) fail("the header has no DataRate");
    if (!toDouble(*pRate, m_rOut.dataRate) || !(m_rOut.dataRate > 0.0) || m_rOut.dataRate > 1e6)
      fail("DataRate \"" + std::string(*pRate) + "\" is not a rate between 0 and 1000000");
    const std::string_view* pMarkers = get("NumMarkers");
    if (!pMarkers) fail("the header has no NumMarkers");
    if (!toInt(*pMarkers, m_markerCount) || m_markerCount < 0)
      fail("NumMarkers \"" + std::string(*pMarkers) + "\" is not a count");
    if (const std::string_view* pFrames = get("NumFrames"))
      if (!pFrames->empty() && !toInt(*pFrames, m_rOut.declaredFrames))
        fail("NumFrames \"" + std::string(*pFrames) + "\" is not a count");
    const std::string_view* pUnits = get("Units");
    m_rOut.units = pUnits && !pUnits->empty() ? std::string(*pUnits) : "mm";
    if (const std::string_view* pStart = get("OrigDataStartFrame")) {
      int start = 1;
      if (toInt(*pStart, start)) m_nextFrame = start;
    }
  }

  void readMarkerNames(const std::vector<std::string_view>& i_fields) {
    if (i_fields.empty() || !lowerEquals(i_fields[0].substr(0, 5), "frame"))
      fail("expected the marker name line starting with \"Frame#\"");
    // Every name stands in the first of its three columns; the columns between are empty.
    const size_t limit = 2 + 3 * size_t(m_markerCount);
    for (size_t i = 2; i < i_fields.size(); ++i) {
      if (i_fields[i].empty()) continue;
      if (i >= limit)
        fail("more marker names than NumMarkers (" + std::to_string(m_markerCount) + ")");
      if ((i - 2) % 3 != 0)
        fail("marker name \"" + std::string(i_fields[i]) + "\" is not in a first column of three");
    }
    for (int k = 0; k < m_markerCount; ++k) {
      const size_t column = 2 + 3 * size_t(k);
      if (column >= i_fields.size() || i_fields[column].empty())
        fail("marker " + std::to_string(k + 1) + " of " + std::to_string(m_markerCount) +
             " (NumMarkers) has no name");
      bool changed = false;
      m_rOut.labels.push_back(C3D::printableText(i_fields[column], &changed));
      if (changed)
        m_rOut.warnings.push_back("marker " + std::to_string(k + 1) +
                                  " has a name with characters that cannot be printed; read as \"" +
                                  m_rOut.labels.back() + "\"");
    }
  }

  void readFrame(const std::vector<std::string_view>& i_fields) {
    int frame = m_nextFrame;
    if (!i_fields.empty() && !i_fields[0].empty() && !toInt(i_fields[0], frame))
      fail("frame number \"" + std::string(i_fields[0]) + "\" is not a whole number", 1);
    if (!m_rOut.frameNumbers.empty() && frame <= m_rOut.frameNumbers.back())
      fail("frame " + std::to_string(frame) + " does not follow frame " +
               std::to_string(m_rOut.frameNumbers.back()),
           1);
    const size_t limit = 2 + 3 * size_t(m_markerCount);
    if (i_fields.size() > limit)
      fail("values past the columns of NumMarkers (" + std::to_string(m_markerCount) + ")",
           int(limit) + 1);
    const int index = int(m_rOut.frameNumbers.size());
    m_rOut.frameNumbers.push_back(frame);
    m_nextFrame = frame + 1;
    // Markers past the last column of a short line have gaps; nothing to visit.
    const int given = i_fields.size() > 2 ? int((i_fields.size() - 2 + 2) / 3) : 0;
    for (int k = 0; k < given; ++k) {
      double xyz[3];
      bool present = true;
      for (int c = 0; c < 3; ++c) {
        const size_t column = 2 + 3 * size_t(k) + size_t(c);
        const std::string_view field = column < i_fields.size() ? i_fields[column] : "";
        if (field.empty() || lowerEquals(field, "nan")) {
          present = false;
          continue;
        }
        if (!toDouble(field, xyz[c])) fail(quoted(field) + " is not a number", int(column) + 1);
        // "inf", "nan(...)" and values beyond the double range are no position: a gap.
        if (!std::isfinite(xyz[c])) present = false;
      }
      if (present) m_rOut.samples.push_back({index, k, xyz[0], xyz[1], xyz[2]});
    }
  }

  std::string_view m_text;
  TrcContent& m_rOut;
  size_t m_pos = 0;
  int m_lineNumber = 0;
  int m_markerCount = 0;
  int m_nextFrame = 1;
};

} // namespace

bool parseTrc(const char* i_pText, size_t i_size, TrcContent& o_rContent, std::string& o_rError) {
  o_rContent = TrcContent();
  try {
    TrcParser(i_pText, i_size, o_rContent).parse();
    return true;
  } catch (const TrcError& e) {
    // Messages quote the file's text, which may hold NULs or control characters.
    o_rError = C3D::printableText(e.message);
    return false;
  }
}

} // namespace AnvilCore
