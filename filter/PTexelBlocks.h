#pragma once

#include <cstddef>
#include <cstdint>
#include <vector>

#include "framework/core/CRect.h"

namespace Tarsa {
class CPixmap;
}

namespace Project {

// The source stage's tiles as texels, kept while nearby result tiles need
// them. Neighbouring tiles' textures overlap by most of their pixels: kept,
// a source tile is read and interleaved once, and textures are filled
// straight from it. It owns the texels; the source pixmap stays the
// caller's, known by address only to tell when the kept texels are of
// another source or another texel kind. Enough tiles are kept for the
// textures of a few rows of result tiles, within a few tens of MiB; past
// that the one used least recently goes.
class PTexelBlocks {
 public:
  // One source tile as rows of texels over rect.
  struct Block {
    std::int32_t col = -1;
    std::int32_t row = -1;
    Tarsa::CRect rect;
    std::uint64_t lastUse = 0;
    std::vector<std::uint8_t> texels;
  };

  // planes and depth: the source's; they fix the texels' kind with halves.
  PTexelBlocks(std::uint32_t planes, std::uint32_t depth);

  // Whether the kept texels are source's, made with halves.
  bool Holds(const Tarsa::CPixmap* source, bool halves) const {
    return source_ == source && halves_ == halves;
  }
  // Tile (col, row) over rect of a source of columns x rows tiles, read
  // from source as texels (half floats at 16 bits with halves) when it is
  // not kept. Texels of another source or kind are dropped first.
  const Block& Get(const Tarsa::CPixmap& source, bool halves, std::uint32_t columns,
                   std::uint32_t rows, std::int32_t col, std::int32_t row,
                   const Tarsa::CRect& rect);
  void Drop();

 private:
  std::uint32_t planes_;
  std::uint32_t depth_;
  std::vector<Block> blocks_;
  // Per tile of the source, row by row: its index in blocks_, or -1.
  std::vector<std::int32_t> index_;
  std::int32_t columns_ = 0;
  const Tarsa::CPixmap* source_ = nullptr;
  bool halves_ = false;
  std::uint64_t uses_ = 0;
  // The source's rows on their way into texels, kept from use to use.
  std::vector<std::uint8_t> rows_;
};

}  // namespace Project
