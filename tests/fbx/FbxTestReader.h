#pragma once
// A strict reader of binary FBX files for tests: header, node records with exact end offsets and
// property lengths, every property type, zlib arrays, null records and the footer. Any flaw
// throws std::runtime_error naming the offset.
#include <cstdint>
#include <map>
#include <string>
#include <vector>

namespace FbxTest {

struct Property {
  char type = 0;
  int64_t integer = 0;           // Y C I L
  double real = 0.0;             // F D
  std::string text;              // S R
  std::vector<double> reals;     // f d
  std::vector<int64_t> integers; // i l
  bool compressed = false;       // an array stored with zlib
};

struct Node {
  std::string name;
  std::vector<Property> props;
  std::vector<Node> children;
  bool nested = false; // ended by a null record

  const Node* child(const std::string& i_rName) const;
  std::vector<const Node*> all(const std::string& i_rName) const;
  /// The values of a P row of this node's Properties70, or null.
  const Node* p(const std::string& i_rName) const;
};

struct File {
  uint32_t version = 0;
  std::vector<Node> top;
  size_t size = 0;

  const Node* section(const std::string& i_rName) const;
};

/// Reads the whole file; throws on any flaw.
File read(const std::string& i_rPath);
File parse(const std::vector<uint8_t>& i_rBytes);

/// An object of the Objects section: its record, id, name (before "\0\1") and class.
struct Object {
  const Node* node;
  int64_t id;
  std::string name;
  std::string cls;
  std::string subtype;
};

/// The objects and connections of a file, indexed.
class Scene {
public:
  /// Keeps its own copy of the file: objects point into it.
  explicit Scene(File i_file);
  Scene(const Scene&) = delete;
  Scene& operator=(const Scene&) = delete;
  std::vector<const Object*> ofType(const std::string& i_rRecordName) const;
  const Object* byId(int64_t i_id) const;
  /// The Model of that name, or null.
  const Object* model(const std::string& i_rName) const;
  /// The parent id of an object by an "OO" connection (0 for the root), -1 when none.
  int64_t parentOf(int64_t i_id) const;
  /// Sources connected to `i_id` (by OO and OP), with the property name of OP links.
  std::vector<std::pair<int64_t, std::string>> sourcesOf(int64_t i_id) const;
  /// The curve of a model's property channel ("Lcl Translation", "d|X"), or null.
  const Node* curve(const std::string& i_rModel, const std::string& i_rProperty,
                    const std::string& i_rChannel) const;
  /// Times and values of a curve.
  static std::vector<int64_t> keyTimes(const Node& i_rCurve);
  static std::vector<double> keyValues(const Node& i_rCurve);

private:
  File m_file;
  std::vector<Object> m_objects;
  std::map<int64_t, size_t> m_byId;
  std::multimap<int64_t, std::pair<int64_t, std::string>> m_sources; // parent -> (child, prop)
  std::map<int64_t, int64_t> m_parent;
};

} // namespace FbxTest
