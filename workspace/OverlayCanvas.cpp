#include "workspace/OverlayCanvas.h"

#include <cmath>

namespace Project {

namespace {

constexpr std::uint32_t kWhite = 0xFFFFFFFF;
constexpr std::uint32_t kBlack = 0xFF000000;

}  // namespace

std::uint32_t OverlayCanvas::WithOpacity(std::uint32_t argb, float opacity) {
  const auto alpha = static_cast<std::uint32_t>(std::lround((argb >> 24) * opacity));
  return (alpha << 24) | (argb & 0x00FFFFFF);
}

void OverlayCanvas::Widen(const Tarsa::CPath& path, double margin) {
  Tarsa::CPointF lo, hi;
  if (!path.Bounds(lo, hi)) return;
  bounds_.Widen({static_cast<float>(lo.x - margin), static_cast<float>(lo.y - margin)});
  bounds_.Widen({static_cast<float>(hi.x + margin), static_cast<float>(hi.y + margin)});
}

void OverlayCanvas::Stroke(const Tarsa::CPath& path, const Tarsa::CStrokeStyle& style) {
  Widen(path, style.width / 2);
  if (port_ != nullptr) port_->StrokePath(path, style);
}

void OverlayCanvas::PaintHandle(const Tarsa::CPath& inside, const Tarsa::CPath& outline,
                                float opacity) {
  Widen(outline, 0.5);
  if (port_ == nullptr) return;
  port_->FillPath(inside, WithOpacity(kWhite, opacity));
  port_->StrokePath(outline, {WithOpacity(kBlack, opacity), 1.0, {}, 0.0});
}

// The white stops at the inner edge of the outline's pen, so that a
// translucent handle's ring is as dark on every side.
void OverlayCanvas::Handle(Point2f centre, float opacity) {
  const auto square = [&](float half) {
    Tarsa::CPath path;
    path.AddRectangle({centre.x - half, centre.y - half}, {centre.x + half, centre.y + half});
    return path;
  };
  if (port_ != nullptr) {
    port_->Save();
    port_->SetAntialias(false);
  }
  PaintHandle(square(kHandleHalf - 0.5f), square(kHandleHalf), opacity);
  if (port_ != nullptr) port_->Restore();
}

void OverlayCanvas::Grip(Point2f centre) {
  Tarsa::CPath inside, outline;
  inside.AddCircle({centre.x, centre.y}, kGripHalf - 0.5f);
  outline.AddCircle({centre.x, centre.y}, kGripHalf);
  PaintHandle(inside, outline, 1.0f);
}

}  // namespace Project
