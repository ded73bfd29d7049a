#pragma once
// The declaration interface of the schema layer. A document type is declared once as a set of
// functions, one per element, each taking an INode and stating the element's attributes and
// children. Run with VReaderNode the declaration reads a document; run with VSchemaNode it emits
// an XML Schema.

#include "Utils/UtilsRapidXml/IEnum.h"
#include "Utils/UtilsRapidXml/IVersion.h"

#include <cstdint>
#include <functional>
#include <string>
#include <string_view>

namespace UtilsRapidXml {

class INode {
public:
  /// A child element's declaration function.
  using Handler = std::function<void(INode&)>;

  virtual ~INode() = default;

  /// The element's name.
  virtual std::string Name() const = 0;
  /// Records the document's version for every node of this run.
  virtual void SetVersion(const IVersion& version) = 0;
  virtual IVersion Version() const = 0;
  /// States that an enumeration is used here (emitted once by a schema, ignored by a reader).
  virtual void Enum(const IEnum& enumeration) = 0;

  /// Declares one child element. Declarations collect until Children. A negative `maxOccurs`
  /// means unbounded; limits are inclusive and an invalid one is open.
  virtual void Child(std::string_view name, std::string_view documentation, std::int32_t minOccurs,
                     std::int32_t maxOccurs, const IVersion& lower = IVersion::None(),
                     const IVersion& upper = IVersion::None()) = 0;
  /// Processes the children declared since the last call, running `handler` on each. With
  /// `choice`, exactly one of the declared names may appear.
  virtual void Children(Handler handler, bool choice = false) = 0;

  /// Declares one attribute and reads it into `o_rValue`. Returns true only when a value was
  /// read; otherwise `o_rValue` is left alone so the caller's default stands.
  virtual bool Attribute(std::string_view name, std::string& o_rValue,
                         std::string_view documentation, std::string_view type, bool required,
                         const IVersion& lower = IVersion::None(),
                         const IVersion& upper = IVersion::None()) = 0;
  /// As Attribute, with the value as a view of the document's text: no copy. The view stays valid
  /// as long as the parsed document does.
  virtual bool AttributeText(std::string_view name, std::string_view& o_rValue,
                             std::string_view documentation, std::string_view type, bool required,
                             const IVersion& lower = IVersion::None(),
                             const IVersion& upper = IVersion::None()) = 0;

  virtual void Error(const std::string& message) = 0;
  virtual void Warning(const std::string& message) = 0;
  virtual std::uint64_t ErrorCount() const = 0;

  /// The declaration refuses this element and stops: what it didn't declare is not reported as
  /// unrecognised, since the one error that refused it is what matters. Nothing for nodes that
  /// don't read.
  virtual void Abandon() {}
};

} // namespace UtilsRapidXml
