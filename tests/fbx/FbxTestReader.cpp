#include "FbxTestReader.h"
#include <cstring>
#include <fstream>
#include <iterator>
#include <stdexcept>
#include <zlib.h>

namespace FbxTest {

namespace {
const uint8_t kFooterMagic[16] = {0xF8, 0x5A, 0x8C, 0x6A, 0xDE, 0xF5, 0xD9, 0x7E,
                                  0xEC, 0xE9, 0x0C, 0xE3, 0x75, 0x8F, 0x29, 0x0B};

class Cursor {
public:
  Cursor(const std::vector<uint8_t>& i_rBytes, bool i_wide) : m_rBytes(i_rBytes), m_wide(i_wide) {}
  size_t pos = 27;

  [[noreturn]] void fail(const std::string& i_rWhat) const {
    throw std::runtime_error(i_rWhat + " at offset " + std::to_string(pos));
  }
  template <typename T> T get() {
    if (pos + sizeof(T) > m_rBytes.size()) fail("read past the end");
    T value;
    std::memcpy(&value, m_rBytes.data() + pos, sizeof(T));
    pos += sizeof(T);
    return value;
  }
  std::string bytes(size_t i_count) {
    if (pos + i_count > m_rBytes.size()) fail("read past the end");
    std::string text(reinterpret_cast<const char*>(m_rBytes.data() + pos), i_count);
    pos += i_count;
    return text;
  }
  uint64_t offset() { return m_wide ? get<uint64_t>() : get<uint32_t>(); }
  size_t nullLength() const { return m_wide ? 25 : 13; }

  template <typename T> void array(Property& io_rProperty) {
    const uint32_t count = get<uint32_t>();
    const uint32_t encoding = get<uint32_t>();
    const uint32_t stored = get<uint32_t>();
    std::string raw = bytes(stored);
    if (encoding == 1) {
      io_rProperty.compressed = true;
      std::string out(size_t(count) * sizeof(T), '\0');
      uLongf outSize = uLongf(out.size());
      if (uncompress(reinterpret_cast<Bytef*>(out.data()), &outSize,
                     reinterpret_cast<const Bytef*>(raw.data()), uLong(raw.size())) != Z_OK ||
          outSize != out.size())
        fail("bad zlib array");
      raw.swap(out);
    } else if (encoding != 0 || stored != count * sizeof(T)) {
      fail("bad array header");
    }
    for (uint32_t i = 0; i < count; ++i) {
      T value;
      std::memcpy(&value, raw.data() + i * sizeof(T), sizeof(T));
      if constexpr (std::is_floating_point_v<T>)
        io_rProperty.reals.push_back(double(value));
      else
        io_rProperty.integers.push_back(int64_t(value));
    }
  }

  Property property() {
    Property p;
    p.type = get<char>();
    switch (p.type) {
    case 'Y':
      p.integer = get<int16_t>();
      break;
    case 'C':
      p.integer = get<uint8_t>();
      break;
    case 'I':
      p.integer = get<int32_t>();
      break;
    case 'L':
      p.integer = get<int64_t>();
      break;
    case 'F':
      p.real = get<float>();
      break;
    case 'D':
      p.real = get<double>();
      break;
    case 'S':
    case 'R':
      p.text = bytes(get<uint32_t>());
      break;
    case 'f':
      array<float>(p);
      break;
    case 'd':
      array<double>(p);
      break;
    case 'i':
      array<int32_t>(p);
      break;
    case 'l':
      array<int64_t>(p);
      break;
    default:
      fail(std::string("unknown property type '") + p.type + "'");
    }
    return p;
  }

