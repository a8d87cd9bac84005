#pragma once

#include <string>

#include "host/plugin/Descriptor.h"
#include "tools/synth/lib/Render.h"
#include "tools/synth/lib/RenderSpec.h"

namespace Synth {

// The action that corrects a generated photograph: the projection model and
// focal length of the camera that took it, and line constraints on the
// longest visible straight edges of the scene, the vertical ones marked
// vertical. Knowing the scene, the generator can say exactly which image
// curves must come out straight; the demo and the end-to-end tests replay
// it through the host. Stateless.
class ActionWriter {
 public:
  ActionWriter() = delete;

  // The descriptor for up to lineCount edges. Throws SynthError for a
  // projection the module has no plain model of.
  static Host::Descriptor Make(const RenderResult& photo, const CameraSpec& camera, int lineCount);
  // The same, written as an action file.
  static void Write(const RenderResult& photo, const CameraSpec& camera, int lineCount,
                    const std::string& path);
};

}  // namespace Synth
