#pragma once

#include <cstddef>
#include <memory>

namespace Tarsa {

// Where the framework takes its large memory blocks from when the process
// heap is not the right place, for instance a plug-in's host lending its own
// buffers. The framework keeps one module-wide allocator, owned by this
// class and replaced, the old one deleted, only through Install(); with none
// installed, blocks come from the heap (see CHeapBlock).
class CVirtualAllocator {
 public:
  CVirtualAllocator() = default;
  virtual ~CVirtualAllocator() = default;
  CVirtualAllocator(const CVirtualAllocator&) = delete;
  CVirtualAllocator& operator=(const CVirtualAllocator&) = delete;

  // A block of at least size bytes, or null.
  virtual void* Allocate(std::size_t size) = 0;
  virtual void Free(void* block) = 0;

  // The module-wide allocator, or null.
  static CVirtualAllocator* Current();
  // Replaces the module-wide allocator; null drops it. Blocks taken from the
  // old one must have gone back before.
  static void Install(std::unique_ptr<CVirtualAllocator> allocator);
};

}  // namespace Tarsa
