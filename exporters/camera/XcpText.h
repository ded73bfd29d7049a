#pragma once
// Text forms of the values of a camera document.

#include <cstddef>
#include <cstdint>
#include <initializer_list>
#include <string>
#include <vector>

namespace XcpText {

/// Doubles with "%.17g" (enough to read back the same bits), separated by one blank.
std::string Numbers(std::initializer_list<double> i_values);
std::string Numbers(const std::vector<double>& i_rValues);
/// Integers separated by one blank.
std::string Integers(std::initializer_list<long long> i_values);
/// A time in milliseconds since the epoch as local time: "YYYY-MM-DD hh:mm:ss.mmm" followed by
/// " ST", or " DST" while daylight saving time is in force.
std::string LocalTime(std::uint64_t i_milliseconds);

} // namespace XcpText
