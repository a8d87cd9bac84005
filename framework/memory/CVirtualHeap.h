#pragma once

#include <cstddef>
#include <cstdint>
#include <memory>
#include <string>
#include <unordered_set>
#include <vector>

#include "framework/memory/CVirtualBlock.h"

namespace Tarsa {

class CSwapFile;

// The store behind the virtual pixmaps: tiles of 256 << sizeClass bytes,
// taken from CHeapBlock, of which no more than the memory limit are held in
// memory at once. To make room for a tile the heap writes the tiles used
// longest ago to ".tmp" swap files on the scratch volumes (one file per
// volume, made when first needed) and brings a tile back when it is touched
// again; a tile whose disk copy is still current leaves memory without a
// write. A write that fails (a full disk, a folder that cannot take the
// file) tries the next volume, and when none takes it the tile stays in
// memory, unharmed, and the heap raises the swap CError; with the limit
// reached and nothing that could go out, the out-of-memory CError.
//
// The heap owns the tiles' memory and the swap files, and removes the files
// when it goes; the blocks handed out by Reserve() belong to their callers.
// The framework's heap is the memory service's (CMemoryService::Heap()),
// which passes on its limit and volumes. Main thread only.
class CVirtualHeap {
 public:
  // limit 0: no limit. With no volumes the temporary folder serves.
  explicit CVirtualHeap(std::uint64_t limit = 0, std::vector<std::string> volumes = {});
  ~CVirtualHeap();
  CVirtualHeap(const CVirtualHeap&) = delete;
  CVirtualHeap& operator=(const CVirtualHeap&) = delete;

  std::uint64_t Limit() const { return limit_; }
  // A lower limit is reached again at the next tile the heap makes room for.
  void SetLimit(std::uint64_t bytes) { limit_ = bytes; }
  const std::vector<std::string>& Volumes() const { return volumes_; }
  // Files already made keep their tiles; new ones go to these folders.
  void SetVolumes(std::vector<std::string> volumes);

  // count tiles of 256 << sizeClass bytes; with allocateAll every tile is
  // made now (zeroed) rather than when first written.
  std::unique_ptr<CVirtualBlock> Reserve(std::uint32_t sizeClass, std::size_t count,
                                         bool allocateAll = false);

  std::uint64_t ResidentBytes() const { return residentBytes_; }
  std::size_t ResidentTiles() const { return residentTiles_; }
  std::size_t SwappedTiles() const { return swappedTiles_; }
  // Tiles written out and read back since the heap began.
  std::uint64_t SwapOuts() const { return swapOuts_; }
  std::uint64_t SwapIns() const { return swapIns_; }
  // The swap files made so far.
  std::vector<std::string> SwapFilePaths() const;

 private:
  friend class CVirtualBlock;
  using Tile = CVirtualBlock::Tile;

  std::uint8_t* Touch(Tile& tile, bool write);
  void Release(CVirtualBlock& block);

  // Sends tiles out until size more bytes fit under the limit.
  void MakeRoom(std::size_t size);
  // Memory for a tile; when the allocator refuses, sends tiles out and
  // tries again while there are any.
  std::unique_ptr<CHeapBlock> Allocate(std::uint32_t sizeClass);
  // Writes the least recently used tile out (unless its disk copy is
  // current) and frees its memory.
  void Evict();
  // Puts a tile's bytes in a slot on some volume; false when none took it.
  bool WriteOut(Tile& tile);
  CSwapFile* FileOn(const std::string& volume);
  void DropSlot(Tile& tile);
  void DropMemory(Tile& tile);

  void LinkNewest(Tile& tile);
  void Unlink(Tile& tile);

  std::uint64_t limit_;
  std::vector<std::string> volumes_;
  std::vector<std::unique_ptr<CSwapFile>> files_;
  std::unordered_set<CVirtualBlock*> blocks_;
  Tile* newest_ = nullptr;
  Tile* oldest_ = nullptr;
  std::uint64_t residentBytes_ = 0;
  std::size_t residentTiles_ = 0;
  std::size_t swappedTiles_ = 0;
  std::uint64_t swapOuts_ = 0;
  std::uint64_t swapIns_ = 0;
};

}  // namespace Tarsa
