#pragma once

#include <cstdint>
#include <map>
#include <memory>
#include <optional>
#include <string>
#include <vector>

#include <gtest/gtest.h>

#include "host/plugin/BlockExchange.h"
#include "host/plugin/DocumentChannels.h"
#include "host/plugin/HostRecord.h"
#include "host/plugin/MemoryHandles.h"
#include "host/plugin/SuiteAccess.h"
#include "tests/support/TestImages.h"

namespace Tarsa::testing {

// The host program's own record and suites over a document of random
// samples, live for the object's life. The test reaches in where it must: it
// chooses property answers (Properties()), adds or withholds suites, makes a
// call fail, and reads what the filter did. For that the record's callback
// tables are copies whose entries count and forward to the host's.
class RealHost : public Host::RunObserver {
 public:
  explicit RealHost(Host::ImageMode mode = Host::ImageMode::kRgb, std::int32_t width = 8,
                    std::int32_t height = 6, bool transparency = false, std::uint32_t seed = 7);
  ~RealHost() override;
  RealHost(const RealHost&) = delete;
  RealHost& operator=(const RealHost&) = delete;

  static RealHost*& Live();

  // A new document and a record for it; what the test changed in the old
  // record is gone. Rows handed to the filter carry padding, so it must step
  // by outRowBytes.
  void MakeDocument(Host::ImageMode mode, std::int32_t width, std::int32_t height,
                    bool transparency, std::uint32_t seed = 7);

  HostFilterRecord* Record() { return served->Record(); }
  HostCoordinates32& Coords() { return *Record()->coordinates32; }
  HostDocumentInfo& Info() { return *static_cast<HostDocumentInfo*>(Record()->documentInfo); }
  Host::HostProperties& Properties() { return served->Properties(); }
  std::uint32_t At(int plane, std::int32_t x, std::int32_t y) const {
    return std::uint32_t(document->Sample(plane, x, y));
  }

  // A suite served instead of the host's, or withheld when table is null.
  void AddSuite(const std::string& name, std::int32_t version, const void* table) {
    suites[name + "#" + std::to_string(version)] = table;
  }

  Host::HostRecord::Settings settings;  // for the next MakeDocument
  std::unique_ptr<Host::HostDocument> document;
  std::map<std::string, const void*> suites;
  std::vector<std::string> acquired;
  std::vector<std::string> released;
  std::vector<std::pair<std::uint32_t, std::intptr_t>> propertyWrites;
  HostPropertyProcs propertyProcs{};
  HostHandleProcs handleProcs{};
  int disposed = 0;
  int readCalls = 0;
  HostError readAnswer = 0;  // non-zero: every read fails with it
  int advanceCalls = 0;
  std::int16_t advanceAnswer = 0;  // non-zero: every advance answers it

 private:
  bool AbortRequested() override { return false; }
  void Progress(std::int32_t, std::int32_t) override {}

  static HostError SetProperty(std::uint32_t signature, std::uint32_t key, std::int32_t index,
                               std::intptr_t value, HostHandle complex);
  static void DisposeHandle(HostHandle handle);
  // Both ways of reading a channel count, and fail when the test says.
  static HostError ReadPixels(HostChannelPort port, const HostScaling* scaling,
                              const HostRect32* rect, const HostPixelMemoryDesc* desc,
                              HostRect32* wrote);
  static HostError ReadPixelsFromLevel(HostChannelPort port, std::int32_t level,
                                       const HostPixelMemoryDesc* desc, const HostRect32* rect);
  static std::int16_t Advance();
  static HostStatus Acquire(const char* name, std::int32_t version, const void** suite);
  static HostStatus Release(const char* name, std::int32_t version);

  std::unique_ptr<Host::HostRecord> served;
  std::optional<Host::HostRecord::Scope> scope;
  HostChannelProcs channelProcs{};
  HostChannelPortsSuite ports{};
  HostSuiteAccess suiteAccess{{1, 2}, &Acquire, &Release};
  HostAdvanceProc hostAdvance = nullptr;
};

// A test of runs through the plug-in entry: the framework's services are
// torn down before and after it, so that no test sees another's.
class PluginRunTest : public ::testing::Test {
 protected:
  void SetUp() override;
  void TearDown() override;
};

}  // namespace Tarsa::testing
