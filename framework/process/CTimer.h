#pragma once

#include <cstdint>

#include "framework/process/CLink.h"
#include "framework/process/CNativeEventSource.h"

namespace Tarsa {

// A repeating timer on the main thread. Running timers sit in one global
// list. A timer without a window is fired by the process's pass once at
// least a period has gone by since it last fired, and then at most once per
// pass, however short the period: there is no catching up. A timer with a
// window is bound to a native timer of that window instead, and the pass
// skips it. Fire() calls the callback, when one is set.
class CTimer : public CLink<CTimer> {
 public:
  static constexpr std::uint32_t kState_Running = 1u << 0;
  static constexpr std::uint32_t kState_WindowBound = 1u << 1;

  using Callback = void (*)(CTimer& timer, std::uintptr_t userData);

  explicit CTimer(double period, CNativeWindowId window = 0);
  virtual ~CTimer();

  // (Re)starts the timer; it first fires a period from now. Needs a process;
  // throws when there is none or the native timer cannot be made.
  void Start();
  void Stop();
  bool IsRunning() const { return (state_ & kState_Running) != 0; }
  std::uint32_t State() const { return state_; }
  double Period() const { return period_; }
  // Takes effect at the next Start for a window-bound timer.
  void SetPeriod(double period) { period_ = period; }
  double LastFired() const { return lastFired_; }
  void SetCallback(Callback callback, std::uintptr_t userData);

  // time: now, in seconds; elapsed: since the timer last fired or started.
  virtual void Fire(double time, double elapsed);

  // The process's pass: fires every due timer that is not window-bound. A
  // failure of Fire() is reported and the others still fire.
  static void FireDue(double now);
  // When the next timer that is not window-bound is due; +infinity if none.
  static double NextDue();

 private:
  // A tick of the native timer of a window-bound timer.
  void Tick(double time);
  void FireNow(double now);
  bool IsDue(double now) const;

  double period_;
  double lastFired_ = 0.0;
  CNativeWindowId window_;
  Callback callback_ = nullptr;
  std::uintptr_t userData_ = 0;
  CNativeTimerId nativeTimer_ = 0;
  std::uint32_t state_ = 0;
};

}  // namespace Tarsa
