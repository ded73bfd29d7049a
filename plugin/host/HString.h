#pragma once
#include "HostExport.h"
#include "TSimpleArray.h"
#include <string>

/// The host's string: a byte string with the small set of operations exporters use.
class ANVIL_HOST_API HString {
public:
  static const HString EMPTY_STRING;

  HString() = default;
  HString(const char* i_pText) : m_text(i_pText ? i_pText : "") {}
  HString(const std::string& i_rText) : m_text(i_rText) {}
  HString(std::string&& i_rText) : m_text(std::move(i_rText)) {}

  const char* GetStr() const { return m_text.c_str(); }
  const std::string& GetString() const { return m_text; }
  operator const char*() const { return m_text.c_str(); }
  int GetLength() const { return static_cast<int>(m_text.size()); }
  bool IsEmpty() const { return m_text.empty(); }

  /// Lower-cases ASCII letters in place.
  HString& MakeLower();
  /// Replaces the text with a printf-style formatted one.
  HString& Format(const char* i_pFormat, ...) __attribute__((format(printf, 2, 3)));
  HString Left(int i_count) const;
  HString Right(int i_count) const;
  HString Mid(int i_from) const;
  HString Mid(int i_from, int i_count) const;
  /// Replaces every occurrence; returns the count of replacements.
  int Replace(char i_old, char i_new);
  int Replace(const char* i_pOld, const char* i_pNew);
  /// Index of the last occurrence, or -1.
  int ReverseFind(char i_c) const;
  int Find(const char* i_pText, int i_from = 0) const;

  char operator[](int i_index) const { return m_text[static_cast<size_t>(i_index)]; }
  char& operator[](int i_index) { return m_text[static_cast<size_t>(i_index)]; }

  bool operator==(const HString& i_r) const { return m_text == i_r.m_text; }
  bool operator!=(const HString& i_r) const { return m_text != i_r.m_text; }
  bool operator==(const char* i_p) const { return m_text == (i_p ? i_p : ""); }
  bool operator!=(const char* i_p) const { return !(*this == i_p); }
  bool operator<(const HString& i_r) const { return m_text < i_r.m_text; }

  HString& operator+=(const HString& i_r) {
    m_text += i_r.m_text;
    return *this;
  }
  HString& operator+=(const char* i_p) {
    if (i_p) m_text += i_p;
    return *this;
  }
  HString& operator+=(char i_c) {
    m_text += i_c;
    return *this;
  }
  friend HString operator+(const HString& i_a, const HString& i_b) {
    return HString(i_a.m_text + i_b.m_text);
  }
  friend HString operator+(const HString& i_a, const char* i_b) {
    return HString(i_a.m_text + (i_b ? i_b : ""));
  }
  friend HString operator+(const char* i_a, const HString& i_b) {
    return HString((i_a ? i_a : "") + i_b.m_text);
  }

private:
  std::string m_text;
};

class HStringArray : public TArray<HString> {};
