#pragma once

#include "lens/sphere/CentredFocalImage.h"

namespace Project {

// A rectilinear (pinhole) picture: x = focal tan(lon), y = focal tan(lat) / cos(lon),
// about an optical centre that need not be the middle of the picture.
class PerspectiveImage : public CentredFocalImage {
 public:
  // focal in pixels; the centre in pixels from the top left corner.
  PerspectiveImage(std::shared_ptr<const Image> image, float focal, float centerX, float centerY);

  bool Contains(float lon, float lat) const override;
  void GetPosition(float lon, float lat, float& x, float& y) const override;
};

}  // namespace Project
