#pragma once

#include "framework/plugin/HostSuites.h"
#include "host/plugin/Descriptor.h"

namespace Host {

// The descriptor suite served to the filter: its descriptors are Descriptor
// objects on the heap, made by `make` or `fromHandle` and owned by the filter
// until `free`. `asHandle` writes the byte form of Descriptor into a new
// handle (MemoryHandles), which the caller owns. Entries the filter does not
// use are null. Operations only.
class DescriptorSuite {
 public:
  DescriptorSuite() = delete;

  static const Tarsa::HostDescriptorSuite* Table();

  // The descriptor behind a suite pointer; null for a null pointer.
  static const Descriptor* Of(Tarsa::HostDescriptor descriptor);
};

}  // namespace Host
