#include "framework/layout/CNamePool.h"

#include <algorithm>
#include <cstring>

namespace Tarsa {

std::string_view CNamePool::Store(std::string_view text) {
  if (text.empty()) return {};
  if (blocks_.empty() || size_ - used_ < text.size()) {
    // A text longer than a block gets a block of its own size.
    const std::size_t size = std::max(kBlockSize, text.size());
    blocks_.push_back(std::make_unique<char[]>(size));
    size_ = size;
    used_ = 0;
    allocated_ += size;
  }
  char* at = blocks_.back().get() + used_;
  std::memcpy(at, text.data(), text.size());
  used_ += text.size();
  return {at, text.size()};
}

}  // namespace Tarsa
