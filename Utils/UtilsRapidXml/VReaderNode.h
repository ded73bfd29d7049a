#pragma once
// INode that reads a parsed document. Each Attribute call fetches and checks one attribute; each
// group of Child calls closed by Children walks the matching child elements and runs their
// declarations. Problems are collected, never thrown: the walk always goes to the end.

#include "Utils/UtilsRapidXml/INode.h"
#include "Utils/UtilsRapidXml/VVisitMarks.h"

#include <boost/container/small_vector.hpp>
#include <rapidxml/rapidxml.hpp>

#include <array>
#include <memory>
#include <string>
#include <string_view>
#include <unordered_set>
#include <vector>

namespace UtilsRapidXml {

/// Hash of strings that also takes views, for lookups without a copy.
struct VStringHash {
  using is_transparent = void;
  std::size_t operator()(std::string_view text) const {
    return std::hash<std::string_view>{}(text);
  }
};

class VReaderNode final : public INode {
public:
  /// Shared by every node of one read.
  struct VGlobalInfo {
    IVersion m_Version; ///< (-1, -1) until the root declaration sets it
    std::vector<std::string> m_Errors;
    std::vector<std::string> m_Warnings;
    bool m_StrictSequence = false; ///< children must follow declaration order
    /// Values of "xsd:ID" attributes read so far; only ever asked whether it holds a value.
    std::unordered_set<std::string, VStringHash, std::equal_to<>> m_Ids;
  };

  /// Root node over a parsed document, with fresh global information.
  VReaderNode(rapidxml::xml_document<>& document, bool strictSequence);
  /// Node for one element; its path is `parentPath` + "/" + the element name.
  VReaderNode(rapidxml::xml_node<>* node, std::shared_ptr<VGlobalInfo> info,
              const std::string& parentPath);
  /// Adds a warning for every attribute and child element that no declaration visited, unless
  /// the declaration abandoned the element.
  ~VReaderNode() override;

  VReaderNode(const VReaderNode&) = delete;
  VReaderNode& operator=(const VReaderNode&) = delete;

  /// The global information; keep it to read the warnings the destructors add.
  std::shared_ptr<VGlobalInfo> Info() const { return m_pInfo; }
  /// "/KinematicModel/Skeleton/Segment": built on first use, since only messages need it.
  const std::string& Path() const;

  std::string Name() const override;
  void SetVersion(const IVersion& version) override { m_pInfo->m_Version = version; }
  IVersion Version() const override { return m_pInfo->m_Version; }
  void Enum(const IEnum&) override {}
  void Child(std::string_view name, std::string_view documentation, std::int32_t minOccurs,
             std::int32_t maxOccurs, const IVersion& lower = IVersion::None(),
             const IVersion& upper = IVersion::None()) override;
  void Children(Handler handler, bool choice = false) override;
  bool Attribute(std::string_view name, std::string& o_rValue, std::string_view documentation,
                 std::string_view type, bool required, const IVersion& lower = IVersion::None(),
                 const IVersion& upper = IVersion::None()) override;
  bool AttributeText(std::string_view name, std::string_view& o_rValue,
                     std::string_view documentation, std::string_view type, bool required,
                     const IVersion& lower = IVersion::None(),
                     const IVersion& upper = IVersion::None()) override;
  void Error(const std::string& message) override { m_pInfo->m_Errors.push_back(message); }
  void Warning(const std::string& message) override { m_pInfo->m_Warnings.push_back(message); }
  std::uint64_t ErrorCount() const override { return m_pInfo->m_Errors.size(); }
  void Abandon() override { m_Abandoned = true; }

private:
  struct VDeclaration {
    // Declared names are short (the longest are some 40 characters): kept inline, off the heap.
    boost::container::small_vector<char, 48> m_NameText;
    std::string_view Name() const { return {m_NameText.data(), m_NameText.size()}; }
    std::int32_t m_MinOccurs;
    std::int32_t m_MaxOccurs;
    IVersion m_Lower;
    IVersion m_Upper;
  };
  struct VAccepted {
    std::size_t m_Position;
    rapidxml::xml_node<>* m_pNode;
  };
  // Most elements declare and hold a handful of children: keep those off the heap.
  using VDeclarations = boost::container::small_vector<VDeclaration, 4>;
  using VAcceptedList = boost::container::small_vector<VAccepted, 8>;

  /// Node for a child element met by Children; its path comes from `parent` when asked for.
  VReaderNode(rapidxml::xml_node<>* node, const VReaderNode& parent);

  /// Applies one declaration to the XML children; accepted ones are appended to `io_rAccepted`.
  void MatchDeclaration(const VDeclaration& declaration, bool choice, std::string& io_rChoiceName,
                        VAcceptedList& io_rAccepted);
  void ReportUnvisited();
  /// Fills m_Attributes on first use.
  void ListAttributes();
  static constexpr std::size_t NoAttribute = ~std::size_t{0};
  /// Marks every attribute named `name` visited; the position of the first, or NoAttribute.
  /// Inlined into AttributeText, its one caller, which runs for every declared attribute.
  [[gnu::always_inline]] inline std::size_t FindAttribute(std::string_view name);
  // The messages, kept out of the lookup's way.
  [[gnu::noinline, gnu::cold]] void ReportOutOfVersion(std::string_view name);
  [[gnu::noinline, gnu::cold]] void ReportMissing(std::string_view name);
  /// Records an xsd:ID value, or checks an xsd:IDREF one.
  [[gnu::noinline]] void CheckId(std::string_view type, std::string_view value);

  rapidxml::xml_node<>* m_pNode;
  std::shared_ptr<VGlobalInfo> m_pInfo;
  mutable const VReaderNode* m_pParent = nullptr; ///< set while the path is still to be built
  mutable std::string m_Path;
  // What the declaration visited, by position among the element's XML attributes and child
  // nodes. A name declared once covers every attribute or child of that name.
  VVisitMarks m_VisitedAttributes;
  // The element's attributes with a short key of each name (length and two characters), so that
  // looking a declared name up compares whole names only where the keys agree.
  struct VListedAttribute {
    std::uint32_t m_Key;
    rapidxml::xml_attribute<>* m_pAttribute;
  };
  boost::container::small_vector<VListedAttribute, 16> m_Attributes;
  // An open-addressed table of the attributes' positions by key, probed linearly from each
  // key's home slot; an element with more attributes than it takes is scanned instead.
  static constexpr unsigned SlotCount = 64;
  static constexpr std::size_t MaxSlotted = 48;
  static constexpr std::uint8_t EmptySlot = 0xFF;
  std::array<std::uint8_t, SlotCount> m_Slots;
  std::uint64_t m_KeyBits = 0; ///< one bit per home slot in use, to pass over absent names at once
  bool m_SlotsFull = false;
  bool m_AttributesListed = false;
  VVisitMarks m_VisitedElements;
  VDeclarations m_Declarations;
  std::size_t m_LastPosition = 0; ///< position of the last accepted child, for strict order
  bool m_Abandoned = false;
};

} // namespace UtilsRapidXml
