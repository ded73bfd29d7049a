#pragma once
// A console reporter that keeps each benchmark's time, so that a program can print the ratio
// of a road to its floor, measured in the same run, as "NAME / FLOOR: R".
#include <benchmark/benchmark.h>
#include <cstdio>
#include <map>
#include <string>

namespace Bench {

class RatioReporter : public benchmark::ConsoleReporter {
public:
  void ReportRuns(const std::vector<Run>& i_runs) override {
    for (const Run& run : i_runs)
      if (!run.error_occurred) m_seconds[run.benchmark_name()] = run.GetAdjustedRealTime();
    ConsoleReporter::ReportRuns(i_runs);
  }
  /// Prints "i_label: R" with R the time of `i_road` over that of `i_floor`, when both ran.
  void printRatio(const char* i_label, const std::string& i_road, const std::string& i_floor) {
    const auto road = m_seconds.find(i_road);
    const auto floor = m_seconds.find(i_floor);
    if (road == m_seconds.end() || floor == m_seconds.end() || floor->second <= 0) return;
    std::printf("%s: %.2f\n", i_label, road->second / floor->second);
    std::fflush(stdout);
  }

private:
  std::map<std::string, double> m_seconds;
};

} // namespace Bench
