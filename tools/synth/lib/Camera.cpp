#include "tools/synth/lib/Camera.h"

#include <cmath>

namespace Synth {
namespace {

// Turns a about the unit axis by angle (right-hand rule).
Vec3 Turn(const Vec3& a, const Vec3& axis, double angle) {
  const double c = std::cos(angle);
  const double s = std::sin(angle);
  return c * a + s * Cross(axis, a) + ((1.0 - c) * Dot(axis, a)) * axis;
}

}  // namespace

Camera::Camera(Vec3 position, double yaw, double pitch, double roll, Projection projection,
               int width, int height)
    : position_(position),
      forward_{1.0, 0.0, 0.0},
      right_{0.0, 1.0, 0.0},
      up_{0.0, 0.0, 1.0},
      projection_(projection),
      width_(width),
      height_(height) {
  // Each turn is about a fixed world axis: roll about x, then pitch about y,
  // then yaw about z, the same as heading first, then raising the view, then
  // rolling about it. The axes' signs make each positive angle turn as the
  // class comment says in this (forward, right, up) frame.
  const Vec3 rollAxis{-1.0, 0.0, 0.0};
  const Vec3 pitchAxis{0.0, -1.0, 0.0};
  const Vec3 yawAxis{0.0, 0.0, 1.0};
  for (Vec3* axis : {&forward_, &right_, &up_}) {
    *axis = Turn(Turn(Turn(*axis, rollAxis, roll), pitchAxis, pitch), yawAxis, yaw);
  }
}

Vec3 Camera::ToCamera(const Vec3& world) const {
  return {Dot(world, forward_), Dot(world, right_), Dot(world, up_)};
}

Vec3 Camera::ToWorld(const Vec3& camera) const {
  return camera.x * forward_ + camera.y * right_ + camera.z * up_;
}

bool Camera::Project(const Vec3& point, Point2* out) const {
  const Vec3 offset = point - position_;
  if (Length(offset) == 0.0) return false;
  if (!projection_.ToImage(Normalised(ToCamera(offset)), out)) return false;
  return out->x >= 0.0 && out->x <= width_ && out->y >= 0.0 && out->y <= height_;
}

}  // namespace Synth
