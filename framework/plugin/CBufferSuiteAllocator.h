#pragma once

#include <cstddef>

#include "framework/memory/CVirtualAllocator.h"
#include "framework/plugin/HostSuites.h"

namespace Tarsa {

// The module-wide allocator of a plug-in whose host lends large blocks
// through its buffer suite. Keeps the suite's table, which the plug-in has
// acquired and releases; owns nothing else.
class CBufferSuiteAllocator : public CVirtualAllocator {
 public:
  explicit CBufferSuiteAllocator(const HostBufferSuite* suite) : suite_(suite) {}

  void* Allocate(std::size_t size) override;
  void Free(void* block) override;

 private:
  const HostBufferSuite* suite_;
};

}  // namespace Tarsa
