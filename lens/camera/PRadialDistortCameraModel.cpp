#include "lens/camera/PRadialDistortCameraModel.h"

#include <cmath>

namespace Project {

bool PRadialDistortCameraModel::IsNeutralRadial() const {
  return IsNeutralFrame() && std::fabs(radial1) <= kEps && std::fabs(radial2) <= kEps &&
         std::fabs(radial3) <= kEps;
}

bool PRadialDistortCameraModel::IsNeutral() const { return IsNeutralRadial(); }

std::unique_ptr<PGenericCameraModel> PRadialDistortCameraModel::Clone() const {
  return std::unique_ptr<PGenericCameraModel>(new PRadialDistortCameraModel(*this));
}

void PRadialDistortCameraModel::Prepare(std::int32_t width, std::int32_t height,
                                        float focalOverride, bool keepFocal) {
  PGenericCameraModel::Prepare(width, height, focalOverride, keepFocal);
  quadraticCoefficient += radial1;
}

double PRadialDistortCameraModel::Factor(double r2) const {
  return ((radial3 * r2 + radial2) * r2 + quadraticCoefficient) * r2 + linearCoefficient;
}

void PRadialDistortCameraModel::MapPoint(float x, float y, float& outX, float& outY) const {
  const double dx = static_cast<double>(x) - centerX;
  const double dy = static_cast<double>(y) - centerY;
  const double u = dx / focalX;
  const double v = dy / focalY;
  const double g = Factor(u * u + v * v);
  outX = static_cast<float>(g * dx + centerX);
  outY = static_cast<float>(g * dy + centerY);
}

void PRadialDistortCameraModel::MapPointPlain(float x, float y, float& outX, float& outY) const {
  const double dx = static_cast<double>(x) - centerX;
  const double dy = static_cast<double>(y) - centerY;
  const double u = dx / focalX;
  const double v = dy / focalY;
  const double r2 = u * u + v * v;
  const double f = ((radial3 * r2 + radial2) * r2 + radial1) * r2 + 1.0;
  outX = static_cast<float>(scale * dx * f + centerX);
  outY = static_cast<float>(scale * dy * f + centerY);
}

bool PRadialDistortCameraModel::IsSameRadial(const PRadialDistortCameraModel& other) const {
  return std::fabs(radial1 - other.radial1) <= kEps && std::fabs(radial2 - other.radial2) <= kEps &&
         std::fabs(radial3 - other.radial3) <= kEps;
}

bool PRadialDistortCameraModel::IsSameModel(const PGenericCameraModel& other) const {
  const auto* radial = dynamic_cast<const PRadialDistortCameraModel*>(&other);
  return radial && IsSameCalibration(other) && IsSameRadial(*radial);
}

}  // namespace Project
