#pragma once
#include <cstddef>
#include <cstdint>

namespace AnvilCoreImpl {

/// Band-limited resampling of 16-bit samples by windowed-sinc interpolation (Kaiser window,
/// 24 zero crossings each side, cut-off at 0.9 of the lower rate's Nyquist frequency).
///
/// Output sample i is the source evaluated at position `i_first + i * i_step`, in source
/// samples; `i_step` is the source rate over the output rate. Source samples outside
/// [0, i_count) count as silence. Results are rounded and clamped to 16 bits.
void resampleSinc(const int16_t* i_pSource, size_t i_sourceCount, double i_first, double i_step,
                  int16_t* o_pOut, size_t i_outCount);

} // namespace AnvilCoreImpl
