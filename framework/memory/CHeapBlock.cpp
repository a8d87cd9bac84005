#include "framework/memory/CHeapBlock.h"

#include <cstdlib>

#include "framework/core/CException.h"
#include "framework/memory/CVirtualAllocator.h"

namespace Tarsa {

namespace {
constexpr const char* kOutOfMemoryText =
    "$$$/Tarsa/Memory/Error/OutOfMemory=There is not enough memory.";
}

CHeapBlock::CHeapBlock(std::uint32_t sizeClass) : size_(0) {
  if (sizeClass > kMaxSizeClass) throw CError(kOutOfMemoryText);
  size_ = SizeOf(sizeClass);
  if (CVirtualAllocator* allocator = CVirtualAllocator::Current()) {
    data_ = static_cast<std::uint8_t*>(allocator->Allocate(size_));
    fromAllocator_ = data_ != nullptr;
  }
  // The host may refuse a block it has no room for; the heap may still have.
  if (data_ == nullptr) data_ = static_cast<std::uint8_t*>(std::malloc(size_));
  if (data_ == nullptr) throw CError(kOutOfMemoryText);
}

CHeapBlock::~CHeapBlock() {
  if (!fromAllocator_) {
    std::free(data_);
    return;
  }
  // The allocator owns its blocks' memory; with it gone the block went with it.
  if (CVirtualAllocator* allocator = CVirtualAllocator::Current()) allocator->Free(data_);
}

}  // namespace Tarsa
