#include "framework/memory/CVirtualBlock.h"

#include "framework/core/CException.h"
#include "framework/memory/CHeapBlock.h"
#include "framework/memory/CVirtualHeap.h"

namespace Tarsa {

namespace {
constexpr const char* kHeapGoneText =
    "$$$/Tarsa/Memory/Error/HeapGone=The image memory was used after it had been released.";
}

CVirtualBlock::CVirtualBlock(CVirtualHeap& heap, std::uint32_t sizeClass, std::size_t count)
    : heap_(&heap), sizeClass_(sizeClass), tiles_(count) {
  for (Tile& tile : tiles_) tile.sizeClass = sizeClass;
}

CVirtualBlock::~CVirtualBlock() {
  if (heap_ != nullptr) heap_->Release(*this);
}

std::size_t CVirtualBlock::TileBytes() const { return CHeapBlock::SizeOf(sizeClass_); }

CVirtualHeap& CVirtualBlock::Heap() const {
  if (heap_ == nullptr) throw CError(kHeapGoneText);
  return *heap_;
}

const std::uint8_t* CVirtualBlock::ReadTile(std::size_t index) {
  return Heap().Touch(tiles_.at(index), false);
}

std::uint8_t* CVirtualBlock::WriteTile(std::size_t index) {
  return Heap().Touch(tiles_.at(index), true);
}

bool CVirtualBlock::IsResident(std::size_t index) const {
  return tiles_.at(index).memory != nullptr;
}

bool CVirtualBlock::IsSwapped(std::size_t index) const {
  const Tile& tile = tiles_.at(index);
  return tile.memory == nullptr && tile.file != nullptr;
}

}  // namespace Tarsa
