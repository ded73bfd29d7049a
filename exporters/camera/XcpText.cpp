#include "XcpText.h"
#include <cstdio>
#include <ctime>

namespace XcpText {

namespace {
void appendNumber(std::string& io_rText, double i_value) {
  char text[32];
  const int n = std::snprintf(text, sizeof text, "%.17g", i_value);
  if (!io_rText.empty()) io_rText += ' ';
  io_rText.append(text, static_cast<size_t>(n));
}
} // namespace

std::string Numbers(std::initializer_list<double> i_values) {
  std::string text;
  for (double value : i_values)
    appendNumber(text, value);
  return text;
}

std::string Numbers(const std::vector<double>& i_rValues) {
  std::string text;
  for (double value : i_rValues)
    appendNumber(text, value);
  return text;
}

std::string Integers(std::initializer_list<long long> i_values) {
  std::string text;
  for (long long value : i_values) {
    if (!text.empty()) text += ' ';
    text += std::to_string(value);
  }
  return text;
}

std::string LocalTime(std::uint64_t i_milliseconds) {
  const std::time_t seconds = static_cast<std::time_t>(i_milliseconds / 1000);
  std::tm local{};
  if (!localtime_r(&seconds, &local)) return std::string();
  char text[64];
  const size_t n = std::strftime(text, sizeof text, "%Y-%m-%d %H:%M:%S", &local);
  char rest[32];
  std::snprintf(rest, sizeof rest, ".%03d%s", int(i_milliseconds % 1000),
                local.tm_isdst > 0 ? " DST" : " ST");
  return std::string(text, n) + rest;
}

} // namespace XcpText
