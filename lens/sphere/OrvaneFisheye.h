#pragma once

#include "lens/sphere/PhotoToSphere.h"

namespace Project {

// The fisheye form of a lens profile: equidistant in the angle t from the
// view axis, with the radius t + radial1 t^3 + radial2 t^5 scaled by focalX
// and focalY on their axes, about the profile's optical centre.
class OrvaneFisheye : public PhotoToSphere {
 public:
  // focalX, focalY, centerX, centerY as a camera model holds them before it is
  // prepared: fractions of the longer image side (focal lengths already
  // multiplied by the crop ratio) and of the image sides. Both are scaled by
  // the longer side here; the camera model's scale does not apply.
  OrvaneFisheye(std::shared_ptr<const Image> image, float focalX, float focalY, float centerX,
                float centerY, float radial1, float radial2);

  bool Contains(float lon, float lat) const override;
  void GetPosition(float lon, float lat, float& x, float& y) const override;

 private:
  const float focalX_;  // pixels
  const float focalY_;
  const float geometricFocal_;
  const float radial1_;
  const float radial2_;
  const float offsetX_;  // the centre's offset from the middle, y upwards
  const float offsetY_;
};

}  // namespace Project
