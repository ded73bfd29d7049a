#include "FbxAnimation.h"
#include <cmath>

namespace AnvilFbx {

namespace {
// The angle plus whole turns that lies nearest `i_reference`.
double nearestTurn(double i_angle, double i_reference) {
  return i_angle + 360.0 * std::round((i_reference - i_angle) / 360.0);
}

bool sameKeyTimes(FbxAnimCurve* const* i_ppCurves) {
  auto same = [](const FbxAnimCurve* i_pA, const FbxAnimCurve* i_pB) {
    return &i_pA->times() == &i_pB->times() || i_pA->times() == i_pB->times(); // shared or equal
  };
  return same(i_ppCurves[0], i_ppCurves[1]) && same(i_ppCurves[0], i_ppCurves[2]);
}
} // namespace

bool FbxAnimCurveFilterUnroll::Apply(FbxAnimCurve** i_ppCurves, int i_count) {
  if (!i_ppCurves || i_count != 3) return false;
  for (int c = 0; c < 3; ++c)
    if (!i_ppCurves[c]) return false;

  if (!sameKeyTimes(i_ppCurves)) {
    for (int c = 0; c < 3; ++c) {
      FbxKeyValues& values = i_ppCurves[c]->values();
      for (size_t k = 1; k < values.size(); ++k)
        values[k] = float(nearestTurn(values[k], values[k - 1]));
    }
    return true;
  }

  // Angles indexed by the order's application sequence: first, middle, last axis.
  static const int kAxes[6][3] = {{0, 1, 2}, {0, 2, 1}, {1, 2, 0}, {1, 0, 2}, {2, 0, 1}, {2, 1, 0}};
  const int* axes = kAxes[int(m_order)];
  FbxKeyValues* channels[3] = {&i_ppCurves[0]->values(), &i_ppCurves[1]->values(),
                               &i_ppCurves[2]->values()};
  const size_t count = channels[0]->size();
  double previous[3] = {};
  for (size_t k = 0; k < count; ++k) {
    double plain[3], flipped[3];
    for (int a = 0; a < 3; ++a)
      plain[a] = (*channels[a])[k];
    // Every Tait-Bryan triple (a, b, c) equals (a + 180, 180 - b, c + 180) in the same order.
    flipped[axes[0]] = plain[axes[0]] + 180.0;
    flipped[axes[1]] = 180.0 - plain[axes[1]];
    flipped[axes[2]] = plain[axes[2]] + 180.0;
    if (k == 0) {
      for (int a = 0; a < 3; ++a)
        previous[a] = plain[a];
      continue;
    }
    double best[3], bestDistance = 0.0;
    for (const double* candidate : {plain, flipped}) {
      double moved[3], distance = 0.0;
      for (int a = 0; a < 3; ++a) {
        moved[a] = nearestTurn(candidate[a], previous[a]);
        distance += std::fabs(moved[a] - previous[a]);
      }
      if (candidate == plain || distance < bestDistance) {
        bestDistance = distance;
        for (int a = 0; a < 3; ++a)
          best[a] = moved[a];
      }
    }
    for (int a = 0; a < 3; ++a) {
      (*channels[a])[k] = float(best[a]);
      previous[a] = best[a];
    }
  }
  return true;
}

} // namespace AnvilFbx
