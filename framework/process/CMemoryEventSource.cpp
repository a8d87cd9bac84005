#include "framework/process/CMemoryEventSource.h"

#include <algorithm>
#include <cmath>
#include <utility>
#include <vector>

namespace Tarsa {

CMemoryEventSource::CMemoryEventSource(double now) : now_(now) {}

void CMemoryEventSource::Post(const CNativeEvent& event) {
  auto at = std::upper_bound(events_.begin(), events_.end(), event.time,
                             [](double t, const CNativeEvent& e) { return t < e.time; });
  events_.insert(at, event);
}

std::size_t CMemoryEventSource::PendingCount() const {
  const double now = Now();
  return static_cast<std::size_t>(
      std::count_if(events_.begin(), events_.end(), [now](auto& e) { return e.time <= now; }));
}

bool CMemoryEventSource::Peek(CNativeEvent& event) {
  if (events_.empty() || events_.front().time > Now()) return false;
  event = events_.front();
  return true;
}

bool CMemoryEventSource::Take(CNativeEvent& event) {
  if (!Peek(event)) return false;
  events_.pop_front();
  return true;
}

bool CMemoryEventSource::Wait(double until, CNativeEvent& event) {
  ++waits_;
  if (Take(event)) return true;
  if (woken_.exchange(false)) return false;
  // Nothing pending: time passes up to the next scripted event or the
  // deadline, whichever is first. With neither, the script has ended and the
  // wait returns at once rather than hang.
  if (!events_.empty() && events_.front().time <= until) {
    now_.store(std::max(Now(), events_.front().time));
    return Take(event);
  }
  if (std::isfinite(until) && until > Now()) now_.store(until);
  return false;
}

CNativeTimerId CMemoryEventSource::StartTimer(CNativeWindowId /*window*/, double /*period*/,
                                              std::function<void(double)> tick) {
  if (timersFail_ || !tick) return 0;
  const CNativeTimerId id = nextTimer_++;
  timers_.emplace(id, std::move(tick));
  return id;
}

void CMemoryEventSource::StopTimer(CNativeTimerId timer) { timers_.erase(timer); }

int CMemoryEventSource::TickTimers(double time) {
  // By id, looked up again before each tick: a tick may stop timers.
  std::vector<CNativeTimerId> ids;
  for (const auto& entry : timers_) ids.push_back(entry.first);
  int ticked = 0;
  for (CNativeTimerId id : ids) {
    auto found = timers_.find(id);
    if (found == timers_.end()) continue;
    auto tick = found->second;  // a copy: the tick may stop its own timer
    tick(time);
    ++ticked;
  }
  return ticked;
}

void CMemoryEventSource::SetFocus(CNativeWindowId window) {
  ++setFocusCalls_;
  focus_ = window;
}

}  // namespace Tarsa
