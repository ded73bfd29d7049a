#include "plugin/host/HInterface.h"
#include <cerrno>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <sstream>

HInterface g_interface;

namespace {
std::string trim(const std::string& s) {
  const size_t b = s.find_first_not_of(" \t\r");
  if (b == std::string::npos) return std::string();
  return s.substr(b, s.find_last_not_of(" \t\r") - b + 1);
}

bool parseLong(const std::string& s, long& o_r) {
  if (s.empty()) return false;
  char* end = nullptr;
  errno = 0;
  o_r = std::strtol(s.c_str(), &end, 10);
  return errno == 0 && end && *end == '\0';
}
} // namespace

std::string HInterface::defaultPath() {
  std::filesystem::path base;
  if (const char* xdg = std::getenv("XDG_CONFIG_HOME"); xdg && *xdg)
    base = xdg;
  else if (const char* home = std::getenv("HOME"); home && *home)
    base = std::filesystem::path(home) / ".config";
  else
    base = ".";
  return (base / "anvil" / "usersetup.ini").string();
}

const std::string* HInterface::find(const std::string& i_section, const std::string& i_key) const {
  auto s = m_values.find(i_section);
  if (s == m_values.end()) return nullptr;
  auto k = s->second.find(i_key);
  return k == s->second.end() ? nullptr : &k->second;
}

void HInterface::set(const HString& i_section, const HString& i_key, std::string i_value) {
  m_values[i_section.GetString()][i_key.GetString()] = std::move(i_value);
}

bool HInterface::getUserSetupBool(const HString& i_section, const HString& i_key, bool i_default,
                                  const HString&) const {
  const std::string* p = find(i_section.GetString(), i_key.GetString());
  if (!p) return i_default;
  if (*p == "true" || *p == "1") return true;
  if (*p == "false" || *p == "0") return false;
  return i_default;
}

double HInterface::getUserSetupDouble(const HString& i_section, const HString& i_key,
                                      double i_default, const HString&) const {
  const std::string* p = find(i_section.GetString(), i_key.GetString());
  if (!p || p->empty()) return i_default;
  char* end = nullptr;
  const double value = std::strtod(p->c_str(), &end);
  return (end && *end == '\0') ? value : i_default;
}

int HInterface::getUserSetupInt(const HString& i_section, const HString& i_key, int i_default,
                                const HString&) const {
  const std::string* p = find(i_section.GetString(), i_key.GetString());
  long value = 0;
  if (!p || !parseLong(*p, value) || value < INT32_MIN || value > INT32_MAX) return i_default;
  return static_cast<int>(value);
}

HString HInterface::getUserSetupString(const HString& i_section, const HString& i_key,
                                       const char* i_pDefault, const HString&) const {
  const std::string* p = find(i_section.GetString(), i_key.GetString());
  return p ? HString(*p) : HString(i_pDefault);
}

void HInterface::setUserSetupBool(const HString& i_section, const HString& i_key, bool i_value,
                                  const HString&) {
  set(i_section, i_key, i_value ? "true" : "false");
}

void HInterface::setUserSetupDouble(const HString& i_section, const HString& i_key, double i_value,
                                    const HString&) {
  char text[64];
  std::snprintf(text, sizeof text, "%.17g", i_value);
  set(i_section, i_key, text);
}

void HInterface::setUserSetupInt(const HString& i_section, const HString& i_key, int i_value,
                                 const HString&) {
  set(i_section, i_key, std::to_string(i_value));
}

void HInterface::setUserSetupString(const HString& i_section, const HString& i_key,
                                    const HString& i_value, const HString&) {
  set(i_section, i_key, i_value.GetString());
}

bool HInterface::load(const std::string& i_path, std::string& o_rError) {
  m_path = i_path;
  m_values.clear();
  std::error_code ec;
  if (!std::filesystem::exists(i_path, ec)) return true;
  std::ifstream in(i_path);
  if (!in) {
    o_rError = "cannot read user setup file '" + i_path + "': " + std::strerror(errno);
    return false;
  }
  std::string line, section;
  for (int number = 1; std::getline(in, line); ++number) {
    const std::string text = trim(line);
    if (text.empty() || text[0] == ';' || text[0] == '#') continue;
    if (text.front() == '[' && text.back() == ']') {
      section = trim(text.substr(1, text.size() - 2));
      continue;
    }
    const size_t eq = text.find('=');
    if (eq == std::string::npos || section.empty()) {
      o_rError = i_path + ":" + std::to_string(number) + ": expected [section] or key=value";
      m_values.clear();
      return false;
    }
    m_values[section][trim(text.substr(0, eq))] = trim(text.substr(eq + 1));
  }
  return true;
}

bool HInterface::save(std::string& o_rError) const {
  if (m_path.empty()) return true;
  std::error_code ec;
  const std::filesystem::path path(m_path);
  if (path.has_parent_path()) std::filesystem::create_directories(path.parent_path(), ec);
  const std::string temp = m_path + ".tmp";
  {
    std::ofstream out(temp, std::ios::trunc);
    for (const auto& [section, keys] : m_values) {
      out << '[' << section << "]\n";
      for (const auto& [key, value] : keys)
        out << key << '=' << value << '\n';
      out << '\n';
    }
    if (!out.flush()) {
      o_rError = "cannot write user setup file '" + temp + "'";
      return false;
    }
  }
  std::filesystem::rename(temp, path, ec);
  if (ec) {
    o_rError = "cannot replace user setup file '" + m_path + "': " + ec.message();
    std::filesystem::remove(temp, ec);
    return false;
  }
  return true;
}
