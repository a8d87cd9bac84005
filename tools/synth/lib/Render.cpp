#include "tools/synth/lib/Render.h"

#include <algorithm>
#include <atomic>
#include <cmath>
#include <numbers>
#include <system_error>
#include <thread>

#include "tools/synth/lib/PixelEncoder.h"
#include "tools/synth/lib/SynthError.h"

namespace Synth {
namespace {

constexpr double kDegree = std::numbers::pi / 180.0;

void Check(const CameraSpec& c) {
  if (c.width < 1 || c.height < 1 || c.width > 30000 || c.height > 30000) {
    throw SynthError("image size must be 1 to 30000 pixels a side");
  }
  if (c.depth != 8 && c.depth != 16) throw SynthError("depth must be 8 or 16");
  if (!(c.focalMm > 0.0) || !std::isfinite(c.focalMm)) {
    throw SynthError("focal length must be above 0 mm");
  }
  if (!(c.cropFactor > 0.0) || !std::isfinite(c.cropFactor)) {
    throw SynthError("crop factor must be above 0");
  }
  if (!(c.maxAngle > 0.0 && c.maxAngle <= 180.0)) {
    throw SynthError("the fisheye field must be above 0 and at most 180 degrees");
  }
  if (c.samplesPerAxis < 1 || c.samplesPerAxis > 16) {
    throw SynthError("samples per axis must be 1 to 16");
  }
}

void RenderRows(const Scene& scene, const Camera& camera, int samples, PixelEncoder* encoder,
                std::atomic<int>* nextRow) {
  const double weight = 1.0 / (samples * samples);
  for (int y = (*nextRow)++; y < camera.Height(); y = (*nextRow)++) {
    for (int x = 0; x < camera.Width(); ++x) {
      Rgb sum;
      for (int j = 0; j < samples; ++j) {
        for (int i = 0; i < samples; ++i) {
          const Point2 p{x + (i + 0.5) / samples, y + (j + 0.5) / samples};
          Vec3 direction;
          if (!camera.Lens().ToDirection(p, &direction)) continue;
          const Rgb c = scene.Trace(camera.Position(), camera.ToWorld(direction));
          sum = {sum.r + c.r, sum.g + c.g, sum.b + c.b};
        }
      }
      encoder->Put(x, y, {sum.r * weight, sum.g * weight, sum.b * weight});
    }
  }
}

}  // namespace

Camera MakeCamera(const Scene& scene, const CameraSpec& c) {
  const Projection projection(c.projection, FocalPixels(c), {0.5 * c.width, 0.5 * c.height},
                              c.distortion.value_or(DefaultDistortion(c.projection)),
                              c.maxAngle * kDegree);
  return Camera(c.position.value_or(scene.DefaultPosition()), c.yaw * kDegree, c.pitch * kDegree,
                c.roll * kDegree, projection, c.width, c.height);
}

RenderResult Render(const SceneSpec& sceneSpec, const CameraSpec& cameraSpec) {
  Check(cameraSpec);
  const Scene scene = Scene::Make(sceneSpec.kind);
  RenderResult result{Host::HostDocument::Create(cameraSpec.width, cameraSpec.height,
                                                 Host::ModeOf(cameraSpec.colour, cameraSpec.depth)),
                      {},
                      MakeCamera(scene, cameraSpec)};

  PixelEncoder encoder(result.document.get());
  std::atomic<int> nextRow{0};
  const unsigned threads = std::clamp(std::thread::hardware_concurrency(), 1u, 16u);
  std::vector<std::thread> workers;
  for (unsigned t = 1; t < threads; ++t) {
    try {
      workers.emplace_back(RenderRows, std::cref(scene), std::cref(result.camera),
                           cameraSpec.samplesPerAxis, &encoder, &nextRow);
    } catch (const std::system_error&) {
      break;  // fewer threads, same picture
    }
  }
  RenderRows(scene, result.camera, cameraSpec.samplesPerAxis, &encoder, &nextRow);
  for (std::thread& worker : workers) worker.join();

  result.truth = TruthTracer(scene, result.camera).Trace();
  return result;
}

}  // namespace Synth
