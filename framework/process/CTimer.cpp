#include "framework/process/CTimer.h"

#include <algorithm>
#include <limits>
#include <vector>

#include "framework/core/CException.h"
#include "framework/process/CProcess.h"
#include "framework/process/CReporter.h"

namespace Tarsa {

namespace {

// Never destroyed, so that a timer that outlives static destruction can
// still leave it.
CLinkList<CTimer>& Timers() {
  static auto* timers = new CLinkList<CTimer>;
  return *timers;
}

bool IsListed(const CTimer* timer) {
  for (const CTimer* t = Timers().Front(); t != nullptr; t = t->Next()) {
    if (t == timer) return true;
  }
  return false;
}

}  // namespace

CTimer::CTimer(double period, CNativeWindowId window) : period_(period), window_(window) {}

CTimer::~CTimer() { Stop(); }

void CTimer::Start() {
  Stop();
  CProcess* process = CProcess::Current();
  if (process == nullptr) throw CError("");
  CNativeEventSource& source = process->EventSource();
  if (window_ != 0) {
    nativeTimer_ = source.StartTimer(window_, period_, [this](double time) { Tick(time); });
    if (nativeTimer_ == 0) throw CError("");
    state_ |= kState_WindowBound;
  }
  lastFired_ = source.Now();
  Timers().PushBack(this);
  state_ |= kState_Running;
}

void CTimer::Stop() {
  if (nativeTimer_ != 0) {
    // Without a process the native layer is gone, and its timers with it.
    if (CProcess* process = CProcess::Current()) process->EventSource().StopTimer(nativeTimer_);
    nativeTimer_ = 0;
  }
  Timers().Unlink(this);
  state_ &= ~(kState_Running | kState_WindowBound);
}

void CTimer::SetCallback(Callback callback, std::uintptr_t userData) {
  callback_ = callback;
  userData_ = userData;
}

void CTimer::Fire(double /*time*/, double /*elapsed*/) {
  if (callback_ != nullptr) callback_(*this, userData_);
}

void CTimer::FireNow(double now) {
  const double elapsed = now - lastFired_;
  lastFired_ = now;
  try {
    Fire(now, elapsed);
  } catch (...) {
    CReporter::ReportCurrent();
  }
}

void CTimer::Tick(double time) { FireNow(time); }

// Compared as a sum, the same sum NextDue gives: the loop waits until exactly
// that time, and a difference could round below the period there and leave
// the timer unfired with the wait already over.
bool CTimer::IsDue(double now) const { return now >= lastFired_ + period_; }

void CTimer::FireDue(double now) {
  std::vector<CTimer*> due;
  for (CTimer* t = Timers().Front(); t != nullptr; t = t->Next()) {
    if ((t->state_ & kState_WindowBound) == 0 && t->IsDue(now)) {
      due.push_back(t);
    }
  }
  // A Fire() may stop or delete other timers: each is looked up again
  // before it fires, and must still be due.
  for (CTimer* t : due) {
    if (!IsListed(t)) continue;
    if ((t->state_ & kState_WindowBound) != 0 || !t->IsDue(now)) continue;
    t->FireNow(now);
  }
}

double CTimer::NextDue() {
  double next = std::numeric_limits<double>::infinity();
  for (const CTimer* t = Timers().Front(); t != nullptr; t = t->Next()) {
    if ((t->state_ & kState_WindowBound) == 0) next = std::min(next, t->lastFired_ + t->period_);
  }
  return next;
}

}  // namespace Tarsa
