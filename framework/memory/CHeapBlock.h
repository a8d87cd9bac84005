#pragma once

#include <cstddef>
#include <cstdint>

namespace Tarsa {

// One block of 256 << sizeClass bytes for the framework's large stores: from
// the module-wide allocator when one is installed, else from the process
// heap, remembering which, so that it goes back where it came from. Owns its
// bytes; not copyable. A failed allocation is the out-of-memory CError.
class CHeapBlock {
 public:
  static constexpr std::uint32_t kMaxSizeClass = 22;  // 1 GiB

  explicit CHeapBlock(std::uint32_t sizeClass);
  ~CHeapBlock();
  CHeapBlock(const CHeapBlock&) = delete;
  CHeapBlock& operator=(const CHeapBlock&) = delete;

  static std::size_t SizeOf(std::uint32_t sizeClass) { return std::size_t(256) << sizeClass; }

  std::uint8_t* Data() { return data_; }
  std::size_t Size() const { return size_; }
  bool FromAllocator() const { return fromAllocator_; }

 private:
  std::uint8_t* data_ = nullptr;
  std::size_t size_;
  bool fromAllocator_ = false;
};

}  // namespace Tarsa
