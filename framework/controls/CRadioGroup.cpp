#include "framework/controls/CRadioGroup.h"

#include <algorithm>

#include "framework/process/CKeyCodes.h"

namespace Tarsa {

namespace {
constexpr std::int32_t kDot = 14;
}  // namespace

CRadioGroup::CRadioGroup(CObjID id, CView* parent, const CRect& frame,
                         const std::vector<std::string>& labels, int chosen, std::uint32_t options,
                         std::uint32_t binding)
    : CControl(id, parent, frame, options, binding) {
  for (const std::string& label : labels) labels_.push_back(ShownText(label));
  SetChosen(chosen);
}

void CRadioGroup::SetChosen(int index) {
  chosen_ = labels_.empty() ? -1 : std::clamp(index, 0, Count() - 1);
  Invalidate();
}

void CRadioGroup::Choose(int index) {
  if (labels_.empty()) return;
  index = std::clamp(index, 0, Count() - 1);
  if (index == chosen_) return;
  SetChosen(index);
  Notify(CNumber{double(chosen_)});
}

CRect CRadioGroup::RowRect(int index) const {
  const CRect image = Image();
  const std::int32_t top = image.top + index * kRowHeight;
  return CRect{image.left, top, image.right, top + kRowHeight};
}

void CRadioGroup::Click(CMouseMessage& message) {
  if (!IsLive()) return;
  const int row = (message.where.y - Image().top) / kRowHeight;
  if (row < 0 || row >= Count()) return;
  pressedRow_ = row;
  // Released over the group chooses the row pressed, as a button would.
  const bool released = TrackPress(message);
  pressedRow_ = -1;
  Invalidate();
  if (released) Choose(row);
}

void CRadioGroup::HandleMessage(CMessage& message) {
  switch (KeyDownCode(message)) {
    case kKey_Up:
    case kKey_Left:
      if (IsLive()) Choose(chosen_ - 1);
      message.SetHandled();
      return;
    case kKey_Down:
    case kKey_Right:
      if (IsLive()) Choose(chosen_ + 1);
      message.SetHandled();
      return;
    default:
      break;
  }
  CControl::HandleMessage(message);
}

void CRadioGroup::Draw(CPort& port) {
  const bool on = IsEnabled();
  for (int i = 0; i < Count(); ++i) {
    const CRect row = RowRect(i);
    const std::int32_t top = row.top + (kRowHeight - kDot) / 2;
    const CRect dot{row.left + 1, top, row.left + 1 + kDot, top + kDot};
    const bool chosen = i == chosen_;
    port.FillEllipse(dot, chosen && on                    ? Skin::kAccent
                          : i == pressedRow_ && Pressed() ? Skin::kFacePressed
                                                          : Skin::kField);
    port.FrameEllipse(dot, chosen && on ? Skin::kAccent : on ? Skin::kEdge : Skin::kEdgeDisabled);
    if (chosen) {
      port.FillEllipse(CRect{dot.left + 4, dot.top + 4, dot.right - 4, dot.bottom - 4},
                       on ? 0xFFFFFFFF : Skin::kTextDisabled);
    }
    const CRect text{dot.right + 6, row.top, row.right, row.bottom};
    port.DrawText(labels_[i], text, EFont::kUIMedium, TextColor());
    if (chosen && IsTarget()) {
      const CSize size = port.MeasureText(labels_[i], EFont::kUIMedium);
      port.FocusRect(CRect{text.left - 2, row.top + 1,
                           std::min(row.right, text.left + size.width + 3), row.bottom - 1},
                     Skin::kFocus);
    }
  }
}

}  // namespace Tarsa
