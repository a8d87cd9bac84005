#include "framework/pixels/CVirtualPixmap.h"

#include <algorithm>
#include <cstring>

#include "framework/core/CException.h"
#include "framework/memory/CHeapBlock.h"
#include "framework/memory/CMemoryService.h"
#include "framework/memory/CVirtualBlock.h"
#include "framework/memory/CVirtualHeap.h"

namespace Tarsa {

namespace {
constexpr const char* kBadDepthText =
    "$$$/Tarsa/Pixmap/Error/Depth=The image has a sample depth the program cannot handle.";
constexpr const char* kBadTileText =
    "$$$/Tarsa/Pixmap/Error/Tile=The image was given a tile size the program cannot handle.";

constexpr std::uint32_t kMaxDepthCode = 5;
constexpr std::int32_t kSquareClasses = 4;  // -1 to -4: 64 to 512 pixels square

std::uint32_t DepthOf(std::uint32_t depthCode) {
  if (depthCode > kMaxDepthCode) throw CError(kBadDepthText);
  return 1u << depthCode;
}

// Samples inside a tile; below 8 bits they are packed from the high bit of
// each byte down.
std::uint32_t LoadSample(const std::uint8_t* tile, std::size_t rowBytes, std::uint32_t depth,
                         std::uint32_t tx, std::uint32_t ty) {
  if (tile == nullptr) return 0;
  const std::uint8_t* row = tile + std::size_t(ty) * rowBytes;
  switch (depth) {
    case 8:
      return row[tx];
    case 16: {
      std::uint16_t v;
      std::memcpy(&v, row + std::size_t(tx) * 2, 2);
      return v;
    }
    case 32: {
      std::uint32_t v;
      std::memcpy(&v, row + std::size_t(tx) * 4, 4);
      return v;
    }
    default: {
      const std::uint32_t bit = tx * depth;
      const std::uint32_t shift = 8 - depth - bit % 8;
      return (row[bit / 8] >> shift) & ((1u << depth) - 1);
    }
  }
}

void StoreSample(std::uint8_t* tile, std::size_t rowBytes, std::uint32_t depth, std::uint32_t tx,
                 std::uint32_t ty, std::uint32_t value) {
  std::uint8_t* row = tile + std::size_t(ty) * rowBytes;
  switch (depth) {
    case 8:
      row[tx] = std::uint8_t(value);
      break;
    case 16: {
      const auto v = std::uint16_t(value);
      std::memcpy(row + std::size_t(tx) * 2, &v, 2);
      break;
    }
    case 32:
      std::memcpy(row + std::size_t(tx) * 4, &value, 4);
      break;
    default: {
      const std::uint32_t bit = tx * depth;
      const std::uint32_t shift = 8 - depth - bit % 8;
      const std::uint32_t mask = ((1u << depth) - 1) << shift;
      row[bit / 8] = std::uint8_t((row[bit / 8] & ~mask) | ((value << shift) & mask));
      break;
    }
  }
}
}  // namespace

CVirtualPixmap::CVirtualPixmap(std::uint32_t depthCode, std::int32_t width, std::int32_t height,
                               std::uint32_t planes, std::int32_t sizeClass, CPoint margins,
                               bool interleaved, bool allocateAll, CVirtualHeap* heap)
    : CPixmap(CRect{}, planes, DepthOf(depthCode)),
      heap_(heap != nullptr ? heap : &CMemoryService::Get(true)->Heap()),
      depthCode_(depthCode),
      width_(std::uint32_t(std::max(width, 0))),
      height_(std::uint32_t(std::max(height, 0))),
      margins_{std::max(margins.x, 0), std::max(margins.y, 0)},
      interleaved_(interleaved),
      allocateAll_(allocateAll) {
  if (!TileShape(depthCode, sizeClass, blockClass_, tileWidth_, tileHeight_)) {
    throw CError(kBadTileText);
  }
  tileRowBytes_ = tileWidth_ * Depth() / 8;
  Build();
}

CVirtualPixmap::~CVirtualPixmap() = default;

bool CVirtualPixmap::TileShape(std::uint32_t depthCode, std::int32_t sizeClass,
                               std::uint32_t& blockClass, std::uint32_t& width,
                               std::uint32_t& height) {
  if (depthCode > kMaxDepthCode || sizeClass < -kSquareClasses) return false;
  // A square class keeps the pixel count whatever the depth: its byte size
  // grows with the sample.
  blockClass =
      sizeClass < 0 ? std::uint32_t(-2 * sizeClass - 1) + depthCode : std::uint32_t(sizeClass);
  if (blockClass > CHeapBlock::kMaxSizeClass) return false;
  // 256 << blockClass bytes are 2^(11 + blockClass) bits.
  const std::uint32_t pixelsLog2 = 11 + blockClass - depthCode;
  width = 1u << ((pixelsLog2 + 1) / 2);
  height = 1u << (pixelsLog2 / 2);
  return true;
}

void CVirtualPixmap::Build() {
  block_.reset();
  const auto planes = Planes();
  if (width_ == 0 || height_ == 0) {
    SetBounds(CRect{origin_.x, origin_.y, origin_.x, origin_.y});
    padX_ = padY_ = 0;
    columns_ = rows_ = 0;
  } else {
    const auto mx = std::uint32_t(margins_.x);
    const auto my = std::uint32_t(margins_.y);
    padX_ = (mx + tileWidth_ - 1) / tileWidth_ * tileWidth_;
    padY_ = (my + tileHeight_ - 1) / tileHeight_ * tileHeight_;
    columns_ = std::uint32_t((std::uint64_t(padX_) + width_ + mx + tileWidth_ - 1) / tileWidth_);
    rows_ = std::uint32_t((std::uint64_t(padY_) + height_ + my + tileHeight_ - 1) / tileHeight_);
    SetBounds(CRect{CRect::Saturate(std::int64_t(origin_.x) - mx),
                    CRect::Saturate(std::int64_t(origin_.y) - my),
                    CRect::Saturate(std::int64_t(origin_.x) + width_ + mx),
                    CRect::Saturate(std::int64_t(origin_.y) + height_ + my)});
  }
  // Apart, a plane's tiles of a tile row follow each other; interleaved, the
  // planes of one tile do.
  rowStride_ = std::size_t(columns_) * planes;
  planeStride_ = interleaved_ ? 1 : columns_;
  columnStride_ = interleaved_ ? planes : 1;
  block_ = heap_->Reserve(blockClass_, std::size_t(columns_) * rows_ * planes, allocateAll_);
}

void CVirtualPixmap::Resize(std::int32_t width, std::int32_t height) {
  width_ = std::uint32_t(std::max(width, 0));
  height_ = std::uint32_t(std::max(height, 0));
  Build();
}

void CVirtualPixmap::SetOrigin(CPoint origin) {
  const CPoint shift{origin.x - origin_.x, origin.y - origin_.y};
  origin_ = origin;
  SetBounds(Bounds().Offset(shift.x, shift.y));
}

void CVirtualPixmap::MoveTo(CPoint corner) {
  SetOrigin(CPoint{corner.x + (Bounds().IsEmpty() ? 0 : margins_.x),
                   corner.y + (Bounds().IsEmpty() ? 0 : margins_.y)});
}

std::uint64_t CVirtualPixmap::LatticeX(std::int32_t x) const {
  return std::uint64_t(std::int64_t(x) - origin_.x + padX_);
}

std::uint64_t CVirtualPixmap::LatticeY(std::int32_t y) const {
  return std::uint64_t(std::int64_t(y) - origin_.y + padY_);
}

void CVirtualPixmap::TileAt(std::int32_t x, std::int32_t y, std::uint32_t& col,
                            std::uint32_t& row) const {
  col = std::uint32_t(LatticeX(x) / tileWidth_);
  row = std::uint32_t(LatticeY(y) / tileHeight_);
}

std::uint32_t CVirtualPixmap::Sample(std::uint32_t plane, std::int32_t x, std::int32_t y) const {
  CheckRow(plane, x, y, 1);
  const std::uint64_t lx = LatticeX(x);
  const std::uint64_t ly = LatticeY(y);
  const std::uint8_t* tile = block_->ReadTile(
      TileIndex(plane, std::uint32_t(lx / tileWidth_), std::uint32_t(ly / tileHeight_)));
  return LoadSample(tile, tileRowBytes_, Depth(), std::uint32_t(lx % tileWidth_),
                    std::uint32_t(ly % tileHeight_));
}

void CVirtualPixmap::SetSample(std::uint32_t plane, std::int32_t x, std::int32_t y,
                               std::uint32_t value) {
  CheckRow(plane, x, y, 1);
  const std::uint64_t lx = LatticeX(x);
  const std::uint64_t ly = LatticeY(y);
  std::uint8_t* tile = block_->WriteTile(
      TileIndex(plane, std::uint32_t(lx / tileWidth_), std::uint32_t(ly / tileHeight_)));
  StoreSample(tile, tileRowBytes_, Depth(), std::uint32_t(lx % tileWidth_),
              std::uint32_t(ly % tileHeight_), value);
}

void CVirtualPixmap::ReadRow(std::uint32_t plane, std::int32_t x, std::int32_t y,
                             std::uint32_t count, void* out) const {
  CheckRow(plane, x, y, count);
  auto* to = static_cast<std::uint8_t*>(out);
  const std::size_t step = RowSampleBytes();
  const std::uint64_t ly = LatticeY(y);
  const auto row = std::uint32_t(ly / tileHeight_);
  const auto ty = std::uint32_t(ly % tileHeight_);
  std::uint64_t lx = LatticeX(x);
  while (count > 0) {
    const auto col = std::uint32_t(lx / tileWidth_);
    const auto tx = std::uint32_t(lx % tileWidth_);
    const std::uint32_t run = std::min(count, tileWidth_ - tx);
    const std::uint8_t* tile = block_->ReadTile(TileIndex(plane, col, row));
    if (tile == nullptr) {
      std::memset(to, 0, run * step);
    } else if (Depth() >= 8) {
      std::memcpy(to, tile + std::size_t(ty) * tileRowBytes_ + tx * step, run * step);
    } else {
      for (std::uint32_t i = 0; i < run; ++i) {
        to[i] = std::uint8_t(LoadSample(tile, tileRowBytes_, Depth(), tx + i, ty));
      }
    }
    to += run * step;
    lx += run;
    count -= run;
  }
}

void CVirtualPixmap::WriteRow(std::uint32_t plane, std::int32_t x, std::int32_t y,
                              std::uint32_t count, const void* in) {
  CheckRow(plane, x, y, count);
  const auto* from = static_cast<const std::uint8_t*>(in);
  const std::size_t step = RowSampleBytes();
  const std::uint64_t ly = LatticeY(y);
  const auto row = std::uint32_t(ly / tileHeight_);
  const auto ty = std::uint32_t(ly % tileHeight_);
  std::uint64_t lx = LatticeX(x);
  while (count > 0) {
    const auto col = std::uint32_t(lx / tileWidth_);
    const auto tx = std::uint32_t(lx % tileWidth_);
    const std::uint32_t run = std::min(count, tileWidth_ - tx);
    std::uint8_t* tile = block_->WriteTile(TileIndex(plane, col, row));
    if (Depth() >= 8) {
      std::memcpy(tile + std::size_t(ty) * tileRowBytes_ + tx * step, from, run * step);
    } else {
      for (std::uint32_t i = 0; i < run; ++i) {
        StoreSample(tile, tileRowBytes_, Depth(), tx + i, ty, from[i]);
      }
    }
    from += run * step;
    lx += run;
    count -= run;
  }
}

}  // namespace Tarsa
