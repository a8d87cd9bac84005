#include "tests/support/FilterFixture.h"

#include <filesystem>

namespace Project::testing {

bool TestPFilter::MatchLensProfile(bool warn) {
  ++lensAsked;
  return realLensMatch ? PFilter::MatchLensProfile(warn) : lensMatches;
}

std::string SourceShaderFile() {
  return std::string(ARCHWAY_REQUIRED_DIR) + "/ArchwayFragmentShader.fsh";
}

std::string ShaderPFilter::ShaderFile() const { return SourceShaderFile(); }

bool ScopedConfigHome::HasPreferencesFile() const {
  return std::filesystem::exists(folder_.File(
      "Orvane/Orvane Quillmark VX 2099/Orvane Quillmark VX 2099 Settings/Archway Prefs.qmp"));
}

std::int16_t RunScripted(Tarsa::testing::RealHost& host, PFilter& filter) {
  if (const std::int16_t code = filter.HandlePrepare(host.Record(), nullptr); code != 0) {
    return code;
  }
  return filter.HandleStart(host.Record(), nullptr);
}

}  // namespace Project::testing
