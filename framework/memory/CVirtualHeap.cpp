#include "framework/memory/CVirtualHeap.h"

#include <algorithm>
#include <cstring>
#include <utility>

#include "framework/core/CException.h"
#include "framework/files/FilePaths.h"
#include "framework/memory/CHeapBlock.h"
#include "framework/memory/CSwapFile.h"

namespace Tarsa {

namespace {
constexpr const char* kOutOfMemoryText =
    "$$$/Tarsa/Memory/Error/OutOfMemory=There is not enough memory.";
constexpr const char* kSwapFailedText =
    "$$$/Tarsa/Memory/Error/SwapFailed=There is not enough memory, and the scratch disks could "
    "not take the rest of the image.";
}  // namespace

CVirtualHeap::CVirtualHeap(std::uint64_t limit, std::vector<std::string> volumes)
    : limit_(limit), volumes_(std::move(volumes)) {}

CVirtualHeap::~CVirtualHeap() {
  for (CVirtualBlock* block : blocks_) {
    for (Tile& tile : block->tiles_) {
      tile.memory.reset();
      tile.file = nullptr;
    }
    block->heap_ = nullptr;
  }
  // The files go with their slots; removing them is the files' own work.
  files_.clear();
}

void CVirtualHeap::SetVolumes(std::vector<std::string> volumes) { volumes_ = std::move(volumes); }

std::unique_ptr<CVirtualBlock> CVirtualHeap::Reserve(std::uint32_t sizeClass, std::size_t count,
                                                     bool allocateAll) {
  if (sizeClass > CHeapBlock::kMaxSizeClass) throw CError(kOutOfMemoryText);
  std::unique_ptr<CVirtualBlock> block(new CVirtualBlock(*this, sizeClass, count));
  blocks_.insert(block.get());
  if (allocateAll) {
    for (Tile& tile : block->tiles_) Touch(tile, true);
  }
  return block;
}

std::vector<std::string> CVirtualHeap::SwapFilePaths() const {
  std::vector<std::string> paths;
  for (const auto& file : files_) paths.push_back(file->Path());
  return paths;
}

std::uint8_t* CVirtualHeap::Touch(Tile& tile, bool write) {
  const std::size_t size = CHeapBlock::SizeOf(tile.sizeClass);
  if (tile.memory != nullptr) {
    if (&tile != newest_) {
      Unlink(tile);
      LinkNewest(tile);
    }
    if (write) tile.dirty = true;
    return tile.memory->Data();
  }
  if (tile.file == nullptr && !write) return nullptr;
  std::unique_ptr<CHeapBlock> memory = Allocate(tile.sizeClass);
  if (tile.file == nullptr) {
    std::memset(memory->Data(), 0, size);
    tile.dirty = true;
  } else {
    // A failed read leaves the tile where it was, on disk.
    tile.file->Read(tile.slot, memory->Data(), size);
    tile.dirty = write;
    --swappedTiles_;
    ++swapIns_;
  }
  tile.memory = std::move(memory);
  residentBytes_ += size;
  ++residentTiles_;
  LinkNewest(tile);
  return tile.memory->Data();
}

void CVirtualHeap::Release(CVirtualBlock& block) {
  for (Tile& tile : block.tiles_) {
    if (tile.memory != nullptr) {
      DropMemory(tile);
    } else if (tile.file != nullptr) {
      --swappedTiles_;
    }
    DropSlot(tile);
  }
  blocks_.erase(&block);
}

void CVirtualHeap::MakeRoom(std::size_t size) {
  // With nothing left to send out, one tile may stand above a limit smaller
  // than itself: a stage needs at least the tile it works on.
  while (limit_ != 0 && oldest_ != nullptr && residentBytes_ + size > limit_) Evict();
}

std::unique_ptr<CHeapBlock> CVirtualHeap::Allocate(std::uint32_t sizeClass) {
  MakeRoom(CHeapBlock::SizeOf(sizeClass));
  for (;;) {
    try {
      return std::make_unique<CHeapBlock>(sizeClass);
    } catch (const CError&) {
      if (oldest_ == nullptr) throw;
      Evict();
    }
  }
}

void CVirtualHeap::Evict() {
  Tile& tile = *oldest_;
  if (tile.file == nullptr || tile.dirty) {
    if (!WriteOut(tile)) throw CError(kSwapFailedText);
    ++swapOuts_;
  }
  DropMemory(tile);
  ++swappedTiles_;
}

bool CVirtualHeap::WriteOut(Tile& tile) {
  const std::size_t size = CHeapBlock::SizeOf(tile.sizeClass);
  const std::uint8_t* bytes = tile.memory->Data();
  if (tile.file != nullptr) {
    try {
      tile.file->Write(tile.slot, bytes, size);
      tile.dirty = false;
      return true;
    } catch (const CException&) {
      // The old copy is spoilt; the memory still holds the tile.
      DropSlot(tile);
    }
  }
  std::vector<std::string> volumes = volumes_;
  if (volumes.empty()) volumes.push_back(GetTemporaryDirectoryPath());
  for (const std::string& volume : volumes) {
    CSwapFile* file = nullptr;
    try {
      file = FileOn(volume);
    } catch (const CException&) {
      continue;
    }
    const std::uint64_t slot = file->TakeSlot(size);
    try {
      file->Write(slot, bytes, size);
    } catch (const CException&) {
      file->FreeSlot(slot, size);
      continue;
    }
    tile.file = file;
    tile.slot = slot;
    tile.dirty = false;
    return true;
  }
  return false;
}

CSwapFile* CVirtualHeap::FileOn(const std::string& volume) {
  for (const auto& file : files_) {
    if (file->Volume() == volume) return file.get();
  }
  files_.push_back(std::make_unique<CSwapFile>(volume));
  return files_.back().get();
}

void CVirtualHeap::DropSlot(Tile& tile) {
  if (tile.file == nullptr) return;
  tile.file->FreeSlot(tile.slot, CHeapBlock::SizeOf(tile.sizeClass));
  tile.file = nullptr;
}

void CVirtualHeap::DropMemory(Tile& tile) {
  Unlink(tile);
  tile.memory.reset();
  residentBytes_ -= CHeapBlock::SizeOf(tile.sizeClass);
  --residentTiles_;
}

void CVirtualHeap::LinkNewest(Tile& tile) {
  tile.older = newest_;
  tile.newer = nullptr;
  if (newest_ != nullptr) newest_->newer = &tile;
  newest_ = &tile;
  if (oldest_ == nullptr) oldest_ = &tile;
}

void CVirtualHeap::Unlink(Tile& tile) {
  if (tile.older != nullptr) tile.older->newer = tile.newer;
  if (tile.newer != nullptr) tile.newer->older = tile.older;
  if (newest_ == &tile) newest_ = tile.older;
  if (oldest_ == &tile) oldest_ = tile.newer;
  tile.older = tile.newer = nullptr;
}

}  // namespace Tarsa
