#include "framework/controls/CScrollBar.h"

#include <algorithm>
#include <cmath>
#include <functional>

#include "framework/process/CKeyCodes.h"
#include "framework/process/CProcess.h"
#include "framework/process/CTimer.h"

namespace Tarsa {

CScrollBar::CScrollBar(CObjID id, CView* parent, const CRect& frame, EOrientation orientation,
                       CView* scrolled, std::uint32_t options, std::uint32_t binding)
    : CControl(id, parent, frame, options, binding),
      orientation_(orientation),
      scrolled_(scrolled) {}

void CScrollBar::SetScrolled(CView* scrolled) {
  scrolled_ = scrolled;
  Invalidate();
}

std::int32_t CScrollBar::Position() const {
  if (scrolled_ == nullptr) return 0;
  const CRect image = scrolled_->Image();
  const CRect limits = scrolled_->Limits();
  return Vertical() ? image.top - limits.top : image.left - limits.left;
}

std::int32_t CScrollBar::Maximum() const {
  if (scrolled_ == nullptr) return 0;
  const CRect image = scrolled_->Image();
  const CRect limits = scrolled_->Limits();
  return std::int32_t(std::max<std::int64_t>(
      0, Vertical() ? limits.Height() - image.Height() : limits.Width() - image.Width()));
}

std::int32_t CScrollBar::Page() const {
  if (scrolled_ == nullptr) return 0;
  const CSize size = scrolled_->Size();
  return std::max(1, (Vertical() ? size.height : size.width) - lineStep_);
}

void CScrollBar::ScrollToPosition(std::int32_t position) {
  if (scrolled_ == nullptr) return;
  const std::int32_t before = Position();
  const std::int32_t to = std::clamp(position, 0, Maximum());
  const CRect limits = scrolled_->Limits();
  const CRect image = scrolled_->Image();
  scrolled_->ScrollTo(Vertical() ? CPoint{image.left, limits.top + to}
                                 : CPoint{limits.left + to, image.top});
  if (Position() != before) {
    Invalidate();
    Notify(CNumber{double(Position())});
  }
}

std::int32_t CScrollBar::TrackStart() const {
  const CRect image = Image();
  return (Vertical() ? image.top : image.left) + kThickness;
}

std::int32_t CScrollBar::TrackEnd() const {
  const CRect image = Image();
  return (Vertical() ? image.bottom : image.right) - kThickness;
}

std::int32_t CScrollBar::ThumbLength() const {
  const std::int32_t track = std::max(0, TrackEnd() - TrackStart());
  const std::int32_t maximum = Maximum();
  if (scrolled_ == nullptr || maximum <= 0) return track;
  const CSize size = scrolled_->Size();
  const double shown = Vertical() ? size.height : size.width;
  const std::int32_t length = std::int32_t(std::lround(track * shown / (shown + maximum)));
  return std::min(track, std::max(kMinThumb, length));
}

std::int32_t CScrollBar::ThumbStart() const {
  const std::int32_t maximum = Maximum();
  const std::int32_t travel = TrackEnd() - TrackStart() - ThumbLength();
  if (maximum <= 0 || travel <= 0) return TrackStart();
  return TrackStart() + std::int32_t(std::lround(double(Position()) * travel / maximum));
}

void CScrollBar::DragThumb(std::int32_t grip) {
  CProcess* process = CProcess::Current();
  if (process == nullptr) return;

  // The thumb keeps the grip where the press took it; the view's position
  // is the thumb's share of its travel.
  class Drag : public CMouseTracking {
   public:
    Drag(CScrollBar& bar, std::int32_t grip) : bar_(bar), grip_(grip) {}
    std::uint32_t Button() const override { return kButton_Left; }
    void Track(const CNativeEvent& event) override {
      const std::int32_t at = bar_.Along(bar_.WindowToLocal({event.where.x, event.where.y}));
      const std::int32_t travel = bar_.TrackEnd() - bar_.TrackStart() - bar_.ThumbLength();
      if (travel <= 0) return;
      const double share = double(at - grip_ - bar_.TrackStart()) / travel;
      bar_.ScrollToPosition(std::int32_t(std::lround(share * bar_.Maximum())));
      bar_.Redraw();
    }
    void OnEnd(const CNativeEvent& /*event*/) override {}

   private:
    CScrollBar& bar_;
    std::int32_t grip_;
  };

  pressedPart_ = 3;
  Redraw();
  Drag drag(*this, grip);
  process->PumpWhileTracking(drag);
  pressedPart_ = 0;
  Invalidate();
}

void CScrollBar::Click(CMouseMessage& message) {
  if (!IsLive() || message.button != kButton_Left || Maximum() <= 0) return;
  const std::int32_t at = Along(message.where);
  const std::int32_t thumb = ThumbStart();
  if (at >= TrackStart() && at < TrackEnd() && at >= thumb && at < thumb + ThumbLength()) {
    DragThumb(at - thumb);
    return;
  }
  // An arrow steps a line and the track pages towards the pointer, once at
  // the press and then again and again while the button is held there.
  const bool arrow = at < TrackStart() || at >= TrackEnd();
  const bool back = arrow ? at < TrackStart() : at < thumb;
  pressedPart_ = arrow ? (back ? 1 : 2) : 0;
  const auto step = [this, arrow, back](std::int32_t pointer) {
    if (!arrow) {
      // The track stops paging once the thumb has come under the pointer.
      const std::int32_t start = ThumbStart();
      if (back ? pointer >= start : pointer < start + ThumbLength()) return;
    }
    const std::int32_t by = arrow ? lineStep_ : Page();
    ScrollToPosition(Position() + (back ? -by : by));
  };
  step(at);
  Redraw();
  CProcess* process = CProcess::Current();
  if (process == nullptr || message.clicks == 0) {
    pressedPart_ = 0;
    return;
  }

  class Hold : public CMouseTracking, public CTimer {
   public:
    Hold(CScrollBar& bar, std::function<void(std::int32_t)> step, std::int32_t at)
        : CTimer(0.05), bar_(bar), step_(std::move(step)), at_(at) {}
    std::uint32_t Button() const override { return kButton_Left; }
    void Track(const CNativeEvent& event) override {
      const CPoint p = bar_.WindowToLocal({event.where.x, event.where.y});
      inside_ = bar_.HitTest(p);
      at_ = bar_.Along(p);
    }
    void OnEnd(const CNativeEvent& /*event*/) override {}
    void Fire(double /*time*/, double elapsed) override {
      held_ += elapsed;
      // A pause first, so that a click steps once.
      if (held_ < 0.35 || !inside_) return;
      step_(at_);
      bar_.Redraw();
    }

   private:
    CScrollBar& bar_;
    std::function<void(std::int32_t)> step_;
    std::int32_t at_;
    bool inside_ = true;
    double held_ = 0.0;
  };

  Hold hold(*this, step, at);
  hold.Start();
  process->PumpWhileTracking(hold);
  hold.Stop();
  pressedPart_ = 0;
  Invalidate();
}

void CScrollBar::MouseWheel(CMouseMessage& message) {
  if (!IsLive() || Maximum() <= 0) return;
  ScrollToPosition(Position() - message.wheel * 3 * lineStep_);
  message.SetHandled();
}

void CScrollBar::HandleMessage(CMessage& message) {
  std::int32_t to = Position();
  switch (KeyDownCode(message)) {
    case kKey_Up:
    case kKey_Left:
      to -= lineStep_;
      break;
    case kKey_Down:
    case kKey_Right:
      to += lineStep_;
      break;
    case kKey_PageUp:
      to -= Page();
      break;
    case kKey_PageDown:
      to += Page();
      break;
    case kKey_Home:
      to = 0;
      break;
    case kKey_End:
      to = Maximum();
      break;
    default:
      CControl::HandleMessage(message);
      return;
  }
  if (IsLive()) ScrollToPosition(to);
  message.SetHandled();
}

void CScrollBar::Draw(CPort& port) {
  const CRect image = Image();
  const bool on = IsEnabled() && Maximum() > 0;
  port.FillRect(image, 0xFFE4E4E4);
  const std::uint32_t arrow = on ? 0xFF5A5A5A : Skin::kEdgeDisabled;
  // The arrows, each in a square at its end.
  for (int end = 0; end < 2; ++end) {
    const std::int32_t start = end == 0 ? TrackStart() - kThickness : TrackEnd();
    const CRect square = Vertical() ? CRect{image.left, start, image.right, start + kThickness}
                                    : CRect{start, image.top, start + kThickness, image.bottom};
    if (pressedPart_ == end + 1) port.FillRect(square, Skin::kFacePressed);
    const double cx = square.left + square.Width() / 2.0;
    const double cy = square.top + square.Height() / 2.0;
    const double s = end == 0 ? -1.0 : 1.0;
    if (Vertical()) {
      const CPointF tri[] = {{cx - 4, cy - 2 * s}, {cx + 4, cy - 2 * s}, {cx, cy + 2.5 * s}};
      port.FillPolygon(tri, arrow);
    } else {
      const CPointF tri[] = {{cx - 2 * s, cy - 4}, {cx - 2 * s, cy + 4}, {cx + 2.5 * s, cy}};
      port.FillPolygon(tri, arrow);
    }
  }
  if (!on) return;
  const std::int32_t thumb = ThumbStart();
  const std::int32_t length = ThumbLength();
  const CRect knob = Vertical() ? CRect{image.left + 3, thumb, image.right - 3, thumb + length}
                                : CRect{thumb, image.top + 3, thumb + length, image.bottom - 3};
  port.FillRoundRect(knob, 4.0,
                     pressedPart_ == 3 ? 0xFF6E6E6E
                     : Hovered()       ? 0xFF8E8E8E
                                       : 0xFFA8A8A8);
  if (IsTarget()) port.FrameRoundRect(knob, 4.0, Skin::kFocus, 1.5);
}

}  // namespace Tarsa
