#include "framework/process/CMessageEvent.h"

#include <utility>

namespace Tarsa {

CMessageEvent::CMessageEvent(std::unique_ptr<CMessage> message, CMessenger* target,
                             std::int32_t priority)
    : CProcessEvent(priority, message != nullptr ? message->time : 0.0),
      message_(message != nullptr ? std::move(message) : std::make_unique<CMessage>()),
      target_(target) {}

void CMessageEvent::Run() {
  if (target_ != nullptr) {
    target_->HandleMessage(*message_);
  } else {
    CMessenger::SendCommand(*message_);
  }
}

bool CMessageEvent::Sweep(std::uintptr_t value) {
  return target_ != nullptr && value == reinterpret_cast<std::uintptr_t>(target_);
}

}  // namespace Tarsa
