#include "workspace/PDetailedPreviewPane.h"

#include <algorithm>

#include "filter/PFilter.h"
#include "filter/PImageHub.h"
#include "filter/PPreview.h"
#include "framework/view/CPort.h"
#include "params/PSettings.h"
#include "solver/constraints/ConstraintList.h"
#include "workspace/ConstraintPainter.h"
#include "workspace/MeshPainter.h"

namespace Project {

namespace {

constexpr std::uint32_t kWhite = 0xFFFFFFFF;
constexpr std::uint32_t kBlack = 0xFF000000;

}  // namespace

PDetailedPreviewPane::PDetailedPreviewPane(Tarsa::CObjID id, Tarsa::CView* parent,
                                           const Tarsa::CRect& frame)
    : Tarsa::CPane(id, parent, frame), refreshTimer_(*this) {}

void PDetailedPreviewPane::Attach(PFilter& filter) {
  filter_ = &filter;
  const Tarsa::CRect image = filter.ImageHub().ImageRect();
  center_ = {std::int32_t(image.Width() / 2), std::int32_t(image.Height() / 2)};
  Invalidate();
}

void PDetailedPreviewPane::SetCenter(Tarsa::CPoint imagePoint) {
  if (imagePoint.x == center_.x && imagePoint.y == center_.y) return;
  center_ = imagePoint;
  if (!refreshTimer_.IsRunning()) refreshTimer_.Start();
}

void PDetailedPreviewPane::RefreshTimer::Fire(double /*time*/, double /*elapsed*/) {
  Stop();
  pane_.Invalidate();
}

void PDetailedPreviewPane::SetShowSource(bool on) {
  if (on == showSource_) return;
  showSource_ = on;
  Invalidate();
}

void PDetailedPreviewPane::Draw(Tarsa::CPort& port) {
  const Tarsa::CRect frame = Image();
  port.FillRect(frame, 0xFF808080);
  if (filter_ == nullptr || center_.x < 0) return;
  const auto width = std::int32_t(frame.Width());
  const auto height = std::int32_t(frame.Height());
  const Tarsa::CRect image = filter_->ImageHub().ImageRect();
  // The pane's size in image pixels about the centre, shifted inside the
  // image; an image smaller than the pane stands in its middle.
  const auto place = [](std::int32_t centre, std::int32_t size, std::int32_t extent,
                        std::int32_t& from, std::int32_t& offset) {
    if (extent <= size) {
      from = 0;
      offset = (size - extent) / 2;
      return;
    }
    from = std::clamp(centre - size / 2, 0, extent - size);
    offset = 0;
  };
  std::int32_t left = 0, top = 0, dx = 0, dy = 0;
  place(center_.x, width, std::int32_t(image.Width()), left, dx);
  place(center_.y, height, std::int32_t(image.Height()), top, dy);
  const Tarsa::CRect area{left, top, left + std::min(width, std::int32_t(image.Width())),
                          top + std::min(height, std::int32_t(image.Height()))};
  filter_->ImageHub().Preview().ReadDetail(area, showSource_, buffer_);
  port.DrawImage(
      buffer_.data(), std::int32_t(area.Width()), std::int32_t(area.Height()),
      std::int32_t(area.Width()) * 4,
      Tarsa::CRect{frame.left + dx, frame.top + dy, frame.left + dx + std::int32_t(area.Width()),
                   frame.top + dy + std::int32_t(area.Height())});
  // The constraints, then the mesh, at 100 % over the picture.
  const PSettings& settings = filter_->Settings();
  ConstraintList& list = filter_->Constraints();
  const ScreenTransform screen{1.0f, float(frame.left + dx - area.left),
                               float(frame.top + dy - area.top), 0.0f, 0.0f};
  port.Save();
  port.Clip(frame);
  if (settings.constraintsVisible != 0) ConstraintPainter(list, screen).Draw(port, false);
  if (settings.meshVisible != 0) DrawMesh(list.Env(), port, screen, settings.colorMesh);
  port.Restore();
  // The cross at the centre: white bars with black strokes on the arms.
  const double x = frame.left + width / 2 + 0.5, y = frame.top + height / 2 + 0.5;
  port.Line({x - 3, y}, {x + 3, y}, kWhite);
  port.Line({x, y - 3}, {x, y + 3}, kWhite);
  const auto cx = std::int32_t(x), cy = std::int32_t(y);
  port.FillRect({cx + 4, cy - 1, cx + 8, cy + 2}, kWhite);
  port.FillRect({cx - 7, cy - 1, cx - 3, cy + 2}, kWhite);
  port.FillRect({cx - 1, cy + 4, cx + 2, cy + 8}, kWhite);
  port.FillRect({cx - 1, cy - 7, cx + 2, cy - 3}, kWhite);
  port.Line({x + 4, y}, {x + 7, y}, kBlack);
  port.Line({x - 7, y}, {x - 4, y}, kBlack);
  port.Line({x, y + 4}, {x, y + 7}, kBlack);
  port.Line({x, y - 7}, {x, y - 4}, kBlack);
  port.FillRect({cx, cy, cx + 1, cy + 1}, kBlack);
}

}  // namespace Project
