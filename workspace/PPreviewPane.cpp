#include "workspace/PPreviewPane.h"

#include <algorithm>
#include <cmath>

#include "filter/PFilter.h"
#include "filter/PImageHub.h"
#include "filter/PPreview.h"
#include "framework/controls/CZoomProgressCombo.h"
#include "framework/tools/CMouseEvent.h"
#include "framework/tools/CViewTracker.h"
#include "framework/view/CMouseMessage.h"
#include "framework/view/CPort.h"
#include "framework/view/CWindow.h"
#include "params/PSettings.h"
#include "solver/constraints/ConstraintList.h"
#include "workspace/ConstraintPainter.h"
#include "workspace/MeshPainter.h"
#include "workspace/PDetailedPreviewPane.h"

namespace Project {

namespace {

constexpr std::int32_t kTile = 128;
// Behind the picture, and where the result has no pixels.
constexpr std::uint32_t kBackground = 0xFF808080;

}  // namespace

PPreviewPane::PPreviewPane(Tarsa::CObjID id, Tarsa::CView* parent, const Tarsa::CRect& frame,
                           std::uint32_t options, std::uint32_t binding)
    : Tarsa::CZoomPane(id, parent, frame, options, binding) {}

PPreviewPane::~PPreviewPane() {
  if (filter_ != nullptr && filter_->HasImageHub()) filter_->ImageHub().ConnectPane(nullptr);
}

void PPreviewPane::Attach(PFilter& filter) {
  filter_ = &filter;
  PImageHub& hub = filter.ImageHub();
  const Tarsa::CRect image = hub.ImageRect();
  SetDocumentSize({std::int32_t(image.Width()), std::int32_t(image.Height())});
  hub.ConnectPane(this);
  UpdateDisplay();
}

double PPreviewPane::PictureScale() const { return std::min(Zoom(), 1.0); }

Tarsa::CRect PPreviewPane::DisplayRect() const {
  const Tarsa::CSize document = DocumentSize();
  const double scale = PictureScale();
  return {0, 0, std::max<std::int32_t>(1, std::int32_t(std::lround(document.width * scale))),
          std::max<std::int32_t>(1, std::int32_t(std::lround(document.height * scale)))};
}

Tarsa::CRect PPreviewPane::GetImageRect() const { return VisiblePictureRect(); }

void PPreviewPane::UpdateDisplay() {
  if (filter_ == nullptr) return;
  PImageHub& hub = filter_->ImageHub();
  const Tarsa::CRect display = DisplayRect();
  hub.SetDisplayRect(display);
  // The part in sight, from view to display coordinates, a pixel wider for
  // the rounding.
  const Tarsa::CRect visible = VisiblePictureRect();
  const Tarsa::CSize document = DocumentSize();
  const double toDisplay =
      document.width > 0 ? double(display.Width()) / (document.width * Zoom()) : 1.0;
  hub.SetVisibleRect(Tarsa::CRect{std::int32_t(std::floor(visible.left * toDisplay)) - 1,
                                  std::int32_t(std::floor(visible.top * toDisplay)) - 1,
                                  std::int32_t(std::ceil(visible.right * toDisplay)) + 1,
                                  std::int32_t(std::ceil(visible.bottom * toDisplay)) + 1}
                         .Intersect(display));
}

void PPreviewPane::ZoomChanged() {
  UpdateDisplay();
  Invalidate();
}

void PPreviewPane::ScrollChanged() {
  UpdateDisplay();
  Invalidate();
}

void PPreviewPane::SizeChanged(std::int32_t dx, std::int32_t dy) {
  Tarsa::CZoomPane::SizeChanged(dx, dy);
  UpdateDisplay();
}

void PPreviewPane::PreviewChanged(const Tarsa::CRect& /*area*/) { Invalidate(); }

void PPreviewPane::PreviewProgress(std::uint64_t done, std::uint64_t total) {
  if (Window() == nullptr) return;
  auto* combo = dynamic_cast<Tarsa::CZoomProgressCombo*>(
      Window()->FindView(Tarsa::CObjID::Intern("Project/Dialog/ZoomCombo")));
  if (combo != nullptr) combo->SetProgress(double(done), double(total));
}

void PPreviewPane::Draw(Tarsa::CPort& port) {
  port.FillRect(Image(), kBackground);
  if (filter_ == nullptr) return;
  DrawTiles(port);
  DrawOverlays(port);
  DrawLoupe(port);
}

void PPreviewPane::DrawTiles(Tarsa::CPort& port) {
  PImageHub& hub = filter_->ImageHub();
  if (!hub.HasPreview()) return;
  const PPreview& preview = hub.Preview();
  const Tarsa::CRect display = preview.ViewRect();
  if (display.IsEmpty()) return;
  const Tarsa::CSize document = DocumentSize();
  // Display to view: the display picture is the image at PictureScale().
  const double toViewX = document.width * Zoom() / double(display.Width());
  const double toViewY = document.height * Zoom() / double(display.Height());
  const Tarsa::CRect visible = VisiblePictureRect();
  for (std::int32_t row = 0; row < std::int32_t(preview.Rows()); ++row) {
    for (std::int32_t col = 0; col < std::int32_t(preview.Columns()); ++col) {
      const Tarsa::CRect cell =
          Tarsa::CRect{col * kTile, row * kTile, (col + 1) * kTile, (row + 1) * kTile}.Intersect(
              display);
      const Tarsa::CRect dest{std::int32_t(std::floor(cell.left * toViewX)),
                              std::int32_t(std::floor(cell.top * toViewY)),
                              std::int32_t(std::ceil(cell.right * toViewX)),
                              std::int32_t(std::ceil(cell.bottom * toViewY))};
      if (dest.Intersect(visible).IsEmpty()) continue;
      const std::uint8_t* pixels = preview.TilePixels(col, row);
      if (pixels == nullptr) continue;
      port.DrawImage(pixels, std::int32_t(cell.Width()), std::int32_t(cell.Height()), kTile * 4,
                     dest);
    }
  }
}

void PPreviewPane::DrawOverlays(Tarsa::CPort& port) { DrawOverlays(port, Scale(), 0.0, 0.0); }

void PPreviewPane::DrawOverlays(Tarsa::CPort& port, double scale, double originX, double originY) {
  const PSettings& settings = filter_->Settings();
  ConstraintList& list = filter_->Constraints();
  const ScreenTransform screen{float(scale), float(originX), float(originY), 0.0f, 0.0f};
  if (settings.meshVisible != 0) DrawMesh(list.Env(), port, screen, settings.colorMesh);
  if (settings.constraintsVisible != 0) ConstraintPainter(list, screen).Draw(port, false);
}

bool PPreviewPane::LoupeShown() const {
  return (showDragLoupe_ || showKeyLoupe_) && Zoom() < 1.0 && mouseInside_;
}

void PPreviewPane::DrawLoupe(Tarsa::CPort& port) {
  if (!LoupeShown()) return;
  const std::int32_t size = std::max(16, filter_->Settings().loupeSize);
  const Tarsa::CRect picture = GetImageRect();
  // The square about the mouse, kept inside the pane.
  const Tarsa::CPoint mouse{std::clamp(lastMouse_.x, picture.left, picture.right),
                            std::clamp(lastMouse_.y, picture.top, picture.bottom)};
  const Tarsa::CRect shown = Image();
  Tarsa::CRect square{mouse.x - size / 2, mouse.y - size / 2, mouse.x - size / 2 + size,
                      mouse.y - size / 2 + size};
  square =
      square.Offset(std::max(0, shown.left - square.left), std::max(0, shown.top - square.top));
  square = square.Offset(std::min(0, shown.right - square.right),
                         std::min(0, shown.bottom - square.bottom));
  // The image pixels about the mouse point, kept inside the image.
  const Tarsa::CPointF at = ViewToImage({double(mouse.x), double(mouse.y)});
  const Tarsa::CSize document = DocumentSize();
  Tarsa::CRect area{std::int32_t(at.x) - size / 2, std::int32_t(at.y) - size / 2,
                    std::int32_t(at.x) - size / 2 + size, std::int32_t(at.y) - size / 2 + size};
  area = area.Offset(std::max(0, -area.left), std::max(0, -area.top));
  area = area.Offset(std::min(0, document.width - area.right),
                     std::min(0, document.height - area.bottom));
  filter_->ImageHub().Preview().ReadDetail(area, showSource_, loupePixels_);
  port.FillRect(square, kBackground);
  port.DrawImage(loupePixels_.data(), size, size, size * 4, square);
  // The constraints at 100 % over it, cut to the square.
  port.Save();
  port.Clip(square);
  DrawOverlays(port, 1.0, square.left - area.left, square.top - area.top);
  port.Restore();
  port.FrameRect(square, 0xFF000000);
  // The drop shadow, under and right of the square.
  port.FillRect({square.left + 4, square.bottom, square.right + 3, square.bottom + 3}, 0x66000000);
  port.FillRect({square.right, square.top + 4, square.right + 3, square.bottom}, 0x66000000);
}

void PPreviewPane::SetDragLoupe(bool on) {
  if (on == showDragLoupe_ || (on && filter_ != nullptr && filter_->Settings().loupeVisible == 0))
    return;
  showDragLoupe_ = on;
  Invalidate();
}

void PPreviewPane::SetKeyLoupe(bool on) {
  if (on == showKeyLoupe_) return;
  showKeyLoupe_ = on;
  Invalidate();
}

void PPreviewPane::SetShowSource(bool on) {
  if (on == showSource_) return;
  showSource_ = on;
  Invalidate();
}

void PPreviewPane::SetTempZoom(bool keyDown) {
  const Tarsa::CPointF mouse{double(lastMouse_.x), double(lastMouse_.y)};
  if (keyDown) {
    if (tempZoom_ || !mouseInside_ || Zoom() >= ZoomMax()) return;
    savedZoom_ = Zoom();
    tempZoom_ = true;
    SetZoom(Zoom() >= 1.0 ? std::min(2 * Zoom(), ZoomMax()) : 1.0, &mouse);
  } else if (tempZoom_) {
    tempZoom_ = false;
    SetZoom(savedZoom_, &mouse);
  }
}

void PPreviewPane::MouseMoved(Tarsa::CMouseMessage& message) {
  lastMouse_ = message.where;
  const Tarsa::CRect picture = GetImageRect();
  mouseInside_ = message.where.x >= picture.left && message.where.x <= picture.right &&
                 message.where.y >= picture.top && message.where.y <= picture.bottom;
  if (LoupeShown() || showKeyLoupe_ || showDragLoupe_) Invalidate();
  if (mouseInside_ && Window() != nullptr) {
    auto* detail = dynamic_cast<PDetailedPreviewPane*>(
        Window()->FindView(Tarsa::CObjID::Intern("Project/Dialog/DetailedPreviewPane")));
    const Tarsa::CPointF at = ViewToImage({double(lastMouse_.x), double(lastMouse_.y)});
    if (detail != nullptr) detail->SetCenter({std::int32_t(at.x), std::int32_t(at.y)});
  }
}

void PPreviewPane::MouseEnter() {
  // The picture takes the keys while the mouse is over it: Q, X and L act
  // on what is under the mouse.
  BecomeTarget(true);
}

void PPreviewPane::MouseDown(Tarsa::CMouseMessage& message) {
  // The hand: until the tools come, a press moves the picture.
  Tarsa::CMouseEvent event;
  event.x = message.where.x;
  event.y = message.where.y;
  event.time = message.time;
  event.modifiers = message.modifiers;
  event.button = Tarsa::CMouseEvent::ButtonOf(message.button);
  Tarsa::CPanner panner(this, Tarsa::CPanner::kAxisX | Tarsa::CPanner::kAxisY);
  panner.RunPan(event);
  message.SetHandled();
}

}  // namespace Project
