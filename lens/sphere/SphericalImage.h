#pragma once

#include "lens/sphere/CentredFocalImage.h"

namespace Project {

// An equirectangular panorama: longitude and latitude run linearly along x and y.
class SphericalImage : public CentredFocalImage {
 public:
  // focal in pixels; the centre in pixels from the top left corner.
  SphericalImage(std::shared_ptr<const Image> image, float focal, float centerX, float centerY);

  void GetPosition(float lon, float lat, float& x, float& y) const override;
  bool WalksToCentre() const override { return false; }
};

}  // namespace Project
