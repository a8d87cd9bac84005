#pragma once

#include "lens/camera/PGenericCameraModel.h"

namespace Project {

// A fisheye lens: equidistant, with the image radius an odd polynomial in the
// angle from the view axis (terms of t, t^3 and t^5). It reads no scale from
// a profile and has no third radial term; scale and corner correction enter
// as angles, normalised by the angle of the farthest corner.
class PFisheyeCameraModel : public PGenericCameraModel {
 public:
  PFisheyeCameraModel() = default;

  std::int32_t GetType() const override { return kTypeFisheye; }
  bool IsNeutral() const override;
  std::unique_ptr<PGenericCameraModel> Clone() const override;
  void Prepare(std::int32_t width, std::int32_t height, float focalOverride,
               bool keepFocal) override;
  // Returns a point within eps of the centre unchanged.
  void MapPoint(float x, float y, float& outX, float& outY) const override;
  // Same class, same calibration and the same radial terms, within eps.
  virtual bool IsSameModel(const PGenericCameraModel& other) const;

  float radial1 = 0.0f;
  float radial2 = 0.0f;
  // Derived by Prepare().
  double geometricFocal = 0.0;  // pixels, the mean of the two focal lengths
  double maxAngle = 0.0;        // radians, from the axis to the farthest corner

 protected:
  PFisheyeCameraModel(const PFisheyeCameraModel&) = default;
};

}  // namespace Project
