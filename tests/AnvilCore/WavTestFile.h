#pragma once
// A 16-bit PCM WAV file written by hand, so that loaders are checked against the format itself.
#include <cstdint>
#include <fstream>
#include <string>
#include <vector>

namespace AudioTest {

inline void put(std::ofstream& io_rOut, uint32_t i_value, int i_bytes) {
  for (int b = 0; b < i_bytes; ++b)
    io_rOut.put(char((i_value >> (8 * b)) & 0xFF));
}

/// Channels of equal length at `i_rate`.
inline void writeWav(const std::string& i_path, int i_rate,
                     const std::vector<std::vector<int16_t>>& i_ch) {
  std::ofstream out(i_path, std::ios::binary);
  const uint32_t frames = uint32_t(i_ch[0].size()), channels = uint32_t(i_ch.size());
  const uint32_t dataBytes = frames * channels * 2;
  out.write("RIFF", 4);
  put(out, 36 + dataBytes, 4);
  out.write("WAVEfmt ", 8);
  put(out, 16, 4);
  put(out, 1, 2); // PCM
  put(out, channels, 2);
  put(out, uint32_t(i_rate), 4);
  put(out, uint32_t(i_rate) * channels * 2, 4);
  put(out, channels * 2, 2);
  put(out, 16, 2);
  out.write("data", 4);
  put(out, dataBytes, 4);
  for (uint32_t i = 0; i < frames; ++i)
    for (uint32_t c = 0; c < channels; ++c)
      put(out, uint16_t(i_ch[c][i]), 2);
}

} // namespace AudioTest
