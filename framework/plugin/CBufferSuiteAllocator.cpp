#include "framework/plugin/CBufferSuiteAllocator.h"

#include <cstdint>
#include <limits>

namespace Tarsa {

void* CBufferSuiteAllocator::Allocate(std::size_t size) {
  if (suite_ == nullptr || suite_->allocate == nullptr) return nullptr;
  if (size > std::numeric_limits<std::uint32_t>::max()) return nullptr;
  std::uint32_t actualSize = 0;
  return suite_->allocate(std::uint32_t(size), &actualSize);
}

void CBufferSuiteAllocator::Free(void* block) {
  if (block == nullptr || suite_ == nullptr || suite_->release == nullptr) return;
  suite_->release(&block);
}

}  // namespace Tarsa
