#pragma once

#include <memory>
#include <vector>

#include "host/io/HostDocument.h"
#include "tools/synth/lib/Camera.h"
#include "tools/synth/lib/RenderSpec.h"
#include "tools/synth/lib/TruthTracer.h"

namespace Synth {

// A rendered photograph: the image as a host document, the image curves of
// the scene's visible straight edges, and the camera that took it (whose
// projection maps any direction to its image position).
struct RenderResult {
  std::unique_ptr<Host::HostDocument> document;
  std::vector<TruthSegment> truth;
  Camera camera;
};

// The camera a CameraSpec describes, placed in a scene: position, turns, projection
// with its focal length in pixels, centred on the image.
Camera MakeCamera(const Scene& scene, const CameraSpec& camera);

// Renders the scene through the camera. Each pixel averages a fixed grid of
// samplesPerAxis^2 rays; a ray outside the projection's domain sees black.
// Uses every processor. Throws SynthError for unusable settings.
RenderResult Render(const SceneSpec& scene, const CameraSpec& camera);

}  // namespace Synth
