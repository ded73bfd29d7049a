#include "River/CoreOstraKMTIO/ReaderPasses.h"

#include "DebugServices/GlobalLog.h"
#include "River/CoreOstraKMTIO/ExpressionEvaluation.h"
#include "River/CoreOstraKMTIO/PostTransform.h"
#include "River/CoreOstraTypesUtils/GenericDynamicSubspace.h"
#include "River/CoreOstraTypesUtils/JointAxes.h"

#include <array>
#include <cmath>
#include <cstring>

#if defined(__SSE2__)
#include <emmintrin.h>
#endif

namespace CoreOstraKMTIO::Detail {

using CoreOstraTypes::JointParameterCount;
using CoreOstraTypes::VJointTypeBase;
using CoreOstraTypes::VTargetTypeBase;
using CoreOstraTypesUtils::VDynamicExpressionParserSimple;

namespace {

/// Evaluates the non-empty entries only: these lists are optional.
template <std::size_t N>
bool EvaluateGiven(VDynamicExpressionParserSimple& parser, const std::array<std::string, N>& texts,
                   const VExpressionOwner& owner, std::vector<std::string>& o_rErrors) {
  bool ok = true;
  double value = 0.0;
  for (const auto& text : texts)
    if (!text.empty()) ok = Evaluate(parser, text, owner, value, o_rErrors) && ok;
  return ok;
}

/// A post half the file left out is no transform, as a missing pre transform is.
std::array<std::string, 3> ZeroIfAbsent(const std::array<std::string, 3>& texts) {
  if (texts != std::array<std::string, 3>{}) return texts;
  return {"0", "0", "0"};
}

void CompleteAxes(const std::string& name, VJointType type,
                  const VSubjectKMTExtras::VSegment& extras, std::array<double, 3>& io_rOrientation,
                  std::vector<std::string>& o_rErrors, std::vector<std::string>& o_rWarnings) {
  if (type == VJointTypeBase::EHardySpicer) {
    CoreOstraTypesUtils::AxisPair pair{0, 0, 1, 0, 1, 0};
    if (!extras.m_HasAxes) {
      o_rWarnings.push_back(
          ZMT::FormatOrRaw("Hardy-Spicer joint '%s' is missing AXIS-PAIR, using defaults", name));
    } else if (extras.m_Axes.size() != 6) {
      o_rErrors.push_back(ZMT::FormatOrRaw(
          "Hardy-Spicer joint '%s' has invalid AXIS-PAIR, expected 6 elements got %d", name,
          extras.m_Axes.size()));
      return;
    } else {
      std::copy(extras.m_Axes.begin(), extras.m_Axes.end(), pair.begin());
    }
    const double dot = pair[0] * pair[3] + pair[1] * pair[4] + pair[2] * pair[5];
    if (!(std::abs(dot) <= 0.001)) {
      o_rErrors.push_back(
          ZMT::FormatOrRaw("Hardy-Spicer joint '%s' has non orthogonal axes", name));
      return;
    }
    CoreOstraTypesUtils::JointOrientationFromAxisPair(pair, io_rOrientation);
    return;
  }
  if (type != VJointTypeBase::EHinge && type != VJointTypeBase::ESlider) return;
  const char* kind = type == VJointTypeBase::EHinge ? "Hinge" : "Slider";
  CoreOstraTypesUtils::Vector3 axis{0, 0, 1};
  if (!extras.m_HasAxes) {
    o_rWarnings.push_back(
        ZMT::FormatOrRaw("%1% joint '%2%' is missing AXIS, using default", kind, name));
  } else if (extras.m_Axes.size() != 3) {
    o_rErrors.push_back(
        ZMT::FormatOrRaw("%1% joint '%2%' has invalid AXIS, expected 3 elements got %3%", kind,
                         name, extras.m_Axes.size()));
    return;
  } else {
    std::copy(extras.m_Axes.begin(), extras.m_Axes.end(), axis.begin());
  }
  CoreOstraTypesUtils::JointOrientationFromAxis(axis, io_rOrientation);
}

} // namespace

bool CheckExpressions(VReadContext& context, VDynamicExpressionParserSimple& parser,
                      std::vector<std::string>& o_rErrors) {
  auto& subject = context.m_rSubject;
  bool ok = parser.SetParameters(subject, o_rErrors);
  for (std::size_t i = 0; i < subject.m_Segments.size(); ++i) {
    const auto& segment = subject.m_Segments[i];
    auto& extras = context.m_rExtras.m_Segments[i];
    const auto owner = VExpressionOwner::Segment(segment.m_Name);
    ok = EvaluateAll(parser, segment.m_PreRotation, owner, extras.m_PreRotation, o_rErrors) && ok;
    ok = EvaluateAll(parser, segment.m_PreTranslation, owner, extras.m_PreTranslation, o_rErrors) &&
         ok;
    if (!segment.m_MassExpression.empty()) {
      double mass = 0.0;
      ok = Evaluate(parser, segment.m_MassExpression, owner, mass, o_rErrors) && ok;
    }
    ok = EvaluateGiven(parser, segment.m_MassCentreExpressions, owner, o_rErrors) && ok;
    ok = EvaluateGiven(parser, segment.m_RadiusOfGyrationExpressions, owner, o_rErrors) && ok;
  }
  for (std::size_t i = 0; i < subject.m_Targets.size(); ++i) {
    const auto owner = VExpressionOwner::Target(i);
    double value = 0.0;
    for (const auto& text : subject.m_Targets[i].m_StateExpressions)
      ok = Evaluate(parser, text, owner, value, o_rErrors) && ok;
  }
  return ok;
}

void CompleteJointsAndTargets(VReadContext& context, VDynamicExpressionParserSimple& parser,
                              std::vector<std::string>& o_rErrors,
                              std::vector<std::string>& o_rWarnings) {
  auto& subject = context.m_rSubject;
  const IVersion version = context.m_FileVersion;
  bool hasTPose = false;
  for (std::size_t i = 0; i < subject.m_Segments.size(); ++i) {
    auto& segment = subject.m_Segments[i];
    const auto& extras = context.m_rExtras.m_Segments[i];
    hasTPose = hasTPose || extras.m_HasTPose;
    if (version < Versions::V3_2 && extras.m_HasPost) {
      const auto owner = VExpressionOwner::Segment(segment.m_Name);
      std::array<double, 3> rotation{}, translation{};
      if (EvaluateAll(parser, ZeroIfAbsent(extras.m_PostRotation), owner, rotation, o_rErrors) &&
          EvaluateAll(parser, ZeroIfAbsent(extras.m_PostTranslation), owner, translation,
                      o_rErrors)) {
        InverseFromPostValues(version, rotation, translation, segment.m_InversePostRotation,
                              segment.m_InversePostTranslation);
      }
    }
    CompleteAxes(segment.m_Joint.m_Name, segment.m_Joint.m_JointType, extras,
                 segment.m_Joint.m_JointOrientation, o_rErrors, o_rWarnings);
  }
  if (hasTPose) {
    const auto offsets = CoreOstraTypesUtils::JointParameterOffsets(subject);
    subject.m_TPoseConstraints.assign(offsets.back(), {});
    for (std::size_t i = 0; i < subject.m_Segments.size(); ++i) {
      const auto& tpose = context.m_rExtras.m_Segments[i].m_TPose;
      for (std::size_t k = 0; k < tpose.size() && offsets[i] + k < offsets[i + 1]; ++k)
        subject.m_TPoseConstraints[offsets[i] + k] = tpose[k];
    }
  }
  for (const auto& target : subject.m_Targets) {
    if (target.m_Type != VTargetTypeBase::ELocalDirectionToWorldDirection) continue;
    double squares = 0.0;
    bool evaluated = true;
    for (const auto& text : target.m_StateExpressions) {
      double value = 0.0;
      evaluated = parser.Evaluate(text, value) && evaluated;
      squares += value * value;
    }
    if (!evaluated || !(std::abs(squares - 1.0) <= 0.001)) {
      o_rErrors.push_back("Direction target state has to be a unit vector");
    }
  }
}

namespace {

/// The first quote or '>' in [p, end), or `end`: where a tag's scan next has something to do.
const char* FindTagStop(const char* p, const char* const end) {
#if defined(__SSE2__)
  // Sixteen characters at a time while sixteen remain; the tail goes one by one.
  const __m128i doubleQuote = _mm_set1_epi8('"');
  const __m128i singleQuote = _mm_set1_epi8('\'');
  const __m128i close = _mm_set1_epi8('>');
  for (; end - p >= 16; p += 16) {
    const __m128i block = _mm_loadu_si128(reinterpret_cast<const __m128i*>(p));
    const __m128i hits = _mm_or_si128(
        _mm_or_si128(_mm_cmpeq_epi8(block, doubleQuote), _mm_cmpeq_epi8(block, singleQuote)),
        _mm_cmpeq_epi8(block, close));
    if (const int mask = _mm_movemask_epi8(hits))
      return p + __builtin_ctz(static_cast<unsigned>(mask));
  }
#endif
  for (; p < end; ++p)
    if (*p == '"' || *p == '\'' || *p == '>') return p;
  return end;
}

} // namespace

bool NestsDeeperThan(const char* pText, std::size_t limit) {
  // Most of a file is indentation and attributes: jump to each '<' with memchr, through a tag
  // to its next quote or '>' a block at a time, and over each quoted value with memchr.
  const char* const end = pText + std::strlen(pText);
  std::size_t depth = 0;
  const char* p = pText;
  while (p < end) {
    p = static_cast<const char*>(std::memchr(p, '<', static_cast<std::size_t>(end - p)));
    if (!p) return false;
    if (p[1] == '/') {
      if (depth > 0) --depth;
      ++p;
      continue;
    }
    if (p[1] == '!' || p[1] == '?') {
      ++p;
      continue;
    }
    if (++depth > limit) return true;
    // Inside the tag: find its '>', skipping quoted values.
    ++p;
    while (true) {
      p = FindTagStop(p, end);
      if (p == end) return false;
      if (*p == '>') {
        if (p[-1] == '/' && depth > 0) --depth;
        ++p;
        break;
      }
      const char quote = *p++;
      p = static_cast<const char*>(std::memchr(p, quote, static_cast<std::size_t>(end - p)));
      if (!p) return false;
      ++p;
    }
  }
  return false;
}

} // namespace CoreOstraKMTIO::Detail
