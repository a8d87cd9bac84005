#include "lens/sphere/FisheyeImage.h"

#include <utility>

namespace Project {

FisheyeImage::FisheyeImage(std::shared_ptr<const Image> image, float focal, float, float)
    : PhotoToSphere(std::move(image)),
      focal_(focal),
      limitRadius_(static_cast<float>(focal * std::sqrt(2.0))) {}

float FisheyeImage::Radius(float lon, float lat) const {
  const float t = Acos(Cos(lon) * Cos(lat));
  return Sin(t * 0.5f) * (focal_ * 2.0f);
}

bool FisheyeImage::Contains(float lon, float lat) const { return limitRadius_ > Radius(lon, lat); }

bool FisheyeImage::Reaches(float lon, float lat) const {
  // 2 sin(75 degrees): 150 degrees from the axis.
  constexpr float kReach = 1.9318517f;
  return focal_ * kReach > Radius(lon, lat);
}

bool FisheyeImage::CoverCircle(float outCentreUv[2], float& outRadius) const {
  outCentreUv[0] = 0.5f;
  outCentreUv[1] = 0.5f;
  outRadius = limitRadius_;
  return true;
}

void FisheyeImage::GetPosition(float lon, float lat, float& x, float& y) const {
  const float a = Cos(lat) * Sin(lon);
  const float b = Sin(lat);
  const float length = std::sqrt(a * a + b * b);
  // The view axis itself has no direction in the plane; it is the centre.
  if (length == 0.0f) {
    x = y = 0.0f;
    return;
  }
  const float k = Radius(lon, lat) / length;
  x = k * a;
  y = k * b;
}

}  // namespace Project
