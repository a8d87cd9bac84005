#pragma once

#include <cstdint>

namespace Tarsa {

// The framework's key codes, as key-down and key-up messages carry them. The
// letters, digits and editing keys are the framework's long-standing codes;
// the navigation keys were given codes of their own above them. Character
// input travels separately, as key-char messages carrying a Unicode code
// point, so that a number field reads what the keyboard layout typed.
inline constexpr std::uint32_t kKey_None = 0;
inline constexpr std::uint32_t kKey_Backspace = 2;
inline constexpr std::uint32_t kKey_Tab = 3;
inline constexpr std::uint32_t kKey_Return = 4;
inline constexpr std::uint32_t kKey_Space = 5;
inline constexpr std::uint32_t kKey_A = 10;  // to kKey_A + 25, Z
inline constexpr std::uint32_t kKey_1 = 40;  // digits 1 to 9, then 0 at 49
inline constexpr std::uint32_t kKey_ShiftedDigits = 50;
inline constexpr std::uint32_t kKey_Minus = 61;
inline constexpr std::uint32_t kKey_Equals = 62;
inline constexpr std::uint32_t kKey_ShiftedMinus = 81;
inline constexpr std::uint32_t kKey_ShiftedEquals = 82;
inline constexpr std::uint32_t kKey_Escape = 99;
inline constexpr std::uint32_t kKey_Left = 100;
inline constexpr std::uint32_t kKey_Right = 101;
inline constexpr std::uint32_t kKey_Up = 102;
inline constexpr std::uint32_t kKey_Down = 103;
inline constexpr std::uint32_t kKey_Home = 104;
inline constexpr std::uint32_t kKey_End = 105;
inline constexpr std::uint32_t kKey_PageUp = 106;
inline constexpr std::uint32_t kKey_PageDown = 107;
inline constexpr std::uint32_t kKey_Delete = 131;

// Modifier bits of messages: the framework's word, with Space held as a
// modifier for the tools' temporary hand.
inline constexpr std::uint32_t kModifier_Alt = 2;
inline constexpr std::uint32_t kModifier_Control = 4;
inline constexpr std::uint32_t kModifier_Shift = 8;
inline constexpr std::uint32_t kModifier_Space = 32;

// Mouse buttons, as mouse messages carry them in their code, and as bits of
// the held-buttons word (1 << (button - 1)).
inline constexpr std::uint32_t kButton_Left = 1;
inline constexpr std::uint32_t kButton_Middle = 2;
inline constexpr std::uint32_t kButton_Right = 3;

inline constexpr std::uint32_t ButtonBit(std::uint32_t button) { return 1u << (button - 1); }

// What a window event (ENativeKind::kWindow) says, in its code.
enum class EWindowEvent : std::uint32_t {
  kClose = 1,    // the user asked to close the window
  kResized = 2,  // the new client size is in `where`
  kExposed = 3,
  kFocusGained = 4,
  kFocusLost = 5,
  kMoved = 6,  // the new position is in `where`
  kEnter = 7,
  kLeave = 8,
};

}  // namespace Tarsa
