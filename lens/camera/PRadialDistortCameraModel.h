#pragma once

#include "lens/camera/PGenericCameraModel.h"

namespace Project {

// A rectilinear lens with radial distortion: the generic factor gains an even
// polynomial in the normalised radius, with terms of r^2, r^4 and r^6.
class PRadialDistortCameraModel : public PGenericCameraModel {
 public:
  PRadialDistortCameraModel() = default;

  std::int32_t GetType() const override { return kTypeRadial; }
  bool IsNeutral() const override;
  std::unique_ptr<PGenericCameraModel> Clone() const override;
  void Prepare(std::int32_t width, std::int32_t height, float focalOverride,
               bool keepFocal) override;
  void MapPoint(float x, float y, float& outX, float& outY) const override;
  void MapPointPlain(float x, float y, float& outX, float& outY) const override;
  // Same class, same calibration and the same radial terms, within eps.
  virtual bool IsSameModel(const PGenericCameraModel& other) const;

  float radial1 = 0.0f;
  float radial2 = 0.0f;
  float radial3 = 0.0f;

 protected:
  PRadialDistortCameraModel(const PRadialDistortCameraModel&) = default;

  bool IsNeutralRadial() const;
  bool IsSameRadial(const PRadialDistortCameraModel& other) const;
  // The radial factor of MapPoint() at squared normalised radius r2.
  double Factor(double r2) const;
};

}  // namespace Project
