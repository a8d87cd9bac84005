#include "framework/controls/CTabs.h"

#include <algorithm>

#include "framework/process/CKeyCodes.h"
#include "framework/process/CMessageNames.h"
#include "framework/view/CNativeWindow.h"

namespace Tarsa {

CTabs::CTabs(CObjID id, CView* parent, const CRect& frame, std::uint32_t options,
             std::uint32_t binding)
    : CControl(id, parent, frame, options, binding) {}

CView* CTabs::AddTab(const std::string& label, CObjID paneId) {
  const CSize size = Size();
  auto* pane = new CView(paneId, this, CRect{1, kRowHeight + 1, size.width - 1, size.height - 1},
                         kView_NoOptions, kBind_Sizeable);
  labels_.push_back(ShownText(label));
  panes_.push_back(pane);
  auto measure = CreateMeasuringPort();
  widths_.push_back(
      std::max(64, measure->MeasureText(labels_.back(), EFont::kUIMedium).width + 28));
  if (chosen_ < 0) {
    chosen_ = 0;
  } else {
    pane->SetShown(false);
  }
  Invalidate();
  return pane;
}

CRect CTabs::TabRect(int index) const {
  std::int32_t left = Image().left + 6;
  for (int i = 0; i < index; ++i) left += widths_[std::size_t(i)] - 1;
  return CRect{left, Image().top, left + widths_[std::size_t(index)], Image().top + kRowHeight + 1};
}

void CTabs::SetChosen(int index) {
  if (panes_.empty()) return;
  index = std::clamp(index, 0, Count() - 1);
  if (index == chosen_) return;
  // A focus inside the pane going away comes to the tabs.
  const auto* target = dynamic_cast<const CView*>(Target());
  bool focusInside = false;
  for (const CView* view = target; view != nullptr; view = view->Parent()) {
    if (view == panes_[std::size_t(chosen_)]) focusInside = true;
  }
  panes_[std::size_t(chosen_)]->SetShown(false);
  chosen_ = index;
  panes_[std::size_t(chosen_)]->SetShown(true);
  if (focusInside && IsLive()) BecomeTarget(true);
  Invalidate();
}

void CTabs::Choose(int index) {
  const int before = chosen_;
  SetChosen(index);
  if (chosen_ != before) Notify(CNumber{double(chosen_)});
}

void CTabs::Click(CMouseMessage& message) {
  if (!IsLive() || message.button != kButton_Left) return;
  for (int i = 0; i < Count(); ++i) {
    const CRect tab = TabRect(i);
    if (message.where.x >= tab.left && message.where.x < tab.right && message.where.y >= tab.top &&
        message.where.y < tab.bottom) {
      Choose(i);
      return;
    }
  }
}

void CTabs::HandleMessage(CMessage& message) {
  const std::uint32_t key = KeyDownCode(message);
  const bool control = (message.modifiers & kModifier_Control) != 0;
  const bool shift = (message.modifiers & kModifier_Shift) != 0;
  int to = -1;
  if (key == kKey_Tab && control && Count() > 0) {
    to = (chosen_ + (shift ? Count() - 1 : 1)) % Count();
  } else if ((key == kKey_Left || key == kKey_Right) && IsTarget()) {
    to = std::clamp(chosen_ + (key == kKey_Left ? -1 : 1), 0, Count() - 1);
  }
  if (to >= 0) {
    if (IsLive()) Choose(to);
    message.SetHandled();
    return;
  }
  CControl::HandleMessage(message);
}

void CTabs::Draw(CPort& port) {
  const CRect image = Image();
  const CRect body{image.left, image.top + kRowHeight, image.right, image.bottom};
  port.FillRect(body, 0xFFF2F2F2);
  port.FrameRect(body, Skin::kEdge);
  const bool on = IsEnabled();
  for (int i = 0; i < Count(); ++i) {
    if (i == chosen_) continue;
    const CRect tab = TabRect(i);
    const CRect back{tab.left, tab.top + 3, tab.right, tab.bottom - 1};
    port.FillRect(back, 0xFFE0E0E0);
    port.FrameRect(back, Skin::kEdge);
    port.DrawText(labels_[std::size_t(i)], back, EFont::kUIMedium, TextColor(), EAlign::kCenter);
  }
  if (chosen_ >= 0) {
    // The chosen tab stands taller and opens into the pane beneath it.
    const CRect tab = TabRect(chosen_);
    port.FillRect(tab, 0xFFF2F2F2);
    port.FrameRect(CRect{tab.left, tab.top, tab.right, tab.bottom}, Skin::kEdge);
    port.FillRect(CRect{tab.left + 1, tab.bottom - 2, tab.right - 1, tab.bottom}, 0xFFF2F2F2);
    port.FillRect(CRect{tab.left + 1, tab.top, tab.right - 1, tab.top + 2},
                  on ? Skin::kAccent : Skin::kEdgeDisabled);
    const CRect text{tab.left, tab.top + 2, tab.right, tab.bottom - 1};
    port.DrawText(labels_[std::size_t(chosen_)], text, EFont::kUIBold, TextColor(),
                  EAlign::kCenter);
    if (IsTarget()) {
      port.FocusRect(CRect{tab.left + 3, tab.top + 4, tab.right - 3, tab.bottom - 3}, Skin::kFocus);
    }
  }
}

}  // namespace Tarsa
