#include "framework/native/SdlEventSource.h"

#include <algorithm>
#include <chrono>
#include <cmath>
#include <limits>

#include <SDL.h>

#include "framework/core/CException.h"
#include "framework/native/NativeDisplay.h"
#include "framework/process/CKeyCodes.h"

namespace Tarsa::Native {

namespace {

std::uint32_t KeyCode(SDL_Keycode key) {
  if (key >= SDLK_a && key <= SDLK_z) return kKey_A + std::uint32_t(key - SDLK_a);
  if (key >= SDLK_1 && key <= SDLK_9) return kKey_1 + std::uint32_t(key - SDLK_1);
  switch (key) {
    case SDLK_0:
      return kKey_1 + 9;
    case SDLK_BACKSPACE:
      return kKey_Backspace;
    case SDLK_TAB:
      return kKey_Tab;
    case SDLK_RETURN:
    case SDLK_KP_ENTER:
      return kKey_Return;
    case SDLK_SPACE:
      return kKey_Space;
    case SDLK_MINUS:
    case SDLK_KP_MINUS:
      return kKey_Minus;
    case SDLK_EQUALS:
    case SDLK_KP_PLUS:
      return kKey_Equals;
    case SDLK_ESCAPE:
      return kKey_Escape;
    case SDLK_LEFT:
      return kKey_Left;
    case SDLK_RIGHT:
      return kKey_Right;
    case SDLK_UP:
      return kKey_Up;
    case SDLK_DOWN:
      return kKey_Down;
    case SDLK_HOME:
      return kKey_Home;
    case SDLK_END:
      return kKey_End;
    case SDLK_PAGEUP:
      return kKey_PageUp;
    case SDLK_PAGEDOWN:
      return kKey_PageDown;
    case SDLK_DELETE:
      return kKey_Delete;
    default:
      return kKey_None;
  }
}

std::uint32_t ModifierBits(SDL_Keymod mod, bool space) {
  std::uint32_t held = 0;
  if ((mod & KMOD_ALT) != 0) held |= kModifier_Alt;
  if ((mod & KMOD_CTRL) != 0) held |= kModifier_Control;
  if ((mod & KMOD_SHIFT) != 0) held |= kModifier_Shift;
  if (space) held |= kModifier_Space;
  return held;
}

// The code points of a UTF-8 text; a malformed byte stands for itself.
template <class Emit>
void EachCodePoint(const char* text, Emit&& emit) {
  const auto* p = reinterpret_cast<const unsigned char*>(text);
  while (*p != 0) {
    std::uint32_t c = *p;
    int extra = c >= 0xF0 ? 3 : c >= 0xE0 ? 2 : c >= 0xC0 ? 1 : 0;
    if (extra > 0) c &= 0x3Fu >> extra;
    ++p;
    for (; extra > 0 && (*p & 0xC0) == 0x80; --extra, ++p) c = (c << 6) | (*p & 0x3F);
    emit(c);
  }
}

}  // namespace

SdlEventSource::SdlEventSource() {
  if (!StartWindowSystem()) {
    throw CError("$$$/Tarsa/Native/Error/NoDisplay=The display cannot be opened.");
  }
  wakeType_ = SDL_RegisterEvents(1);
  keyState_ = SDL_GetModState();
  SDL_StartTextInput();
}

SdlEventSource::~SdlEventSource() { SDL_StopTextInput(); }

double SdlEventSource::Now() const {
  using Clock = std::chrono::steady_clock;
  return std::chrono::duration<double>(Clock::now().time_since_epoch()).count();
}

CNativePoint SdlEventSource::Pointer() const {
  int x = 0, y = 0;
  SDL_GetMouseState(&x, &y);
  return {x, y};
}

std::uint32_t SdlEventSource::Modifiers() const {
  return ModifierBits(SDL_GetModState(), spaceHeld_);
}

std::uint32_t SdlEventSource::Buttons() const {
  const std::uint32_t state = SDL_GetMouseState(nullptr, nullptr);
  std::uint32_t held = 0;
  if ((state & SDL_BUTTON(SDL_BUTTON_LEFT)) != 0) held |= ButtonBit(kButton_Left);
  if ((state & SDL_BUTTON(SDL_BUTTON_MIDDLE)) != 0) held |= ButtonBit(kButton_Middle);
  if ((state & SDL_BUTTON(SDL_BUTTON_RIGHT)) != 0) held |= ButtonBit(kButton_Right);
  return held;
}

bool SdlEventSource::Fill() {
  SDL_PumpEvents();
  SDL_Event e;
  while (SDL_PollEvent(&e) != 0) Convert(e);
  return !converted_.empty();
}

void SdlEventSource::Convert(const SDL_Event& e) {
  {
    CNativeEvent n;
    n.time = Now();
    // The keys held when this event came, not when the batch was read: SDL's
    // own state is already that of the last event in its queue.
    n.modifiers = ModifierBits(static_cast<SDL_Keymod>(keyState_), spaceHeld_);
    switch (e.type) {
      case SDL_QUIT:
        n.kind = ENativeKind::kQuit;
        break;
      case SDL_KEYDOWN:
      case SDL_KEYUP: {
        const bool down = e.type == SDL_KEYDOWN;
        if (e.key.keysym.sym == SDLK_SPACE) spaceHeld_ = down;
        keyState_ = e.key.keysym.mod;
        n.modifiers = ModifierBits(static_cast<SDL_Keymod>(keyState_), spaceHeld_);
        n.code = KeyCode(e.key.keysym.sym);
        if (n.code == kKey_None) return;
        const bool alt = (e.key.keysym.mod & KMOD_ALT) != 0;
        n.kind = down ? (alt ? ENativeKind::kSysKeyDown : ENativeKind::kKeyDown)
                      : (alt ? ENativeKind::kSysKeyUp : ENativeKind::kKeyUp);
        n.window = e.key.windowID;
        break;
      }
      case SDL_TEXTINPUT:
        EachCodePoint(e.text.text, [&](std::uint32_t c) {
          CNativeEvent ch = n;
          ch.kind = ENativeKind::kKeyChar;
          ch.window = e.text.windowID;
          ch.code = c;
          converted_.push_back(ch);
        });
        return;
      case SDL_MOUSEMOTION:
        n.kind = ENativeKind::kMouseMove;
        n.window = e.motion.windowID;
        n.where = {e.motion.x, e.motion.y};
        break;
      case SDL_MOUSEBUTTONDOWN:
      case SDL_MOUSEBUTTONUP:
        if (e.button.button > SDL_BUTTON_RIGHT) return;
        n.kind = e.type == SDL_MOUSEBUTTONDOWN ? ENativeKind::kMouseDown : ENativeKind::kMouseUp;
        n.window = e.button.windowID;
        n.where = {e.button.x, e.button.y};
        n.code = e.button.button;
        break;
      case SDL_MOUSEWHEEL: {
        n.kind = ENativeKind::kMouseWheel;
        n.window = e.wheel.windowID;
        n.where = Pointer();
        const int lines = e.wheel.direction == SDL_MOUSEWHEEL_FLIPPED ? -e.wheel.y : e.wheel.y;
        if (lines == 0) return;
        n.code = static_cast<std::uint32_t>(lines);
        break;
      }
      case SDL_WINDOWEVENT: {
        n.kind = ENativeKind::kWindow;
        n.window = e.window.windowID;
        switch (e.window.event) {
          case SDL_WINDOWEVENT_CLOSE:
            n.code = std::uint32_t(EWindowEvent::kClose);
            break;
          case SDL_WINDOWEVENT_SIZE_CHANGED:
            n.code = std::uint32_t(EWindowEvent::kResized);
            n.where = {e.window.data1, e.window.data2};
            break;
          case SDL_WINDOWEVENT_EXPOSED:
            n.kind = ENativeKind::kPaint;
            break;
          case SDL_WINDOWEVENT_FOCUS_GAINED:
            n.code = std::uint32_t(EWindowEvent::kFocusGained);
            break;
          case SDL_WINDOWEVENT_FOCUS_LOST:
            n.code = std::uint32_t(EWindowEvent::kFocusLost);
            break;
          case SDL_WINDOWEVENT_MOVED:
            n.code = std::uint32_t(EWindowEvent::kMoved);
            n.where = {e.window.data1, e.window.data2};
            break;
          case SDL_WINDOWEVENT_ENTER:
            n.code = std::uint32_t(EWindowEvent::kEnter);
            break;
          case SDL_WINDOWEVENT_LEAVE:
            n.code = std::uint32_t(EWindowEvent::kLeave);
            break;
          default:
            return;
        }
        break;
      }
      default:
        if (e.type != wakeType_) return;
        n.kind = ENativeKind::kWake;
        break;
    }
    converted_.push_back(n);
  }
}

double SdlEventSource::NextTimerDue() const {
  double due = std::numeric_limits<double>::infinity();
  for (const auto& [id, timer] : timers_) due = std::min(due, timer.due);
  return due;
}

bool SdlEventSource::FireDueTimer() {
  const double now = Now();
  for (auto& [id, timer] : timers_) {
    if (timer.due > now) continue;
    // The next tick counts from now: a loop that fell behind gets one tick,
    // not a burst of the ones it missed.
    timer.due = now + timer.period;
    CNativeEvent tick;
    tick.kind = ENativeKind::kTimer;
    tick.window = timer.window;
    tick.time = now;
    tick.code = id;
    const std::function<void(double)> call = timer.tick;
    converted_.push_back(tick);
    call(now);
    return true;
  }
  return false;
}

bool SdlEventSource::Peek(CNativeEvent& event) {
  if (converted_.empty() && !Fill() && !FireDueTimer()) return false;
  event = converted_.front();
  return true;
}

bool SdlEventSource::Take(CNativeEvent& event) {
  if (!Peek(event)) return false;
  converted_.pop_front();
  return true;
}

bool SdlEventSource::Wait(double until, CNativeEvent& event) {
  for (;;) {
    if (Take(event)) return true;
    const double now = Now();
    const double end = std::min(until, NextTimerDue());
    if (end <= now && until <= now) return false;
    SDL_Event e;
    int got = 0;
    if (std::isinf(end)) {
      got = SDL_WaitEvent(&e);
    } else {
      const double ms = std::ceil((end - now) * 1000.0);
      got = SDL_WaitEventTimeout(&e, int(std::clamp(ms, 0.0, 1e7)));
    }
    if (got != 0) {
      Convert(e);
      Fill();
    } else if (until <= Now()) {
      return Take(event);
    }
  }
}

void SdlEventSource::Wake() {
  SDL_Event e{};
  e.type = wakeType_;
  SDL_PushEvent(&e);
}

CNativeTimerId SdlEventSource::StartTimer(CNativeWindowId window, double period,
                                          std::function<void(double)> tick) {
  if (!tick || !(period >= 0.0)) return 0;
  const CNativeTimerId id = nextTimer_++;
  timers_[id] = Timer{period, Now() + period, window, std::move(tick)};
  return id;
}

void SdlEventSource::StopTimer(CNativeTimerId timer) { timers_.erase(timer); }

CNativeWindowId SdlEventSource::GetFocus() const {
  SDL_Window* focus = SDL_GetKeyboardFocus();
  return focus == nullptr ? 0 : SDL_GetWindowID(focus);
}

void SdlEventSource::SetFocus(CNativeWindowId window) {
  SDL_Window* w = SDL_GetWindowFromID(static_cast<std::uint32_t>(window));
  if (w == nullptr) return;
  SDL_RaiseWindow(w);
  SDL_SetWindowInputFocus(w);
}

void SdlEventSource::CaptureMouse(bool capture) {
  SDL_CaptureMouse(capture ? SDL_TRUE : SDL_FALSE);
}

}  // namespace Tarsa::Native
