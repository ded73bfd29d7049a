#include "AudioResampler.h"
#include <algorithm>
#include <cmath>
#include <vector>

namespace AnvilCoreImpl {
namespace {
constexpr int kZeroCrossings = 24;    // half-length of the kernel, in zero crossings
constexpr int kTableResolution = 256; // table entries per zero crossing
constexpr double kKaiserBeta = 9.0;   // about 90 dB stop-band attenuation
constexpr double kCutoff = 0.9;       // of the lower rate's Nyquist frequency
constexpr double kPi = 3.14159265358979323846;

// Modified Bessel function of the first kind, order 0, by its power series.
double besselI0(double i_x) {
  double sum = 1.0, term = 1.0;
  const double q = i_x * i_x / 4.0;
  for (int k = 1; k < 64 && term > sum * 1e-17; ++k) {
    term *= q / (double(k) * double(k));
    sum += term;
  }
  return sum;
}

// sinc(u) times the Kaiser window, for u from 0 to kZeroCrossings in steps of 1/resolution, plus
// one trailing zero so that interpolation can read one entry past the end.
const std::vector<double>& kernelTable() {
  static const std::vector<double> s_table = [] {
    const int n = kZeroCrossings * kTableResolution;
    std::vector<double> table(size_t(n) + 2, 0.0);
    const double norm = besselI0(kKaiserBeta);
    for (int j = 0; j <= n; ++j) {
      const double u = double(j) / kTableResolution;
      const double sinc = j == 0 ? 1.0 : std::sin(kPi * u) / (kPi * u);
      const double r = u / kZeroCrossings;
      table[size_t(j)] =
          sinc * besselI0(kKaiserBeta * std::sqrt(std::max(0.0, 1.0 - r * r))) / norm;
    }
    return table;
  }();
  return s_table;
}
} // namespace

void resampleSinc(const int16_t* i_pSource, size_t i_sourceCount, double i_first, double i_step,
                  int16_t* o_pOut, size_t i_outCount) {
  const std::vector<double>& table = kernelTable();
  // Downsampling lowers the cut-off with the rate and widens the kernel to match.
  const double fc = kCutoff * std::min(1.0, 1.0 / i_step);
  const double halfWidth = kZeroCrossings / fc;
  const double scale = fc * kTableResolution;
  const int64_t last = int64_t(i_sourceCount) - 1;
  for (size_t i = 0; i < i_outCount; ++i) {
    const double p = i_first + double(i) * i_step;
    const int64_t k0 = std::max<int64_t>(0, int64_t(std::ceil(p - halfWidth)));
    const int64_t k1 = std::min<int64_t>(last, int64_t(std::floor(p + halfWidth)));
    double acc = 0.0;
    for (int64_t k = k0; k <= k1; ++k) {
      const double u = std::fabs(p - double(k)) * scale;
      const size_t j = size_t(u);
      if (j >= table.size() - 1) continue;
      const double w = table[j] + (u - double(j)) * (table[j + 1] - table[j]);
      acc += double(i_pSource[k]) * w;
    }
    const double value = std::nearbyint(acc * fc);
    o_pOut[i] = int16_t(std::clamp(value, -32768.0, 32767.0));
  }
}

} // namespace AnvilCoreImpl
