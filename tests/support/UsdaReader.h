#pragma once
// A small reader of USDA text for tests: the layer metadata, prims with their types, API
// schemas, attributes (default values and time samples) and relationships. It accepts the
// subset the exporter writes and fails loudly on anything else.
#include <cctype>
#include <cstdlib>
#include <map>
#include <memory>
#include <stdexcept>
#include <string>
#include <vector>

namespace UsdaTest {

struct Value {
  enum Kind { ENumber, EString, EPath, ETuple, EArray } kind = ENumber;
  std::string text; ///< a number's text, a string's or path's content
  std::vector<Value> items;

  double number() const { return std::strtod(text.c_str(), nullptr); }
  float single() const { return std::strtof(text.c_str(), nullptr); }
};

struct Attribute {
  std::string type;
  bool uniform = false;
  bool hasDefault = false;
  Value value;
  std::map<double, Value> samples;
};

struct Prim {
  std::string type;
  std::string name;
  std::vector<std::string> apiSchemas;
  std::map<std::string, Attribute> attributes;
  std::map<std::string, std::vector<std::string>> relationships;
  std::vector<std::string> propertyOrder;
  std::vector<std::unique_ptr<Prim>> children;

  const Prim* child(const std::string& i_name) const {
    for (const auto& p : children)
      if (p->name == i_name) return p.get();
    return nullptr;
  }
};

struct Layer {
  std::map<std::string, Value> metadata;
  std::vector<std::unique_ptr<Prim>> roots;

  const Prim* prim(const std::string& i_path) const {
    const std::vector<std::unique_ptr<Prim>>* pLevel = &roots;
    const Prim* pFound = nullptr;
    std::size_t start = 1;
    while (start <= i_path.size()) {
      std::size_t end = i_path.find('/', start);
      if (end == std::string::npos) end = i_path.size();
      const std::string name = i_path.substr(start, end - start);
      pFound = nullptr;
      for (const auto& p : *pLevel)
        if (p->name == name) pFound = p.get();
      if (!pFound) return nullptr;
      pLevel = &pFound->children;
      start = end + 1;
    }
    return pFound;
  }
};

class Parser {
public:
  explicit Parser(const std::string& i_text) : m_text(i_text) {}

