#pragma once

#include "lens/sphere/PhotoToSphere.h"

namespace Project {

// An equisolid-angle fisheye centred on the picture: a direction at angle t
// from the view axis lands at radius 2 focal sin(t / 2). The focal solver
// builds one of these for every trial focal length.
class FisheyeImage : public PhotoToSphere {
 public:
  // focal in pixels. The centre is not used: the projection is always about
  // the middle of the picture.
  FisheyeImage(std::shared_ptr<const Image> image, float focal, float centerX, float centerY);

  // The front half sphere: t below 90 degrees.
  bool Contains(float lon, float lat) const override;
  // The formula holds on to the far side; a margin short of the pole
  // behind the camera keeps the cells beyond the cover from folding.
  bool Reaches(float lon, float lat) const override;
  // The circle of 90 degrees, about the middle of the picture.
  bool CoverCircle(float outCentreUv[2], float& outRadius) const override;
  void GetPosition(float lon, float lat, float& x, float& y) const override;

  float GetFocal() const { return focal_; }

 private:
  // The radius of the angle from the view axis, 2 focal sin(t / 2).
  float Radius(float lon, float lat) const;

  const float focal_;
  const float limitRadius_;  // the radius at 90 degrees, focal sqrt(2)
};

}  // namespace Project
