#include "framework/view/CZoomPane.h"

#include <algorithm>
#include <cmath>
#include <cstdlib>

#include "framework/process/CKeyCodes.h"

namespace Tarsa {
namespace {

// Ladder values compare with a relative margin, so that a zoom computed as
// 1/3 elsewhere still counts as the step.
constexpr double kSameStep = 1e-9;

bool Below(double a, double b) { return a < b * (1.0 - kSameStep); }

// The picture's extent in view pixels along one side: at least one pixel
// for a picture that has any.
std::int32_t Extent(std::int32_t pixels, double scale, std::int32_t limit) {
  if (pixels <= 0) return 0;
  const double extent = std::round(double(pixels) * scale);
  return std::int32_t(std::clamp(extent, 1.0, double(limit)));
}

}  // namespace

CZoomPane::CZoomPane(CObjID id, CView* parent, const CRect& frame, std::uint32_t options,
                     std::uint32_t binding)
    : CPane(id, parent, frame, options, binding | kBind_Scrollable, 0, 0) {
  SetFill(0xFF808080);
}

void CZoomPane::SetDocumentSize(CSize size) {
  document_ = size;
  UpdateLimits();
  ApplyZoom(std::clamp(zoom_, zoomMin_, zoomMax_), nullptr);
}

void CZoomPane::SetZoomLimits(double layoutMin, double layoutMax) {
  layoutMin_ = layoutMin;
  layoutMax_ = layoutMax;
  UpdateLimits();
  ApplyZoom(std::clamp(zoom_, zoomMin_, zoomMax_), nullptr);
}

void CZoomPane::UpdateLimits() {
  // A layout minimum of zero or less would let the scale reach zero.
  zoomMin_ = std::max(layoutMin_, 1e-6);
  zoomMax_ = layoutMax_;
  const std::int32_t longest = std::max(document_.width, document_.height);
  if (longest > 0) {
    const bool big = (ViewFlags() & kViewFlag_BigCoordinates) != 0;
    const double extent = big ? kBigCoordinateExtent : kCoordinateExtent;
    zoomMin_ = std::max(zoomMin_, DisplayScale() / longest);
    zoomMax_ = std::min(zoomMax_, extent * DisplayScale() / longest);
  }
  zoomMin_ = std::min(zoomMin_, zoomMax_);
}

bool CZoomPane::SetZoom(double value, const CPointF* viewPoint) {
  const double zoom = std::clamp(value, zoomMin_, zoomMax_);
  if (zoom == zoom_) return false;
  return ApplyZoom(zoom, viewPoint);
}

bool CZoomPane::ZoomIn(const CPointF* viewPoint) {
  if (!CanZoomIn()) return false;
  return SetZoom(StepUp(zoom_, zoomMin_, zoomMax_), viewPoint);
}

bool CZoomPane::ZoomOut(const CPointF* viewPoint) {
  if (!CanZoomOut()) return false;
  return SetZoom(StepDown(zoom_, zoomMin_, zoomMax_), viewPoint);
}

double CZoomPane::FitZoom() const {
  const CSize size = Size();
  const double width = size.width - 2.0 * fitCushion_;
  const double height = size.height - 2.0 * fitCushion_;
  if (document_.width <= 0 || document_.height <= 0 || width <= 0 || height <= 0) return zoom_;
  const double fit = std::min(width / document_.width, height / document_.height) * DisplayScale();
  return std::clamp(fit, zoomMin_, zoomMax_);
}

bool CZoomPane::FitInView() { return SetZoom(FitZoom()); }

bool CZoomPane::ActualPixels() { return SetZoom(1.0); }

CRect CZoomPane::PictureRect() const {
  const double scale = Scale();
  const CPoint origin = PictureOrigin();
  return {origin.x, origin.y, origin.x + Extent(document_.width, scale, kCoordinateExtent),
          origin.y + Extent(document_.height, scale, kCoordinateExtent)};
}

CRect CZoomPane::VisiblePictureRect() const { return PictureRect().Intersect(Image()); }

CPointF CZoomPane::ViewToImage(CPointF view) const {
  const CPoint origin = PictureOrigin();
  return {(view.x - origin.x) / Scale(), (view.y - origin.y) / Scale()};
}

CPointF CZoomPane::ImageToView(CPointF image) const {
  const CPoint origin = PictureOrigin();
  return {image.x * Scale() + origin.x, image.y * Scale() + origin.y};
}

double CZoomPane::StepUp(double zoom, double zoomMin, double zoomMax) {
  for (double step : kLadder) {
    if (Below(zoom, step)) return std::clamp(step, zoomMin, zoomMax);
  }
  return zoomMax;
}

double CZoomPane::StepDown(double zoom, double zoomMin, double zoomMax) {
  for (auto it = kLadder.rbegin(); it != kLadder.rend(); ++it) {
    if (Below(*it, zoom)) return std::clamp(*it, zoomMin, zoomMax);
  }
  return zoomMin;
}

double CZoomPane::WheelZoom(double zoom, bool up, double zoomMin, double zoomMax) {
  // The two steps around the zoom: for a zoom on a step, that step and the
  // next one in the wheel's direction.
  double lower = zoomMin;
  double upper = zoomMax;
  for (double step : kLadder) {
    const bool isLower = up ? !Below(zoom, step) : Below(step, zoom);
    if (isLower) {
      lower = step;
    } else {
      upper = step;
      break;
    }
  }
  const double span = upper - lower;
  if (span <= 0.0) return zoom;
  // The tenths already gone from the step the wheel leaves, plus one.
  const double gone = up ? zoom - lower : upper - zoom;
  const double f = std::clamp((std::round(gone / span * 10.0) + 1.0) / 10.0, 0.0, 1.0);
  return up ? lower + f * span : upper - f * span;
}

CObjID CZoomPane::ZoomChangedName() { return CObjID::Intern("tarsa/zoomPane/zoomChanged"); }

CObjID CZoomPane::ScrollChangedName() { return CObjID::Intern("tarsa/zoomPane/scrollChanged"); }

void CZoomPane::MouseWheel(CMouseMessage& message) {
  if (message.wheel == 0) return;
  const bool zooms = (message.modifiers & kModifier_Alt) != 0 || wheelZooms_;
  if (!zooms) {
    const std::int32_t by = -message.wheel * kWheelLine;
    if ((message.modifiers & kModifier_Shift) != 0) {
      ScrollBy(by, 0);
    } else {
      ScrollBy(0, by);
    }
    message.SetHandled();
    return;
  }
  if (!IsLive() || !IsVisible()) return;
  // The picture point under the pointer stays there.
  const CPointF at{double(message.where.x), double(message.where.y)};
  const bool up = message.wheel > 0;
  for (std::int32_t line = 0; line < std::abs(message.wheel); ++line) {
    if ((message.modifiers & kModifier_HighResolutionWheel) != 0) {
      up ? ZoomIn(&at) : ZoomOut(&at);
    } else {
      SetZoom(WheelZoom(zoom_, up, zoomMin_, zoomMax_), &at);
    }
  }
  message.SetHandled();
}

void CZoomPane::SizeChanged(std::int32_t /*dx*/, std::int32_t /*dy*/) {
  ScrollChanged();
  Announce(ScrollChangedName());
}

void CZoomPane::OnScrolled() {
  if (adjusting_) return;
  ScrollChanged();
  Announce(ScrollChangedName());
}

bool CZoomPane::ApplyZoom(double zoom, const CPointF* viewPoint) {
  const CRect before = Image();
  const CPointF at = viewPoint != nullptr ? *viewPoint
                                          : CPointF{before.left + before.Width() * 0.5,
                                                    before.top + before.Height() * 0.5};
  const CPointF onPicture = ViewToImage(at);
  const bool zoomed = zoom != zoom_;
  zoom_ = zoom;
  adjusting_ = true;
  SetContent(PictureRect());
  // The new image's top left puts the picture point back at the same place
  // in the frame.
  const CPointF now = ImageToView(onPicture);
  ScrollTo({std::int32_t(std::lround(now.x - (at.x - before.left))),
            std::int32_t(std::lround(now.y - (at.y - before.top)))});
  adjusting_ = false;
  if (zoomed) {
    ZoomChanged();
    Announce(ZoomChangedName());
  }
  if (Image() != before) {
    ScrollChanged();
    Announce(ScrollChangedName());
  }
  return zoomed;
}

void CZoomPane::Announce(CObjID name) {
  CMessage message(name, 0.0, 0, reinterpret_cast<std::uintptr_t>(this));
  if (Supervisor() != nullptr) Supervisor()->HandleMessage(message);
}

}  // namespace Tarsa
