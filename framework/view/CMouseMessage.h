#pragma once

#include <cstdint>
#include <memory>

#include "framework/core/CRect.h"
#include "framework/process/CMessage.h"

namespace Tarsa {

// A mouse message on its way down the view tree: the point in the space of
// the view it is offered to (moved as it goes down), the button (1 left,
// 2 middle, 3 right; 0 for a move), the click count a mouse-down registered,
// and for the wheel the lines turned, away from the user positive.
class CMouseMessage : public CMessage {
 public:
  CMouseMessage() = default;
  CMouseMessage(CObjID name, CPoint where, std::uint32_t button, double time,
                std::uint32_t modifiers)
      : CMessage(name, time, modifiers), where(where), button(button) {}

  std::unique_ptr<CMessage> Clone() const override {
    return std::make_unique<CMouseMessage>(*this);
  }

  CPoint where;
  std::uint32_t button = 0;
  std::int32_t clicks = 0;
  std::int32_t wheel = 0;
};

}  // namespace Tarsa
