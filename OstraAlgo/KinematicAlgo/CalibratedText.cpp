#include "OstraAlgo/KinematicAlgo/CalibratedText.h"

#include <algorithm>
#include <charconv>
#include <sstream>

namespace KinematicAlgo {

namespace Text {

namespace {
void Number(std::ostream& o_rStream, double value) {
  char buffer[32];
  const auto result = std::to_chars(buffer, buffer + sizeof buffer, value);
  o_rStream.write(buffer, result.ptr - buffer);
}
} // namespace

void Numbers(std::ostream& o_rStream, std::string_view label, const double* values, size_t n) {
  o_rStream << label;
  for (size_t i = 0; i < n; ++i) {
    if (i) o_rStream << ' ';
    Number(o_rStream, values[i]);
  }
}

void String(std::ostream& o_rStream, std::string_view label, const std::string& value) {
  o_rStream << value.size() << '\n' << label << value;
}

void Pose(std::ostream& o_rStream, std::string_view label, const VPose& pose) {
  double values[12];
  for (int r = 0; r < 3; ++r)
    for (int c = 0; c < 3; ++c)
      values[3 * r + c] = pose.m_Rotation(r, c);
  for (int i = 0; i < 3; ++i)
    values[9 + i] = pose.m_Translation[i];
  Numbers(o_rStream, label, values, 12);
}

void Matrix3(std::ostream& o_rStream, std::string_view label, const Eigen::Matrix3d& m) {
  const Eigen::Matrix<double, 3, 3, Eigen::RowMajor> rows = m;
  Numbers(o_rStream, label, rows.data(), 9);
  o_rStream << '\n';
}

} // namespace Text

namespace {
bool IsSpace(char c) {
  return c == ' ' || c == '\n' || c == '\r' || c == '\t';
}
std::string_view Trimmed(std::string_view s) {
  while (!s.empty() && IsSpace(s.front()))
    s.remove_prefix(1);
  while (!s.empty() && IsSpace(s.back()))
    s.remove_suffix(1);
  return s;
}
} // namespace

void VTextReader::SkipSpace() {
  while (m_Pos < m_Text.size() && IsSpace(m_Text[m_Pos]))
    ++m_Pos;
}

std::string_view VTextReader::Token() {
  SkipSpace();
  size_t end = m_Pos;
  while (end < m_Text.size() && !IsSpace(m_Text[end]))
    ++end;
  return m_Text.substr(m_Pos, end - m_Pos);
}

bool VTextReader::Fail(const std::string& message) {
  if (m_Error.empty()) {
    const size_t at = std::min(m_Pos, m_Text.size());
    const auto line = 1 + std::count(m_Text.begin(), m_Text.begin() + std::ptrdiff_t(at), '\n');
    m_Error = "line " + std::to_string(line) + ": " + message;
  }
  return false;
}

bool VTextReader::AtEnd() {
  SkipSpace();
  return m_Pos == m_Text.size();
}

bool VTextReader::Label(std::string_view label) {
  const std::string_view expected = Trimmed(label);
  SkipSpace();
  if (m_Text.substr(m_Pos, expected.size()) != expected)
    return Fail("expected '" + std::string(expected) + "'");
  m_Pos += expected.size();
  return true;
}

namespace {
template <class T> bool Parse(std::string_view token, T& o_rValue) {
  const char* end = token.data() + token.size();
  const auto result = std::from_chars(token.data(), end, o_rValue);
  return !token.empty() && result.ec == std::errc() && result.ptr == end;
}
} // namespace

bool VTextReader::Int(std::int32_t& o_rValue) {
  const std::string_view token = Token();
  if (!Parse(token, o_rValue))
    return Fail("expected a whole number, found '" + std::string(token.substr(0, 40)) + "'");
  m_Pos += token.size();
  return true;
}

bool VTextReader::UInt(std::uint32_t& o_rValue) {
  const std::string_view token = Token();
  if (!Parse(token, o_rValue))
    return Fail("expected an unsigned whole number, found '" + std::string(token.substr(0, 40)) +
                "'");
  m_Pos += token.size();
  return true;
}

bool VTextReader::Count(std::uint32_t& o_rValue, std::uint32_t limit, std::string_view what) {
  if (!UInt(o_rValue)) return false;
  if (o_rValue > limit)
    return Fail(std::string(what) + " " + std::to_string(o_rValue) + " exceeds " +
                std::to_string(limit));
  return true;
}

bool VTextReader::Number(double& o_rValue) {
  const std::string_view token = Token();
  if (!Parse(token, o_rValue))
    return Fail("expected a number, found '" + std::string(token.substr(0, 40)) + "'");
  m_Pos += token.size();
  return true;
}

bool VTextReader::Numbers(double* o_pValues, size_t n) {
  for (size_t i = 0; i < n; ++i)
    if (!Number(o_pValues[i])) return false;
  return true;
}

bool VTextReader::String(std::string_view label, std::string& o_rValue) {
  std::uint32_t length = 0;
  if (!UInt(length) || !Label(label)) return false;
  // The label's own trailing blank separates it from the bytes of the string.
  if (m_Pos >= m_Text.size() || m_Text[m_Pos] != ' ')
    return Fail("expected a blank after the label");
  ++m_Pos;
  if (length > m_Text.size() - m_Pos)
    return Fail("a string of " + std::to_string(length) + " bytes runs past the end");
  o_rValue.assign(m_Text.substr(m_Pos, length));
  m_Pos += length;
  return true;
}

bool VTextReader::Pose(std::string_view label, VPose& o_rPose) {
  double values[12];
  if (!Label(label) || !Numbers(values, 12)) return false;
  for (int r = 0; r < 3; ++r)
    for (int c = 0; c < 3; ++c)
      o_rPose.m_Rotation(r, c) = values[3 * r + c];
  for (int i = 0; i < 3; ++i)
    o_rPose.m_Translation[i] = values[9 + i];
  return true;
}

bool VTextReader::Matrix3(std::string_view label, Eigen::Matrix3d& o_rMatrix) {
  Eigen::Matrix<double, 3, 3, Eigen::RowMajor> rows;
  if (!Label(label) || !Numbers(rows.data(), 9)) return false;
  o_rMatrix = rows;
  return true;
}

std::string Summary(const ISubjectCalibrated& subject) {
  std::ostringstream out;
  const SegmentTree& tree = subject.Segments();
  const auto jointName = [](const ISegmentCalibrated& s) {
    return s.Joint() ? s.Joint()->TypeName() : std::string("none");
  };
  out << "Subject: " << subject.Name() << '\n';
  out << "Markers : " << subject.NumMarkers() << '\n';
  out << "Segments : " << tree.Size() << '\n';
  for (std::int32_t i = 0; i < tree.Size(); ++i) {
    const ISegmentCalibrated& s = *tree[i].m_Value;
    if (tree[i].m_Parent < 0) {
      out << "Root Segment : " << s.Name() << ", joint=" << jointName(s) << '\n';
      continue;
    }
    out << std::string(size_t(tree.Depth(i)), ' ') << "Segment : " << s.Name()
        << " (parent= " << tree[tree[i].m_Parent].m_Value->Name() << "), joint=" << jointName(s)
        << '\n';
  }
  return out.str();
}

} // namespace KinematicAlgo
