#pragma once

#include "tools/synth/lib/Geometry.h"
#include "tools/synth/lib/Projection.h"

namespace Synth {

// A camera placed in the world: a position, an orientation given as yaw,
// pitch and roll, and a projection onto an image of a given size. The camera
// first turns to its heading (yaw about the world's up axis, positive to the
// right), then raises its view (pitch, positive up), then rolls about its
// view axis (positive tilting its up axis towards its right, so the scene
// turns anticlockwise in the image). A value.
class Camera {
 public:
  // Angles in radians.
  Camera(Vec3 position, double yaw, double pitch, double roll, Projection projection, int width,
         int height);

  const Vec3& Position() const { return position_; }
  const Projection& Lens() const { return projection_; }
  int Width() const { return width_; }
  int Height() const { return height_; }

  // Between the world's frame and the camera's, for directions.
  Vec3 ToCamera(const Vec3& world) const;
  Vec3 ToWorld(const Vec3& camera) const;

  // A world point to its image position: false behind or outside the
  // projection's domain, or off the image (edges included).
  bool Project(const Vec3& point, Point2* out) const;

 private:
  Vec3 position_;
  // The camera's forward, right and up axes in world coordinates.
  Vec3 forward_;
  Vec3 right_;
  Vec3 up_;
  Projection projection_;
  int width_;
  int height_;
};

}  // namespace Synth
