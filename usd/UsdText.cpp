#include "usd/UsdText.h"

#include "usd/UsdNumbers.h"
#include "usd/UsdStage.h"

#include <algorithm>
#include <cctype>
#include <variant>

namespace AnvilUsd {

namespace {
bool IsDigit(char c) {
  return c >= '0' && c <= '9';
}
} // namespace

bool DictionaryLess(std::string_view a, std::string_view b) {
  std::size_t i = 0, j = 0;
  while (i < a.size() && j < b.size()) {
    if (IsDigit(a[i]) && IsDigit(b[j])) {
      std::size_t iEnd = i, jEnd = j;
      while (iEnd < a.size() && IsDigit(a[iEnd]))
        ++iEnd;
      while (jEnd < b.size() && IsDigit(b[jEnd]))
        ++jEnd;
      std::string_view x = a.substr(i, iEnd - i), y = b.substr(j, jEnd - j);
      while (x.size() > 1 && x[0] == '0')
        x.remove_prefix(1);
      while (y.size() > 1 && y[0] == '0')
        y.remove_prefix(1);
      if (x.size() != y.size()) return x.size() < y.size();
      if (x != y) return x < y;
      i = iEnd;
      j = jEnd;
      continue;
    }
    const int ca = std::tolower(static_cast<unsigned char>(a[i]));
    const int cb = std::tolower(static_cast<unsigned char>(b[j]));
    if (ca != cb) return ca < cb;
    ++i;
    ++j;
  }
  if ((a.size() - i) != (b.size() - j)) return a.size() - i < b.size() - j;
  return a < b;
}

void VTextWriter::Flush() {
  if (!m_Buffer.empty() && m_pFile) std::fwrite(m_Buffer.data(), 1, m_Buffer.size(), m_pFile);
  m_Buffer.clear();
}

void VTextWriter::Text(std::string_view text) {
  m_Buffer.append(text);
}

void VTextWriter::String(std::string_view text) {
  const bool multiline = text.find('\n') != std::string_view::npos;
  const char quote =
      text.find('"') != std::string_view::npos && text.find('\'') == std::string_view::npos ? '\''
                                                                                            : '"';
  const std::string quotes(multiline ? 3 : 1, quote);
  m_Buffer += quotes;
  for (char c : text) {
    const auto byte = static_cast<unsigned char>(c);
    if (c == '\\') {
      m_Buffer += "\\\\";
    } else if (c == quote) {
      m_Buffer += '\\';
      m_Buffer += c;
    } else if (c == '\n' && multiline) {
      m_Buffer += c;
    } else if (c == '\n') {
      m_Buffer += "\\n";
    } else if (c == '\r') {
      m_Buffer += "\\r";
    } else if (c == '\t') {
      m_Buffer += "\\t";
    } else if (byte < 0x20 || byte == 0x7f) {
      static const char digits[] = "0123456789abcdef";
      m_Buffer += "\\x";
      m_Buffer += digits[byte >> 4];
      m_Buffer += digits[byte & 15];
    } else {
      m_Buffer += c;
    }
  }
  m_Buffer += quotes;
}

void VTextWriter::Double(double value) {
  char text[MaxNumberChars];
  m_Buffer.append(text, WriteDouble(text, value));
}

template <class T, class F> void VTextWriter::Array(const std::vector<T>& values, F element) {
  m_Buffer += '[';
  char text[4 * 4 * MaxNumberChars + 64];
  for (std::size_t i = 0; i < values.size(); ++i) {
    char* p = text;
    if (i) {
      *p++ = ',';
      *p++ = ' ';
    }
    p = element(p, values[i]);
    m_Buffer.append(text, p);
  }
  m_Buffer += ']';
}

namespace {
char* Put(char* p, const char* pText) {
  while (*pText)
    *p++ = *pText++;
  return p;
}
char* Vec3(char* p, const Vec3f& v) {
  *p++ = '(';
  p = WriteFloat(p, v[0]);
  p = Put(p, ", ");
  p = WriteFloat(p, v[1]);
  p = Put(p, ", ");
  p = WriteFloat(p, v[2]);
  *p++ = ')';
  return p;
}
} // namespace

void VTextWriter::Value(const VValue& value) {
  if (const auto* pTokens = std::get_if<TokenArray>(&value)) {
    m_Buffer += '[';
    for (std::size_t i = 0; i < pTokens->size(); ++i) {
      if (i) m_Buffer += ", ";
      String((*pTokens)[i]);
    }
    m_Buffer += ']';
  } else if (const auto* pMatrices = std::get_if<Matrix4dArray>(&value)) {
    Array(*pMatrices, [](char* p, const Matrix4d& m) {
      p = Put(p, "( ");
      for (int row = 0; row < 4; ++row) {
        p = Put(p, row ? ", (" : "(");
        for (int column = 0; column < 4; ++column) {
          if (column) p = Put(p, ", ");
          p = WriteDouble(p, m[row][column]);
        }
        *p++ = ')';
      }
      return Put(p, " )");
    });
  } else if (const auto* pVectors = std::get_if<Vec3fArray>(&value)) {
    Array(*pVectors, Vec3);
  } else if (const auto* pQuats = std::get_if<QuatfArray>(&value)) {
    Array(*pQuats, [](char* p, const Quatf& q) {
      *p++ = '(';
      p = WriteFloat(p, q.w);
      p = Put(p, ", ");
      p = WriteFloat(p, q.x);
      p = Put(p, ", ");
      p = WriteFloat(p, q.y);
      p = Put(p, ", ");
      p = WriteFloat(p, q.z);
      *p++ = ')';
      return p;
    });
  } else if (const auto* pHalves = std::get_if<Vec3hArray>(&value)) {
    Array(*pHalves, [](char* p, const Vec3h& v) {
      *p++ = '(';
      p = WriteHalf(p, v[0]);
      p = Put(p, ", ");
      p = WriteHalf(p, v[1]);
      p = Put(p, ", ");
      p = WriteHalf(p, v[2]);
      *p++ = ')';
      return p;
    });
  }
}

void VTextWriter::Prim(const VPrim& prim, int indent) {
  Indent(indent);
  Text("def ");
  if (!prim.TypeName().empty()) {
    Text(prim.TypeName());
    Text(" ");
  }
  String(prim.Name());
  if (!prim.ApiSchemas().empty()) {
    Text(" (\n");
    Indent(indent + 1);
    Text("prepend apiSchemas = ");
    Value(TokenArray(prim.ApiSchemas()));
    Text("\n");
    Indent(indent);
    Text(")");
  }
  Text("\n");
  Indent(indent);
  Text("{\n");

  // Properties by name; an attribute before a relationship of the same name.
  struct VProperty {
    const std::string* m_pName;
    const VAttribute* m_pAttribute;
    const VRelationship* m_pRelationship;
  };
  std::vector<VProperty> properties;
  for (const auto& pAttribute : prim.Attributes())
    if (pAttribute->IsAuthored()) properties.push_back({&pAttribute->Name(), pAttribute.get(), {}});
  for (const auto& pRelationship : prim.Relationships())
    properties.push_back({&pRelationship->Name(), {}, pRelationship.get()});
  std::stable_sort(properties.begin(), properties.end(),
                   [](const VProperty& a, const VProperty& b) {
                     if (*a.m_pName == *b.m_pName) return a.m_pAttribute && !b.m_pAttribute;
                     return DictionaryLess(*a.m_pName, *b.m_pName);
                   });

  for (const VProperty& property : properties) {
    if (const VRelationship* pRelationship = property.m_pRelationship) {
      Indent(indent + 1);
      Text("rel ");
      Text(pRelationship->Name());
      const auto& targets = pRelationship->Targets();
      if (targets.size() == 1) {
        Text(" = <");
        Text(targets[0]);
        Text(">\n");
      } else {
        Text(" = [\n");
        for (const std::string& target : targets) {
          Indent(indent + 2);
          Text("<");
          Text(target);
          Text(">,\n");
        }
        Indent(indent + 1);
        Text("]\n");
      }
      continue;
    }
    const VAttribute& attribute = *property.m_pAttribute;
    const char* pType = attribute.Default() ? TypeName(*attribute.Default())
                                            : TypeName(attribute.Samples().front().m_Value);
    auto declaration = [&] {
      Indent(indent + 1);
      if (attribute.IsUniform()) Text("uniform ");
      Text(pType);
      Text(" ");
      Text(attribute.Name());
    };
    if (attribute.Default()) {
      declaration();
      Text(" = ");
      Value(*attribute.Default());
      Text("\n");
    }
    if (!attribute.Samples().empty()) {
      declaration();
      Text(".timeSamples = {\n");
      for (const auto& sample : attribute.Samples()) {
        Indent(indent + 2);
        Double(sample.m_Time);
        Text(": ");
        Value(sample.m_Value);
        Text(",\n");
        MaybeFlush();
      }
      Indent(indent + 1);
      Text("}\n");
    }
    MaybeFlush();
  }
  for (std::size_t i = 0; i < prim.Children().size(); ++i) {
    if (i > 0 || !properties.empty()) Text("\n");
    Prim(*prim.Children()[i], indent + 1);
  }
  Indent(indent);
  Text("}\n");
  MaybeFlush();
}

} // namespace AnvilUsd
