#pragma once

#include "lens/sphere/PhotoToSphere.h"

namespace Project {

// The rectilinear form of a lens profile: the pinhole position with radial
// and tangential (Brown-Conrady) distortion, scaled by focalX and focalY.
// Unlike every other model the centre's offsets are subtracted, so a centre
// right of the middle moves the picture left; the profiles are written so.
class OrvanePerspective : public PhotoToSphere {
 public:
  // The camera model's unprepared fields, as for OrvaneFisheye: fractions of
  // the longer side (focal lengths times the crop ratio) and of the sides.
  OrvanePerspective(std::shared_ptr<const Image> image, float focalX, float focalY, float centerX,
                    float centerY, float radial1, float radial2, float radial3, float tangential1,
                    float tangential2);

  bool Contains(float lon, float lat) const override;
  void GetPosition(float lon, float lat, float& x, float& y) const override;
  bool AddsOffsets() const override { return false; }

 private:
  const float focalX_;  // pixels
  const float focalY_;
  const float radial1_;
  const float radial2_;
  const float radial3_;
  const float tangential1_;
  const float tangential2_;
  const float offsetX_;
  const float offsetY_;
};

}  // namespace Project
