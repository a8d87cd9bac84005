#include "framework/tools/CTracker.h"

#include <algorithm>
#include <cmath>

#include "framework/process/CKeyCodes.h"
#include "framework/process/CProcess.h"
#include "framework/view/CView.h"
#include "framework/view/CWindow.h"

namespace Tarsa {

namespace {

// The one running tracker, as the process knows it.
CTracker* gRunning = nullptr;

}  // namespace

CTracker::CTracker(CView* view, std::uint32_t trackFlags)
    : view_(view), window_(view != nullptr ? view->Window() : nullptr) {
  const std::uint32_t binding = view != nullptr ? view->Binding() : 0;
  if ((trackFlags & kTrack_ScrollX) != 0 && (binding & kBind_XScrollable) != 0) flags_ |= kScrollX;
  if ((trackFlags & kTrack_ScrollY) != 0 && (binding & kBind_YScrollable) != 0) flags_ |= kScrollY;
  if ((flags_ & (kScrollX | kScrollY)) != 0) flags_ |= kScroll;
  if ((trackFlags & kTrack_Keys) != 0) flags_ |= kKeys;
  if ((trackFlags & kTrack_Option8) != 0) flags_ |= kOption512;
  if ((trackFlags & kTrack_Idle) != 0) flags_ |= kIdle;
  if ((trackFlags & kTrack_Clamp) != 0) flags_ |= kClamp;
  if ((trackFlags & kTrack_Option64) != 0) flags_ |= kOption8192;
}

CTracker::CTracker(CWindow* window, std::uint32_t trackFlags)
    : CTracker(static_cast<CView*>(nullptr), trackFlags) {
  window_ = window;
}

CTracker::~CTracker() {
  if (gRunning == this) gRunning = nullptr;
}

CTracker* CTracker::Running() { return gRunning; }

std::uint32_t CTracker::NativeButton() const {
  return CMouseEvent::NativeButton(startEvent_.button);
}

CNativeWindowId CTracker::TrackedWindow() const {
  return window_ != nullptr ? window_->NativeId() : 0;
}

CMouseEvent CTracker::ToView(const CNativeEvent& event) const {
  CMouseEvent out;
  out.time = event.time;
  out.modifiers = event.modifiers;
  out.button = startEvent_.button;
  CPoint at{event.where.x, event.where.y};
  if (view_ != nullptr) at = view_->WindowToLocal(at);
  out.x = at.x;
  out.y = at.y;
  return out;
}

void CTracker::Clamp(CMouseEvent& event) const {
  if ((flags_ & kClamp) == 0 || view_ == nullptr) return;
  const CRect area = view_->Image();
  event.x = std::clamp(event.x, double(area.left), double(area.right - 1));
  event.y = std::clamp(event.y, double(area.top), double(area.bottom - 1));
}

bool CTracker::ContainsPoint(double x, double y) const {
  return view_ != nullptr &&
         view_->HitTest(CPoint{std::int32_t(std::floor(x)), std::int32_t(std::floor(y))});
}

void CTracker::AutoScrollNeeded(double x, double y, std::int32_t& dx, std::int32_t& dy) const {
  dx = dy = 0;
  if (view_ == nullptr || (flags_ & kScroll) == 0) return;
  const CRect frame = view_->Image();
  // Beyond an edge: the distance (one more past the far edge), at least a
  // step.
  const auto axis = [](double p, std::int32_t low, std::int32_t high, std::int32_t step) {
    if (p < low) return -std::max(step, std::int32_t(std::ceil(low - p)));
    if (p >= high) return std::max(step, std::int32_t(std::floor(p - high)) + 1);
    return 0;
  };
  if ((flags_ & kScrollX) != 0) dx = axis(x, frame.left, frame.right, scrollStepX_);
  if ((flags_ & kScrollY) != 0) dy = axis(y, frame.top, frame.bottom, scrollStepY_);
}

void CTracker::Run(const CMouseEvent& event) {
  gRunning = this;
  CProcess* process = CProcess::Current();
  if (window_ == nullptr || process == nullptr) {
    gRunning = nullptr;
    return;
  }
  flags_ = (flags_ & ~(kBegunPrepare | kBegunBegin | kCaptured | kAborted)) | kRunning | kGoOn;
  startEvent_ = event;
  Clamp(startEvent_);
  lastEvent_ = currentEvent_ = startEvent_;
  Prepare();
  flags_ |= kBegunPrepare;
  if (!Begin()) {
    flags_ &= ~kGoOn;
  } else {
    flags_ |= kBegunBegin | kCaptured;
    process->EventSource().CaptureMouse(true);
    while ((flags_ & kRunning) != 0 && (flags_ & kGoOn) != 0) process->TrackRound(*this);
  }
  if ((flags_ & kRunning) != 0) Close(false);
}

void CTracker::Close(bool aborted) {
  CProcess* process = CProcess::Current();
  endTime_ = process != nullptr ? process->Now() : 0.0;
  if ((flags_ & kCaptured) != 0) {
    flags_ &= ~kCaptured;
    if (process != nullptr) process->EventSource().CaptureMouse(false);
  }
  if ((flags_ & kBegunBegin) != 0) {
    flags_ &= ~kBegunBegin;
    End(aborted);
  }
  if ((flags_ & kBegunPrepare) != 0) {
    flags_ &= ~kBegunPrepare;
    Finish();
  }
  if (gRunning == this) gRunning = nullptr;
  flags_ &= ~kRunning;
}

void CTracker::Stop() { flags_ &= ~kGoOn; }

void CTracker::Abort() {
  if (gRunning == this) gRunning = nullptr;
  flags_ = (flags_ & ~kGoOn) | kAborted;
  if ((flags_ & kRunning) != 0) Close(true);
}

bool CTracker::OnMouse(const CNativeEvent& event) {
  if ((flags_ & kRunning) == 0) return false;
  currentEvent_ = ToView(event);
  bool scrolled = false;
  if ((flags_ & kScroll) != 0 && view_ != nullptr) {
    std::int32_t dx = 0, dy = 0;
    AutoScrollNeeded(currentEvent_.x, currentEvent_.y, dx, dy);
    if (dx != 0 || dy != 0) {
      const CRect before = view_->Image();
      view_->ScrollBy(dx, dy);
      const CRect after = view_->Image();
      const std::int32_t sx = after.left - before.left, sy = after.top - before.top;
      if (sx != 0 || sy != 0) {
        Moved(sx, sy);
        view_->Redraw();
        // The view's coordinates moved under the pointer: the position is
        // read again in them.
        currentEvent_ = ToView(event);
        Scrolled(sx, sy);
        scrolled = true;
      }
    }
  }
  Clamp(currentEvent_);
  const bool moved = currentEvent_.x != lastEvent_.x || currentEvent_.y != lastEvent_.y;
  const bool modifiers = !CMouseEvent::SameModifiers(currentEvent_.modifiers, lastEvent_.modifiers);
  if (!scrolled && !moved && !modifiers) return false;
  if (!Track(moved || scrolled, modifiers)) Stop();
  lastEvent_ = currentEvent_;
  return true;
}

void CTracker::OnKey(const CNativeEvent& event) {
  if (event.kind == ENativeKind::kKeyUp || event.kind == ENativeKind::kSysKeyUp) {
    KeyUpEvent(event);
  } else if (!KeyEvent(event)) {
    Stop();
  }
}

void CTracker::OnIdle(const CNativeEvent& event) {
  if ((flags_ & kRunning) != 0) Idle(ToView(event));
}

}  // namespace Tarsa
