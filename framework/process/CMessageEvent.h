#pragma once

#include <cstdint>
#include <memory>

#include "framework/process/CMessage.h"
#include "framework/process/CMessenger.h"
#include "framework/process/CProcessEvent.h"

namespace Tarsa {

// A message delivered later: to a given messenger's HandleMessage, or, with
// no messenger, as a command to whatever is the target when it runs. Due at
// the message's time. Owns the message; when the messenger dies first the
// process sweeps the event away unrun.
class CMessageEvent : public CProcessEvent {
 public:
  CMessageEvent(std::unique_ptr<CMessage> message, CMessenger* target, std::int32_t priority = 0);

  const CMessage& Message() const { return *message_; }
  CMessenger* TargetMessenger() const { return target_; }

  void Run() override;
  // Done when value is the messenger it was meant for.
  bool Sweep(std::uintptr_t value) override;

 private:
  std::unique_ptr<CMessage> message_;
  CMessenger* target_;
};

}  // namespace Tarsa
