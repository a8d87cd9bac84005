#pragma once

#include <cstdint>

#include "framework/process/CObjID.h"

namespace Tarsa {

// A mouse event as tools and trackers see it: the position in the receiving
// view's coordinates, the modifier word (Alt 2, Ctrl 4, Shift 8, 16, Space
// 32, 64), the time in seconds and the button's id.
struct CMouseEvent {
  double x = 0.0;
  double y = 0.0;
  std::uint32_t modifiers = 0;
  double time = 0.0;
  CObjID button;

  static constexpr std::uint32_t kAlt = 2;
  static constexpr std::uint32_t kCtrl = 4;
  static constexpr std::uint32_t kShift = 8;
  static constexpr std::uint32_t kSpace = 32;
  // Only Alt, Ctrl and Shift take part when two modifier words are compared.
  static constexpr std::uint32_t kCompared = kAlt | kCtrl | kShift;

  bool Has(std::uint32_t bit) const { return (modifiers & bit) != 0; }
  void Set(std::uint32_t bit, bool on) { modifiers = on ? (modifiers | bit) : (modifiers & ~bit); }
  static bool SameModifiers(std::uint32_t a, std::uint32_t b) {
    return (a & kCompared) == (b & kCompared);
  }

  // The button ids.
  static CObjID Primary();
  static CObjID Context();
  static CObjID Tertiary();
  static CObjID Backward();
  static CObjID Forward();
  // The native button number (1 left, 2 middle, 3 right) of a button id; 0
  // for the others.
  static std::uint32_t NativeButton(CObjID button);
  static CObjID ButtonOf(std::uint32_t nativeButton);
};

}  // namespace Tarsa
