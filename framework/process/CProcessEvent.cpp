#include "framework/process/CProcessEvent.h"

#include <utility>

namespace Tarsa {

CProcessEvent::CProcessEvent(std::int32_t priority, double due, std::function<void()> action)
    : priority_(priority), due_(due), action_(std::move(action)) {}

void CProcessEvent::Run() {
  if (action_) action_();
}

bool CProcessEvent::Sweep(std::uintptr_t /*value*/) { return false; }

}  // namespace Tarsa
