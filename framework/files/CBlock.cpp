#include "framework/files/CBlock.h"

namespace Tarsa {

std::size_t CBlock::CapacityFor(std::uint32_t size) const {
  if (granularity_ <= 1) return size;
  // In size_t, so that rounding a size near 4 GiB cannot wrap.
  const std::size_t step = granularity_;
  return (static_cast<std::size_t>(size) + step - 1) / step * step;
}

void CBlock::Resize(std::uint32_t newSize, bool keepContents) {
  if (newSize == 0) {
    if (size_ != 0) {
      Release(CapacityFor(size_));
      size_ = 0;
    }
    return;
  }
  if (newSize == size_) return;
  const std::size_t oldCapacity = size_ == 0 ? 0 : CapacityFor(size_);
  const std::size_t newCapacity = CapacityFor(newSize);
  if (newCapacity != oldCapacity || data_ == nullptr) {
    Reallocate(newCapacity, oldCapacity, keepContents);
  }
  size_ = newSize;
}

}  // namespace Tarsa
