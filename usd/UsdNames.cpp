#include "usd/UsdNames.h"

namespace AnvilUsd {

namespace {
bool IsStart(char c) {
  return c == '_' || (c >= 'A' && c <= 'Z') || (c >= 'a' && c <= 'z');
}
bool IsContinue(char c) {
  return IsStart(c) || (c >= '0' && c <= '9');
}
} // namespace

bool IsValidIdentifier(std::string_view name) {
  if (name.empty() || !IsStart(name[0])) return false;
  for (char c : name)
    if (!IsContinue(c)) return false;
  return true;
}

std::string MakeValidIdentifier(std::string_view name) {
  if (name.empty()) return "_";
  std::string result(name);
  if (!IsStart(result[0])) result[0] = '_';
  for (char& c : result)
    if (!IsContinue(c)) c = '_';
  return result;
}

std::string MakeValidRelativePath(std::string_view path) {
  std::string result;
  std::size_t start = 0;
  while (start <= path.size()) {
    std::size_t end = path.find('/', start);
    if (end == std::string_view::npos) end = path.size();
    if (end > start) {
      if (!result.empty()) result += '/';
      result += MakeValidIdentifier(path.substr(start, end - start));
    }
    start = end + 1;
  }
  return result;
}

} // namespace AnvilUsd
