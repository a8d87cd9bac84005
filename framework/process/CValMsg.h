#pragma once

#include <cstdint>
#include <memory>
#include <utility>

#include "framework/process/CMessage.h"
#include "framework/process/CObjID.h"

namespace Tarsa {

// A message that carries a value, as controls send them. Its own word is
// the kind of change: set, still tracking, or the end of a drag.
class CValueMessage : public CMessage {
 public:
  static constexpr std::int32_t kChange_Set = 2;
  static constexpr std::int32_t kChange_Tracking = 7;
  static constexpr std::int32_t kChange_EndDrag = 8;

  CValueMessage() = default;
  explicit CValueMessage(CObjID name, std::int32_t change = kChange_Set, double time = 0.0,
                         std::uint32_t modifiers = 0, std::uintptr_t source = 0)
      : CMessage(name, time, modifiers, source), change(change) {}

  std::unique_ptr<CMessage> Clone() const override {
    return std::make_unique<CValueMessage>(*this);
  }

  std::int32_t change = kChange_Set;
};

// A value message holding a value of T.
template <class T>
class CValMsg : public CValueMessage {
 public:
  CValMsg() = default;
  CValMsg(CObjID name, T value, std::int32_t change = kChange_Set, double time = 0.0,
          std::uint32_t modifiers = 0, std::uintptr_t source = 0)
      : CValueMessage(name, change, time, modifiers, source), value(std::move(value)) {}

  std::unique_ptr<CMessage> Clone() const override { return std::make_unique<CValMsg>(*this); }

  T value{};
};

extern template class CValMsg<std::uint32_t>;
extern template class CValMsg<CObjID>;

}  // namespace Tarsa
