#pragma once

#include "framework/plugin/HostSuites.h"

namespace Host {

// Large blocks for the filter, in the two forms it asks for them: by id
// through the record's bufferProcs, and as bare memory through the buffer
// suite. Each block belongs to the filter from allocation to its free or
// release. Operations only; the state is in the blocks.
class HostBuffers {
 public:
  HostBuffers() = delete;

  static const Tarsa::HostBufferProcs* Procs();
  static const Tarsa::HostBufferSuite* Suite();
};

}  // namespace Host
