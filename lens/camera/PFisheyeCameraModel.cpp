#include "lens/camera/PFisheyeCameraModel.h"

#include <cmath>

namespace Project {

bool PFisheyeCameraModel::IsNeutral() const {
  return IsNeutralFrame() && std::fabs(radial1) <= kEps && std::fabs(radial2) <= kEps;
}

std::unique_ptr<PGenericCameraModel> PFisheyeCameraModel::Clone() const {
  return std::unique_ptr<PGenericCameraModel>(new PFisheyeCameraModel(*this));
}

void PFisheyeCameraModel::Prepare(std::int32_t width, std::int32_t height, float focalOverride,
                                  bool keepFocal) {
  float cornerX = 0.0f;
  float cornerY = 0.0f;
  PrepareFrame(width, height, focalOverride, keepFocal, cornerX, cornerY);
  geometricFocal = std::sqrt(focalX * focalY);  // single precision on purpose
  const double corner =
      std::sqrt(static_cast<double>(cornerX) * cornerX + static_cast<double>(cornerY) * cornerY);
  maxAngle = std::atan(corner / geometricFocal);
  // Normalised so that at the farthest corner the angle grows by
  // (scale - 1) + cornerCorrection, radial terms apart.
  linearCoefficient = (scale - 1.0) / maxAngle + 1.0;
  quadraticCoefficient = cornerCorrection / (maxAngle * maxAngle * maxAngle) + radial1;
}

void PFisheyeCameraModel::MapPoint(float x, float y, float& outX, float& outY) const {
  const double dx = static_cast<double>(x) - centerX;
  const double dy = static_cast<double>(y) - centerY;
  if (std::fabs(dx) <= kEps && std::fabs(dy) <= kEps) {
    outX = x;
    outY = y;
    return;
  }
  const double r = std::sqrt(dx * dx + dy * dy);
  const double t = std::atan(r / geometricFocal);
  const double t2 = t * t;
  const double h = ((radial2 * t2 + quadraticCoefficient) * t2 + linearCoefficient) * t;
  const double k = h / r;
  outX = static_cast<float>(focalX * k * dx + centerX);
  outY = static_cast<float>(focalY * k * dy + centerY);
}

bool PFisheyeCameraModel::IsSameModel(const PGenericCameraModel& other) const {
  const auto* fisheye = dynamic_cast<const PFisheyeCameraModel*>(&other);
  return fisheye && IsSameCalibration(other) && std::fabs(radial1 - fisheye->radial1) <= kEps &&
         std::fabs(radial2 - fisheye->radial2) <= kEps;
}

}  // namespace Project
