#pragma once

#include <cstdint>
#include <memory>
#include <string>
#include <vector>

namespace Tarsa {

class CVirtualHeap;

// The framework's memory service: how much memory its large stores (the
// pixel stages' tiles) may hold, and the scratch volumes they may swap to.
// A framework service like the string table: created on first use by
// Get(true), owned by this class until Drop(). Main thread only.
//
// The service owns the framework's virtual heap, made on first use, and
// passes its limit and volumes on to it; dropping the service ends the heap
// and removes its swap files, so the pixmaps on it must have gone before.
class CMemoryService {
 public:
  CMemoryService();
  ~CMemoryService();
  CMemoryService(const CMemoryService&) = delete;
  CMemoryService& operator=(const CMemoryService&) = delete;

  // The service; with create false, null until someone has created it.
  static CMemoryService* Get(bool create);
  // Ends the service (framework shutdown, tests).
  static void Drop();

  std::uint64_t MemoryLimit() const { return memoryLimit_; }
  void SetMemoryLimit(std::uint64_t bytes);

  bool HasSwap() const { return swapStarted_; }
  // Swap on these folders (UTF-8 paths); with an empty list the heap swaps
  // to the temporary folder. Either way swap counts as set up.
  void StartSwap(std::vector<std::string> volumes);
  const std::vector<std::string>& ScratchVolumes() const { return scratchVolumes_; }

  // The heap of the pixel stages' tiles, under the limit (none while 0).
  CVirtualHeap& Heap();

 private:
  std::uint64_t memoryLimit_ = 0;  // 0: not set yet
  bool swapStarted_ = false;
  std::vector<std::string> scratchVolumes_;
  std::unique_ptr<CVirtualHeap> heap_;
};

}  // namespace Tarsa
