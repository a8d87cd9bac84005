#include "lens/sphere/OrvaneFisheye.h"

#include <utility>

namespace Project {

OrvaneFisheye::OrvaneFisheye(std::shared_ptr<const Image> image, float focalX, float focalY,
                             float centerX, float centerY, float radial1, float radial2)
    : PhotoToSphere(std::move(image)),
      focalX_(GetImage()->LongerSide() * focalX),
      focalY_(GetImage()->LongerSide() * focalY),
      geometricFocal_(std::sqrt(focalX_ * focalY_)),
      radial1_(radial1),
      radial2_(radial2),
      offsetX_((centerX - 0.5f) * GetImage()->LongerSide()),
      offsetY_((0.5f - centerY) * GetImage()->LongerSide()) {}

bool OrvaneFisheye::Contains(float lon, float lat) const { return WithinQuarterTurn(lon, lat); }

void OrvaneFisheye::GetPosition(float lon, float lat, float& x, float& y) const {
  const float px = Tan(lon) * geometricFocal_;
  const float py = Tan(lat) * geometricFocal_ / Cos(lon);
  const float r = std::sqrt(px * px + py * py);
  // On the view axis the direction in the plane is undefined: the centre.
  if (r == 0.0f) {
    x = offsetX_;
    y = offsetY_;
    return;
  }
  const float t = Atan2(r, geometricFocal_);
  const float t2 = t * t;
  const float p = t + radial1_ * t2 * t + radial2_ * t2 * t2 * t;
  x = focalX_ * p * px / r + offsetX_;
  y = focalY_ * p * py / r + offsetY_;
}

}  // namespace Project
