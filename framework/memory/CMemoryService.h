#pragma once

#include <cstdint>
#include <memory>
#include <string>
#include <vector>

namespace Tarsa {

// The framework's memory service: how much memory its large stores (the
// pixel stages' tiles) may hold, and the scratch volumes they may swap to.
// A framework service like the string table: created on first use by
// Get(true), owned by this class until Drop(). Main thread only.
//
// This is the seam for the pixel stages' swapping heap: StartSwap() only
// records the volumes and marks swap as set up; the heap that honours the
// limit and writes tiles out to those volumes is built on this service.
class CMemoryService {
 public:
  CMemoryService() = default;
  CMemoryService(const CMemoryService&) = delete;
  CMemoryService& operator=(const CMemoryService&) = delete;

  // The service; with create false, null until someone has created it.
  static CMemoryService* Get(bool create);
  // Ends the service (framework shutdown, tests).
  static void Drop();

  std::uint64_t MemoryLimit() const { return memoryLimit_; }
  void SetMemoryLimit(std::uint64_t bytes) { memoryLimit_ = bytes; }

  bool HasSwap() const { return swapStarted_; }
  // Swap on these folders (UTF-8 paths); an empty list means swap to no
  // volume, which still counts as set up.
  void StartSwap(std::vector<std::string> volumes);
  const std::vector<std::string>& ScratchVolumes() const { return scratchVolumes_; }

 private:
  std::uint64_t memoryLimit_ = 0;  // 0: not set yet
  bool swapStarted_ = false;
  std::vector<std::string> scratchVolumes_;
};

}  // namespace Tarsa
