#pragma once

#include <string>
#include <vector>

#include "tools/synth/lib/Geometry.h"
#include "tools/synth/lib/Surface.h"

namespace Synth {

enum class SceneKind { kRoom, kFacade, kChecker, kSegments };

// The command-line name of a scene ("room"), and back; false for an unknown
// name.
const char* SceneName(SceneKind kind);
bool SceneFromName(const std::string& name, SceneKind* kind);

// A world of painted rectangles under a sky, rendered by casting rays. The
// four scenes are built here with fixed sizes and colours:
// - room: a box 8 m deep (x), 6 m wide (y), 3 m high, every wall its own
//   colour, a floor of 0.5 m tiles, windows with frames on the far and left
//   walls and framed doors on the right and back walls;
// - facade: a 28 by 16 m wall with 7 by 5 windows standing on a ground plane,
//   turned 30 degrees from square to the unturned camera;
// - checker: a board of 12 by 9 cells of 0.25 m, 2 m in front of the origin;
// - segments: 21 dark bars hung in a light haze around a camera at (0, 0,
//   1.6), vertical, level, oblique and running away from the view, from the
//   middle of the view out to 64 degrees from it, each a separate blob in
//   the image; their centrelines are the scene's only edges.
// Neighbouring paints differ in brightness by at least 0.1, so every edge
// shows in gray images too.
class Scene {
 public:
  static Scene Make(SceneKind kind);

  // Where a camera stands when no position is given.
  const Vec3& DefaultPosition() const { return defaultPosition_; }

  // The colour seen along a ray: the nearest surface's paint, else the sky.
  Rgb Trace(const Vec3& from, const Vec3& direction) const;
  // The nearest surface's distance along a ray; false when it meets none.
  bool NearestHit(const Vec3& from, const Vec3& direction, double* t) const;
  // Every straight edge once, even where two surfaces share it.
  std::vector<Edge> Edges() const;

 private:
  Scene(Rgb sky, Vec3 defaultPosition) : sky_(sky), defaultPosition_(defaultPosition) {}
  static Scene Room();
  static Scene Facade();
  static Scene Checker();
  static Scene Segments();

  Rgb sky_;
  Vec3 defaultPosition_;
  std::vector<Surface> surfaces_;
};

}  // namespace Synth
