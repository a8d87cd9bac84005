#include "framework/files/CMemoryBlock.h"

#include <cstdlib>

#include "framework/core/CException.h"

namespace Tarsa {

CMemoryBlock::~CMemoryBlock() { std::free(data_); }

void CMemoryBlock::Reallocate(std::size_t newCapacity, std::size_t /*oldCapacity*/,
                              bool /*keepContents*/) {
  void* moved = std::realloc(data_, newCapacity);
  if (moved == nullptr && FreeForRetry(newCapacity)) moved = std::realloc(data_, newCapacity);
  if (moved == nullptr) throw CError(kOutOfMemoryText);
  data_ = static_cast<std::uint8_t*>(moved);
}

void CMemoryBlock::Release(std::size_t /*capacity*/) {
  std::free(data_);
  data_ = nullptr;
}

bool CMemoryBlock::FreeForRetry(std::size_t /*bytes*/) { return false; }

}  // namespace Tarsa
