#include "framework/controls/CScroller.h"

#include <algorithm>

#include "framework/controls/CControl.h"
#include "framework/controls/CScrollBar.h"
#include "framework/controls/CZoomProgressCombo.h"
#include "framework/view/CZoomPane.h"

namespace Tarsa {

CScroller::CScroller(CObjID id, CView* parent, const CRect& frame, std::uint32_t attributes,
                     std::uint32_t binding)
    : CPane(id, parent, frame, kView_NoOptions, binding),
      attributes_(attributes),
      xBar_(new CScrollBar(CObjID(), this, {}, CScrollBar::EOrientation::kHorizontal)),
      yBar_(new CScrollBar(CObjID(), this, {}, CScrollBar::EOrientation::kVertical)) {
  SetFill(Skin::kWell);
  SetAttributes(attributes);
}

void CScroller::SetAttributes(std::uint32_t attributes) {
  attributes_ = attributes;
  SetFrameStyle((attributes_ & kScroller_WellFrame) != 0 ? EFrame::kRectangle : EFrame::kNone);
  xBar_->SetShown((attributes_ & kScroller_XBar) != 0);
  yBar_->SetShown((attributes_ & kScroller_YBar) != 0);
  Arrange();
}

void CScroller::SetGapLeft(std::int32_t width) {
  gapLeft_ = std::max(0, width);
  Arrange();
}

void CScroller::SetGapView(CView* view) {
  gapView_ = view != nullptr && view->Parent() == this ? view : nullptr;
  Arrange();
}

CView* CScroller::Scrolled() const {
  constexpr std::uint32_t kScrolls = kBind_XScrollable | kBind_YScrollable;
  for (CView* child : Children()) {
    if (child == xBar_ || child == yBar_ || child == gapView_) continue;
    if ((child->Binding() & kScrolls) != 0) return child;
  }
  return nullptr;
}

CZoomPane* CScroller::ZoomPane() const { return dynamic_cast<CZoomPane*>(Scrolled()); }

CScrollBar* CScroller::XBar() const {
  return (attributes_ & kScroller_XBar) != 0 ? xBar_ : nullptr;
}

CScrollBar* CScroller::YBar() const {
  return (attributes_ & kScroller_YBar) != 0 ? yBar_ : nullptr;
}

CRect CScroller::Inner() const {
  const CRect image = Image();
  if ((attributes_ & kScroller_WellFrame) == 0) return image;
  return {image.left + 1, image.top + 1, image.right - 1, image.bottom - 1};
}

std::int32_t CScroller::BottomRow() const {
  const bool gap = gapView_ != nullptr && gapLeft_ > 0;
  const std::int32_t bar = XBar() != nullptr ? CScrollBar::kThickness : 0;
  return gap ? std::max(bar, std::int32_t(gapView_->Frame().Height())) : bar;
}

void CScroller::Arrange() {
  // A gap view deleted since it was set is forgotten.
  if (std::find(Children().begin(), Children().end(), gapView_) == Children().end()) {
    gapView_ = nullptr;
  }
  const CRect inner = Inner();
  const std::int32_t bottom = BottomRow();
  const std::int32_t right = YBar() != nullptr ? CScrollBar::kThickness : 0;
  const std::int32_t gap = gapView_ != nullptr ? gapLeft_ : 0;
  CView* scrolled = Scrolled();
  if (scrolled != nullptr) {
    scrolled->SetFrame({inner.left, inner.top, std::max(inner.left, inner.right - right),
                        std::max(inner.top, inner.bottom - bottom)});
  }
  xBar_->SetScrolled(scrolled);
  yBar_->SetScrolled(scrolled);
  if (XBar() != nullptr) {
    xBar_->SetFrame({inner.left + gap, inner.bottom - bottom,
                     std::max(inner.left + gap, inner.right - right), inner.bottom});
  }
  if (YBar() != nullptr) {
    yBar_->SetFrame(
        {inner.right - right, inner.top, inner.right, std::max(inner.top, inner.bottom - bottom)});
  }
  if (gapView_ != nullptr) {
    gapView_->SetFrame({inner.left, inner.bottom - bottom, inner.left + gap, inner.bottom});
  }
  Invalidate();
}

void CScroller::SizeChanged(std::int32_t /*dx*/, std::int32_t /*dy*/) { Arrange(); }

void CScroller::HandleMessage(CMessage& message) {
  const bool zoomed = message.name == CZoomPane::ZoomChangedName();
  const bool scrolled = message.name == CZoomPane::ScrollChangedName();
  const CZoomPane* pane = ZoomPane();
  if ((zoomed || scrolled) && pane != nullptr &&
      message.source == reinterpret_cast<std::uintptr_t>(pane)) {
    xBar_->Invalidate();
    yBar_->Invalidate();
    if (auto* combo = dynamic_cast<CZoomProgressCombo*>(gapView_); combo != nullptr && zoomed) {
      combo->UpdateZoomControls();
    }
  }
  CPane::HandleMessage(message);
}

}  // namespace Tarsa
