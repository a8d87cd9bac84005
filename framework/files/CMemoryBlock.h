#pragma once

#include <cstddef>
#include <cstdint>

#include "framework/files/CBlock.h"

namespace Tarsa {

// A block on the C library's heap. It owns its bytes and frees them when it
// dies. Growth keeps the contents whatever the caller asks, since realloc
// keeps them for free. A failed allocation is retried once after asking the
// memory service to make room; a second failure is the out-of-memory error.
class CMemoryBlock : public CBlock {
 public:
  static constexpr const char* kOutOfMemoryText =
      "$$$/Tarsa/Memory/Error/OutOfMemory=There is not enough memory.";

  explicit CMemoryBlock(std::uint32_t granularity) : CBlock(granularity) {}
  ~CMemoryBlock() override;

 protected:
  void Reallocate(std::size_t newCapacity, std::size_t oldCapacity, bool keepContents) override;
  void Release(std::size_t capacity) override;

 private:
  // The seam to the pixel memory service: asks it to purge `bytes` and says
  // whether a retry is worth making. Until that service exists nothing can be
  // purged, and the answer is false.
  static bool FreeForRetry(std::size_t bytes);
};

}  // namespace Tarsa
