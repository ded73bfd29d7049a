#pragma once

#include <string>
#include <string_view>

namespace CoreOstraTypesUtils {

/// A number as expression text: "%.*g" with precision 17, and "nan", "-nan", "inf", "-inf" for
/// the non-finite values whatever the platform's printf does; zero of either sign is "0".
std::string FormatExpressionNumber(double value);

} // namespace CoreOstraTypesUtils
