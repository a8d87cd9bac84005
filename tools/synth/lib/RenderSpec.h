#pragma once

#include <optional>
#include <string>

#include "host/io/ImageMode.h"
#include "tools/synth/lib/Geometry.h"
#include "tools/synth/lib/Projection.h"
#include "tools/synth/lib/Scene.h"

namespace Synth {

// What to render.
struct SceneSpec {
  SceneKind kind = SceneKind::kRoom;
};

// The camera that takes the photograph, and the file's make-up.
struct CameraSpec {
  ProjectionKind projection = ProjectionKind::kRectilinear;
  // The lens's focal length and the body's crop factor; together with the
  // image diagonal they give the focal length in pixels (see FocalPixels).
  double focalMm = 24.0;
  double cropFactor = 1.0;
  int width = 1200;
  int height = 800;
  // 8 or 16 bits a sample, in any of the host's colour models.
  int depth = 8;
  Host::ColourModel colour = Host::ColourModel::kRgb;
  // Degrees; see Camera for their meaning.
  double yaw = 0.0;
  double pitch = 0.0;
  double roll = 0.0;
  // The scene's own standpoint when absent.
  std::optional<Vec3> position;
  // The kind's typical coefficients (DefaultDistortion) when absent.
  std::optional<Distortion> distortion;
  // Field of the fisheyes, degrees from the view axis.
  double maxAngle = 90.0;
  // Rays a pixel is sampled with, along each axis, on a fixed grid.
  int samplesPerAxis = 4;
  std::string make = "Archway";
  std::string model = "Synthetic Camera";
  // A name from the focal length and projection when empty.
  std::string lens;
};

// The focal length in pixels: the image diagonal is taken to be the diagonal
// of the body's sensor, 43.27 mm / cropFactor, so f = focalMm * cropFactor *
// diagonal / 43.27. An equirectangular image always spans 180 degrees of
// latitude over its height: f = height / pi.
double FocalPixels(const CameraSpec& camera);
// Coefficients that bend like a real lens of the kind, gently enough that
// the mapping is one-to-one over the whole frame; zero for the ideal kinds.
Distortion DefaultDistortion(ProjectionKind kind);
// The lens name written to the file.
std::string LensName(const CameraSpec& camera);

}  // namespace Synth
