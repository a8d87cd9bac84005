#pragma once

#include "lens/camera/PRadialDistortCameraModel.h"

namespace Project {

// A rectilinear lens with radial and tangential (decentring) distortion, the
// Brown-Conrady form. tangential1 acts along y and tangential2 along x, so a
// transposed picture swaps them.
class PTangentialDistortCameraModel : public PRadialDistortCameraModel {
 public:
  PTangentialDistortCameraModel() = default;

  std::int32_t GetType() const override { return kTypeTangential; }
  bool IsNeutral() const override;
  std::unique_ptr<PGenericCameraModel> Clone() const override;
  void Transpose() override;
  void MapPoint(float x, float y, float& outX, float& outY) const override;
  void MapPointPlain(float x, float y, float& outX, float& outY) const override;
  // Through the generic argument type this is IsSameCalibration() alone: the
  // distortion terms are compared only when both sides are known to be
  // tangential, by the overload below.
  bool IsSameModel(const PGenericCameraModel& other) const override;
  // Same calibration, radial and tangential terms, within eps.
  virtual bool IsSameModel(const PTangentialDistortCameraModel& other) const;

  float tangential1 = 0.0f;
  float tangential2 = 0.0f;

 protected:
  PTangentialDistortCameraModel(const PTangentialDistortCameraModel&) = default;
};

}  // namespace Project
