#include "framework/view/CView.h"

#include <algorithm>
#include <cstdlib>

#include "framework/process/CMessageNames.h"
#include "framework/view/CWindow.h"

namespace Tarsa {

CView::CView(CObjID id, CView* parent, const CRect& frame, std::uint32_t options,
             std::uint32_t binding, std::int32_t contentWidth, std::int32_t contentHeight)
    : parent_(parent), viewFlags_(ViewFlagsOf(options)), binding_(binding) {
  SetId(id);
  frameOriginX_ = frame.left;
  frameOriginY_ = frame.top;
  imageRight_ = std::int32_t(std::max<std::int64_t>(0, frame.Width()));
  imageBottom_ = std::int32_t(std::max<std::int64_t>(0, frame.Height()));
  contentRight_ = contentWidth >= 0 ? contentWidth : imageRight_;
  contentBottom_ = contentHeight >= 0 ? contentHeight : imageBottom_;
  CMessenger::SetShown((viewFlags_ & kViewFlag_Visible) != 0);
  CMessenger::SetEnabled((viewFlags_ & kViewFlag_Enabled) != 0);
  if (parent_ != nullptr) {
    SetSupervisor(parent_);
    parent_->children_.push_back(this);
  }
  ClampScroll();
}

CView::~CView() {
  while (!children_.empty()) {
    CView* last = children_.back();
    children_.pop_back();
    last->parent_ = nullptr;
    delete last;
  }
  if (parent_ != nullptr) std::erase(parent_->children_, this);
}

void CView::DeleteChild(CView* child) {
  if (std::find(children_.begin(), children_.end(), child) == children_.end()) return;
  Invalidate();
  delete child;  // unlinks itself
}

void CView::BringToFront() {
  if (parent_ == nullptr) return;
  std::erase(parent_->children_, this);
  parent_->children_.push_back(this);
  Invalidate();
}

CWindow* CView::Window() const { return parent_ != nullptr ? parent_->Window() : nullptr; }

CRect CView::Frame() const {
  return {frameOriginX_, frameOriginY_, frameOriginX_ + Size().width,
          frameOriginY_ + Size().height};
}

void CView::SetFrame(const CRect& frame) {
  Invalidate();
  const CSize before = Size();
  frameOriginX_ = frame.left;
  frameOriginY_ = frame.top;
  ResizeBy(std::int32_t(frame.Width()) - before.width,
           std::int32_t(frame.Height()) - before.height);
  Invalidate();
}

void CView::ResizeBy(std::int32_t dx, std::int32_t dy) {
  // Which edge of the image moves with the frame's far edge: the far one,
  // unless the image is pinned there and not at the near one.
  const auto grow = [](std::int32_t d, bool pinNear, bool pinFar, std::int32_t& near,
                       std::int32_t& far) {
    if (pinFar && !pinNear) {
      near -= d;
    } else if (pinFar && pinNear) {
      near -= d / 2;
      far += d - d / 2;
    } else {
      far += d;
    }
  };
  grow(dx, (binding_ & kBind_PinLeft) != 0, (binding_ & kBind_PinRight) != 0, imageLeft_,
       imageRight_);
  grow(dy, (binding_ & kBind_PinTop) != 0, (binding_ & kBind_PinBottom) != 0, imageTop_,
       imageBottom_);
  ClampScroll();
  if (dx != 0 || dy != 0) {
    for (CView* child : children_) child->ParentResized(dx, dy);
    SizeChanged(dx, dy);
  }
}

void CView::ParentResized(std::int32_t dx, std::int32_t dy) {
  // A size bit takes the parent's change; otherwise a far-edge bit moves by
  // it and a centre bit by half of it, and a view tied only to the near edge
  // stays.
  const auto follow = [](std::int32_t d, bool sizeable, bool center, bool nearEdge, bool farEdge,
                         std::int32_t& origin, std::int32_t& grow) {
    if (sizeable) {
      grow = d;
    } else if (center) {
      origin += d / 2;
    } else if (farEdge && !nearEdge) {
      origin += d;
    }
  };
  std::int32_t growX = 0, growY = 0;
  follow(dx, (binding_ & kBind_XSizeable) != 0, (binding_ & kBind_XCenter) != 0,
         (binding_ & kBind_Left) != 0, (binding_ & kBind_Right) != 0, frameOriginX_, growX);
  follow(dy, (binding_ & kBind_YSizeable) != 0, (binding_ & kBind_YCenter) != 0,
         (binding_ & kBind_Top) != 0, (binding_ & kBind_Bottom) != 0, frameOriginY_, growY);
  ResizeBy(growX, growY);
}

void CView::SetContent(const CRect& content) {
  contentLeft_ = content.left;
  contentTop_ = content.top;
  contentRight_ = content.right;
  contentBottom_ = content.bottom;
  ClampScroll();
  Invalidate();
}

void CView::ScrollTo(CPoint where) {
  const CSize size = Size();
  const std::int32_t x =
      std::clamp(where.x, limitLeft_, std::max(limitLeft_, limitRight_ - size.width));
  const std::int32_t y =
      std::clamp(where.y, limitTop_, std::max(limitTop_, limitBottom_ - size.height));
  if (x == imageLeft_ && y == imageTop_) return;
  imageLeft_ = x;
  imageTop_ = y;
  imageRight_ = x + size.width;
  imageBottom_ = y + size.height;
  Invalidate();
  OnScrolled();
}

void CView::ScrollBy(std::int32_t dx, std::int32_t dy) {
  ScrollTo({imageLeft_ + dx, imageTop_ + dy});
}

void CView::ClampAxis(bool scrolls, std::uint32_t limitLow, std::uint32_t limitHigh,
                      std::int32_t& image0, std::int32_t& image1, std::int32_t& limit0,
                      std::int32_t& limit1, std::int32_t& content0, std::int32_t& content1) {
  if (!scrolls) {
    limit0 = content0 = image0;
    limit1 = content1 = image1;
    return;
  }
  const std::int32_t size = image1 - image0;
  const std::int32_t content = content1 - content0;
  if (size > content) {
    if ((binding_ & limitLow) != 0) {
      limit0 = content0;
      limit1 = content0 + size;
    } else if ((binding_ & limitHigh) != 0) {
      limit1 = content1;
      limit0 = content1 - size;
    } else {
      limit0 = content0 - (size - content) / 2;
      limit1 = limit0 + size;
    }
  } else {
    limit0 = content0;
    limit1 = content1;
  }
  // An image outside the limits is brought back: by moving the content to
  // meet it, for a view that pins that way, or else by moving the image.
  std::int32_t shift = 0;
  if (image0 < limit0) {
    shift = image0 - limit0;
  } else if (image1 > limit1) {
    shift = image1 - limit1;
  }
  if (shift == 0) return;
  if (PinsByMovingContent()) {
    limit0 += shift;
    limit1 += shift;
    content0 += shift;
    content1 += shift;
  } else {
    image0 -= shift;
    image1 -= shift;
  }
}

void CView::ClampScroll() {
  ClampAxis((binding_ & kBind_XScrollable) != 0, kBind_LimitLeft, kBind_LimitRight, imageLeft_,
            imageRight_, limitLeft_, limitRight_, contentLeft_, contentRight_);
  ClampAxis((binding_ & kBind_YScrollable) != 0, kBind_LimitTop, kBind_LimitBottom, imageTop_,
            imageBottom_, limitTop_, limitBottom_, contentTop_, contentBottom_);
}

CPoint CView::LocalToWindow(CPoint p) const {
  const CPoint inParent{p.x - imageLeft_ + frameOriginX_, p.y - imageTop_ + frameOriginY_};
  return parent_ != nullptr ? parent_->LocalToWindow(inParent) : inParent;
}

CPoint CView::WindowToLocal(CPoint p) const {
  const CPoint inParent = parent_ != nullptr ? parent_->WindowToLocal(p) : p;
  return {inParent.x - frameOriginX_ + imageLeft_, inParent.y - frameOriginY_ + imageTop_};
}

CRect CView::LocalToWindow(const CRect& r) const {
  const CPoint a = LocalToWindow(CPoint{r.left, r.top});
  return {a.x, a.y, a.x + std::int32_t(r.Width()), a.y + std::int32_t(r.Height())};
}

bool CView::IsVisible() const { return IsShown() && (parent_ == nullptr || parent_->IsVisible()); }

void CView::Invalidate() {
  if (CWindow* window = Window()) window->InvalidateArea(LocalToWindow(Image()));
}

void CView::Redraw() {
  if (CWindow* window = Window()) window->PaintNow();
}

void CView::DrawTree(CPort& port) {
  if (!IsShown()) return;
  port.Save();
  port.Translate(frameOriginX_ - imageLeft_, frameOriginY_ - imageTop_);
  port.Clip(Image());
  Draw(port);
  for (CView* child : children_) child->DrawTree(port);
  port.Restore();
}

bool CView::HitTest(CPoint where) const {
  return where.x >= imageLeft_ && where.x < imageRight_ && where.y >= imageTop_ &&
         where.y < imageBottom_;
}

bool CView::TakesMouse() const {
  return IsShown() && IsEnabled() && (viewFlags_ & kViewFlag_IgnoreMouse) == 0;
}

void CView::DispatchMouse(CMouseMessage& message) {
  // Front to back, so that a view laid over another (an open list) gets the
  // mouse first.
  for (auto it = children_.rbegin(); it != children_.rend(); ++it) {
    CView* child = *it;
    if (!child->TakesMouse()) continue;
    const CPoint inChild{message.where.x - child->frameOriginX_ + child->imageLeft_,
                         message.where.y - child->frameOriginY_ + child->imageTop_};
    if (!child->HitTest(inChild)) continue;
    CMouseMessage copy = message;
    copy.where = inChild;
    child->DispatchMouse(copy);
    if (copy.IsHandled()) message.SetHandled();
    return;
  }
  CWindow* window = Window();
  if (window != nullptr && window->Capture() != this) {
    window->SetCapture(nullptr);
    window->SetHover(this);
  }
  const CMessageNames& names = CMessageNames::Get();
  if (message.name == names.mouseDown) {
    MouseDown(message);
  } else if (message.name == names.mouseUp) {
    MouseUp(message);
  } else if (message.name == names.mouseMoved) {
    MouseMoved(message);
  } else if (message.wheel != 0) {
    MouseWheel(message);
  }
}

void CView::MouseDown(CMouseMessage& message) {
  if (RegisterClick(message)) message.SetHandled();
}

void CView::MouseWheel(CMouseMessage& message) {
  if ((binding_ & kBind_YScrollable) != 0 && contentBottom_ - contentTop_ > Size().height) {
    ScrollBy(0, -message.wheel * 3 * 12);
    message.SetHandled();
    return;
  }
  if (parent_ != nullptr) {
    CMouseMessage up = message;
    up.where = {message.where.x - imageLeft_ + frameOriginX_,
                message.where.y - imageTop_ + frameOriginY_};
    parent_->MouseWheel(up);
    if (up.IsHandled()) message.SetHandled();
  }
}

bool CView::RegisterClick(CMouseMessage& message) {
  if (WantsTarget() && (viewFlags_ & kViewFlag_NoFocusOnClick) == 0) {
    const bool quiet = (viewFlags_ & kViewFlag_SupressSurrenders) != 0;
    if (IsLive()) {
      if (!IsTarget() && !BecomeTarget(quiet)) return false;
    } else if (!quiet && Target() != nullptr && !Target()->CanResign(false)) {
      return false;
    }
  }
  CWindow* window = Window();
  std::int32_t clicks = 1;
  if (window != nullptr) clicks = window->CountClick(this, message);
  message.clicks = clicks;
  if ((viewFlags_ & kViewFlag_MultiOnMouseUp) == 0 && clicks > 1 && MultiClick(message)) {
    return true;
  }
  Click(message);
  return true;
}

void CView::AddTip(const std::string& text, std::int32_t /*place*/, double delay) {
  tip_ = text;
  tipDelay_ = delay;
}

void CView::Start() {
  if (IsStarted()) return;
  viewFlags_ |= kViewFlag_Started;
  if ((viewFlags_ & kViewFlag_InvalidOnActivate) != 0 && IsLive()) Invalidate();
  OnStart();
  if (TakesTargetAtStart() && IsLive()) BecomeTarget(true);
  for (CView* child : std::vector<CView*>(children_)) child->Start();
}

void CView::SetShown(bool shown) {
  if (shown == IsShown()) return;
  if (!shown) Invalidate();
  CMessenger::SetShown(shown);
  if (shown) {
    viewFlags_ |= kViewFlag_Visible;
    Invalidate();
  } else {
    viewFlags_ &= ~kViewFlag_Visible;
  }
}

void CView::SetEnabled(bool enabled) {
  if (enabled == IsEnabled()) return;
  CMessenger::SetEnabled(enabled);
  if (enabled) {
    viewFlags_ |= kViewFlag_Enabled;
  } else {
    viewFlags_ &= ~kViewFlag_Enabled;
  }
  Invalidate();
}

CNativeWindowId CView::NativeWindow() const {
  const CWindow* window = Window();
  return window != nullptr ? window->NativeId() : 0;
}

}  // namespace Tarsa
