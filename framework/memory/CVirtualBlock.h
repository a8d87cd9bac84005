#pragma once

#include <cstddef>
#include <cstdint>
#include <memory>
#include <vector>

namespace Tarsa {

class CHeapBlock;
class CSwapFile;
class CVirtualHeap;

// A reservation of equal tiles on the virtual heap, as a virtual pixmap
// holds it. A tile is absent (all zeros, no memory) until first written,
// then lives in memory or, when the heap needed room, in a slot of a swap
// file, and comes back when touched. The block owns its tiles' records and
// gives everything back when it goes; the heap owns the memory and the
// files. A pointer that ReadTile() or WriteTile() hands out stays valid
// until the next call on this heap. Not copyable. If the heap goes first,
// the block is left empty and any access is a CError.
class CVirtualBlock {
 public:
  ~CVirtualBlock();
  CVirtualBlock(const CVirtualBlock&) = delete;
  CVirtualBlock& operator=(const CVirtualBlock&) = delete;

  std::uint32_t SizeClass() const { return sizeClass_; }
  std::size_t TileBytes() const;
  std::size_t TileCount() const { return tiles_.size(); }

  // The tile's bytes for reading, null for a tile never written (all zeros).
  const std::uint8_t* ReadTile(std::size_t index);
  // The tile's bytes for writing, made (zeroed) when absent.
  std::uint8_t* WriteTile(std::size_t index);

  bool IsResident(std::size_t index) const;
  bool IsSwapped(std::size_t index) const;

 private:
  friend class CVirtualHeap;

  // One tile's whereabouts: its memory when resident, its slot when it has
  // one on disk; `dirty` says the memory is newer than the slot. Resident
  // tiles are linked in the heap's order of use.
  struct Tile {
    std::unique_ptr<CHeapBlock> memory;
    CSwapFile* file = nullptr;
    std::uint64_t slot = 0;
    bool dirty = false;
    std::uint32_t sizeClass = 0;
    Tile* older = nullptr;
    Tile* newer = nullptr;
  };

  CVirtualBlock(CVirtualHeap& heap, std::uint32_t sizeClass, std::size_t count);
  // The heap the block lives on; CError once the heap has gone.
  CVirtualHeap& Heap() const;

  CVirtualHeap* heap_;
  std::uint32_t sizeClass_;
  std::vector<Tile> tiles_;
};

}  // namespace Tarsa
