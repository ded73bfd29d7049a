#pragma once
// The grammar of the subject file language, stated once as declaration functions over INode.
// Run over VReaderNode they read a file into subject records; run over VSchemaNode they emit
// the XSD. Each element has its own function; the context carries the records being filled.

#include "River/CoreOstraKMTIO/KMTLanguage.h"
#include "River/CoreOstraKMTIO/SubjectKMTExtras.h"
#include "River/CoreOstraTypes/VSubjectApplicationData.h"
#include "River/CoreOstraTypes/VSubjectDynamicSubspace.h"
#include "River/CoreOstraTypes/VSubjectParametrised.h"
#include "Utils/UtilsRapidXml/INode.h"
#include "Utils/UtilsRapidXml/ReadAttributes.h"

#include <array>
#include <cstdint>
#include <optional>
#include <string>
#include <string_view>
#include <unordered_map>
#include <unordered_set>

namespace CoreOstraKMTIO::Detail {

using UtilsRapidXml::INode;

inline constexpr std::string_view XsdString = "xsd:string";
inline constexpr std::string_view XsdDouble = "xsd:double";
inline constexpr std::string_view XsdId = "xsd:ID";
inline constexpr std::string_view XsdIdRef = "xsd:IDREF";

/// Deepest segment nesting a file may have; deeper files are refused rather than recursed.
inline constexpr std::uint32_t MaxSegmentDepth = 1000;

/// What one read fills, and the lookups the declaration needs.
struct VReadContext {
  CoreOstraTypes::VSubjectParametrised& m_rSubject;
  CoreOstraTypes::VSubjectApplicationData& m_rAppData;
  CoreOstraTypes::VSubjectDynamicSubspace& m_rSubspace;
  VSubjectKMTExtras& m_rExtras;
  IVersion m_MinVersion = MinVersion;
  IVersion m_MaxVersion = MaxVersion;
  IVersion m_FileVersion{1, 0};
  bool m_Refused = false; ///< the root refused the file (version or development flag)

  /// The first segment or marker of that name.
  std::optional<std::uint32_t> FindSegment(const std::string& name) const;
  std::optional<std::uint32_t> FindMarker(const std::string& name) const;
  /// Drops the segments from `index` on, with their display and extra records.
  void DropSegmentsFrom(std::uint32_t index);

  /// First index of each name among the first m_Count records, extended as records are added:
  /// the lookups of targets and markers would otherwise walk the lists each time.
  struct VNameIndex {
    std::unordered_map<std::string, std::uint32_t> m_First;
    std::size_t m_Count = 0;
  };
  mutable VNameIndex m_SegmentNames{};
  mutable VNameIndex m_MarkerNames{};

  /// Whether a marker read so far has this ID hash.
  bool HasMarkerId(std::uint32_t id) const;
  /// The ID hashes of the first m_Count markers, extended as markers are added.
  struct VIdIndex {
    std::unordered_set<std::uint32_t> m_Ids;
    std::size_t m_Count = 0;
  };
  mutable VIdIndex m_MarkerIds{};
};

/// The document: one KinematicModel.
void DeclareDocument(INode& node, VReadContext& context);
void DeclareKinematicModel(INode& node, VReadContext& context);
void DeclareParameters(INode& node, VReadContext& context);
void DeclareSkeleton(INode& node, VReadContext& context);
void DeclareMarkerSet(INode& node, VReadContext& context);
void DeclareTargetSet(INode& node, VReadContext& context);
void DeclareSubspace(INode& node, VReadContext& context);

// Typed helpers over the attribute readers of the schema layer.

/// Exactly N expressions into a fixed array.
template <std::size_t N>
bool ReadExpressions(INode& node, std::string_view name, std::array<std::string, N>& o_rValue,
                     std::string_view documentation, bool required,
                     const IVersion& lower = Versions::None,
                     const IVersion& upper = Versions::None) {
  return UtilsRapidXml::ReadExpressionArray(node, name, o_rValue, documentation, XsdString,
                                            required, lower, upper);
}

/// Exactly N numbers into a fixed array.
template <std::size_t N>
bool ReadNumbers(INode& node, std::string_view name, std::array<double, N>& o_rValue,
                 std::string_view documentation, const IVersion& lower = Versions::None,
                 const IVersion& upper = Versions::None) {
  return UtilsRapidXml::ReadDoubleArray(node, name, o_rValue, documentation, XsdString, false,
                                        lower, upper);
}

/// A list of numbers of a given count (AnyCount for any) into a vector.
bool ReadNumberList(INode& node, std::string_view name, std::vector<double>& o_rValues,
                    std::size_t count, std::string_view documentation, bool required = false,
                    const IVersion& lower = Versions::None, const IVersion& upper = Versions::None);

/// A plain text attribute.
bool ReadText(INode& node, std::string_view name, std::string& o_rValue,
              std::string_view documentation, bool required = false,
              const IVersion& lower = Versions::None, const IVersion& upper = Versions::None);

/// HIDDEN: stores its negation in `io_rVisible`.
bool ReadHidden(INode& node, bool& io_rVisible, std::string_view documentation, bool required,
                const IVersion& lower = Versions::None);

/// OPACITY: a number clamped to 0..255 as the alpha byte; 255 when absent.
std::uint8_t ReadOpacity(INode& node, std::string_view documentation,
                         const IVersion& lower = Versions::None);

/// A direction made unit when it is at least 0.001 long; otherwise left as it is.
std::array<double, 3> NormaliseDirection(const std::array<double, 3>& direction);

} // namespace CoreOstraKMTIO::Detail
