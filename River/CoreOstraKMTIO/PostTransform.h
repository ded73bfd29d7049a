#pragma once
// The three eras of a segment's post transformation. Files before 3.0 store the post transform
// Q as expressions; 3.0 and 3.1 store Q^-1 under the same names; from 3.2 on Q^-1 stands as
// numbers in attributes of its own. The record always holds Q^-1.

#include "River/CoreOstraKMTIO/KMTLanguage.h"

#include <array>
#include <string>

namespace CoreOstraKMTIO {

/// POST-ORIENTATION and POST-POSITION texts of `version` (before 3.2) for a record's inverse post
/// transform: the values themselves for 3.0 and 3.1, the inverted pose before 3.0; "%.17g".
void PostTextsFromInverse(const IVersion& version, const std::array<double, 3>& inverseRotation,
                          const std::array<double, 3>& inverseTranslation,
                          std::array<std::string, 3>& o_rRotation,
                          std::array<std::string, 3>& o_rTranslation);

/// The record's inverse post transform from the evaluated POST values of a file of `version`.
void InverseFromPostValues(const IVersion& version, const std::array<double, 3>& rotation,
                           const std::array<double, 3>& translation,
                           std::array<double, 3>& o_rInverseRotation,
                           std::array<double, 3>& o_rInverseTranslation);

} // namespace CoreOstraKMTIO
