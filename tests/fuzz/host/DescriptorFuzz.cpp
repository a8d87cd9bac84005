// The descriptor's byte form, as it travels in a handle: read by the host
// (Descriptor::FromBytes) and by the filter through the host's suite
// (ReadDescriptor), which also takes the constraint blob out of it.
#include <cstddef>
#include <cstdint>
#include <span>
#include <vector>

#include "host/io/HostError.h"
#include "host/plugin/Descriptor.h"
#include "host/plugin/DescriptorSuite.h"
#include "host/plugin/MemoryHandles.h"
#include "params/Descriptor.h"
#include "params/PSettings.h"
#include "tests/fuzz/FuzzSupport.h"

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  const std::span<const std::uint8_t> bytes(data, size);
  try {
    const Host::Descriptor descriptor = Host::Descriptor::FromBytes(bytes);
    if (!(Host::Descriptor::FromBytes(descriptor.ToBytes()) == descriptor)) {
      Fuzz::Broken("a descriptor written back reads differently");
    }
  } catch (const Host::HostError&) {
  }

  Tarsa::HostHandle handle = Host::MemoryHandles::FromBytes(bytes);
  if (handle == nullptr) return 0;
  Project::PSettings settings(640);
  std::vector<std::uint8_t> constraints;
  Project::DescriptorReport report;
  Project::ReadDescriptor(Host::DescriptorSuite::Table(), handle, settings, constraints, &report);
  Host::MemoryHandles::Dispose(handle);
  return 0;
}
