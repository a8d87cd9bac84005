#include "framework/controls/CCheckButton.h"

#include "framework/process/CKeyCodes.h"

namespace Tarsa {

namespace {
constexpr std::int32_t kBox = 14;
}  // namespace

CCheckButton::CCheckButton(CObjID id, CView* parent, const CRect& frame, const std::string& label,
                           bool checked, std::uint32_t options, std::uint32_t binding)
    : CControl(id, parent, frame, options, binding), checked_(checked) {
  SetLabel(label);
}

void CCheckButton::SetChecked(bool checked) {
  if (checked == checked_) return;
  checked_ = checked;
  Invalidate();
}

void CCheckButton::Toggle() {
  SetChecked(!checked_);
  Notify(checked_ ? EButtonValue::kOn : EButtonValue::kOff);
}

void CCheckButton::Click(CMouseMessage& message) {
  if (IsLive() && TrackPress(message)) Toggle();
}

void CCheckButton::HandleMessage(CMessage& message) {
  if (KeyDownCode(message) == kKey_Space && IsLive()) {
    Toggle();
    message.SetHandled();
    return;
  }
  CControl::HandleMessage(message);
}

void CCheckButton::Draw(CPort& port) {
  const CRect image = Image();
  const std::int32_t top = image.top + (std::int32_t(image.Height()) - kBox) / 2;
  const CRect box{image.left + 1, top, image.left + 1 + kBox, top + kBox};
  const bool on = IsEnabled();
  port.FillRoundRect(box, 3.0,
                     checked_ && on ? Skin::kAccent
                     : Pressed()    ? Skin::kFacePressed
                                    : Skin::kField);
  port.FrameRoundRect(box, 3.0,
                      checked_ && on ? Skin::kAccent
                      : on           ? Skin::kEdge
                                     : Skin::kEdgeDisabled);
  if (checked_) {
    const std::uint32_t mark = on ? 0xFFFFFFFF : Skin::kTextDisabled;
    const double x = box.left, y = box.top;
    port.Line({x + 3.5, y + 7.5}, {x + 6, y + 10}, mark, 2.0);
    port.Line({x + 6, y + 10}, {x + 11, y + 4}, mark, 2.0);
  }
  const CRect text{box.right + 6, image.top, image.right, image.bottom};
  port.DrawText(Label(), text, EFont::kUIMedium, TextColor());
  if (IsTarget()) {
    const CSize size = port.MeasureText(Label(), EFont::kUIMedium);
    port.FocusRect(CRect{text.left - 2, image.top,
                         std::min(image.right, text.left + size.width + 3), image.bottom},
                   Skin::kFocus);
  }
}

}  // namespace Tarsa
