#include "lens/sphere/OrvanePerspective.h"

#include <utility>

namespace Project {

OrvanePerspective::OrvanePerspective(std::shared_ptr<const Image> image, float focalX, float focalY,
                                     float centerX, float centerY, float radial1, float radial2,
                                     float radial3, float tangential1, float tangential2)
    : PhotoToSphere(std::move(image)),
      focalX_(GetImage()->LongerSide() * focalX),
      focalY_(GetImage()->LongerSide() * focalY),
      radial1_(radial1),
      radial2_(radial2),
      radial3_(radial3),
      tangential1_(tangential1),
      tangential2_(tangential2),
      offsetX_((centerX - 0.5f) * GetImage()->LongerSide()),
      offsetY_((0.5f - centerY) * GetImage()->LongerSide()) {}

bool OrvanePerspective::Contains(float lon, float lat) const { return WithinQuarterTurn(lon, lat); }

void OrvanePerspective::GetPosition(float lon, float lat, float& x, float& y) const {
  const float px = Tan(lon);
  const float py = Tan(lat) / Cos(lon);
  const float r2 = px * px + py * py;
  const float f = 1.0f + radial1_ * r2 + radial2_ * r2 * r2 + radial3_ * r2 * r2 * r2;
  const float g = tangential2_ * px + tangential1_ * py;
  x = (2.0f * px * g + px * f + tangential2_ * r2) * focalX_ - offsetX_;
  y = (2.0f * py * g + py * f + tangential1_ * r2) * focalY_ - offsetY_;
}

}  // namespace Project
