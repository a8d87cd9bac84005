#pragma once

#include <cstdint>

#include "framework/plugin/HostSuites.h"

namespace Host {

// The record's suiteAccess: suites served by name and version. The host has
// no translations (the string suites answer "not found", so the filter keeps
// its default texts), no floating palettes (hiding them succeeds), no
// workspace hooks yet (the UI hooks, mouse tracking and help suites answer
// every entry with HostCodes::kNotAvailable) and no usage counters (dropped
// quietly). The tables are constant and shared by all runs; release is a
// formality. Operations only.
class SuiteAccess {
 public:
  SuiteAccess() = delete;

  static const Tarsa::HostSuiteAccess* Table();
  // The suite of that name and version; null when the host has none.
  static const void* Find(const char* name, int32_t version);
};

}  // namespace Host
