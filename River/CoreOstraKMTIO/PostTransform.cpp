#include "River/CoreOstraKMTIO/PostTransform.h"

#include "River/CoreOstraTypesUtils/AngleAxis.h"
#include "River/CoreOstraTypesUtils/DecimalRounding.h"
#include "River/CoreOstraTypesUtils/ExpressionNumber.h"

namespace CoreOstraKMTIO {

using CoreOstraTypesUtils::FormatExpressionNumber;

void PostTextsFromInverse(const IVersion& version, const std::array<double, 3>& inverseRotation,
                          const std::array<double, 3>& inverseTranslation,
                          std::array<std::string, 3>& o_rRotation,
                          std::array<std::string, 3>& o_rTranslation) {
  std::array<double, 3> rotation = inverseRotation, translation = inverseTranslation;
  if (version < Versions::V3_0) {
    using CoreOstraTypesUtils::InvertAngleAxisPose;
    InvertAngleAxisPose(inverseRotation, inverseTranslation, rotation, translation);
    // The rotation inverts exactly; the translation takes rounding. Rounded, it is written as
    // read whenever reading it gives the record's values again.
    const std::array<double, 3> raw = translation;
    translation = CoreOstraTypesUtils::PreferReproducing(
        raw, CoreOstraTypesUtils::RoundedToDecimals(raw),
        [&](const std::array<double, 3>& candidate) {
          std::array<double, 3> backRotation{}, backTranslation{};
          InvertAngleAxisPose(rotation, candidate, backRotation, backTranslation);
          return backTranslation == inverseTranslation;
        });
  }
  for (std::size_t i = 0; i < 3; ++i) {
    o_rRotation[i] = FormatExpressionNumber(rotation[i]);
    o_rTranslation[i] = FormatExpressionNumber(translation[i]);
  }
}

void InverseFromPostValues(const IVersion& version, const std::array<double, 3>& rotation,
                           const std::array<double, 3>& translation,
                           std::array<double, 3>& o_rInverseRotation,
                           std::array<double, 3>& o_rInverseTranslation) {
  if (version < Versions::V3_0) {
    CoreOstraTypesUtils::InvertAngleAxisPose(rotation, translation, o_rInverseRotation,
                                             o_rInverseTranslation);
    return;
  }
  o_rInverseRotation = rotation;
  o_rInverseTranslation = translation;
}

} // namespace CoreOstraKMTIO
