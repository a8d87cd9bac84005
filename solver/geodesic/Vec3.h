#pragma once

#include <cmath>

namespace Project {

// A direction or point of the sphere in double precision, for the few
// products that tracing and fitting need. Built from the grid's floats.
struct Vec3 {
  double x = 0.0;
  double y = 0.0;
  double z = 0.0;

  static Vec3 From(const float p[3]) { return {p[0], p[1], p[2]}; }

  friend Vec3 operator+(Vec3 a, Vec3 b) { return {a.x + b.x, a.y + b.y, a.z + b.z}; }
  friend Vec3 operator-(Vec3 a, Vec3 b) { return {a.x - b.x, a.y - b.y, a.z - b.z}; }
  friend Vec3 operator-(Vec3 a) { return {-a.x, -a.y, -a.z}; }
  friend Vec3 operator*(double k, Vec3 a) { return {k * a.x, k * a.y, k * a.z}; }
  friend double Dot(Vec3 a, Vec3 b) { return a.x * b.x + a.y * b.y + a.z * b.z; }
  friend Vec3 Cross(Vec3 a, Vec3 b) {
    return {a.y * b.z - a.z * b.y, a.z * b.x - a.x * b.z, a.x * b.y - a.y * b.x};
  }
  friend double Length(Vec3 a) { return std::sqrt(Dot(a, a)); }
  // The angle between two directions of any length, well conditioned at
  // both small and large angles.
  friend double AngleBetween(Vec3 a, Vec3 b) { return std::atan2(Length(Cross(a, b)), Dot(a, b)); }
};

}  // namespace Project
