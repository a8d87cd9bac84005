#pragma once

#include <cstdint>
#include <memory>

#include "framework/process/CObjID.h"

namespace Tarsa {

// A message: a name, who sent it, when, and the key state at the time. A
// handler that takes the message marks it handled; a copy is a new delivery
// and starts unhandled, so that forwarding a copy never looks answered.
class CMessage {
 public:
  static constexpr std::uint32_t kHandled = 1u << 0;

  CMessage() = default;
  explicit CMessage(CObjID name, double time = 0.0, std::uint32_t modifiers = 0,
                    std::uintptr_t source = 0);
  virtual ~CMessage() = default;

  CMessage(const CMessage& other);
  CMessage& operator=(const CMessage& other);

  // A copy of the whole message, derived part included, unhandled.
  virtual std::unique_ptr<CMessage> Clone() const;

  bool IsHandled() const { return (flags & kHandled) != 0; }
  void SetHandled(bool handled = true);

  std::uintptr_t source = 0;    // the sending object, or 0
  std::uint32_t modifiers = 0;  // key state at the time
  double time = 0.0;            // seconds, on the event source's clock
  CObjID name;
  std::uint32_t flags = 0;
};

}  // namespace Tarsa
