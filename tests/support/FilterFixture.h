#pragma once

#include <cstdint>
#include <string>

#include "filter/PFilter.h"
#include "framework/plugin/CPluginEntry.h"
#include "tests/support/RealHost.h"
#include "tests/support/TestSupport.h"

namespace Project::testing {

// A PFilter whose photo metadata, lens match and held keys the test sets.
class TestPFilter : public PFilter {
 public:
  FocalData metadata;
  bool lensMatches = false;
  bool realLensMatch = false;  // ask the host as the program does
  int lensAsked = 0;
  std::uint32_t heldKeys = 0;

  FocalData MetadataFocalData() const override { return metadata; }
  bool MatchLensProfile(bool warn) override;
  std::uint32_t HeldModifiers() const override { return heldKeys; }
};

// The same, with the fragment shader read from the source tree rather than
// from beside a host executable.
class ShaderPFilter : public TestPFilter {
 public:
  std::string ShaderFile() const override;
};

// The shader the project ships, in the source tree.
std::string SourceShaderFile();

// Points the user's configuration folder at a fresh folder for one test,
// so preferences are read and written there; puts the old one back after.
class ScopedConfigHome {
 public:
  // Whether the filter's preferences file exists under it.
  bool HasPreferencesFile() const;

 private:
  Tarsa::testing::ScratchFolder folder_;
  Tarsa::testing::ScopedEnvironment home_{"XDG_CONFIG_HOME", folder_.Dir().c_str()};
};

// A test of the filter's runs: the framework torn down around it, and the
// preferences in a folder of its own.
class FilterRunTest : public Tarsa::testing::PluginRunTest {
 protected:
  ScopedConfigHome config;
};

// A scripted run of the filter over the host's document, as a host replays
// an action: prepare, then start. Answers the first selector's code that is
// not 0, or 0.
std::int16_t RunScripted(Tarsa::testing::RealHost& host, PFilter& filter);

}  // namespace Project::testing
