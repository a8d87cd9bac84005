#pragma once

#include <atomic>
#include <cstddef>
#include <cstdint>
#include <deque>
#include <functional>
#include <map>

#include "framework/process/CNativeEventSource.h"

namespace Tarsa {

// A native event source that plays a script: events posted with time stamps
// become pending when the manual clock reaches them, and waiting moves the
// clock forward to the next event or to the deadline instead of sleeping.
// Window timers are recorded and tick only when told to. For tests and
// for runs with no window system.
class CMemoryEventSource : public CNativeEventSource {
 public:
  explicit CMemoryEventSource(double now = 0.0);
  CMemoryEventSource(const CMemoryEventSource&) = delete;
  CMemoryEventSource& operator=(const CMemoryEventSource&) = delete;

  // Script: the event arrives when the clock reaches event.time; events of
  // equal time arrive in the order posted.
  void Post(const CNativeEvent& event);
  void SetNow(double now) { now_.store(now); }
  void Advance(double seconds) { now_.store(now_.load() + seconds); }
  void SetPointer(CNativePoint where) { pointer_ = where; }
  void SetModifiers(std::uint32_t modifiers) { modifiers_ = modifiers; }
  void SetButtons(std::uint32_t buttons) { buttons_ = buttons; }
  // While set, StartTimer fails.
  void SetTimersFail(bool fail) { timersFail_ = fail; }
  // Ticks every window timer at time; returns how many ticked.
  int TickTimers(double time);

  std::size_t PendingCount() const;  // events that have arrived
  std::size_t ScriptCount() const { return events_.size(); }
  std::size_t TimerCount() const { return timers_.size(); }
  int WaitCount() const { return waits_; }

  bool Peek(CNativeEvent& event) override;
  bool Take(CNativeEvent& event) override;
  bool Wait(double until, CNativeEvent& event) override;
  void Wake() override { woken_.store(true); }
  double Now() const override { return now_.load(); }
  CNativePoint Pointer() const override { return pointer_; }
  std::uint32_t Modifiers() const override { return modifiers_; }
  std::uint32_t Buttons() const override { return buttons_; }
  CNativeTimerId StartTimer(CNativeWindowId window, double period,
                            std::function<void(double)> tick) override;
  void StopTimer(CNativeTimerId timer) override;
  CNativeWindowId GetFocus() const override { return focus_; }
  void SetFocus(CNativeWindowId window) override;

  int SetFocusCount() const { return setFocusCalls_; }
  void CaptureMouse(bool capture) override { captured_ = capture; }
  bool Captured() const { return captured_; }

 private:
  std::deque<CNativeEvent> events_;  // sorted by time, stable
  std::atomic<double> now_;
  std::atomic<bool> woken_{false};
  CNativePoint pointer_;
  std::uint32_t modifiers_ = 0;
  std::uint32_t buttons_ = 0;
  bool captured_ = false;
  bool timersFail_ = false;
  CNativeTimerId nextTimer_ = 1;
  std::map<CNativeTimerId, std::function<void(double)>> timers_;
  CNativeWindowId focus_ = 0;
  int waits_ = 0;
  int setFocusCalls_ = 0;
};

}  // namespace Tarsa
