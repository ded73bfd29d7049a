#pragma once
// The named parameters of a calibrated skeleton and the links that tie segments and markers to
// them: a segment link gives the 12 expressions of a segment's fixed poses (pre-rotation,
// pre-translation, post-rotation, post-translation, three each), a marker link the 3 of a
// marker's position. Expressions follow the subject language's expression rules: a parameter's
// expression may use the parameters before it.

#include <array>
#include <cstdint>
#include <iosfwd>
#include <string>
#include <string_view>
#include <vector>

namespace KinematicAlgo {

class VTextReader;

struct VSkeletonParameter {
  std::string m_Name;
  /// Defines the value; empty means the prior.
  std::string m_Expression;
  double m_Value = 0.0;
  double m_Prior = 0.0;
  double m_StandardDeviation = 0.0;
  bool m_Advanced = false;
  bool m_ReadOnly = false;
  bool m_Used = true;
  /// A parameter of the skeleton's shape (true) or of its motion.
  bool m_Static = true;
  bool operator==(const VSkeletonParameter&) const = default;
};

struct VSkeletonParameterLink {
  std::string m_Segment;
  std::array<std::string, 12> m_Expressions;
  bool operator==(const VSkeletonParameterLink&) const = default;
};

struct VMarkerParameterLink {
  std::string m_Marker;
  std::array<std::string, 3> m_Expressions;
  bool operator==(const VMarkerParameterLink&) const = default;
};

class ISkeletonParameters {
public:
  virtual ~ISkeletonParameters() = default;
  virtual const std::string& Name() const = 0;
  virtual void SetName(const std::string& name) = 0;
  virtual std::vector<VSkeletonParameter>& Parameters() = 0;
  virtual const std::vector<VSkeletonParameter>& Parameters() const = 0;
  virtual std::vector<VSkeletonParameterLink>& SegmentLinks() = 0;
  virtual const std::vector<VSkeletonParameterLink>& SegmentLinks() const = 0;
  virtual std::vector<VMarkerParameterLink>& MarkerLinks() = 0;
  virtual const std::vector<VMarkerParameterLink>& MarkerLinks() const = 0;
  /// Sets each static parameter's value from its expression (over the parameters before it),
  /// or its prior when it has none. False when an expression fails; its message is appended to
  /// `o_rErrors` and that value is left as it was.
  virtual bool Evaluate(std::vector<std::string>& o_rErrors) = 0;
  /// The values of a link's expressions over the parameters' current values; false (with
  /// messages) when one does not evaluate.
  virtual bool LinkValues(const VSkeletonParameterLink& link, std::array<double, 12>& o_rValues,
                          std::vector<std::string>& o_rErrors) const = 0;
  virtual bool LinkValues(const VMarkerParameterLink& link, std::array<double, 3>& o_rValues,
                          std::vector<std::string>& o_rErrors) const = 0;
  virtual bool Equals(const ISkeletonParameters& other) const = 0;
  /// One line per parameter for people: "Parameter: ", " Expression: ", " Value: ", " Prior: ",
  /// " SD: ", then " Advanced", " Read-only", " (not used)" and "Static" where they apply.
  virtual std::string Print() const = 0;
  virtual void Write(std::ostream& o_rStream) const = 0;
  /// As written by Write; on failure nothing changes and the reader's error says why.
  virtual bool Read(VTextReader& io_rReader) = 0;
};

class VSkeletonParameters : public ISkeletonParameters {
public:
  const std::string& Name() const override { return m_Name; }
  void SetName(const std::string& name) override { m_Name = name; }
  std::vector<VSkeletonParameter>& Parameters() override { return m_Parameters; }
  const std::vector<VSkeletonParameter>& Parameters() const override { return m_Parameters; }
  std::vector<VSkeletonParameterLink>& SegmentLinks() override { return m_SegmentLinks; }
  const std::vector<VSkeletonParameterLink>& SegmentLinks() const override {
    return m_SegmentLinks;
  }
  std::vector<VMarkerParameterLink>& MarkerLinks() override { return m_MarkerLinks; }
  const std::vector<VMarkerParameterLink>& MarkerLinks() const override { return m_MarkerLinks; }
  bool Evaluate(std::vector<std::string>& o_rErrors) override;
  bool LinkValues(const VSkeletonParameterLink& link, std::array<double, 12>& o_rValues,
                  std::vector<std::string>& o_rErrors) const override;
  bool LinkValues(const VMarkerParameterLink& link, std::array<double, 3>& o_rValues,
                  std::vector<std::string>& o_rErrors) const override;
  bool Equals(const ISkeletonParameters& other) const override;
  std::string Print() const override;
  void Write(std::ostream& o_rStream) const override;
  bool Read(VTextReader& io_rReader) override;

private:
  std::string m_Name;
  std::vector<VSkeletonParameter> m_Parameters;
  std::vector<VSkeletonParameterLink> m_SegmentLinks;
  std::vector<VMarkerParameterLink> m_MarkerLinks;
};

} // namespace KinematicAlgo
