#include "framework/controls/CPopupList.h"

#include <algorithm>

#include "framework/controls/CControl.h"
#include "framework/process/CKeyCodes.h"
#include "framework/process/CMessageNames.h"
#include "framework/view/CWindow.h"

namespace Tarsa {

namespace {

CObjID ListId() {
  static const CObjID id = CObjID::Intern("Tarsa/PopupList");
  return id;
}

// Whether view lies in the tree under root, compared by address only (it
// may be gone).
bool InTree(const CView* root, const CView* view) {
  if (root == view) return true;
  for (const CView* child : root->Children()) {
    if (InTree(child, view)) return true;
  }
  return false;
}

}  // namespace

CPopupList::CPopupList(CWindow& window)
    : CView(ListId(), &window, window.Image(), kView_Invisible | kView_Target, kBind_Sizeable) {}

CPopupList& CPopupList::For(CWindow& window) {
  if (auto* list = dynamic_cast<CPopupList*>(window.FindView(ListId()))) return *list;
  return *new CPopupList(window);
}

CPopupList* CPopupList::OpenIn(CWindow& window) {
  auto* list = dynamic_cast<CPopupList*>(window.FindView(ListId()));
  return list != nullptr && list->IsOpen() ? list : nullptr;
}

void CPopupList::Open(CView* owner, const CRect& anchor, const std::vector<std::string>& items,
                      int marked, Chosen chosen) {
  if (IsOpen()) Close(-1);
  CWindow* window = Window();
  if (window == nullptr || items.empty()) return;
  owner_ = owner;
  chosen_ = std::move(chosen);
  items_ = items;
  marked_ = std::clamp(marked, 0, int(items_.size()) - 1);
  current_ = marked_;
  // Wide enough for the longest item, never narrower than the anchor.
  auto measure = CreateMeasuringPort();
  std::int32_t width = std::int32_t(anchor.Width());
  for (const std::string& item : items_) {
    width = std::max(width, measure->MeasureText(item, EFont::kUIMedium).width + 36);
  }
  const CSize client = window->Size();
  const std::int32_t below = client.height - anchor.bottom - 4;
  const std::int32_t above = anchor.top - 4;
  const std::int32_t wanted = std::int32_t(items_.size()) * kRowHeight + 2;
  std::int32_t height = std::min(wanted, std::max(below, above));
  height = std::max(height, std::min(wanted, kRowHeight + 2));
  height = 2 + (height - 2) / kRowHeight * kRowHeight;
  const std::int32_t left = std::clamp(anchor.left, 0, std::max(0, client.width - width));
  if (height <= below || below >= above) {
    box_ = CRect{left, anchor.bottom + 1, left + width, anchor.bottom + 1 + height};
  } else {
    box_ = CRect{left, anchor.top - 1 - height, left + width, anchor.top - 1};
  }
  first_ = 0;
  Mark(marked_);
  SetFrame(window->Image());
  BringToFront();
  SetShown(true);
  BecomeTarget(true);
  Invalidate();
}

void CPopupList::Close(int index) {
  if (!IsOpen()) return;
  CView* owner = owner_;
  Chosen chosen = std::move(chosen_);
  owner_ = nullptr;
  chosen_ = nullptr;
  SetShown(false);
  // An owner deleted with a part of the tree could not forget its list;
  // it is not called then.
  CWindow* window = Window();
  if (window == nullptr || !InTree(window, owner)) return;
  if (owner->IsLive()) owner->BecomeTarget(true);
  if (chosen) chosen(index);
}

void CPopupList::Forget(const CView* owner) {
  if (owner_ != owner) return;
  owner_ = nullptr;
  chosen_ = nullptr;
  SetShown(false);
}

int CPopupList::VisibleRows() const { return std::max(1, int(box_.Height() - 2) / kRowHeight); }

CRect CPopupList::RowRect(int index) const {
  const std::int32_t top = box_.top + 1 + (index - first_) * kRowHeight;
  return CRect{box_.left + 1, top, box_.right - 1, top + kRowHeight};
}

int CPopupList::ItemAt(CPoint where) const {
  if (where.x < box_.left || where.x >= box_.right || where.y <= box_.top ||
      where.y >= box_.bottom - 1) {
    return -1;
  }
  const int index = first_ + (where.y - box_.top - 1) / kRowHeight;
  return index < int(items_.size()) ? index : -1;
}

void CPopupList::Mark(int index) {
  if (items_.empty()) return;
  marked_ = std::clamp(index, 0, int(items_.size()) - 1);
  if (marked_ < first_) first_ = marked_;
  if (marked_ >= first_ + VisibleRows()) first_ = marked_ - VisibleRows() + 1;
  Invalidate();
}

bool CPopupList::HitTest(CPoint /*where*/) const { return IsOpen(); }

void CPopupList::MouseDown(CMouseMessage& message) {
  message.SetHandled();
  // The list lies at the window's origin, so its points are the window's.
  Close(ItemAt(message.where));
}

void CPopupList::MouseMoved(CMouseMessage& message) {
  const int index = ItemAt(message.where);
  if (index >= 0 && index != marked_) Mark(index);
}

void CPopupList::MouseWheel(CMouseMessage& message) {
  message.SetHandled();
  const int most = std::max(0, int(items_.size()) - VisibleRows());
  first_ = std::clamp(first_ - message.wheel, 0, most);
  Invalidate();
}

void CPopupList::HandleMessage(CMessage& message) {
  const CMessageNames& names = CMessageNames::Get();
  if (IsOpen() && (message.name == names.keyDown || message.name == names.sysKeyDown)) {
    const auto* key = dynamic_cast<const CValMsg<std::uint32_t>*>(&message);
    if (key != nullptr) {
      message.SetHandled();
      switch (key->value) {
        case kKey_Up:
          Mark(marked_ - 1);
          break;
        case kKey_Down:
          Mark(marked_ + 1);
          break;
        case kKey_PageUp:
          Mark(marked_ - VisibleRows());
          break;
        case kKey_PageDown:
          Mark(marked_ + VisibleRows());
          break;
        case kKey_Home:
          Mark(0);
          break;
        case kKey_End:
          Mark(int(items_.size()) - 1);
          break;
        case kKey_Return:
        case kKey_Space:
          Close(marked_);
          break;
        case kKey_Escape:
        case kKey_Tab:
          Close(-1);
          break;
        default:
          break;
      }
      return;
    }
  }
  if (IsOpen() && message.name == names.keyChar) {
    message.SetHandled();
    return;
  }
  CView::HandleMessage(message);
}

void CPopupList::Draw(CPort& port) {
  if (!IsOpen()) return;
  // A soft shadow, then the box.
  port.FillRoundRect(box_.Offset(2, 3), 4.0, 0x30000000);
  port.FillRect(box_, Skin::kField);
  port.FrameRect(box_, Skin::kEdge);
  port.Save();
  port.Clip(CRect{box_.left + 1, box_.top + 1, box_.right - 1, box_.bottom - 1});
  const int last = std::min(int(items_.size()), first_ + VisibleRows());
  for (int i = first_; i < last; ++i) {
    const CRect row = RowRect(i);
    const bool marked = i == marked_;
    if (marked) port.FillRect(row, Skin::kAccent);
    if (i == current_) {
      // The item the owner shows now carries a check.
      const std::uint32_t mark = marked ? 0xFFFFFFFF : Skin::kText;
      const double x = row.left + 6.0, y = row.top + 5.0;
      port.Line({x, y + 6}, {x + 3.5, y + 9.5}, mark, 1.8);
      port.Line({x + 3.5, y + 9.5}, {x + 10, y + 2}, mark, 1.8);
    }
    port.DrawText(items_[i], CRect{row.left + 22, row.top, row.right - 8, row.bottom},
                  EFont::kUIMedium, marked ? 0xFFFFFFFF : Skin::kText);
  }
  port.Restore();
  // Rows beyond the box: a small arrow says there is more.
  if (first_ > 0 || last < int(items_.size())) {
    const double x = box_.right - 10.0;
    if (first_ > 0) {
      const CPointF up[] = {{x - 4, box_.top + 9.0}, {x + 4, box_.top + 9.0}, {x, box_.top + 4.0}};
      port.FillPolygon(up, Skin::kText);
    }
    if (last < int(items_.size())) {
      const CPointF down[] = {
          {x - 4, box_.bottom - 9.0}, {x + 4, box_.bottom - 9.0}, {x, box_.bottom - 4.0}};
      port.FillPolygon(down, Skin::kText);
    }
  }
}

}  // namespace Tarsa
