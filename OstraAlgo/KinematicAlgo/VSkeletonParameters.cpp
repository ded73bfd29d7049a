#include "OstraAlgo/KinematicAlgo/VSkeletonParameters.h"

#include "OstraAlgo/KinematicAlgo/CalibratedText.h"

#include "River/CoreOstraTypesUtils/ExpressionParsers.h"

#include <algorithm>
#include <sstream>

namespace KinematicAlgo {

namespace {
// The static parameters as a subject record's, for the expression parser. With `current` each
// value is fixed at the parameter's current value; otherwise expressions and priors decide.
CoreOstraTypes::VSubjectParametrised AsRecord(const std::vector<VSkeletonParameter>& parameters,
                                              bool current) {
  CoreOstraTypes::VSubjectParametrised record;
  for (const VSkeletonParameter& p : parameters) {
    if (!p.m_Static) continue;
    CoreOstraTypes::VSubjectParametrised::VStaticParameter s;
    s.m_Name = p.m_Name;
    s.m_DefaultExpression = p.m_Expression;
    s.m_Prior = p.m_Prior;
    if (current) s.m_UserValue = p.m_Value;
    record.m_StaticParameters.push_back(s);
  }
  return record;
}

template <size_t N>
bool Values(const std::vector<VSkeletonParameter>& parameters, const std::string& owner,
            const std::array<std::string, N>& expressions, std::array<double, N>& o_rValues,
            std::vector<std::string>& o_rErrors) {
  CoreOstraTypesUtils::VStaticExpressionParser parser;
  parser.SetParameters(AsRecord(parameters, true), o_rErrors);
  bool ok = true;
  for (size_t i = 0; i < N; ++i) {
    std::string message;
    if (!parser.Evaluate(expressions[i], o_rValues[i], message)) {
      o_rErrors.push_back("Could not evaluate expression " + std::to_string(i) + " of " + owner +
                          ": " + message);
      ok = false;
    }
  }
  return ok;
}

std::uint32_t Flags(const VSkeletonParameter& p) {
  return std::uint32_t(p.m_Advanced) | std::uint32_t(p.m_ReadOnly) << 1 |
         std::uint32_t(!p.m_Used) << 2 | std::uint32_t(p.m_Static) << 3;
}
} // namespace

bool VSkeletonParameters::Evaluate(std::vector<std::string>& o_rErrors) {
  CoreOstraTypesUtils::VStaticExpressionParser parser;
  const bool ok = parser.SetParameters(AsRecord(m_Parameters, false), o_rErrors);
  for (VSkeletonParameter& p : m_Parameters)
    if (p.m_Static) parser.StaticValue(p.m_Name, p.m_Value);
  return ok;
}

bool VSkeletonParameters::LinkValues(const VSkeletonParameterLink& link,
                                     std::array<double, 12>& o_rValues,
                                     std::vector<std::string>& o_rErrors) const {
  return Values(m_Parameters, "segment " + link.m_Segment, link.m_Expressions, o_rValues,
                o_rErrors);
}

bool VSkeletonParameters::LinkValues(const VMarkerParameterLink& link,
                                     std::array<double, 3>& o_rValues,
                                     std::vector<std::string>& o_rErrors) const {
  return Values(m_Parameters, "marker " + link.m_Marker, link.m_Expressions, o_rValues, o_rErrors);
}

bool VSkeletonParameters::Equals(const ISkeletonParameters& o) const {
  return m_Name == o.Name() && m_Parameters == o.Parameters() &&
         m_SegmentLinks == o.SegmentLinks() && m_MarkerLinks == o.MarkerLinks();
}

std::string VSkeletonParameters::Print() const {
  std::ostringstream out;
  for (const VSkeletonParameter& p : m_Parameters) {
    out << "Parameter: " << p.m_Name << " Expression: " << p.m_Expression << " Value: " << p.m_Value
        << " Prior: " << p.m_Prior << " SD: " << p.m_StandardDeviation;
    if (p.m_Advanced) out << " Advanced";
    if (p.m_ReadOnly) out << " Read-only";
    if (!p.m_Used) out << " (not used)";
    if (p.m_Static) out << " Static";
    out << '\n';
  }
  return out.str();
}

void VSkeletonParameters::Write(std::ostream& o) const {
  Text::String(o, "SkeletonParameters: ", m_Name);
  o << "\nNumParameters: " << m_Parameters.size() << '\n';
  for (const VSkeletonParameter& p : m_Parameters) {
    Text::String(o, "Parameter: ", p.m_Name);
    o << '\n';
    Text::String(o, " Expression: ", p.m_Expression);
    const double numbers[] = {p.m_Value, p.m_Prior, p.m_StandardDeviation};
    Text::Numbers(o, "\nValue Prior SD: ", numbers, 3);
    o << " Flags: " << Flags(p) << '\n';
  }
  o << "NumSegmentLinks: " << m_SegmentLinks.size() << '\n';
  for (const auto& link : m_SegmentLinks) {
    Text::String(o, "SegmentLink: ", link.m_Segment);
    o << '\n';
    for (const auto& e : link.m_Expressions) {
      Text::String(o, " Expression: ", e);
      o << '\n';
    }
  }
  o << "NumMarkerLinks: " << m_MarkerLinks.size() << '\n';
  for (const auto& link : m_MarkerLinks) {
    Text::String(o, "MarkerLink: ", link.m_Marker);
    o << '\n';
    for (const auto& e : link.m_Expressions) {
      Text::String(o, " Expression: ", e);
      o << '\n';
    }
  }
}

bool VSkeletonParameters::Read(VTextReader& r) {
  VSkeletonParameters read;
  const auto bound = [&] { return std::uint32_t(std::min<size_t>(r.Remaining(), UINT32_MAX)); };
  std::uint32_t count = 0;
  if (!r.String("SkeletonParameters: ", read.m_Name) || !r.Label("NumParameters: ") ||
      !r.Count(count, bound(), "NumParameters"))
    return false;
  for (std::uint32_t i = 0; i < count; ++i) {
    VSkeletonParameter p;
    double numbers[3];
    std::uint32_t flags = 0;
    if (!r.String("Parameter: ", p.m_Name) || !r.String(" Expression: ", p.m_Expression) ||
        !r.Label("Value Prior SD: ") || !r.Numbers(numbers, 3) || !r.Label(" Flags: ") ||
        !r.Count(flags, 15, "Flags"))
      return false;
    p.m_Value = numbers[0];
    p.m_Prior = numbers[1];
    p.m_StandardDeviation = numbers[2];
    p.m_Advanced = flags & 1;
    p.m_ReadOnly = flags & 2;
    p.m_Used = !(flags & 4);
    p.m_Static = flags & 8;
    read.m_Parameters.push_back(p);
  }
  if (!r.Label("NumSegmentLinks: ") || !r.Count(count, bound(), "NumSegmentLinks")) return false;
  for (std::uint32_t i = 0; i < count; ++i) {
    VSkeletonParameterLink link;
    if (!r.String("SegmentLink: ", link.m_Segment)) return false;
    for (auto& e : link.m_Expressions)
      if (!r.String(" Expression: ", e)) return false;
    read.m_SegmentLinks.push_back(link);
  }
  if (!r.Label("NumMarkerLinks: ") || !r.Count(count, bound(), "NumMarkerLinks")) return false;
  for (std::uint32_t i = 0; i < count; ++i) {
    VMarkerParameterLink link;
    if (!r.String("MarkerLink: ", link.m_Marker)) return false;
    for (auto& e : link.m_Expressions)
      if (!r.String(" Expression: ", e)) return false;
    read.m_MarkerLinks.push_back(link);
  }
  *this = std::move(read);
  return true;
}

} // namespace KinematicAlgo
