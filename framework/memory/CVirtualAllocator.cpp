#include "framework/memory/CVirtualAllocator.h"

#include <utility>

namespace Tarsa {

namespace {
std::unique_ptr<CVirtualAllocator>& ModuleAllocator() {
  static std::unique_ptr<CVirtualAllocator> allocator;
  return allocator;
}
}  // namespace

CVirtualAllocator* CVirtualAllocator::Current() { return ModuleAllocator().get(); }

void CVirtualAllocator::Install(std::unique_ptr<CVirtualAllocator> allocator) {
  ModuleAllocator() = std::move(allocator);
}

}  // namespace Tarsa
