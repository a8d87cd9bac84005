#pragma once

#include <cstdint>
#include <deque>
#include <functional>
#include <map>

#include "framework/process/CNativeEventSource.h"

union SDL_Event;

namespace Tarsa::Native {

// The window system's events for the process loop: SDL's queue, read in
// arrival order and turned into the framework's native events. One SDL
// event may become several (typed text becomes one key-char a code point),
// so converted events wait in a queue of their own until taken. Window
// timers are kept here and fire from the loop that reads events, so a tick
// arrives in order with the input around it. Owns nothing of SDL's but its
// wake-up event type; the video part is started by the constructor.
class SdlEventSource : public CNativeEventSource {
 public:
  // Throws CError when the window system cannot be started.
  SdlEventSource();
  ~SdlEventSource() override;
  SdlEventSource(const SdlEventSource&) = delete;
  SdlEventSource& operator=(const SdlEventSource&) = delete;

  // Puts an event behind those already converted, as if the window system
  // had sent it: for tests, and for replaying recorded input.
  void Inject(const CNativeEvent& event) { converted_.push_back(event); }

  bool Peek(CNativeEvent& event) override;
  bool Take(CNativeEvent& event) override;
  bool Wait(double until, CNativeEvent& event) override;
  void Wake() override;

  double Now() const override;
  CNativePoint Pointer() const override;
  std::uint32_t Modifiers() const override;
  std::uint32_t Buttons() const override;

  CNativeTimerId StartTimer(CNativeWindowId window, double period,
                            std::function<void(double)> tick) override;
  void StopTimer(CNativeTimerId timer) override;

  CNativeWindowId GetFocus() const override;
  void SetFocus(CNativeWindowId window) override;
  void CaptureMouse(bool capture) override;

 private:
  struct Timer {
    double period = 0.0;
    double due = 0.0;
    CNativeWindowId window = 0;
    std::function<void(double)> tick;
  };

  // Moves everything SDL has queued into converted_; true when any is there.
  bool Fill();
  // Appends what one SDL event becomes (nothing, for one we do not use).
  void Convert(const SDL_Event& e);
  // Fires the first due timer into converted_ as a tick; true when one was.
  bool FireDueTimer();
  double NextTimerDue() const;

  std::deque<CNativeEvent> converted_;
  std::map<CNativeTimerId, Timer> timers_;
  CNativeTimerId nextTimer_ = 1;
  std::uint32_t wakeType_ = 0;
  bool spaceHeld_ = false;
  std::uint32_t keyState_ = 0;  // SDL's modifier word as of the last key event read
};

}  // namespace Tarsa::Native
