#include "framework/memory/CMemoryService.h"

#include <utility>

#include "framework/memory/CVirtualHeap.h"

namespace Tarsa {

namespace {
std::unique_ptr<CMemoryService>& Service() {
  static std::unique_ptr<CMemoryService> service;
  return service;
}
}  // namespace

CMemoryService* CMemoryService::Get(bool create) {
  auto& service = Service();
  if (!service && create) service = std::make_unique<CMemoryService>();
  return service.get();
}

void CMemoryService::Drop() { Service().reset(); }

CMemoryService::CMemoryService() = default;

CMemoryService::~CMemoryService() = default;

void CMemoryService::SetMemoryLimit(std::uint64_t bytes) {
  memoryLimit_ = bytes;
  if (heap_) heap_->SetLimit(bytes);
}

void CMemoryService::StartSwap(std::vector<std::string> volumes) {
  scratchVolumes_ = std::move(volumes);
  swapStarted_ = true;
  if (heap_) heap_->SetVolumes(scratchVolumes_);
}

CVirtualHeap& CMemoryService::Heap() {
  if (!heap_) heap_ = std::make_unique<CVirtualHeap>(memoryLimit_, scratchVolumes_);
  return *heap_;
}

}  // namespace Tarsa
