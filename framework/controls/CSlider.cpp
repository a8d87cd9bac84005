#include "framework/controls/CSlider.h"

#include <algorithm>
#include <cmath>

#include "framework/process/CKeyCodes.h"
#include "framework/process/CProcess.h"

namespace Tarsa {

CSlider::CSlider(CObjID id, CView* parent, const CRect& frame, double value, double minimum,
                 double maximum, std::int32_t positions, std::uint32_t options,
                 std::uint32_t binding)
    : CControl(id, parent, frame, options, binding),
      value_(value),
      minimum_(std::min(minimum, maximum)),
      maximum_(std::max(minimum, maximum)),
      positions_(std::max(2, positions)) {
  SetValue(value);
}

double CSlider::PositionStep() const { return (maximum_ - minimum_) / (positions_ - 1); }

double CSlider::Snap(double value) const {
  if (!std::isfinite(value)) value = minimum_;
  const double step = PositionStep();
  if (step <= 0.0) return minimum_;
  const double index = std::round((std::clamp(value, minimum_, maximum_) - minimum_) / step);
  return std::min(maximum_, minimum_ + index * step);
}

void CSlider::SetValue(double value) {
  value_ = Snap(value);
  Invalidate();
}

void CSlider::SetRange(double minimum, double maximum) {
  minimum_ = std::min(minimum, maximum);
  maximum_ = std::max(minimum, maximum);
  SetValue(value_);
}

void CSlider::Change(double value, std::int32_t change) {
  const double before = value_;
  SetValue(value);
  if (value_ != before || change != CValueMessage::kChange_Tracking) {
    Notify(CNumber{value_}, change);
  }
}

std::int32_t CSlider::TrackLeft() const { return Image().left + kThumbRadius + 1; }

std::int32_t CSlider::TrackRight() const { return Image().right - kThumbRadius - 1; }

double CSlider::ValueAt(std::int32_t x) const {
  const std::int32_t span = std::max(1, TrackRight() - TrackLeft());
  return Snap(minimum_ + (maximum_ - minimum_) * double(x - TrackLeft()) / span);
}

std::int32_t CSlider::ThumbCenter() const {
  const double share = maximum_ > minimum_ ? (value_ - minimum_) / (maximum_ - minimum_) : 0.0;
  return TrackLeft() + std::int32_t(std::lround(share * (TrackRight() - TrackLeft())));
}

void CSlider::Click(CMouseMessage& message) {
  CProcess* process = CProcess::Current();
  if (!IsLive() || message.button != kButton_Left || process == nullptr) return;

  // A press on the thumb keeps the grip where it took it; one on the track
  // brings the thumb under the pointer first.
  class Drag : public CMouseTracking {
   public:
    Drag(CSlider& slider, std::int32_t grip) : slider_(slider), grip_(grip) {}
    std::uint32_t Button() const override { return kButton_Left; }
    void Track(const CNativeEvent& event) override {
      const CPoint at = slider_.WindowToLocal({event.where.x, event.where.y});
      slider_.Change(slider_.ValueAt(at.x - grip_), CValueMessage::kChange_Tracking);
      slider_.Redraw();
    }
    void OnEnd(const CNativeEvent& /*event*/) override {}

   private:
    CSlider& slider_;
    std::int32_t grip_;
  };

  std::int32_t grip = message.where.x - ThumbCenter();
  if (std::abs(grip) > kThumbRadius) {
    grip = 0;
    Change(ValueAt(message.where.x), CValueMessage::kChange_Tracking);
  }
  dragging_ = true;
  Redraw();
  Drag drag(*this, grip);
  process->PumpWhileTracking(drag);
  dragging_ = false;
  Notify(CNumber{value_}, CValueMessage::kChange_EndDrag);
  Invalidate();
}

void CSlider::MouseWheel(CMouseMessage& message) {
  if (!IsLive()) return;
  Change(value_ + message.wheel * PositionStep(), CValueMessage::kChange_Set);
  message.SetHandled();
}

void CSlider::HandleMessage(CMessage& message) {
  const double page = std::max(PositionStep(), (maximum_ - minimum_) / 10.0);
  double to = value_;
  switch (KeyDownCode(message)) {
    case kKey_Left:
    case kKey_Down:
      to = value_ - PositionStep();
      break;
    case kKey_Right:
    case kKey_Up:
      to = value_ + PositionStep();
      break;
    case kKey_PageDown:
      to = value_ - page;
      break;
    case kKey_PageUp:
      to = value_ + page;
      break;
    case kKey_Home:
      to = minimum_;
      break;
    case kKey_End:
      to = maximum_;
      break;
    default:
      CControl::HandleMessage(message);
      return;
  }
  if (IsLive()) Change(to, CValueMessage::kChange_Set);
  message.SetHandled();
}

void CSlider::Draw(CPort& port) {
  const CRect image = Image();
  const std::int32_t middle = image.top + std::int32_t(image.Height()) / 2;
  const bool on = IsEnabled();
  const CRect track{TrackLeft(), middle - 2, TrackRight(), middle + 2};
  port.FillRoundRect(track, 2.0, Skin::kWell);
  const std::int32_t thumb = ThumbCenter();
  port.FillRoundRect(CRect{TrackLeft(), middle - 2, thumb, middle + 2}, 2.0,
                     on ? Skin::kAccent : Skin::kEdgeDisabled);
  const CRect knob{thumb - kThumbRadius, middle - kThumbRadius, thumb + kThumbRadius + 1,
                   middle + kThumbRadius + 1};
  port.FillEllipse(knob, dragging_   ? Skin::kFacePressed
                         : Hovered() ? Skin::kFaceHover
                                     : Skin::kFace);
  port.FrameEllipse(knob,
                    IsTarget() ? Skin::kFocus
                    : on       ? Skin::kEdge
                               : Skin::kEdgeDisabled,
                    IsTarget() ? 2.0 : 1.0);
}

}  // namespace Tarsa
