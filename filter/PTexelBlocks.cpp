#include "filter/PTexelBlocks.h"

#include <algorithm>

#include "framework/pixels/CTexelPacker.h"

namespace Project {

namespace {

constexpr std::size_t kTile = 128;
// Source tiles enough for the textures of a few rows of tiles, which reach
// some four rows of source tiles, within a few tens of MiB.
constexpr std::size_t kBlockRows = 6;
constexpr std::size_t kBlockBudget = 48u << 20;

}  // namespace

PTexelBlocks::PTexelBlocks(std::uint32_t planes, std::uint32_t depth)
    : planes_(planes), depth_(depth) {}

const PTexelBlocks::Block& PTexelBlocks::Get(const Tarsa::CPixmap& source, bool halves,
                                             std::uint32_t columns, std::uint32_t rows,
                                             std::int32_t col, std::int32_t row,
                                             const Tarsa::CRect& rect) {
  if (!Holds(&source, halves) || columns_ != std::int32_t(columns) ||
      index_.size() != std::size_t(columns) * rows) {
    Drop();
    source_ = &source;
    halves_ = halves;
    columns_ = std::int32_t(columns);
    index_.assign(std::size_t(columns) * rows, -1);
  }
  std::int32_t& index = index_[std::size_t(row) * std::size_t(columns_) + std::size_t(col)];
  if (index >= 0) {
    Block& block = blocks_[std::size_t(index)];
    block.lastUse = ++uses_;
    return block;
  }

  const Tarsa::CTexelPacker packer(planes_, 0, depth_, halves_);
  const std::size_t texelBytes = packer.TexelBytes();
  const std::size_t capacity = std::max<std::size_t>(
      16,
      std::min(std::size_t(columns_) * kBlockRows, kBlockBudget / (kTile * kTile * texelBytes)));
  std::size_t slot = blocks_.size();
  if (slot >= capacity) {
    slot = std::size_t(
        std::min_element(blocks_.begin(), blocks_.end(),
                         [](const Block& a, const Block& b) { return a.lastUse < b.lastUse; }) -
        blocks_.begin());
    const Block& old = blocks_[slot];
    index_[std::size_t(old.row) * std::size_t(columns_) + std::size_t(old.col)] = -1;
  } else {
    blocks_.emplace_back();
  }
  Block& block = blocks_[slot];
  block.col = col;
  block.row = row;
  block.rect = rect;
  block.lastUse = ++uses_;
  const auto width = std::size_t(rect.Width());
  block.texels.resize(width * std::size_t(rect.Height()) * texelBytes);
  for (std::int32_t y = rect.top; y < rect.bottom; ++y) {
    packer.Read(source, rect.left, y, width,
                block.texels.data() + std::size_t(y - rect.top) * width * texelBytes, rows_);
  }
  index = std::int32_t(slot);
  return block;
}

void PTexelBlocks::Drop() {
  blocks_.clear();
  index_.clear();
  source_ = nullptr;
}

}  // namespace Project
