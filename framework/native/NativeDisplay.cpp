#include "framework/native/NativeDisplay.h"

#include <cstdlib>

#include <SDL.h>
#include <X11/Xlib.h>

namespace Tarsa::Native {

namespace {

bool gVideoStarted = false;

// Requests the window layer makes about a window the server has just seen
// destroyed (a raise or focus racing an alert's close) come back as errors,
// and Xlib's own handler ends the process for them: the user's work would
// go with it. They are dropped instead; the request had nothing left to do.
int IgnoreXError(Display* /*display*/, XErrorEvent* /*error*/) { return 0; }

bool NonEmptyEnv(const char* name) {
  const char* value = std::getenv(name);
  return value != nullptr && value[0] != '\0';
}

}  // namespace

bool StartWindowSystem() {
  if (gVideoStarted) return true;
  if (!HasDisplay()) return false;
  // The host owns the process: SDL must not take over its Ctrl-C.
  SDL_SetHint(SDL_HINT_NO_SIGNAL_HANDLERS, "1");
  // A click that activates a window also acts on what it lands on, as a
  // user of a dialog expects.
  SDL_SetHint(SDL_HINT_MOUSE_FOCUS_CLICKTHROUGH, "1");
  // Windows show their pixels through the window system's own image
  // transfer, not a GL context of SDL's: the module renders with a GL
  // context of its own on the same thread, which would leave SDL's current
  // context elsewhere and the windows black.
  SDL_SetHint(SDL_HINT_FRAMEBUFFER_ACCELERATION, "0");
  // Closing a dialog's window is that dialog's Cancel, not the end of the
  // program: the host decides when it quits.
  SDL_SetHint(SDL_HINT_QUIT_ON_LAST_WINDOW_CLOSE, "0");
  if (SDL_InitSubSystem(SDL_INIT_VIDEO) != 0) return false;
  if (std::getenv("DISPLAY") != nullptr) XSetErrorHandler(IgnoreXError);
  gVideoStarted = true;
  return true;
}

bool HasDisplay() { return NonEmptyEnv("DISPLAY") || NonEmptyEnv("WAYLAND_DISPLAY"); }

std::uint32_t KeyboardModifiers() {
  if (!StartWindowSystem()) return 0;
  SDL_PumpEvents();
  const SDL_Keymod mod = SDL_GetModState();
  std::uint32_t held = 0;
  if ((mod & KMOD_ALT) != 0) held |= kModifierAlt;
  if ((mod & KMOD_CTRL) != 0) held |= kModifierControl;
  if ((mod & KMOD_SHIFT) != 0) held |= kModifierShift;
  return held;
}

bool ShowAlertBox(const std::string& title, const std::string& text) {
  if (!HasDisplay()) return false;
  // Allowed before SDL is started; it opens its own connection.
  return SDL_ShowSimpleMessageBox(SDL_MESSAGEBOX_ERROR, title.c_str(), text.c_str(), nullptr) == 0;
}

void ShutdownDisplay() {
  if (!gVideoStarted) return;
  SDL_QuitSubSystem(SDL_INIT_VIDEO);
  gVideoStarted = false;
}

}  // namespace Tarsa::Native
