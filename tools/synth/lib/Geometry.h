#pragma once

#include <cmath>

namespace Synth {

// A point or direction in 3-D. World coordinates are metres with x forward
// (the view axis of an unturned camera), y to the right and z up; a camera's
// own frame uses the same axes, so that a direction's longitude turns from the
// view axis towards the image's right and its latitude rises towards its top.
struct Vec3 {
  double x = 0.0;
  double y = 0.0;
  double z = 0.0;

  friend Vec3 operator+(const Vec3& a, const Vec3& b) { return {a.x + b.x, a.y + b.y, a.z + b.z}; }
  friend Vec3 operator-(const Vec3& a, const Vec3& b) { return {a.x - b.x, a.y - b.y, a.z - b.z}; }
  friend Vec3 operator*(double s, const Vec3& a) { return {s * a.x, s * a.y, s * a.z}; }
  friend bool operator==(const Vec3&, const Vec3&) = default;
};

inline double Dot(const Vec3& a, const Vec3& b) { return a.x * b.x + a.y * b.y + a.z * b.z; }
inline Vec3 Cross(const Vec3& a, const Vec3& b) {
  return {a.y * b.z - a.z * b.y, a.z * b.x - a.x * b.z, a.x * b.y - a.y * b.x};
}
inline double Length(const Vec3& a) { return std::sqrt(Dot(a, a)); }
inline Vec3 Normalised(const Vec3& a) { return (1.0 / Length(a)) * a; }

// The unit direction of a longitude and latitude in radians.
inline Vec3 DirectionOf(double lon, double lat) {
  return {std::cos(lat) * std::cos(lon), std::cos(lat) * std::sin(lon), std::sin(lat)};
}

// A position in an image, in pixels: x to the right, y downwards, the pixel
// (i, j) being the square [i, i + 1) x [j, j + 1), so its centre is at
// (i + 0.5, j + 0.5) and the texture fraction of (x, y) is (x / W, 1 - y / H).
struct Point2 {
  double x = 0.0;
  double y = 0.0;
};

// A colour, each channel 0 to 1, as the encoded (not linear) values.
struct Rgb {
  double r = 0.0;
  double g = 0.0;
  double b = 0.0;
};

}  // namespace Synth
