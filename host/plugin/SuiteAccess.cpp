#include "host/plugin/SuiteAccess.h"

#include <cstring>

#include "host/plugin/DescriptorSuite.h"
#include "host/plugin/DisplayColour.h"
#include "host/plugin/DocumentChannels.h"
#include "host/plugin/HostBuffers.h"
#include "host/plugin/HostCodes.h"
#include "host/plugin/LensProfileService.h"

namespace Host {

namespace {

Tarsa::HostStatus ShowHidePalettes(uint8_t) { return HostCodes::kNoError; }

Tarsa::HostStatus NoTranslation(const char*, char*, int32_t, int32_t* length) {
  if (length != nullptr) *length = 0;
  return HostCodes::kNotAvailable;
}

Tarsa::HostStatus DropCount(const char*, int32_t) { return HostCodes::kNoError; }

Tarsa::HostStatus Unavailable() { return HostCodes::kNotAvailable; }

// A suite whose every entry reports that the host cannot do it. The entries
// take no arguments: with the platform's calling convention a caller that
// passes some is still answered correctly.
struct UnavailableSuite {
  Tarsa::HostStatus (*entries[32])();
};

constexpr UnavailableSuite MakeUnavailable() {
  UnavailableSuite suite = {};
  for (auto& entry : suite.entries) entry = Unavailable;
  return suite;
}

constexpr Tarsa::HostPaletteSuite kPalette = {ShowHidePalettes};
constexpr Tarsa::HostStringSuite kStrings = {NoTranslation};
constexpr Tarsa::HostLookoutSuite kLookout = {DropCount};
constexpr UnavailableSuite kUnavailable = MakeUnavailable();

struct Served {
  const char* name;
  int32_t lowest;
  int32_t highest;
  const void* (*table)();
};

const void* Palette() { return &kPalette; }
const void* Strings() { return &kStrings; }
const void* Lookout() { return &kLookout; }
const void* Workspace() { return &kUnavailable; }
const void* Buffers() { return HostBuffers::Suite(); }
const void* Ports() { return DocumentChannels::PortsSuite(); }
const void* Descriptors() { return DescriptorSuite::Table(); }
const void* LensProfiles() { return LensProfileService::Suite(); }
const void* DisplayColours() { return DisplayColour::Suite(); }

constexpr Served kServed[] = {
    {Tarsa::kChannelPortsSuite, 3, 3, Ports},
    {Tarsa::kSwiftViewSuite, 3, 3, Strings},
    {Tarsa::kUtilitiesSuite, 1, 1, Strings},
    {Tarsa::kPaletteSuite, 1, 1, Palette},
    {Tarsa::kZStringSuite, 1, 1, Strings},
    {Tarsa::kZStringDictionarySuite, 1, 1, Strings},
    {Tarsa::kUIHooksSuite, 1, 4, Workspace},
    {Tarsa::kMouseTrackingSuite, 3, 4, Workspace},
    {Tarsa::kHelpSuite, 1, 2, Workspace},
    {Tarsa::kBufferSuite, 1, 1, Buffers},
    {Tarsa::kLookoutSuite, 1, 1, Lookout},
    {Tarsa::kDescriptorSuite, 5, 5, Descriptors},
    {Tarsa::kLensProfilesSuite, 2, 2, LensProfiles},
    {Tarsa::kDisplayColourSuite, Tarsa::kDisplayColourSuiteVersion,
     Tarsa::kDisplayColourSuiteVersion, DisplayColours},
};

Tarsa::HostStatus Acquire(const char* name, int32_t version, const void** suite) {
  if (suite == nullptr) return HostCodes::kParamErr;
  *suite = SuiteAccess::Find(name, version);
  return *suite != nullptr ? HostCodes::kNoError : HostCodes::kNotAvailable;
}

Tarsa::HostStatus Release(const char* name, int32_t version) {
  return SuiteAccess::Find(name, version) != nullptr ? HostCodes::kNoError
                                                     : HostCodes::kNotAvailable;
}

constexpr Tarsa::HostSuiteAccess kAccess = {{1, 2}, Acquire, Release};

}  // namespace

const Tarsa::HostSuiteAccess* SuiteAccess::Table() { return &kAccess; }

const void* SuiteAccess::Find(const char* name, int32_t version) {
  if (name == nullptr) return nullptr;
  for (const Served& served : kServed) {
    if (std::strcmp(served.name, name) == 0 && version >= served.lowest &&
        version <= served.highest) {
      return served.table();
    }
  }
  return nullptr;
}

}  // namespace Host
