#include "lens/sphere/CylindricalImage.h"

#include <utility>

namespace Project {

CylindricalImage::CylindricalImage(std::shared_ptr<const Image> image, float focal, float centerX,
                                   float centerY)
    : CentredFocalImage(std::move(image), focal, centerX, centerY) {}

void CylindricalImage::GetPosition(float lon, float lat, float& x, float& y) const {
  x = focal_ * lon + offsetX_;
  y = focal_ * Tan(lat) + offsetY_;
}

}  // namespace Project
