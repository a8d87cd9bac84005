#include "framework/controls/CListBox.h"

#include <algorithm>

#include "framework/controls/CScrollBar.h"
#include "framework/process/CKeyCodes.h"

namespace Tarsa {

namespace {
// The rows' distance from the list's edge: room for a two-pixel focus line.
constexpr std::int32_t kInset = 2;
}  // namespace

// The scrolling view the rows lie in; the list does the drawing and the
// choosing.
class CListBox::RowArea : public CView {
 public:
  RowArea(CListBox& list, const CRect& frame)
      : CView(CObjID(), &list, frame, kView_NoOptions,
              kBind_Sizeable | kBind_YScrollable | kBind_LimitTop),
        list_(list) {}

  void Draw(CPort& port) override { list_.DrawRows(port, Image()); }
  void Click(CMouseMessage& message) override {
    if (!list_.IsLive()) return;
    // The list takes the focus, not the rows' view.
    if (list_.WantsTarget() && !list_.IsTarget()) list_.BecomeTarget(false);
    list_.RowClicked(message.where.y / kRowHeight, message.clicks);
  }
  // Whole rows, three a notch, so that the top row is never cut.
  void MouseWheel(CMouseMessage& message) override {
    if (Content().Height() <= Size().height) return CView::MouseWheel(message);
    ScrollBy(0, -message.wheel * 3 * kRowHeight);
    message.SetHandled();
  }
  bool MultiClick(CMouseMessage& message) override {
    Click(message);
    return true;
  }

 private:
  CListBox& list_;
};

CListBox::CListBox(CObjID id, CView* parent, const CRect& frame,
                   const std::vector<std::string>& rows, int selected, std::uint32_t options,
                   std::uint32_t binding)
    : CControl(id, parent, frame, options, binding), rows_(rows) {
  const CSize size = Size();
  rows_view_ = new RowArea(*this, CRect{kInset, kInset, size.width - kInset, size.height - kInset});
  bar_ = new CScrollBar(
      CObjID(), this,
      CRect{size.width - 1 - CScrollBar::kThickness, 1, size.width - 1, size.height - 1},
      CScrollBar::EOrientation::kVertical, rows_view_);
  bar_->SetLineStep(kRowHeight);
  Layout();
  SetSelected(selected);
}

void CListBox::Layout() {
  const CSize size = Size();
  const std::int32_t content = Count() * kRowHeight;
  const bool needsBar = content > size.height - 2 * kInset;
  bar_->SetShown(needsBar);
  const std::int32_t right = size.width - kInset - (needsBar ? CScrollBar::kThickness : 0);
  rows_view_->SetFrame(CRect{kInset, kInset, right, size.height - kInset});
  rows_view_->SetContent(CRect{0, 0, right - kInset, content});
}

void CListBox::SetRows(const std::vector<std::string>& rows) {
  rows_ = rows;
  selected_ = -1;
  Layout();
  rows_view_->ScrollTo({0, 0});
  Invalidate();
}

int CListBox::FirstVisible() const { return rows_view_->Image().top / kRowHeight; }

int CListBox::VisibleRows() const { return std::max(1, rows_view_->Size().height / kRowHeight); }

void CListBox::SetSelected(int index) {
  selected_ = index < 0 || rows_.empty() ? -1 : std::min(index, Count() - 1);
  if (selected_ >= 0) {
    // Scroll only as far as brings the row in sight.
    const CRect image = rows_view_->Image();
    const std::int32_t top = selected_ * kRowHeight;
    if (top < image.top) {
      rows_view_->ScrollTo({0, top});
    } else if (top + kRowHeight > image.bottom) {
      rows_view_->ScrollTo({0, top + kRowHeight - std::int32_t(image.Height())});
    }
  }
  Invalidate();
}

void CListBox::Select(int index, std::int32_t change) {
  if (rows_.empty()) return;
  index = std::clamp(index, 0, Count() - 1);
  const bool changed = index != selected_;
  SetSelected(index);
  if (changed) Notify(CNumber{double(selected_)});
  if (change == kChange_Activate) Notify(CNumber{double(selected_)}, kChange_Activate);
}

void CListBox::RowClicked(int index, std::int32_t clicks) {
  if (index < 0 || index >= Count()) return;
  Select(index, clicks >= 2 ? kChange_Activate : CValueMessage::kChange_Set);
}

void CListBox::HandleMessage(CMessage& message) {
  int to = selected_;
  switch (KeyDownCode(message)) {
    case kKey_Up:
      to = selected_ < 0 ? 0 : selected_ - 1;
      break;
    case kKey_Down:
      to = selected_ + 1;
      break;
    case kKey_PageUp:
      to = std::max(0, selected_) - (VisibleRows() - 1);
      break;
    case kKey_PageDown:
      to = std::max(0, selected_) + (VisibleRows() - 1);
      break;
    case kKey_Home:
      to = 0;
      break;
    case kKey_End:
      to = Count() - 1;
      break;
    default:
      CControl::HandleMessage(message);
      return;
  }
  if (IsLive()) Select(to, CValueMessage::kChange_Set);
  message.SetHandled();
}

void CListBox::DrawRows(CPort& port, const CRect& shown) {
  port.FillRect(shown, IsEnabled() ? Skin::kField : Skin::kFace);
  const int first = std::max(0, shown.top / kRowHeight);
  const int last = std::min(Count(), int(shown.bottom / kRowHeight) + 1);
  for (int i = first; i < last; ++i) {
    const CRect row{shown.left, i * kRowHeight, shown.right, (i + 1) * kRowHeight};
    const bool selected = i == selected_;
    if (selected) port.FillRect(row, IsTarget() ? Skin::kAccent : Skin::kWell);
    port.DrawText(rows_[i], CRect{row.left + 6, row.top, row.right - 4, row.bottom},
                  EFont::kUIMedium, selected && IsTarget() ? 0xFFFFFFFF : TextColor());
  }
}

void CListBox::Draw(CPort& port) {
  const CRect image = Image();
  port.FillRect(image, Skin::kField);
  // The rows leave room for the focus's wider line.
  port.FrameRect(image,
                 IsTarget()    ? Skin::kFocus
                 : IsEnabled() ? Skin::kEdge
                               : Skin::kEdgeDisabled,
                 IsTarget() ? 2.0 : 1.0);
}

}  // namespace Tarsa
