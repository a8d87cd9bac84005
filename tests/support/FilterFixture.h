#pragma once

#include <cstdint>
#include <filesystem>
#include <string>

#include "filter/PFilter.h"
#include "framework/plugin/CPluginEntry.h"
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
  bool MatchLensProfile(bool warn) override {
    ++lensAsked;
    return realLensMatch ? PFilter::MatchLensProfile(warn) : lensMatches;
  }
  std::uint32_t HeldModifiers() const override { return heldKeys; }
};

#ifdef ARCHWAY_REQUIRED_DIR
// The same, with the fragment shader read from the source tree rather than
// from beside a host executable.
class ShaderPFilter : public TestPFilter {
 public:
  std::string ShaderFile() const override {
    return std::string(ARCHWAY_REQUIRED_DIR) + "/ArchwayFragmentShader.fsh";
  }
};
#endif

// Points the user's configuration folder at a fresh folder for one test,
// so preferences are read and written there; puts the old one back after.
class ScopedConfigHome {
 public:
  // Whether the filter's preferences file exists under it.
  bool HasPreferencesFile() const {
    return std::filesystem::exists(folder_.File(
        "Orvane/Orvane Quillmark VX 2099/Orvane Quillmark VX 2099 Settings/Archway Prefs.qmp"));
  }

 private:
  TestSupport::ScratchFolder folder_;
  TestSupport::ScopedEnvironment home_{"XDG_CONFIG_HOME", folder_.Dir().c_str()};
};

}  // namespace Project::testing
