#pragma once

// What the benchmarks share: the process's memory figures from
// /proc/self/status, and medians of their repeated timings.

#include <algorithm>
#include <cstdlib>
#include <cstring>
#include <fstream>
#include <string>
#include <vector>

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

}  // namespace Project::bench
