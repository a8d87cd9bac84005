#include "lens/sphere/CentredFocalImage.h"

#include <utility>

namespace Project {

CentredFocalImage::CentredFocalImage(std::shared_ptr<const Image> image, float focal, float centerX,
                                     float centerY)
    : PhotoToSphere(std::move(image)),
      focal_(focal),
      offsetX_(centerX - GetImage()->width * 0.5f),
      offsetY_(GetImage()->height * 0.5f - centerY) {}

bool CentredFocalImage::Contains(float lon, float lat) const {
  float x = 0.0f;
  float y = 0.0f;
  GetPosition(lon, lat, x, y);
  return ContainsPixel(x, y);
}

}  // namespace Project
