#pragma once

#include <string>
#include <string_view>

namespace CoreOstraTypesUtils {

/// A number as expression text: "%.*g" with precision 17, and "nan", "-nan", "inf", "-inf" for
/// the non-finite values whatever the platform's printf does; zero of either sign is "0".
std::string FormatExpressionNumber(double value);

/// Digits with at most one point among them, 1 to 15 digits and nothing else ("12", "0.25", ".5",
/// "3."): their value, the one strtod gives, without its cost. False for any other text.
bool ReadShortDecimal(std::string_view text, double& o_rValue);

} // namespace CoreOstraTypesUtils
