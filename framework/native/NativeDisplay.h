#pragma once

#include <cstdint>
#include <string>

// The framework's door to the display: whether there is one, the keyboard's
// modifier state, and the system's own alert box. Everything here answers
// sensibly on a machine with no display (a scripted run on a server): no
// display, no keys held, no box shown.
namespace Tarsa::Native {

// The framework's modifier bits, as in its mouse and key messages.
inline constexpr std::uint32_t kModifierAlt = 2;
inline constexpr std::uint32_t kModifierControl = 4;
inline constexpr std::uint32_t kModifierShift = 8;

// True when a display server is named in the environment.
bool HasDisplay();

// Starts the window layer's video part once; false with no display or when
// the display cannot be opened. Windows and the event source call it.
bool StartWindowSystem();

// The modifier keys held now, as the window layer knows them; 0 with no
// display. Starts the window layer's video part on first use.
std::uint32_t KeyboardModifiers();

// Shows a modal error box with title and text (UTF-8) and waits for the user
// to close it. False when there is no display or the box cannot be shown.
bool ShowAlertBox(const std::string& title, const std::string& text);

// Ends what KeyboardModifiers started; later calls start it again.
void ShutdownDisplay();

}  // namespace Tarsa::Native
