#include "lens/camera/PGenericCameraModel.h"

#include <algorithm>
#include <cmath>
#include <utility>

namespace Project {

bool PGenericCameraModel::IsValid() const {
  return centerX >= 0.0f && 1.0f >= centerX && centerY >= 0.0f && 1.0f >= centerY &&
         focalX >= 0.0f && focalY >= 0.0f;
}

bool PGenericCameraModel::HasFocalLength() const {
  return IsValid() && focalX > kEps && focalY > kEps;
}

bool PGenericCameraModel::IsNeutralFrame() const {
  return IsValid() && std::fabs(scale - 1.0f) <= kEps && std::fabs(cornerCorrection) <= kEps;
}

bool PGenericCameraModel::IsNeutral() const { return IsNeutralFrame(); }

std::unique_ptr<PGenericCameraModel> PGenericCameraModel::Clone() const {
  return std::unique_ptr<PGenericCameraModel>(new PGenericCameraModel(*this));
}

bool PGenericCameraModel::IsSameCalibration(const PGenericCameraModel& other) const {
  auto near = [](float a, float b) { return std::fabs(a - b) <= kEps; };
  return GetType() == other.GetType() && near(centerX, other.centerX) &&
         near(centerY, other.centerY) && near(focalX, other.focalX) && near(focalY, other.focalY) &&
         near(residualMeanError, other.residualMeanError) &&
         near(residualStdDev, other.residualStdDev);
}

void PGenericCameraModel::Transpose() {
  std::swap(centerX, centerY);
  std::swap(focalX, focalY);
}

void PGenericCameraModel::PrepareFrame(std::int32_t width, std::int32_t height, float focalOverride,
                                       bool keepFocal, float& cornerX, float& cornerY) {
  const float w = static_cast<float>(width);
  const float h = static_cast<float>(height);
  cornerX = std::max(centerX, 1.0f - centerX) * w;
  cornerY = std::max(centerY, 1.0f - centerY) * h;
  centerX *= w;
  centerY *= h;
  if (focalOverride > kEps) {
    if (focalX <= kEps || focalY <= kEps) {
      focalX = focalOverride;
      focalY = focalOverride;
    } else if (!keepFocal) {
      focalY = focalY * focalOverride / focalX;
      focalX = focalOverride;
    }
  }
  // The centre follows its own side but the focal lengths the longer one:
  // that is what the profile's units mean.
  const float m = std::max(w, h);
  focalX *= m;
  focalY *= m;
  const double u = static_cast<double>(cornerX) / focalX;
  const double v = static_cast<double>(cornerY) / focalY;
  maxRadiusSquared = u * u + v * v;
}

void PGenericCameraModel::Prepare(std::int32_t width, std::int32_t height, float focalOverride,
                                  bool keepFocal) {
  float cornerX = 0.0f;
  float cornerY = 0.0f;
  PrepareFrame(width, height, focalOverride, keepFocal, cornerX, cornerY);
  linearCoefficient = scale;
  // Normalised so that the factor reaches scale + cornerCorrection at the
  // farthest corner.
  quadraticCoefficient = cornerCorrection / maxRadiusSquared;
}

void PGenericCameraModel::SetCorrection(float newScale, float newCornerCorrection) {
  scale = newScale;
  cornerCorrection = newCornerCorrection;
}

void PGenericCameraModel::SetScale(float newScale) { scale = newScale; }

void PGenericCameraModel::MapPoint(float x, float y, float& outX, float& outY) const {
  const double dx = static_cast<double>(x) - centerX;
  const double dy = static_cast<double>(y) - centerY;
  const double u = dx / focalX;
  const double v = dy / focalY;
  const double g = quadraticCoefficient * (u * u + v * v) + linearCoefficient;
  outX = static_cast<float>(g * dx + centerX);
  outY = static_cast<float>(g * dy + centerY);
}

void PGenericCameraModel::MapPointPlain(float x, float y, float& outX, float& outY) const {
  outX = (x - centerX) * scale + centerX;
  outY = (y - centerY) * scale + centerY;
}

}  // namespace Project
