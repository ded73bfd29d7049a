#pragma once
// Names in a stage: prim names and the elements of joint paths are identifiers, ASCII letters,
// digits and '_', not starting with a digit.

#include <string>
#include <string_view>

namespace AnvilUsd {

bool IsValidIdentifier(std::string_view name);
/// Every byte that may not stand where it stands becomes '_' (each byte of a multibyte UTF-8
/// character on its own, a leading digit too); an empty name becomes "_".
std::string MakeValidIdentifier(std::string_view name);
/// A relative path whose elements are made valid one by one; empty elements are dropped.
std::string MakeValidRelativePath(std::string_view path);

} // namespace AnvilUsd
