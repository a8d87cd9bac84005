#include "lens/sphere/PerspectiveImage.h"

#include <utility>

namespace Project {

PerspectiveImage::PerspectiveImage(std::shared_ptr<const Image> image, float focal, float centerX,
                                   float centerY)
    : CentredFocalImage(std::move(image), focal, centerX, centerY) {}

// Only the half sphere in front projects; latitude is free.
bool PerspectiveImage::Contains(float lon, float /*lat*/) const {
  return std::fabs(static_cast<double>(lon)) < 1.57;
}

void PerspectiveImage::GetPosition(float lon, float lat, float& x, float& y) const {
  x = focal_ * Tan(lon) + offsetX_;
  y = focal_ * Tan(lat) / Cos(lon) + offsetY_;
}

}  // namespace Project
