#include "framework/controls/CProgressBar.h"

#include <algorithm>
#include <cmath>

#include "framework/controls/CControl.h"
#include "framework/process/CProcess.h"
#include "framework/process/CTimer.h"

namespace Tarsa {

class CProgressBar::Sweep : public CTimer {
 public:
  explicit Sweep(CProgressBar& bar) : CTimer(1.0 / 15.0), bar_(bar) {}
  void Fire(double /*time*/, double elapsed) override {
    if (!bar_.IsVisible()) return;
    // Once along the track in 1.5 s.
    bar_.phase_ = std::fmod(bar_.phase_ + elapsed / 1.5, 1.0);
    bar_.Invalidate();
  }

 private:
  CProgressBar& bar_;
};

CProgressBar::CProgressBar(CObjID id, CView* parent, const CRect& frame, std::uint32_t binding)
    : CPane(id, parent, frame, kView_NoOptions, binding) {}

CProgressBar::~CProgressBar() = default;

void CProgressBar::SetValue(double value) {
  if (!std::isfinite(value)) value = 0.0;
  const std::int32_t before = FillRight();
  value_ = std::clamp(value, 0.0, 1.0);
  if (FillRight() != before) Invalidate();
}

void CProgressBar::SetIndeterminate(bool indeterminate) {
  if (indeterminate == indeterminate_) return;
  indeterminate_ = indeterminate;
  if (indeterminate_ && CProcess::Current() != nullptr) {
    sweep_ = std::make_unique<Sweep>(*this);
    sweep_->Start();
  } else {
    sweep_.reset();
  }
  Invalidate();
}

std::int32_t CProgressBar::FillRight() const {
  const CRect image = Image();
  return image.left + std::int32_t(std::lround(value_ * double(image.Width())));
}

void CProgressBar::Draw(CPort& port) {
  const CRect image = Image();
  const std::int32_t middle = image.top + std::int32_t(image.Height()) / 2;
  const CRect track{image.left, middle - 4, image.right, middle + 4};
  const std::uint32_t fill = IsEnabled() ? Skin::kAccent : Skin::kEdgeDisabled;
  port.FillRoundRect(track, 4.0, Skin::kWell);
  if (indeterminate_) {
    // A block a quarter of the track wide, coming in at the left and going
    // out at the right.
    port.Save();
    port.Clip(track);
    const double width = double(track.Width()) / 4;
    const double left = track.left - width + phase_ * (double(track.Width()) + width);
    port.FillRoundRect(
        CRect{std::int32_t(left), track.top, std::int32_t(left + width), track.bottom}, 4.0, fill);
    port.Restore();
  } else if (FillRight() > track.left) {
    port.FillRoundRect(
        CRect{track.left, track.top, std::max(FillRight(), track.left + 8), track.bottom}, 4.0,
        fill);
  }
  port.FrameRoundRect(track, 4.0, 0x20000000);
}

}  // namespace Tarsa
