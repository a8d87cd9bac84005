#pragma once

#include <cstddef>
#include <cstdint>
#include <span>

#include "framework/plugin/HostSuites.h"

namespace Host {

// The host's handles: resizable memory blocks with a lock count, lent to the
// filter through the record's handleProcs and used by the host itself for
// complex property values and descriptors. A handle is a heap object owned by
// whoever holds it; Dispose() frees it. A locked handle may shrink but not
// grow, since growing could move the bytes under the filter's pointer.
// Operations only; the state is in the handles.
class MemoryHandles {
 public:
  MemoryHandles() = delete;

  // The table hung from the record: eight entries, disposal at entry 8 too.
  static const Tarsa::HostHandleProcs* Procs();

  // Null when the size is negative or memory runs out.
  static Tarsa::HostHandle New(int32_t size);
  static Tarsa::HostHandle FromBytes(std::span<const uint8_t> bytes);
  // The handle's bytes; empty for a null or foreign handle.
  static std::span<uint8_t> Bytes(Tarsa::HostHandle handle);
  // Whether the pointer is a live handle of this host.
  static bool IsHandle(Tarsa::HostHandle handle);
  static void Dispose(Tarsa::HostHandle handle);
};

}  // namespace Host
