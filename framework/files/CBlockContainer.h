#pragma once

#include <cstddef>
#include <cstdint>

#include "framework/files/CBlock.h"
#include "framework/files/CContainer.h"

namespace Tarsa {

// The three store operations of a container kept in a block, shared by the
// block and memory containers. A null block ignores them all. A block holds
// at most 4 GiB - 1 bytes; a larger size is the out-of-memory error, and bytes
// that a resize adds are zero.
struct BlockStore {
  static void SetSize(CBlock* block, std::uint64_t size);
  static void Read(const CBlock* block, std::uint64_t position, void* buffer, std::size_t count);
  static void Write(CBlock* block, std::uint64_t position, const void* buffer, std::size_t count);
};

// A container over a block that somebody else owns and outlives it. Its size
// starts as the block's size; writes grow the block. The block may be null:
// then the size and position move while nothing is stored.
class CBlockContainer : public CContainer {
 public:
  explicit CBlockContainer(CBlock* block);

  CBlock* Block() const { return block_; }

 protected:
  void DoSetSize(std::uint64_t size) override { BlockStore::SetSize(block_, size); }
  void DoSetPosition(std::uint64_t /*position*/) override {}
  void DoRead(void* buffer, std::size_t count) override {
    BlockStore::Read(block_, Position(), buffer, count);
  }
  void DoWrite(const void* buffer, std::size_t count) override {
    BlockStore::Write(block_, Position(), buffer, count);
  }

 private:
  CBlock* block_;
};

}  // namespace Tarsa
