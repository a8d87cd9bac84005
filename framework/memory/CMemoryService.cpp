#include "framework/memory/CMemoryService.h"

#include <utility>

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

void CMemoryService::StartSwap(std::vector<std::string> volumes) {
  scratchVolumes_ = std::move(volumes);
  swapStarted_ = true;
}

}  // namespace Tarsa
