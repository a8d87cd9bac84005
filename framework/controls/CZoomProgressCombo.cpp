#include "framework/controls/CZoomProgressCombo.h"

#include <algorithm>
#include <cmath>
#include <cstdio>
#include <cstdlib>

#include "framework/controls/CPopupList.h"
#include "framework/controls/CProgressBar.h"
#include "framework/controls/CScroller.h"
#include "framework/process/CKeyCodes.h"
#include "framework/process/CMessageNames.h"
#include "framework/view/CWindow.h"
#include "framework/view/CZoomPane.h"

namespace Tarsa {
namespace {

constexpr const char* kFitOnScreen = "$$$/Tarsa/ZoomCombo/FitOnScreen=Fit on Screen";

}  // namespace

CZoomProgressCombo::CZoomProgressCombo(CObjID id, CView* parent, const CRect& frame,
                                       std::uint32_t options, std::uint32_t binding)
    : CControl(id, parent, frame, options, binding),
      progress_(new CProgressBar(
          CObjID(), this, CRect{0, 0, std::int32_t(frame.Width()), std::int32_t(frame.Height())},
          kBind_Sizeable)) {
  progress_->SetShown(false);
  UpdateZoomControls();
}

CZoomProgressCombo::~CZoomProgressCombo() {
  if (CWindow* window = Window()) {
    if (CPopupList* list = CPopupList::OpenIn(*window)) list->Forget(this);
  }
}

void CZoomProgressCombo::SetZoomPane(CZoomPane* pane) {
  pane_ = pane;
  UpdateZoomControls();
}

CZoomPane* CZoomProgressCombo::ZoomPane() const {
  if (pane_ != nullptr) return pane_;
  const auto* scroller = dynamic_cast<const CScroller*>(Parent());
  return scroller != nullptr ? scroller->ZoomPane() : nullptr;
}

void CZoomProgressCombo::UpdateZoomControls() {
  const CZoomPane* pane = ZoomPane();
  text_ = pane != nullptr ? FormatZoom(pane->Zoom()) : std::string();
  canIn_ = pane != nullptr && pane->CanZoomIn();
  canOut_ = pane != nullptr && pane->CanZoomOut();
  selectAll_ = IsTarget();
  Invalidate();
}

std::string CZoomProgressCombo::FormatZoom(double zoom) {
  const double tenths = std::round(zoom * 1000.0);
  char text[32];
  if (std::fmod(tenths, 10.0) == 0.0) {
    std::snprintf(text, sizeof text, "%.0f%%", tenths / 10.0);
  } else {
    std::snprintf(text, sizeof text, "%.1f%%", tenths / 10.0);
  }
  return text;
}

void CZoomProgressCombo::SetPopup(ItemSource source) { source_ = std::move(source); }

std::vector<CZoomProgressCombo::Item> CZoomProgressCombo::PopupItems() const {
  const CZoomPane* pane = ZoomPane();
  if (pane == nullptr) return {};
  return source_ ? source_(*pane) : DefaultItems(*pane);
}

std::vector<CZoomProgressCombo::Item> CZoomProgressCombo::DefaultItems(const CZoomPane& pane) {
  std::vector<Item> items;
  for (double step : CZoomPane::kLadder) {
    if (step < pane.ZoomMin() || step > pane.ZoomMax()) continue;
    items.push_back({FormatZoom(step), [step](CZoomPane& p) { p.SetZoom(step); }});
  }
  items.push_back({ShownText(kFitOnScreen), [](CZoomPane& p) { p.FitInView(); }});
  return items;
}

void CZoomProgressCombo::OpenPopup() {
  CWindow* window = Window();
  CZoomPane* pane = ZoomPane();
  if (window == nullptr || pane == nullptr) return;
  auto items = std::make_shared<std::vector<Item>>(PopupItems());
  std::vector<std::string> labels;
  int marked = 0;
  const std::string shown = FormatZoom(pane->Zoom());
  for (const Item& item : *items) {
    if (item.label == shown) marked = int(labels.size());
    labels.push_back(item.label);
  }
  CPopupList::For(*window).Open(this, LocalToWindow(Image()), labels, marked,
                                [this, items](int index) {
                                  CZoomPane* target = ZoomPane();
                                  if (index < 0 || target == nullptr) return;
                                  const Item& item = (*items)[std::size_t(index)];
                                  if (item.choose) item.choose(*target);
                                  UpdateZoomControls();
                                });
}

void CZoomProgressCombo::SetProgress(double done, double total) {
  const bool working = done < total;
  if (working) progress_->SetValue(total > 0.0 ? done / total : 0.0);
  if (working == progress_->IsShown()) return;
  progress_->SetShown(working);
  if (!working) UpdateZoomControls();
  Invalidate();
}

bool CZoomProgressCombo::InProgress() const { return progress_->IsShown(); }

bool CZoomProgressCombo::Commit() {
  CZoomPane* pane = ZoomPane();
  const char* begin = text_.c_str();
  char* end = nullptr;
  const double percent = std::strtod(begin, &end);
  const bool number = end != begin && std::isfinite(percent);
  // The field's zoom is taken even when it is the pane's already, so that
  // the text is tidied either way.
  if (number && pane != nullptr) pane->SetZoom(percent / 100.0);
  UpdateZoomControls();
  return number;
}

CRect CZoomProgressCombo::InRect() const {
  const CRect image = Image();
  return {image.right - kButtonWidth, image.top, image.right, image.bottom};
}

CRect CZoomProgressCombo::OutRect() const {
  const CRect in = InRect();
  return {in.left - kButtonWidth, in.top, in.left, in.bottom};
}

CRect CZoomProgressCombo::ArrowRect() const {
  const CRect out = OutRect();
  return {out.left - kArrowWidth, out.top, out.left, out.bottom};
}

CRect CZoomProgressCombo::FieldRect() const {
  const CRect image = Image();
  return {image.left, image.top, std::max(image.left, ArrowRect().left), image.bottom};
}

void CZoomProgressCombo::Click(CMouseMessage& message) {
  if (!IsLive() || InProgress()) return;
  const CPoint at = message.where;
  const auto inside = [at](const CRect& r) {
    return at.x >= r.left && at.x < r.right && at.y >= r.top && at.y < r.bottom;
  };
  int part = 0;
  if (inside(ArrowRect())) part = 1;
  if (inside(OutRect()) && canOut_) part = 2;
  if (inside(InRect()) && canIn_) part = 3;
  if (part == 0) {
    // In the field: the whole text is taken, so typing replaces it.
    selectAll_ = true;
    Invalidate();
    return;
  }
  pressedPart_ = part;
  const bool released = part == 1 || TrackPress(message);
  pressedPart_ = 0;
  Invalidate();
  if (!released) return;
  CZoomPane* pane = ZoomPane();
  if (part == 1) {
    OpenPopup();
  } else if (pane != nullptr) {
    part == 2 ? pane->ZoomOut() : pane->ZoomIn();
    UpdateZoomControls();
  }
}

void CZoomProgressCombo::HandleMessage(CMessage& message) {
  if (InProgress()) {
    CControl::HandleMessage(message);
    return;
  }
  const CMessageNames& names = CMessageNames::Get();
  if (message.name == names.keyChar) {
    if (const auto* typed = dynamic_cast<const CValMsg<std::uint32_t>*>(&message)) {
      message.SetHandled();
      const std::uint32_t c = typed->value;
      if (!((c >= '0' && c <= '9') || c == '.' || c == '%')) return;
      if (selectAll_) text_.clear();
      selectAll_ = false;
      text_.push_back(char(c));
      Invalidate();
      return;
    }
  }
  switch (KeyDownCode(message)) {
    case kKey_Backspace:
      if (selectAll_) {
        text_.clear();
      } else if (!text_.empty()) {
        text_.pop_back();
      }
      selectAll_ = false;
      Invalidate();
      message.SetHandled();
      return;
    case kKey_Return:
      // Return sets the zoom and goes no further: it is not the dialog's OK.
      Commit();
      message.SetHandled();
      return;
    case kKey_Escape: {
      // Escape takes back a typed zoom; with nothing typed it is the
      // window's (a dialog's Cancel).
      CZoomPane* pane = ZoomPane();
      const bool typed = pane != nullptr && text_ != FormatZoom(pane->Zoom());
      UpdateZoomControls();
      if (!typed) break;
      message.SetHandled();
      return;
    }
    case kKey_Up:
    case kKey_Down:
      if (CZoomPane* pane = ZoomPane()) {
        KeyDownCode(message) == kKey_Up ? pane->ZoomIn() : pane->ZoomOut();
        UpdateZoomControls();
      }
      message.SetHandled();
      return;
    default:
      break;
  }
  CControl::HandleMessage(message);
}

void CZoomProgressCombo::OnBecameTarget() {
  selectAll_ = true;
  CControl::OnBecameTarget();
}

void CZoomProgressCombo::OnLostTarget() {
  UpdateZoomControls();
  selectAll_ = false;
  CControl::OnLostTarget();
}

void CZoomProgressCombo::DrawStep(CPort& port, const CRect& box, bool in, bool enabled) const {
  const int part = in ? 3 : 2;
  port.FillRect(box, pressedPart_ == part ? Skin::kFacePressed : Skin::kFace);
  port.FrameRect(box, enabled ? Skin::kEdge : Skin::kEdgeDisabled);
  const std::uint32_t ink = enabled ? Skin::kText : Skin::kEdgeDisabled;
  const double cx = box.left + box.Width() / 2.0;
  const double cy = box.top + box.Height() / 2.0;
  port.Line({cx - 4.0, cy}, {cx + 4.0, cy}, ink, 1.5);
  if (in) port.Line({cx, cy - 4.0}, {cx, cy + 4.0}, ink, 1.5);
}

void CZoomProgressCombo::Draw(CPort& port) {
  port.FillRect(Image(), Skin::kWell);
  if (InProgress()) return;  // the progress bar covers the combo
  const CRect field = FieldRect();
  const bool on = IsEnabled() && ZoomPane() != nullptr;
  port.FillRect(field, on ? Skin::kField : Skin::kFace);
  port.FrameRect(field, IsTarget() ? Skin::kFocus : Skin::kEdge);
  const CRect text{field.left + 4, field.top, field.right - 3, field.bottom};
  if (IsTarget() && selectAll_ && !text_.empty()) {
    const CSize size = port.MeasureText(text_, EFont::kUISmall);
    const std::int32_t top = text.top + (std::int32_t(text.Height()) - size.height) / 2;
    port.FillRect({text.left - 1, top, text.left + size.width + 1, top + size.height},
                  Skin::kAccentLight);
  }
  port.DrawText(text_, text, EFont::kUISmall, on ? Skin::kText : Skin::kTextDisabled);
  // The arrow that opens the list.
  const CRect arrow = ArrowRect();
  port.FillRect(arrow, pressedPart_ == 1 ? Skin::kFacePressed : Skin::kFace);
  port.FrameRect(arrow, Skin::kEdge);
  const double ax = arrow.left + arrow.Width() / 2.0;
  const double ay = arrow.top + arrow.Height() / 2.0;
  const CPointF tri[] = {{ax - 3.5, ay - 1.5}, {ax + 3.5, ay - 1.5}, {ax, ay + 2.5}};
  port.FillPolygon(tri, on ? Skin::kText : Skin::kEdgeDisabled);
  DrawStep(port, OutRect(), false, on && canOut_);
  DrawStep(port, InRect(), true, on && canIn_);
}

}  // namespace Tarsa
