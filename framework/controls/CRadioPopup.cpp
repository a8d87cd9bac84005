#include "framework/controls/CRadioPopup.h"

#include <algorithm>

#include "framework/controls/CPopupList.h"
#include "framework/process/CKeyCodes.h"
#include "framework/view/CWindow.h"

namespace Tarsa {

CRadioPopup::CRadioPopup(CObjID id, CView* parent, const CRect& frame,
                         const std::vector<std::string>& items, int chosen, std::uint32_t options,
                         std::uint32_t binding)
    : CControl(id, parent, frame, options, binding) {
  for (const std::string& item : items) items_.push_back(ShownText(item));
  SetChosen(chosen);
}

CRadioPopup::~CRadioPopup() {
  if (CWindow* window = Window()) {
    if (CPopupList* list = CPopupList::OpenIn(*window)) list->Forget(this);
  }
}

void CRadioPopup::SetChosen(int index) {
  chosen_ = items_.empty() ? -1 : std::clamp(index, 0, int(items_.size()) - 1);
  Invalidate();
}

void CRadioPopup::Choose(int index) {
  if (index < 0 || index == chosen_) return;
  SetChosen(index);
  Notify(CNumber{double(chosen_)});
}

void CRadioPopup::OpenList() {
  CWindow* window = Window();
  if (window == nullptr || !IsLive() || items_.empty()) return;
  CPopupList::For(*window).Open(this, LocalToWindow(Image()), items_, chosen_,
                                [this](int index) { Choose(index); });
}

void CRadioPopup::Click(CMouseMessage& message) {
  if (message.button == kButton_Left) OpenList();
}

void CRadioPopup::MouseWheel(CMouseMessage& message) {
  if (!IsLive()) return;
  Choose(std::clamp(chosen_ - message.wheel, 0, int(items_.size()) - 1));
  message.SetHandled();
}

void CRadioPopup::HandleMessage(CMessage& message) {
  switch (KeyDownCode(message)) {
    case kKey_Space:
    case kKey_Down:
    case kKey_Up:
      OpenList();
      message.SetHandled();
      return;
    default:
      break;
  }
  CControl::HandleMessage(message);
}

void CRadioPopup::Draw(CPort& port) {
  const CRect box = Image();
  const bool on = IsEnabled();
  port.FillRoundRect(box, 4.0, !on ? Skin::kFace : Hovered() ? Skin::kFaceHover : Skin::kFace);
  port.FrameRoundRect(box, 4.0, on ? Skin::kEdge : Skin::kEdgeDisabled);
  DrawFocus(port, CRect{box.left + 2, box.top + 2, box.right - 2, box.bottom - 2});
  const std::string shown = chosen_ >= 0 ? items_[chosen_] : std::string();
  port.DrawText(shown, CRect{box.left + 8, box.top, box.right - 22, box.bottom}, EFont::kUIMedium,
                TextColor());
  // The two small arrows of a popup: it opens both ways.
  const double x = box.right - 12.0;
  const double y = box.top + box.Height() / 2.0;
  const std::uint32_t arrow = on ? Skin::kText : Skin::kTextDisabled;
  const CPointF up[] = {{x - 3.5, y - 1.5}, {x + 3.5, y - 1.5}, {x, y - 5.5}};
  const CPointF down[] = {{x - 3.5, y + 1.5}, {x + 3.5, y + 1.5}, {x, y + 5.5}};
  port.FillPolygon(up, arrow);
  port.FillPolygon(down, arrow);
}

}  // namespace Tarsa
