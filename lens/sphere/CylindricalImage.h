#pragma once

#include "lens/sphere/CentredFocalImage.h"

namespace Project {

// A cylindrical panorama: longitude runs linearly along x, y = focal tan(lat).
class CylindricalImage : public CentredFocalImage {
 public:
  // focal in pixels; the centre in pixels from the top left corner.
  CylindricalImage(std::shared_ptr<const Image> image, float focal, float centerX, float centerY);

  void GetPosition(float lon, float lat, float& x, float& y) const override;
  bool WalksToCentre() const override { return false; }
};

}  // namespace Project
