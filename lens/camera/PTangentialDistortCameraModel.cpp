#include "lens/camera/PTangentialDistortCameraModel.h"

#include <cmath>
#include <utility>

namespace Project {

bool PTangentialDistortCameraModel::IsNeutral() const {
  return IsNeutralRadial() && std::fabs(tangential1) <= kEps && std::fabs(tangential2) <= kEps;
}

std::unique_ptr<PGenericCameraModel> PTangentialDistortCameraModel::Clone() const {
  return std::unique_ptr<PGenericCameraModel>(new PTangentialDistortCameraModel(*this));
}

void PTangentialDistortCameraModel::Transpose() {
  PGenericCameraModel::Transpose();
  std::swap(tangential1, tangential2);
}

void PTangentialDistortCameraModel::MapPoint(float x, float y, float& outX, float& outY) const {
  const double dx = static_cast<double>(x) - centerX;
  const double dy = static_cast<double>(y) - centerY;
  const double u = dx / focalX;
  const double v = dy / focalY;
  const double r2 = u * u + v * v;
  const double g = Factor(r2) + 2.0 * (tangential1 * v + tangential2 * u);
  outX = static_cast<float>(g * dx + centerX + tangential2 * focalX * r2);
  outY = static_cast<float>(g * dy + centerY + tangential1 * focalY * r2);
}

void PTangentialDistortCameraModel::MapPointPlain(float x, float y, float& outX,
                                                  float& outY) const {
  const double u = (static_cast<double>(x) - centerX) / focalX;
  const double v = (static_cast<double>(y) - centerY) / focalY;
  const double r2 = u * u + v * v;
  const double f = ((radial3 * r2 + radial2) * r2 + radial1) * r2 + 1.0;
  const double px = 2.0 * tangential1 * u * v + f * u + (2.0 * u * u + r2) * tangential2;
  const double py = (2.0 * v * v + r2) * tangential1 + f * v + 2.0 * tangential2 * u * v;
  outX = static_cast<float>(px * focalX * scale + centerX);
  outY = static_cast<float>(py * focalY * scale + centerY);
}

bool PTangentialDistortCameraModel::IsSameModel(const PGenericCameraModel& other) const {
  return IsSameCalibration(other);
}

bool PTangentialDistortCameraModel::IsSameModel(const PTangentialDistortCameraModel& other) const {
  return IsSameCalibration(other) && IsSameRadial(other) &&
         std::fabs(tangential1 - other.tangential1) <= kEps &&
         std::fabs(tangential2 - other.tangential2) <= kEps;
}

}  // namespace Project