  // One record, or false at a null record.
  bool record(Node& o_rNode) {
    const size_t start = pos;
    const uint64_t end = offset();
    const uint64_t count = offset();
    const uint64_t length = offset();
    const uint8_t nameLength = get<uint8_t>();
    if (end == 0) {
      if (count != 0 || length != 0 || nameLength != 0) fail("bad null record");
      return false;
    }
    o_rNode.name = bytes(nameLength);
    if (o_rNode.name.find('\0') != std::string::npos) fail("NUL in a record name");
    const size_t propertiesStart = pos;
    for (uint64_t i = 0; i < count; ++i)
      o_rNode.props.push_back(property());
    if (pos - propertiesStart != length) fail("property length mismatch in " + o_rNode.name);
    if (end < pos) fail("end offset before the properties of " + o_rNode.name);
    if (end > pos) {
      o_rNode.nested = true;
      while (true) {
        Node child;
        if (!record(child)) break;
        o_rNode.children.push_back(std::move(child));
      }
    }
    if (pos != end)
      fail("end offset of " + o_rNode.name + " (record at " + std::to_string(start) + ") is " +
           std::to_string(end) + ", content ends at " + std::to_string(pos));
    return true;
  }

private:
  const std::vector<uint8_t>& m_rBytes;
  bool m_wide;
};
} // namespace

const Node* Node::child(const std::string& i_rName) const {
  for (const Node& n : children)
    if (n.name == i_rName) return &n;
  return nullptr;
}

std::vector<const Node*> Node::all(const std::string& i_rName) const {
  std::vector<const Node*> result;
  for (const Node& n : children)
    if (n.name == i_rName) result.push_back(&n);
  return result;
}

const Node* Node::p(const std::string& i_rName) const {
  const Node* pProperties = child("Properties70");
  if (!pProperties) return nullptr;
  for (const Node& row : pProperties->children)
    if (!row.props.empty() && row.props[0].text == i_rName) return &row;
  return nullptr;
}

const Node* File::section(const std::string& i_rName) const {
  for (const Node& n : top)
    if (n.name == i_rName) return &n;
  return nullptr;
}

File parse(const std::vector<uint8_t>& i_rBytes) {
  if (i_rBytes.size() < 27 || std::memcmp(i_rBytes.data(), "Kaydara FBX Binary  \0\x1a\0", 23) != 0)
    throw std::runtime_error("bad header");
  File file;
  file.size = i_rBytes.size();
  std::memcpy(&file.version, i_rBytes.data() + 23, 4);
  Cursor cursor(i_rBytes, file.version >= 7500);
  while (true) {
    Node node;
    if (!cursor.record(node)) break;
    file.top.push_back(std::move(node));
  }
  // Footer: 16-byte id, 1 to 16 zeros to a multiple of 16, 4 zeros, version, 120 zeros, magic.
  const size_t afterId = cursor.pos + 16;
  const size_t padding = 16 - afterId % 16;
  if (i_rBytes.size() != afterId + padding + 4 + 4 + 120 + 16) cursor.fail("bad footer length");
  for (size_t i = afterId; i < afterId + padding + 4; ++i)
    if (i_rBytes[i] != 0) cursor.fail("footer padding not zero");
  uint32_t version;
  std::memcpy(&version, i_rBytes.data() + afterId + padding + 4, 4);
  if (version != file.version) cursor.fail("footer version differs");
  if (std::memcmp(i_rBytes.data() + i_rBytes.size() - 16, kFooterMagic, 16) != 0)
    cursor.fail("bad footer magic");
  return file;
}

File read(const std::string& i_rPath) {
  std::ifstream in(i_rPath, std::ios::binary);
  if (!in) throw std::runtime_error("cannot open " + i_rPath);
  std::vector<uint8_t> bytes((std::istreambuf_iterator<char>(in)),
                             std::istreambuf_iterator<char>());
  return parse(bytes);
}

Scene::Scene(File i_file) : m_file(std::move(i_file)) {
  const File& i_rFile = m_file;
  const Node* pObjects = i_rFile.section("Objects");
  if (!pObjects) throw std::runtime_error("no Objects");
  for (const Node& n : pObjects->children) {
    if (n.props.size() < 3 || n.props[0].type != 'L' || n.props[1].type != 'S')
      throw std::runtime_error("object " + n.name + " without L,S,S");
    const std::string& full = n.props[1].text;
    const size_t sep = full.find(std::string("\0\1", 2));
    if (sep == std::string::npos || full.find(std::string("\0\1", 2), sep + 2) != std::string::npos)
      throw std::runtime_error("object name without exactly one separator: " + n.name);
    if (n.props[0].integer == 0) throw std::runtime_error("object id 0");
    if (m_byId.count(n.props[0].integer)) throw std::runtime_error("duplicate id");
    if (!n.nested) throw std::runtime_error("object without nested list: " + n.name);
    m_byId[n.props[0].integer] = m_objects.size();
    m_objects.push_back(
        {&n, n.props[0].integer, full.substr(0, sep), full.substr(sep + 2), n.props[2].text});
  }
  const Node* pConnections = i_rFile.section("Connections");
  if (!pConnections) throw std::runtime_error("no Connections");
  for (const Node& c : pConnections->children) {
    const int64_t child = c.props.at(1).integer, parent = c.props.at(2).integer;
    if (!m_byId.count(child) || (parent != 0 && !m_byId.count(parent)))
      throw std::runtime_error("connection to an unknown object");
    const std::string property = c.props.size() > 3 ? c.props[3].text : std::string();
    m_sources.emplace(parent, std::make_pair(child, property));
    if (c.props[0].text == "OO" && byId(child)->node->name == "Model") m_parent[child] = parent;
  }
}

std::vector<const Object*> Scene::ofType(const std::string& i_rRecordName) const {
  std::vector<const Object*> result;
  for (const Object& o : m_objects)
    if (o.node->name == i_rRecordName) result.push_back(&o);
  return result;
}

const Object* Scene::byId(int64_t i_id) const {
  const auto it = m_byId.find(i_id);
  return it == m_byId.end() ? nullptr : &m_objects[it->second];
}

const Object* Scene::model(const std::string& i_rName) const {
  for (const Object& o : m_objects)
    if (o.node->name == "Model" && o.name == i_rName) return &o;
  return nullptr;
}

int64_t Scene::parentOf(int64_t i_id) const {
  const auto it = m_parent.find(i_id);
  return it == m_parent.end() ? -1 : it->second;
}

std::vector<std::pair<int64_t, std::string>> Scene::sourcesOf(int64_t i_id) const {
  std::vector<std::pair<int64_t, std::string>> result;
  const auto [first, last] = m_sources.equal_range(i_id);
  for (auto it = first; it != last; ++it)
    result.push_back(it->second);
  return result;
}

const Node* Scene::curve(const std::string& i_rModel, const std::string& i_rProperty,
                         const std::string& i_rChannel) const {
  const Object* pModel = model(i_rModel);
  if (!pModel) return nullptr;
  for (const auto& [curveNode, property] : sourcesOf(pModel->id)) {
    if (property != i_rProperty) continue;
    for (const auto& [curve, channel] : sourcesOf(curveNode))
      if (channel == i_rChannel) return byId(curve)->node;
  }
  return nullptr;
}

std::vector<int64_t> Scene::keyTimes(const Node& i_rCurve) {
  return i_rCurve.child("KeyTime")->props.at(0).integers;
}

std::vector<double> Scene::keyValues(const Node& i_rCurve) {
  return i_rCurve.child("KeyValueFloat")->props.at(0).reals;
}

} // namespace FbxTest
