#include "framework/view/CWindow.h"

#include <cstdlib>
#include <functional>

#include "framework/icons/CIconCursor.h"
#include "framework/native/CNativeCursor.h"
#include "framework/process/CKeyCodes.h"
#include "framework/process/CMessageNames.h"
#include "framework/process/CProcess.h"
#include "framework/process/CValMsg.h"
#include "framework/tools/CTracker.h"

namespace Tarsa {

namespace {

// Every view of the tree in drawing order (parents before children).
void Walk(CView* view, const std::function<void(CView*)>& visit) {
  visit(view);
  for (CView* child : view->Children()) Walk(child, visit);
}

CObjID WheelName() {
  static const CObjID name = CObjID::Intern("Tarsa/Message/MouseWheel");
  return name;
}

}  // namespace

CWindow::CWindow(CObjID id, EWindowKind kind, const std::string& title, CSize size,
                 const CWindow* parent)
    : CView(id, nullptr, CRect{0, 0, size.width, size.height}),
      native_(CreateNativeWindow(kind, title, size,
                                 parent != nullptr ? parent->native_.get() : nullptr)) {
  if (CProcess* process = CProcess::Current()) {
    SetSupervisor(process);
    process->RegisterWindow(native_->Id(), this);
  }
}

CWindow::~CWindow() {
  if (CProcess* process = CProcess::Current()) process->UnregisterWindow(native_->Id());
  // The views go before the native window they draw into.
  while (!Children().empty()) DeleteChild(Children().back());
}

void CWindow::Show() {
  const bool wasOpen = open_;
  open_ = true;
  if (tipTimer_ == nullptr && CProcess::Current() != nullptr) {
    tipTimer_ = std::make_unique<TipTimer>(*this);
    tipTimer_->Start();
  }
  Start();
  native_->Show(true);
  if (CProcess* process = CProcess::Current(); process != nullptr && !wasOpen) {
    process->EventSource().SetFocus(NativeId());
  }
  if (Target() == nullptr || Target()->NativeWindow() != NativeId()) {
    if (!FocusNext(false)) BecomeTarget(true);
  }
  InvalidateArea(Image());
}

void CWindow::Hide() {
  open_ = false;
  tipTimer_.reset();
  native_->Show(false);
}

void CWindow::SetClientSize(CSize size) {
  native_->SetClientSize(size);
  SetFrame(CRect{0, 0, size.width, size.height});
}

void CWindow::InvalidateArea(const CRect& area) {
  if (open_) native_->Invalidate(area);
}

void CWindow::PaintNow() {
  const CSize size = native_->ClientSize();
  CPort& port = native_->BeginPaint(CRect{0, 0, size.width, size.height});
  port.FillRect(CRect{0, 0, size.width, size.height}, 0xFFECECEC);
  DrawTree(port);
  if (const CTracker* tracker = CTracker::Running();
      tracker != nullptr && tracker->View() != nullptr && tracker->View()->Window() == this) {
    const CView& view = *tracker->View();
    const CPoint origin = view.LocalToWindow(CPoint{0, 0});
    port.Save();
    port.Clip(view.LocalToWindow(view.Image()));
    port.Translate(origin.x, origin.y);
    tracker->DrawFeedback(port);
    port.Restore();
  }
  if (tipShown_) DrawTip(port);
  native_->EndPaint();
}

void CWindow::ShowTipIfDue(double now) {
  if (tipShown_ || hover_ == nullptr || hover_->Tip().empty() || capture_ != nullptr) return;
  if (now - restingSince_ < hover_->TipDelay()) return;
  tipShown_ = true;
  InvalidateArea(Image());
}

void CWindow::DrawTip(CPort& port) {
  const std::string& text = hover_->Tip();
  const CSize size = port.MeasureText(text, EFont::kUISmall);
  const CSize client = native_->ClientSize();
  CRect box{pointer_.x + 12, pointer_.y + 18, pointer_.x + 12 + size.width + 10,
            pointer_.y + 18 + size.height + 6};
  if (box.right > client.width) box = box.Offset(client.width - box.right - 2, 0);
  if (box.bottom > client.height) box = box.Offset(0, -(size.height + 30));
  port.FillRect(box, 0xFFFFFFE1);
  port.FrameRect(box, 0xFF767676);
  port.DrawText(text, CRect{box.left + 5, box.top, box.right - 5, box.bottom}, EFont::kUISmall,
                0xFF000000, EAlign::kStart, EAlign::kCenter);
}

void CWindow::HandleNative(const CNativeEvent& event) {
  switch (event.kind) {
    case ENativeKind::kPaint:
      PaintNow();
      break;
    case ENativeKind::kWindow:
      switch (static_cast<EWindowEvent>(event.code)) {
        case EWindowEvent::kResized:
          SetFrame(CRect{0, 0, event.where.x, event.where.y});
          InvalidateArea(Image());
          break;
        case EWindowEvent::kClose:
          CloseRequested();
          break;
        case EWindowEvent::kLeave:
          SetHover(nullptr);
          break;
        default:
          break;
      }
      break;
    case ENativeKind::kMouseDown:
    case ENativeKind::kMouseUp:
    case ENativeKind::kMouseMove:
    case ENativeKind::kMouseWheel:
      DeliverMouse(event);
      break;
    default:
      break;
  }
}

void CWindow::DeliverMouse(const CNativeEvent& event) {
  const CMessageNames& names = CMessageNames::Get();
  if (event.kind == ENativeKind::kMouseMove || event.kind == ENativeKind::kMouseDown) {
    pointer_ = {event.where.x, event.where.y};
    restingSince_ = event.time;
    if (tipShown_) {
      tipShown_ = false;
      InvalidateArea(Image());
    }
  }
  CObjID name = names.mouseMoved;
  if (event.kind == ENativeKind::kMouseDown) name = names.mouseDown;
  if (event.kind == ENativeKind::kMouseUp) name = names.mouseUp;
  if (event.kind == ENativeKind::kMouseWheel) name = WheelName();
  const CPoint where{event.where.x, event.where.y};
  CMouseMessage message(name, where, event.kind == ENativeKind::kMouseMove ? 0 : event.code,
                        event.time, event.modifiers);
  if (event.kind == ENativeKind::kMouseWheel) {
    message.button = 0;
    message.wheel = static_cast<std::int32_t>(event.code);
  }
  if (capture_ != nullptr && event.kind != ENativeKind::kMouseWheel) {
    // A view that took a press sees the rest of it, wherever the pointer is.
    message.where = capture_->WindowToLocal(where);
    CView* captured = capture_;
    if (event.kind == ENativeKind::kMouseUp) capture_ = nullptr;
    captured->DispatchMouse(message);
    return;
  }
  DispatchMouse(message);
  if (event.kind == ENativeKind::kMouseMove) UpdateCursor();
}

bool CWindow::CursorShowsImage() const {
  const auto found = cursors_.find(cursorShown_);
  return found != cursors_.end() && found->second->ShowsImage();
}

void CWindow::UpdateCursor() {
  std::int32_t id = 0;
  for (const CView* view = hover_; view != nullptr && id == 0; view = view->Parent()) {
    id = view->CursorId();
  }
  if (id == cursorShown_) return;
  cursorShown_ = id;
  if (id == 0) {
    if (arrow_ == nullptr) arrow_ = std::make_unique<CNativeCursor>(nullptr, 0, 0);
    arrow_->Set();
    return;
  }
  std::unique_ptr<CIconCursor>& cursor = cursors_[id];
  if (cursor == nullptr) cursor = std::make_unique<CIconCursor>(id);
  cursor->Set();
}

void CWindow::SetHover(CView* view) {
  if (view == hover_) return;
  CView* old = hover_;
  hover_ = view;
  if (old != nullptr) old->MouseLeave();
  if (view != nullptr) view->MouseEnter();
}

std::int32_t CWindow::CountClick(const CView* view, const CMouseMessage& message) {
  const CPoint where = view->LocalToWindow(message.where);
  const bool repeat = view == lastClickView_ && message.button == lastClickButton_ &&
                      std::abs(where.x - lastClickWhere_.x) < 3 &&
                      std::abs(where.y - lastClickWhere_.y) < 3 &&
                      message.time - lastClickTime_ <= kDoubleClickTime;
  lastClickCount_ = repeat ? lastClickCount_ + 1 : 1;
  lastClickView_ = view;
  lastClickButton_ = message.button;
  lastClickTime_ = message.time;
  lastClickWhere_ = where;
  return lastClickCount_;
}

CView* CWindow::FindView(CObjID id) {
  CView* found = nullptr;
  Walk(this, [&](CView* view) {
    if (found == nullptr && view->GetId() == id) found = view;
  });
  return found;
}

bool CWindow::FocusNext(bool backwards) {
  std::vector<CView*> stops;
  Walk(this, [&](CView* view) {
    if (view != this && view->IsTabStop() && view->IsVisible() && view->IsLive() &&
        (view->ViewFlags() & kViewFlag_NoTabNavigate) == 0) {
      stops.push_back(view);
    }
  });
  if (stops.empty()) return false;
  const auto current = std::find(stops.begin(), stops.end(), Target());
  std::size_t next = 0;
  if (current != stops.end()) {
    const std::size_t at = std::size_t(current - stops.begin());
    next = backwards ? (at + stops.size() - 1) % stops.size() : (at + 1) % stops.size();
  } else if (backwards) {
    next = stops.size() - 1;
  }
  return stops[next]->BecomeTarget(false);
}

void CWindow::HandleMessage(CMessage& message) {
  const CMessageNames& names = CMessageNames::Get();
  if (message.name == names.keyDown || message.name == names.sysKeyDown) {
    const auto* key = dynamic_cast<const CValMsg<std::uint32_t>*>(&message);
    if (key != nullptr) {
      CView* press = nullptr;
      if (key->value == kKey_Tab) {
        FocusNext((message.modifiers & kModifier_Shift) != 0);
        message.SetHandled();
        return;
      }
      if (key->value == kKey_Return) press = FindView(defaultView_);
      if (key->value == kKey_Escape) press = FindView(cancelView_);
      if (press != nullptr && press->IsLive()) {
        CMouseMessage click(names.mouseDown, CPoint{}, kButton_Left, message.time,
                            message.modifiers);
        press->Click(click);
        message.SetHandled();
        return;
      }
      if (key->value == kKey_Escape && modalEnded_ == false && open_ && cancelView_.IsNull()) {
        EndModal(CObjID());
        message.SetHandled();
        return;
      }
    }
  }
  CView::HandleMessage(message);
}

void CWindow::CloseRequested() {
  CView* cancel = FindView(cancelView_);
  if (cancel != nullptr && cancel->IsLive()) {
    CMouseMessage click(CMessageNames::Get().mouseDown, CPoint{}, kButton_Left, 0.0, 0);
    cancel->Click(click);
    return;
  }
  EndModal(CObjID());
  Hide();
}

CObjID CWindow::RunModal() {
  modalEnded_ = false;
  modalResult_ = CObjID();
  // The view that had the focus gets it back afterwards, found again by its
  // window and id, since the modal run may delete views.
  const auto* before = dynamic_cast<const CView*>(Target());
  const CNativeWindowId beforeWindow = before != nullptr ? before->NativeWindow() : 0;
  const CObjID beforeId = before != nullptr ? before->GetId() : CObjID();
  Show();
  CProcess* process = CProcess::Current();
  if (process != nullptr) process->RunModal([this] { return modalEnded_; });
  Hide();
  if (process != nullptr && beforeWindow != 0) {
    if (auto* window = dynamic_cast<CWindow*>(process->FindWindow(beforeWindow))) {
      CView* view = beforeId.IsNull() ? nullptr : window->FindView(beforeId);
      if (view != nullptr && view->IsLive()) {
        view->BecomeTarget(true);
      } else {
        window->BecomeTarget(true);
      }
      process->EventSource().SetFocus(beforeWindow);
    }
  }
  return modalResult_;
}

void CWindow::EndModal(CObjID result) {
  modalEnded_ = true;
  modalResult_ = result;
  if (CProcess* process = CProcess::Current()) process->EventSource().Wake();
}

}  // namespace Tarsa
