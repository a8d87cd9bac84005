#include "framework/files/CConstContainer.h"

#include <cstring>

namespace Tarsa {

CConstContainer::CConstContainer(std::span<const std::uint8_t> bytes) : bytes_(bytes) {
  AdoptStoreSize(bytes_.size());
}

std::span<const std::uint8_t> CConstContainer::ReadView(std::size_t count) {
  const std::uint64_t start = Position();
  SkipRead(count);
  return bytes_.subspan(static_cast<std::size_t>(start), count);
}

// The base class would move the position before it finds out that nothing
// may be written; refusing up front leaves everything as it was.
void CConstContainer::SkipWrite(std::uint64_t /*count*/) { throw ReadOnly(); }

void CConstContainer::WriteAt(const void* /*buffer*/, std::size_t /*count*/,
                              std::uint64_t /*position*/) {
  throw ReadOnly();
}

void CConstContainer::DoSetSize(std::uint64_t /*size*/) { throw ReadOnly(); }

void CConstContainer::DoRead(void* buffer, std::size_t count) {
  std::memcpy(buffer, bytes_.data() + Position(), count);
}

void CConstContainer::DoWrite(const void* /*buffer*/, std::size_t /*count*/) { throw ReadOnly(); }

}  // namespace Tarsa
