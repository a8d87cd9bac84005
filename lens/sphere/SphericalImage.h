#pragma once

#include "lens/sphere/PhotoToSphere.h"

namespace Project {

// An equirectangular panorama: longitude and latitude run linearly along x and y.
class SphericalImage : public PhotoToSphere {
 public:
  // focal in pixels; the centre in pixels from the top left corner.
  SphericalImage(std::shared_ptr<const Image> image, float focal, float centerX, float centerY);

  bool Contains(float lon, float lat) const override;
  void GetPosition(float lon, float lat, float& x, float& y) const override;
  bool WalksToCentre() const override { return false; }

 private:
  const float focal_;
  const float offsetX_;  // the centre's offset from the middle, y upwards
  const float offsetY_;
};

}  // namespace Project
