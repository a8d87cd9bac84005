#include "framework/files/CBlockContainer.h"

#include <cstring>
#include <limits>

#include "framework/files/CMemoryBlock.h"

namespace Tarsa {

namespace {

std::uint32_t CheckedBlockSize(std::uint64_t size) {
  if (size > std::numeric_limits<std::uint32_t>::max())
    throw CError(CMemoryBlock::kOutOfMemoryText);
  return static_cast<std::uint32_t>(size);
}

}  // namespace

void BlockStore::SetSize(CBlock* block, std::uint64_t size) {
  if (block == nullptr) return;
  const std::uint32_t oldSize = block->Size();
  const std::uint32_t newSize = CheckedBlockSize(size);
  block->Resize(newSize, true);
  // A skip past the end must not expose stale heap bytes to a later writer
  // of the block (a file written from it, say).
  if (newSize > oldSize) std::memset(block->Data() + oldSize, 0, newSize - oldSize);
}

void BlockStore::Read(const CBlock* block, std::uint64_t position, void* buffer,
                      std::size_t count) {
  if (block == nullptr) return;
  // The owner may have shrunk an outside block behind the container's back.
  if (position > block->Size() || count > block->Size() - position) throw CContainer::EndOfData();
  std::memmove(buffer, block->Data() + position, count);
}

void BlockStore::Write(CBlock* block, std::uint64_t position, const void* buffer,
                       std::size_t count) {
  if (block == nullptr) return;
  const std::uint32_t end = CheckedBlockSize(position + count);
  const std::uint32_t oldSize = block->Size();
  if (end > oldSize) {
    block->Resize(end, true);
    if (position > oldSize) std::memset(block->Data() + oldSize, 0, position - oldSize);
  }
  std::memmove(block->Data() + position, buffer, count);
}

CBlockContainer::CBlockContainer(CBlock* block) : block_(block) {
  if (block_ != nullptr) AdoptStoreSize(block_->Size());
}

}  // namespace Tarsa
