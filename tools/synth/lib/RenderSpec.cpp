#include "tools/synth/lib/RenderSpec.h"

#include <cmath>
#include <cstdio>
#include <numbers>

namespace Synth {

double FocalPixels(const CameraSpec& camera) {
  if (camera.projection == ProjectionKind::kEquirectangular) {
    return camera.height / std::numbers::pi;
  }
  const double fullFrameDiagonal = std::hypot(36.0, 24.0);
  return camera.focalMm * camera.cropFactor * std::hypot(camera.width, camera.height) /
         fullFrameDiagonal;
}

Distortion DefaultDistortion(ProjectionKind kind) {
  // Each polynomial's slope 1 + 3 k1 r^2 + 5 k2 r^4 has no real root, so the
  // mapping never folds.
  switch (kind) {
    case ProjectionKind::kRadial:
      return {-0.18, 0.03, 0.0, 0.0, 0.0};
    case ProjectionKind::kTangential:
      return {-0.12, 0.02, 0.0, 0.004, -0.003};
    case ProjectionKind::kFisheyePoly:
      return {-0.04, 0.004, 0.0, 0.0, 0.0};
    default:
      return {};
  }
}

std::string LensName(const CameraSpec& camera) {
  if (!camera.lens.empty()) return camera.lens;
  char name[96];
  std::snprintf(name, sizeof name, "Synthetic %gmm %s", camera.focalMm,
                ProjectionName(camera.projection));
  return name;
}

}  // namespace Synth
