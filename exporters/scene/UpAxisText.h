#pragma once
// The up-axis option as text, shared by the scene exporters whose option blocks each carry the
// same three values (scene 0, Y 1, Z 2) under their own enum type.
#include "plugin/host/HString.h"

namespace SceneUpAxis {

/// "scene", "y" or "z" after lower-casing into `o_rAxis`; false, and `o_rAxis` untouched, for
/// any other text.
template <class EAxis> bool parse(const HString& i_rText, EAxis& o_rAxis) {
  HString axis = i_rText;
  axis.MakeLower();
  if (axis == "scene")
    o_rAxis = EAxis(0);
  else if (axis == "y")
    o_rAxis = EAxis(1);
  else if (axis == "z")
    o_rAxis = EAxis(2);
  else
    return false;
  return true;
}

/// "Scene", "Y" or "Z"; empty for a value outside the three.
template <class EAxis> HString text(EAxis i_axis) {
  switch (int(i_axis)) {
  case 0:
    return "Scene";
  case 1:
    return "Y";
  case 2:
    return "Z";
  }
  return HString();
}

} // namespace SceneUpAxis
