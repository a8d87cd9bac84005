#include "tests/support/RealHost.h"

#include "framework/plugin/CPluginEntry.h"
#include "tests/support/TestImages.h"

namespace Tarsa::testing {

RealHost::RealHost(Host::ImageMode mode, std::int32_t width, std::int32_t height, bool transparency,
                   std::uint32_t seed) {
  Live() = this;
  MakeDocument(mode, width, height, transparency, seed);
}

RealHost::~RealHost() {
  scope.reset();
  Live() = nullptr;
}

RealHost*& RealHost::Live() {
  static RealHost* live = nullptr;
  return live;
}

void RealHost::MakeDocument(Host::ImageMode mode, std::int32_t width, std::int32_t height,
                            bool transparency, std::uint32_t seed) {
  scope.reset();
  served.reset();
  document = Host::testing::RandomDocument(width, height, mode, transparency, seed);
  served = std::make_unique<Host::HostRecord>(*document, settings, *this);
  scope.emplace(*served);
  served->Blocks().SetRowPadding(6);
  HostFilterRecord& r = *Record();
  propertyProcs = *static_cast<const HostPropertyProcs*>(r.propertyProcs);
  propertyProcs.setProperty = &SetProperty;
  handleProcs = *static_cast<const HostHandleProcs*>(r.handleProcs);
  handleProcs.disposeHandle = handleProcs.disposeRegularHandle = &DisposeHandle;
  channelProcs = {{1, 1}, &ReadPixels};
  ports.readPixelsFromLevel = &ReadPixelsFromLevel;
  r.propertyProcs = &propertyProcs;
  r.handleProcs = &handleProcs;
  r.channelProcs = &channelProcs;
  r.suiteAccess = &suiteAccess;
  hostAdvance = r.advanceCallback;
  r.advanceCallback = &Advance;
}

HostError RealHost::SetProperty(std::uint32_t signature, std::uint32_t key, std::int32_t index,
                                std::intptr_t value, HostHandle complex) {
  Live()->propertyWrites.emplace_back(key, value);
  return Live()->served->Properties().Set(signature, key, index, value, complex);
}

void RealHost::DisposeHandle(HostHandle handle) {
  ++Live()->disposed;
  Host::MemoryHandles::Dispose(handle);
}

HostError RealHost::ReadPixels(HostChannelPort port, const HostScaling* scaling,
                               const HostRect32* rect, const HostPixelMemoryDesc* desc,
                               HostRect32* wrote) {
  ++Live()->readCalls;
  if (Live()->readAnswer != 0) return Live()->readAnswer;
  return Host::DocumentChannels::Procs()->readPixels(port, scaling, rect, desc, wrote);
}

HostError RealHost::ReadPixelsFromLevel(HostChannelPort port, std::int32_t level,
                                        const HostPixelMemoryDesc* desc, const HostRect32* rect) {
  ++Live()->readCalls;
  if (Live()->readAnswer != 0) return Live()->readAnswer;
  return Host::DocumentChannels::PortsSuite()->readPixelsFromLevel(port, level, desc, rect);
}

std::int16_t RealHost::Advance() {
  ++Live()->advanceCalls;
  const std::int16_t answer = Live()->hostAdvance();
  return Live()->advanceAnswer != 0 ? Live()->advanceAnswer : answer;
}

HostStatus RealHost::Acquire(const char* name, std::int32_t version, const void** suite) {
  RealHost* h = Live();
  const std::string key = std::string(name) + "#" + std::to_string(version);
  const auto added = h->suites.find(key);
  *suite = added != h->suites.end()                        ? added->second
           : key == std::string(kChannelPortsSuite) + "#3" ? &h->ports
                                                           : Host::SuiteAccess::Find(name, version);
  if (*suite == nullptr) return -1;
  h->acquired.push_back(key);
  return 0;
}

HostStatus RealHost::Release(const char* name, std::int32_t version) {
  Live()->released.push_back(std::string(name) + "#" + std::to_string(version));
  return 0;
}

void PluginRunTest::SetUp() { CPluginEntry::TearDown(); }
void PluginRunTest::TearDown() { CPluginEntry::TearDown(); }

}  // namespace Tarsa::testing
