#include "framework/controls/CPushButton.h"

#include "framework/process/CKeyCodes.h"
#include "framework/view/CWindow.h"

namespace Tarsa {

CPushButton::CPushButton(CObjID id, CView* parent, const CRect& frame, const std::string& label,
                         std::uint32_t options, std::uint32_t binding)
    : CControl(id, parent, frame, options, binding) {
  SetLabel(label);
}

bool CPushButton::IsDefault() const {
  const CWindow* window = Window();
  return window != nullptr && !GetId().IsNull() && window->DefaultView() == GetId();
}

void CPushButton::Press() {
  Notify(EButtonValue::kOn);
  if (endsModal_) {
    if (CWindow* window = Window()) window->EndModal(GetId());
  }
}

void CPushButton::Click(CMouseMessage& message) {
  if (IsLive() && TrackPress(message)) Press();
}

void CPushButton::HandleMessage(CMessage& message) {
  if (KeyDownCode(message) == kKey_Space && IsLive()) {
    Press();
    message.SetHandled();
    return;
  }
  CControl::HandleMessage(message);
}

void CPushButton::Draw(CPort& port) {
  const CRect box = Image();
  const bool on = IsEnabled();
  const std::uint32_t face = !on         ? Skin::kFace
                             : Pressed() ? Skin::kFacePressed
                             : Hovered() ? Skin::kFaceHover
                                         : Skin::kFace;
  port.FillRoundRect(box, 4.0, face);
  const bool accent = on && IsDefault();
  port.FrameRoundRect(box, 4.0,
                      !on      ? Skin::kEdgeDisabled
                      : accent ? Skin::kAccent
                               : Skin::kEdge,
                      accent ? 2.0 : 1.0);
  DrawFocus(port, CRect{box.left + 2, box.top + 2, box.right - 2, box.bottom - 2});
  port.DrawText(Label(), box, EFont::kUIMedium, TextColor(), EAlign::kCenter, EAlign::kCenter);
}

}  // namespace Tarsa
