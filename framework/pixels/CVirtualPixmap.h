#pragma once

#include <cstddef>
#include <cstdint>
#include <memory>

#include "framework/pixels/CPixmap.h"

namespace Tarsa {

class CVirtualBlock;
class CVirtualHeap;

// A pixmap whose samples live in tiles on the virtual heap, so that an
// image larger than the memory limit can be held: tiles are made when first
// written (until then they read as zeros), may be swapped out by the heap,
// and come back when touched. Planes are stored apart; a sample has
// 1 << depthCode bits (1 to 32), below 8 bits packed from the high bit down.
//
// The tile's shape follows from its size class: a tile of class c holds
// 256 << c bytes, as square as a power of two allows, wider when it cannot
// be square (class 0 gives 64 x 32 at 1 bit down to 8 x 8 at 32 bits). A
// negative class -k picks the class by depth that gives tiles of
// 32 << k pixels square: 64, 128, 256 or 512.
//
// The image proper is width x height with its top left at Origin(); a
// margin of extra samples may lie around it, and Bounds() includes it. The
// tile lattice runs through the origin, so that the tiles match the cells of
// a grid laid out there. Tiles are indexed by row, column and plane with the
// strides below. The pixmap owns its block of tiles; the heap must outlive
// it (the framework's heap, by default, lives until the memory service
// ends). Not copyable.
class CVirtualPixmap : public CPixmap {
 public:
  // CError for a depthCode above 5 or a class that gives no tile; heap
  // null: the memory service's heap. With allocateAll every tile is made
  // now rather than when first written.
  CVirtualPixmap(std::uint32_t depthCode, std::int32_t width, std::int32_t height,
                 std::uint32_t planes, std::int32_t sizeClass, CPoint margins = {},
                 bool interleaved = false, bool allocateAll = false, CVirtualHeap* heap = nullptr);
  ~CVirtualPixmap() override;

  // The tile of a size class at a depth: its block's class and its shape;
  // false when there is none.
  static bool TileShape(std::uint32_t depthCode, std::int32_t sizeClass, std::uint32_t& blockClass,
                        std::uint32_t& width, std::uint32_t& height);

  // A new size, all samples zero again; the origin and margins stay.
  void Resize(std::int32_t width, std::int32_t height);
  // Moves the image's top left corner to origin (Bounds() with it).
  void SetOrigin(CPoint origin);
  CPoint Origin() const { return origin_; }
  CPoint Margins() const { return margins_; }
  // Moves Bounds()' top left corner, margin included.
  void MoveTo(CPoint corner) override;

  std::uint32_t DepthCode() const { return depthCode_; }
  std::uint32_t Width() const { return width_; }
  std::uint32_t Height() const { return height_; }
  std::uint32_t TileWidth() const { return tileWidth_; }
  std::uint32_t TileHeight() const { return tileHeight_; }
  std::uint32_t Columns() const { return columns_; }
  std::uint32_t Rows() const { return rows_; }
  bool Interleaved() const { return interleaved_; }
  std::size_t PlaneStride() const { return planeStride_; }
  std::size_t RowStride() const { return rowStride_; }
  std::size_t ColumnStride() const { return columnStride_; }
  std::size_t TileIndex(std::uint32_t plane, std::uint32_t col, std::uint32_t row) const {
    return row * rowStride_ + col * columnStride_ + plane * planeStride_;
  }
  // The tile (of every plane) that holds the sample at (x, y) inside Bounds().
  void TileAt(std::int32_t x, std::int32_t y, std::uint32_t& col, std::uint32_t& row) const;
  CVirtualBlock& Block() { return *block_; }

  std::uint32_t Sample(std::uint32_t plane, std::int32_t x, std::int32_t y) const override;
  void SetSample(std::uint32_t plane, std::int32_t x, std::int32_t y, std::uint32_t value) override;
  void ReadRow(std::uint32_t plane, std::int32_t x, std::int32_t y, std::uint32_t count,
               void* out) const override;
  void WriteRow(std::uint32_t plane, std::int32_t x, std::int32_t y, std::uint32_t count,
                const void* in) override;

 private:
  // Lays out the tiles for the current size and takes a fresh block.
  void Build();
  // Offsets from the tile lattice's first line, which lies a whole number
  // of tiles before the margin's edge.
  std::uint64_t LatticeX(std::int32_t x) const;
  std::uint64_t LatticeY(std::int32_t y) const;

  CVirtualHeap* heap_;
  std::uint32_t depthCode_;
  std::uint32_t width_ = 0;
  std::uint32_t height_ = 0;
  CPoint origin_;
  CPoint margins_;
  std::uint32_t blockClass_ = 0;
  std::uint32_t tileWidth_ = 0;
  std::uint32_t tileHeight_ = 0;
  std::uint32_t tileRowBytes_ = 0;
  std::uint32_t padX_ = 0;  // the lattice's first line lies this far left of the origin
  std::uint32_t padY_ = 0;
  std::uint32_t columns_ = 0;
  std::uint32_t rows_ = 0;
  bool interleaved_;
  bool allocateAll_;
  std::size_t planeStride_ = 0;
  std::size_t rowStride_ = 0;
  std::size_t columnStride_ = 0;
  std::unique_ptr<CVirtualBlock> block_;
};

}  // namespace Tarsa
