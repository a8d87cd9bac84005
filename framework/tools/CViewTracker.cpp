#include "framework/tools/CViewTracker.h"

#include <algorithm>
#include <cmath>
#include <cstdlib>

#include "framework/process/CProcess.h"
#include "framework/view/CView.h"
#include "framework/view/CWindow.h"

namespace Tarsa {

bool CViewTracker::Track(bool moved, bool modifiersChanged) {
  return View()->TrackStep(*this, client_, moved, modifiersChanged);
}

bool CViewTracker::KeyEvent(const CNativeEvent& event) {
  return View()->TrackKey(*this, client_, event);
}

void CViewTracker::KeyUpEvent(const CNativeEvent& event) {
  View()->TrackKeyUp(*this, client_, event);
}

void CViewTracker::Idle(const CMouseEvent& event) { View()->TrackIdle(*this, client_, event); }

// ---- CPanner ------------------------------------------------------------------

CPanner::CPanner(CView* view, std::uint32_t options)
    : CTracker(view, options & (kTrack_Keys | kTrack_Option8 | kTrack_Idle)),
      axes_(options & (kAxisX | kAxisY)) {}

void CPanner::RunPan(const CMouseEvent& event) {
  const CRect image = View()->Image();
  startScroll_ = lastScroll_ = CPoint{image.left, image.top};
  startWindow_ = View()->LocalToWindow(
      CPoint{std::int32_t(std::floor(event.x)), std::int32_t(std::floor(event.y))});
  Run(event);
}

bool CPanner::OnMouse(const CNativeEvent& event) {
  if ((Flags() & kRunning) == 0) return false;
  std::int32_t dx = startWindow_.x - event.where.x;
  std::int32_t dy = startWindow_.y - event.where.y;
  if (axes_ == kAxisX) dy = 0;
  if (axes_ == kAxisY) dx = 0;
  if (axes_ == 0) dx = dy = 0;
  if (axes_ == (kAxisX | kAxisY) && (event.modifiers & CMouseEvent::kShift) != 0) {
    if ((event.modifiers & CMouseEvent::kAlt) != 0) {
      dy = 0;
    } else if ((event.modifiers & CMouseEvent::kCtrl) != 0) {
      dx = 0;
    } else if (std::abs(dx) > std::abs(dy)) {
      dy = 0;
    } else {
      dx = 0;
    }
  }
  View()->ScrollTo(CPoint{startScroll_.x + dx, startScroll_.y + dy});
  const CRect image = View()->Image();
  const CPoint now{image.left, image.top};
  if (now == lastScroll_) return false;
  lastScroll_ = now;
  View()->Redraw();
  return true;
}

// ---- CZoomTracker -------------------------------------------------------------

std::uint8_t CZoomTracker::PatternRow(std::int32_t phase, std::int32_t row) {
  const unsigned shift = unsigned(phase + row) & 7u;
  const unsigned band = 0xF0u;
  return std::uint8_t(((band << shift) | (band >> (8u - shift))) & 0xFFu);
}

CRect CZoomTracker::GetRectangle() const {
  const CRect image = View()->Image();
  return rect_.Intersect(CRect{image.left - 2, image.top - 2, image.right + 2, image.bottom + 2});
}

bool CZoomTracker::Begin() {
  const CMouseEvent& at = StartEvent();
  const std::int32_t x = std::int32_t(std::floor(at.x)), y = std::int32_t(std::floor(at.y));
  rect_ = CRect{x, y, x + 1, y + 1};
  if (CProcess* process = CProcess::Current()) lastPhaseTime_ = process->Now();
  View()->Invalidate();
  return true;
}

bool CZoomTracker::Track(bool /*moved*/, bool /*modifiersChanged*/) {
  const std::int32_t x0 = std::int32_t(std::floor(StartEvent().x));
  const std::int32_t y0 = std::int32_t(std::floor(StartEvent().y));
  const std::int32_t x1 = std::int32_t(std::floor(CurrentEvent().x));
  const std::int32_t y1 = std::int32_t(std::floor(CurrentEvent().y));
  const CRect next{std::min(x0, x1), std::min(y0, y1), std::max(x0, x1) + 1, std::max(y0, y1) + 1};
  if (next != rect_) {
    rect_ = next;
    View()->Redraw();
  }
  return true;
}

void CZoomTracker::Idle(const CMouseEvent& event) {
  if (event.time - lastPhaseTime_ < 0.05) return;
  lastPhaseTime_ = event.time;
  phase_ = (phase_ + 1) % 8;
  View()->Redraw();
}

void CZoomTracker::End(bool /*aborted*/) {
  rect_ = CRect{};
  View()->Invalidate();
}

void CZoomTracker::DrawFeedback(CPort& port) const {
  const CRect r = GetRectangle();
  if (r.IsEmpty()) return;
  // The frame's pixels take black or white from the pattern at their place,
  // in runs of one colour.
  const auto bit = [this](std::int32_t x, std::int32_t y) {
    return ((PatternRow(phase_, y & 7) >> (7 - (x & 7))) & 1u) != 0;
  };
  const auto run = [&](std::int32_t x0, std::int32_t y0, std::int32_t dx, std::int32_t dy,
                       std::int32_t count) {
    std::int32_t start = 0;
    for (std::int32_t i = 1; i <= count; ++i) {
      const bool ends =
          i == count || bit(x0 + i * dx, y0 + i * dy) != bit(x0 + start * dx, y0 + start * dy);
      if (!ends) continue;
      const std::int32_t ax = x0 + start * dx, ay = y0 + start * dy;
      const std::int32_t n = i - start;
      const CRect piece{ax, ay, dx != 0 ? ax + n : ax + 1, dy != 0 ? ay + n : ay + 1};
      port.FillRect(piece, bit(ax, ay) ? 0xFF000000 : 0xFFFFFFFF);
      start = i;
    }
  };
  const std::int32_t w = std::int32_t(r.Width()), h = std::int32_t(r.Height());
  run(r.left, r.top, 1, 0, w);
  run(r.left, r.bottom - 1, 1, 0, w);
  run(r.left, r.top, 0, 1, h);
  run(r.right - 1, r.top, 0, 1, h);
}

}  // namespace Tarsa
