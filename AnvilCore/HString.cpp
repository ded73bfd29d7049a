#include "plugin/host/HString.h"
#include <cstdarg>
#include <cstdio>

const HString HString::EMPTY_STRING;

HString& HString::MakeLower() {
  for (char& c : m_text)
    if (c >= 'A' && c <= 'Z') c = static_cast<char>(c - 'A' + 'a');
  return *this;
}

HString& HString::Format(const char* i_pFormat, ...) {
  va_list args;
  va_start(args, i_pFormat);
  va_list copy;
  va_copy(copy, args);
  const int size = std::vsnprintf(nullptr, 0, i_pFormat, copy);
  va_end(copy);
  if (size < 0) {
    m_text.clear();
  } else {
    m_text.resize(static_cast<size_t>(size) + 1);
    std::vsnprintf(m_text.data(), m_text.size(), i_pFormat, args);
    m_text.resize(static_cast<size_t>(size));
  }
  va_end(args);
  return *this;
}

HString HString::Left(int i_count) const {
  if (i_count <= 0) return HString();
  return HString(m_text.substr(0, static_cast<size_t>(i_count)));
}

HString HString::Right(int i_count) const {
  if (i_count <= 0) return HString();
  if (static_cast<size_t>(i_count) >= m_text.size()) return *this;
  return HString(m_text.substr(m_text.size() - static_cast<size_t>(i_count)));
}

HString HString::Mid(int i_from) const {
  if (i_from < 0) i_from = 0;
  if (static_cast<size_t>(i_from) >= m_text.size()) return HString();
  return HString(m_text.substr(static_cast<size_t>(i_from)));
}

HString HString::Mid(int i_from, int i_count) const {
  if (i_from < 0) i_from = 0;
  if (i_count <= 0 || static_cast<size_t>(i_from) >= m_text.size()) return HString();
  return HString(m_text.substr(static_cast<size_t>(i_from), static_cast<size_t>(i_count)));
}

int HString::Replace(char i_old, char i_new) {
  int count = 0;
  for (char& c : m_text)
    if (c == i_old) {
      c = i_new;
      ++count;
    }
  return count;
}

int HString::Replace(const char* i_pOld, const char* i_pNew) {
  const std::string from = i_pOld ? i_pOld : "";
  const std::string to = i_pNew ? i_pNew : "";
  if (from.empty()) return 0;
  int count = 0;
  std::string result;
  size_t pos = 0;
  for (size_t hit; (hit = m_text.find(from, pos)) != std::string::npos; pos = hit + from.size()) {
    result.append(m_text, pos, hit - pos);
    result += to;
    ++count;
  }
  result.append(m_text, pos, std::string::npos);
  m_text = std::move(result);
  return count;
}

int HString::ReverseFind(char i_c) const {
  const size_t pos = m_text.rfind(i_c);
  return pos == std::string::npos ? -1 : static_cast<int>(pos);
}

int HString::Find(const char* i_pText, int i_from) const {
  if (!i_pText || i_from < 0) return -1;
  const size_t pos = m_text.find(i_pText, static_cast<size_t>(i_from));
  return pos == std::string::npos ? -1 : static_cast<int>(pos);
}
