#pragma once

#include <memory>

#include "lens/sphere/PhotoToSphere.h"

namespace Project {

// The part the perspective and panorama models share: one focal length in
// pixels and the optical centre, held as its offset from the middle of the
// picture with y upwards. By default a direction is contained when it lands
// on the picture; the perspective model narrows that to the front half.
class CentredFocalImage : public PhotoToSphere {
 public:
  bool Contains(float lon, float lat) const override;

 protected:
  // focal in pixels; the centre in pixels from the top left corner.
  CentredFocalImage(std::shared_ptr<const Image> image, float focal, float centerX, float centerY);

  const float focal_;
  const float offsetX_;
  const float offsetY_;
};

}  // namespace Project
