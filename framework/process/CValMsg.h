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

// A control's number, as sliders and number fields send it.
struct CNumber {
  double value = 0.0;
  friend bool operator==(const CNumber&, const CNumber&) = default;
};

// A button's state, as check and push buttons send it.
enum class EButtonValue : std::int32_t { kOff = 0, kOn = 1, kMixed = 2 };

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
extern template class CValMsg<CNumber>;
extern template class CValMsg<EButtonValue>;

}  // namespace Tarsa
