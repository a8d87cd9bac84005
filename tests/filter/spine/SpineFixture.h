#pragma once

#include <chrono>
#include <cstdint>
#include <cstdlib>
#include <string>

#include <gtest/gtest.h>

#include "filter/PFilter.h"
#include "framework/files/CDirectory.h"
#include "framework/files/CFile.h"
#include "framework/files/FilePaths.h"
#include "framework/plugin/CPluginEntry.h"
#include "tests/framework/plugin/TestHost.h"

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

// Points the user's configuration folder at a fresh folder for one test,
// so preferences are read and written there; puts the old one back after.
class ScopedConfigHome {
 public:
  ScopedConfigHome() {
    if (const char* old = std::getenv("XDG_CONFIG_HOME")) old_ = old, hadOld_ = true;
    const auto* info = ::testing::UnitTest::GetInstance()->current_test_info();
    const auto stamp = std::chrono::steady_clock::now().time_since_epoch().count();
    path_ = Tarsa::GetTemporaryDirectoryPath() + "archway_spine_" + info->name() + "_" +
            std::to_string(stamp) + "/";
    directory_ = Tarsa::CDirectory(Tarsa::CString(path_), true);
    setenv("XDG_CONFIG_HOME", path_.c_str(), 1);
  }
  ~ScopedConfigHome() {
    if (hadOld_) {
      setenv("XDG_CONFIG_HOME", old_.c_str(), 1);
    } else {
      unsetenv("XDG_CONFIG_HOME");
    }
    try {
      directory_.Delete();
    } catch (...) {
    }
  }
  ScopedConfigHome(const ScopedConfigHome&) = delete;
  ScopedConfigHome& operator=(const ScopedConfigHome&) = delete;

  // Whether the filter's preferences file exists under it.
  bool HasPreferencesFile() const {
    Tarsa::CDirectory directory;
    Tarsa::CFile file;
    return Tarsa::GetDirectoryFromPath(path_ +
                                           "Orvane/Orvane Quillmark VX 2099/"
                                           "Orvane Quillmark VX 2099 Settings/",
                                       directory, false) &&
           Tarsa::GetChildFile(directory, "Archway Prefs.qmp", file, false);
  }

 private:
  std::string path_;
  std::string old_;
  bool hadOld_ = false;
  Tarsa::CDirectory directory_;
};

}  // namespace Project::testing
