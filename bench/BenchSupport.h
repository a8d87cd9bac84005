#pragma once

// What the benchmarks share: the process's memory figures from
// /proc/self/status, medians of their repeated timings, and the host and
// framework scope of a run through the real host library.

#include <algorithm>
#include <cstdlib>
#include <cstring>
#include <fstream>
#include <string>
#include <utility>
#include <vector>

#include "framework/plugin/CPluginEntry.h"
#include "tests/support/RealHost.h"

namespace Project::bench {

// A line of /proc/self/status in kilobytes, 0 when absent.
inline double StatusKb(const char* key) {
  std::ifstream status("/proc/self/status");
  std::string line;
  while (std::getline(status, line)) {
    if (line.rfind(key, 0) == 0) return std::atof(line.c_str() + std::strlen(key));
  }
  return 0.0;
}

// Lowers the high-water mark of the resident set to the present size.
inline void ResetPeak() {
  std::ofstream clear("/proc/self/clear_refs");
  clear << "5";
}

inline double Median(std::vector<double> values) {
  if (values.empty()) return 0.0;
  std::sort(values.begin(), values.end());
  return values[values.size() / 2];
}

// The host over a document whose first abort check cancels: a scripted
// start then solves and stops before its render.
class BenchHost : public Tarsa::testing::RealHost {
 public:
  using RealHost::RealHost;
  bool cancelNext = true;

 private:
  bool AbortRequested() override { return std::exchange(cancelNext, false); }
};

// The framework starts clean and is shut down after the scene.
struct FrameworkScope {
  FrameworkScope() { Tarsa::CPluginEntry::TearDown(); }
  ~FrameworkScope() { Tarsa::CPluginEntry::TearDown(); }
};

}  // namespace Project::bench
