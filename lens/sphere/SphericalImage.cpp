#include "lens/sphere/SphericalImage.h"

#include <utility>

namespace Project {

SphericalImage::SphericalImage(std::shared_ptr<const Image> image, float focal, float centerX,
                               float centerY)
    : CentredFocalImage(std::move(image), focal, centerX, centerY) {}

void SphericalImage::GetPosition(float lon, float lat, float& x, float& y) const {
  x = focal_ * lon + offsetX_;
  y = focal_ * lat + offsetY_;
}

}  // namespace Project
