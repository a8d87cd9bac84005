#pragma once

#include <string>

#include "host/plugin/Descriptor.h"
#include "tools/synth/lib/Render.h"
#include "tools/synth/lib/RenderSpec.h"

namespace Synth {

// The action that corrects a generated photograph: the projection model and
// focal length of the camera that took it, and line constraints on straight
// edges of the scene. Knowing the scene, the generator can say exactly which
// image curves must come out straight; the demo and the end-to-end tests
// replay it through the host. Stateless.
//
// Two choices of edges. The scene's own is what a photographer would mark:
// in the room every wall corner (vertical), the walls' tops and feet, and the
// window and door frames (their uprights vertical); in the segments scene
// every bar, the vertical ones vertical and the level ones (horizontal and
// square to the camera's heading) horizontal; in the others the 6 longest
// edges. The other choice is the N longest edges, vertical ones vertical.
// Either way a run shorter than 40 pixels end to end is left out: it says
// too little about straightness.
class ActionWriter {
 public:
  ActionWriter() = delete;

  // The descriptor for the scene's own choice. Throws SynthError for a
  // projection the module has no plain model of.
  static Host::Descriptor Make(const RenderResult& photo, const SceneSpec& scene,
                               const CameraSpec& camera);
  // The descriptor for the lineCount longest edges, verticals and the rest
  // taken in turn, and of those only runs at least a tenth of the image's
  // shorter side long.
  static Host::Descriptor Make(const RenderResult& photo, const CameraSpec& camera, int lineCount);

  // The same, written as action files.
  static void Write(const RenderResult& photo, const SceneSpec& scene, const CameraSpec& camera,
                    const std::string& path);
  static void Write(const RenderResult& photo, const CameraSpec& camera, int lineCount,
                    const std::string& path);
};

}  // namespace Synth
