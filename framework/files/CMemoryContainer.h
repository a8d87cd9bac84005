#pragma once

#include <cstddef>
#include <cstdint>

#include "framework/files/CBlockContainer.h"
#include "framework/files/CContainer.h"
#include "framework/files/CMemoryBlock.h"

namespace Tarsa {

// A container that owns its bytes: a heap block that starts empty and grows
// in granularity steps as it is written. Blobs, preference files and
// resources are built and read in one of these.
class CMemoryContainer : public CContainer {
 public:
  static constexpr std::uint32_t kDefaultGranularity = 4096;

  explicit CMemoryContainer(std::uint32_t granularity = kDefaultGranularity)
      : block_(granularity) {}

  CMemoryBlock& Block() { return block_; }
  const CMemoryBlock& Block() const { return block_; }
  std::uint8_t* Data() { return block_.Data(); }
  const std::uint8_t* Data() const { return block_.Data(); }

 protected:
  void DoSetSize(std::uint64_t size) override { BlockStore::SetSize(&block_, size); }
  void DoSetPosition(std::uint64_t /*position*/) override {}
  void DoRead(void* buffer, std::size_t count) override {
    BlockStore::Read(&block_, Position(), buffer, count);
  }
  void DoWrite(const void* buffer, std::size_t count) override {
    BlockStore::Write(&block_, Position(), buffer, count);
  }

 private:
  CMemoryBlock block_;
};

}  // namespace Tarsa
