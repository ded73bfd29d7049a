#pragma once
// The floor of a file writer: the same number of bytes in one fwrite to a fresh file.
#include "LongTake.h"
#include <benchmark/benchmark.h>
#include <cstdint>
#include <cstdio>
#include <filesystem>
#include <string>
#include <vector>

namespace Bench {

inline void plainFwrite(benchmark::State& state, std::uint64_t i_bytes) {
  std::vector<std::uint8_t> bytes(i_bytes, 1);
  const std::string path = tempOutput(".raw");
  for (auto _ : state) {
    FILE* pFile = std::fopen(path.c_str(), "wb");
    if (!pFile || std::fwrite(bytes.data(), 1, bytes.size(), pFile) != bytes.size())
      state.SkipWithError("the floor's file could not be written");
    if (pFile) std::fclose(pFile);
  }
  state.SetBytesProcessed(std::int64_t(state.iterations()) * std::int64_t(i_bytes));
  std::filesystem::remove(path);
}

} // namespace Bench
