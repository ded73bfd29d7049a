#pragma once
// The line-oriented text form of the calibrated model, and its log summary.
//
// Every value follows a label ("NumSegments: 12"). A string is written as its length on a line
// of its own, then its label, then exactly that many bytes, so that any name (blanks and line
// breaks included) reads back unchanged. Numbers are written in their shortest form that reads
// back to the same double. Counts and sizes read are checked against what the model allows and
// against the text that is left, so malformed text ends in an error, never in a huge
// allocation.

#include "OstraAlgo/KinematicAlgo/ICalibrated.h"

#include <cstddef>
#include <ostream>
#include <string>
#include <string_view>

namespace KinematicAlgo {

/// Writing helpers shared by the model classes.
namespace Text {
/// `label` then the numbers, separated by blanks.
void Numbers(std::ostream& o_rStream, std::string_view label, const double* values, size_t n);
/// The length on its own line, then `label` and the string.
void String(std::ostream& o_rStream, std::string_view label, const std::string& value);
/// Rotation row by row, then translation.
void Pose(std::ostream& o_rStream, std::string_view label, const VPose& pose);
/// A 3x3 matrix row by row, then a line break.
void Matrix3(std::ostream& o_rStream, std::string_view label, const Eigen::Matrix3d& m);
} // namespace Text

/// Reads the text form from memory. Each operation skips white space first and returns false
/// on a mismatch, keeping the first error with its line ("line 7: expected 'NumSegments:'").
class VTextReader {
public:
  explicit VTextReader(std::string_view text) : m_Text(text) {}

  /// The label's text without its surrounding blanks must come next.
  bool Label(std::string_view label);
  bool Int(std::int32_t& o_rValue);
  bool UInt(std::uint32_t& o_rValue);
  /// An unsigned count no larger than `limit`; `what` names it in the error.
  bool Count(std::uint32_t& o_rValue, std::uint32_t limit, std::string_view what);
  bool Number(double& o_rValue);
  bool Numbers(double* o_pValues, size_t n);
  /// A length line, `label`, one blank, then exactly that many bytes.
  bool String(std::string_view label, std::string& o_rValue);
  bool Pose(std::string_view label, VPose& o_rPose);
  /// A 3x3 matrix written by Text::Matrix3.
  bool Matrix3(std::string_view label, Eigen::Matrix3d& o_rMatrix);
  /// Records `message` (if no error is recorded yet) at the current line; returns false.
  bool Fail(const std::string& message);

  const std::string& Error() const { return m_Error; }
  /// Bytes not read yet (a bound for counts: every item needs some).
  size_t Remaining() const { return m_Text.size() - m_Pos; }
  /// True when only white space is left.
  bool AtEnd();

private:
  void SkipSpace();
  std::string_view Token();

  std::string_view m_Text;
  size_t m_Pos = 0;
  std::string m_Error;
};

/// A short description for logs: the subject's name, its marker and segment counts, the root
/// with its joint, then each further segment indented by its depth, with its parent and joint.
std::string Summary(const ISubjectCalibrated& subject);

} // namespace KinematicAlgo
