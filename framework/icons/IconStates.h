#pragma once

#include <cstdint>

namespace Tarsa {

// The states an icon resource may hold an image for, one index 0 to 7 each.
// This is the one place that says what a state means; the skin generator
// draws by it and the controls choose by it.
//
//   0  normal      enabled, at rest; every image has it
//   1  pressed     the mouse is down on the control (or the key that clicks it)
//   2  hover       the pointer is over the control, nothing pressed
//   4  disabled    the control does not take input
//   6  focused     the control holds keyboard focus
//
// 3, 5 and 7 are unused. Which way something is on (a check box checked, a
// tab chosen, a button the default) is not a state but a separate image
// ("CheckBox.On", "Tab.Selected", "DefaultButton.Left"), so that every
// on/off image can still show all five states.
//
// A control picks its state with IconStateFor() and asks the provider for
// that state; when the image has no such state (a track has no hover look) it
// draws state 0 instead. Disabled wins over everything, then pressed, hover
// and focus.
enum class IconState : std::uint32_t {
  kNormal = 0,
  kPressed = 1,
  kHover = 2,
  kDisabled = 4,
  kFocused = 6,
};

inline constexpr std::uint32_t kIconStateCount = 8;

constexpr IconState IconStateFor(bool enabled, bool pressed, bool hover, bool focused) {
  if (!enabled) return IconState::kDisabled;
  if (pressed) return IconState::kPressed;
  if (hover) return IconState::kHover;
  if (focused) return IconState::kFocused;
  return IconState::kNormal;
}

constexpr std::uint32_t IconStateIndex(IconState state) {
  return static_cast<std::uint32_t>(state);
}

}  // namespace Tarsa