  Layer parse() {
    if (m_text.rfind("#usda 1.0\n", 0) != 0) fail("no #usda 1.0 header");
    m_pos = 10;
    Layer layer;
    skipSpace();
    if (peek() == '(') {
      ++m_pos;
      while (skipSpace(), peek() != ')') {
        const std::string key = identifier();
        expect('=');
        layer.metadata[key] = value();
      }
      ++m_pos;
    }
    while (skipSpace(), m_pos < m_text.size())
      layer.roots.push_back(prim());
    return layer;
  }

private:
  [[noreturn]] void fail(const std::string& i_what) const {
    throw std::runtime_error("USDA at " + std::to_string(m_pos) + ": " + i_what);
  }
  char peek() const { return m_pos < m_text.size() ? m_text[m_pos] : '\0'; }
  void skipSpace() {
    while (m_pos < m_text.size() && std::isspace(static_cast<unsigned char>(m_text[m_pos])))
      ++m_pos;
  }
  void expect(char i_c) {
    skipSpace();
    if (peek() != i_c) fail(std::string("expected '") + i_c + "'");
    ++m_pos;
  }
  bool accept(const std::string& i_word) {
    skipSpace();
    if (m_text.compare(m_pos, i_word.size(), i_word) != 0) return false;
    m_pos += i_word.size();
    return true;
  }
  std::string identifier() {
    skipSpace();
    const std::size_t start = m_pos;
    while (m_pos < m_text.size() &&
           (std::isalnum(static_cast<unsigned char>(m_text[m_pos])) || m_text[m_pos] == '_' ||
            m_text[m_pos] == ':' || m_text[m_pos] == '[' || m_text[m_pos] == ']' ||
            m_text[m_pos] == '.'))
      ++m_pos;
    if (m_pos == start) fail("expected a name");
    return m_text.substr(start, m_pos - start);
  }
  std::string quoted() {
    skipSpace();
    const char quote = peek();
    if (quote != '"' && quote != '\'') fail("expected a string");
    const bool triple = m_text.compare(m_pos, 3, std::string(3, quote)) == 0;
    m_pos += triple ? 3 : 1;
    std::string result;
    for (;;) {
      if (m_pos >= m_text.size()) fail("unterminated string");
      if (triple ? m_text.compare(m_pos, 3, std::string(3, quote)) == 0 : peek() == quote) break;
      char c = m_text[m_pos++];
      if (c == '\\') {
        const char e = m_text[m_pos++];
        c = e == 'n' ? '\n' : e == 't' ? '\t' : e == 'r' ? '\r' : e;
        if (e == 'x') {
          c = char(std::stoi(m_text.substr(m_pos, 2), nullptr, 16));
          m_pos += 2;
        }
      }
      result += c;
    }
    m_pos += triple ? 3 : 1;
    return result;
  }
  Value value() {
    skipSpace();
    Value v;
    const char c = peek();
    if (c == '"' || c == '\'') {
      v.kind = Value::EString;
      v.text = quoted();
    } else if (c == '<') {
      v.kind = Value::EPath;
      const std::size_t end = m_text.find('>', m_pos);
      v.text = m_text.substr(m_pos + 1, end - m_pos - 1);
      m_pos = end + 1;
    } else if (c == '(' || c == '[') {
      v.kind = c == '(' ? Value::ETuple : Value::EArray;
      const char close = c == '(' ? ')' : ']';
      ++m_pos;
      while (skipSpace(), peek() != close) {
        v.items.push_back(value());
        skipSpace();
        if (peek() == ',') ++m_pos;
      }
      ++m_pos;
    } else {
      const std::size_t start = m_pos;
      while (m_pos < m_text.size() &&
             std::string("+-.0123456789einaf").find(m_text[m_pos]) != std::string::npos)
        ++m_pos;
      if (m_pos == start) fail("expected a value");
      v.text = m_text.substr(start, m_pos - start);
    }
    return v;
  }
  std::unique_ptr<Prim> prim() {
    if (!accept("def")) fail("expected def");
    auto pPrim = std::make_unique<Prim>();
    skipSpace();
    if (peek() != '"') pPrim->type = identifier();
    pPrim->name = quoted();
    skipSpace();
    if (peek() == '(') {
      ++m_pos;
      while (skipSpace(), peek() != ')') {
        accept("prepend");
        const std::string key = identifier();
        expect('=');
        const Value v = value();
        if (key != "apiSchemas") fail("unexpected prim metadata " + key);
        for (const Value& item : v.items)
          pPrim->apiSchemas.push_back(item.text);
      }
      ++m_pos;
    }
    expect('{');
    while (skipSpace(), peek() != '}') {
      if (m_text.compare(m_pos, 3, "def") == 0) {
        pPrim->children.push_back(prim());
        continue;
      }
      if (accept("rel ")) {
        const std::string name = identifier();
        expect('=');
        const Value v = value();
        std::vector<std::string>& targets = pPrim->relationships[name];
        if (v.kind == Value::EPath) targets.push_back(v.text);
        for (const Value& item : v.items)
          targets.push_back(item.text);
        pPrim->propertyOrder.push_back(name);
        continue;
      }
      const bool uniform = accept("uniform ");
      const std::string type = identifier();
      std::string name = identifier();
      const bool samples = name.size() > 12 && name.ends_with(".timeSamples");
      if (samples) name.resize(name.size() - 12);
      Attribute& attribute = pPrim->attributes[name];
      if (!attribute.type.empty() && attribute.type != type) fail("type changes for " + name);
      attribute.type = type;
      attribute.uniform = uniform;
      expect('=');
      if (samples) {
        expect('{');
        while (skipSpace(), peek() != '}') {
          const double time = value().number();
          expect(':');
          attribute.samples[time] = value();
          expect(',');
        }
        ++m_pos;
      } else {
        attribute.hasDefault = true;
        attribute.value = value();
      }
      if (pPrim->propertyOrder.empty() || pPrim->propertyOrder.back() != name)
        pPrim->propertyOrder.push_back(name);
    }
    ++m_pos;
    return pPrim;
  }

  const std::string& m_text;
  std::size_t m_pos = 0;
};

inline Layer parse(const std::string& i_text) {
  return Parser(i_text).parse();
}

} // namespace UsdaTest
