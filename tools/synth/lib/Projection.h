#pragma once

#include <string>

#include "tools/synth/lib/Geometry.h"

namespace Synth {

enum class ProjectionKind {
  kRectilinear,         // pinhole: r = f tan(theta)
  kFisheyeEquisolid,    // r = 2 f sin(theta / 2)
  kFisheyeEquidistant,  // r = f theta
  kCylindrical,         // x = f lon, y = f tan(lat)
  kEquirectangular,     // x = f lon, y = f lat
  kRadial,              // pinhole, then radial distortion
  kTangential,          // pinhole, then radial and decentring (tangential) distortion
  kFisheyePoly,         // r = f (theta + k1 theta^3 + k2 theta^5 + k3 theta^7)
};

// The command-line name of a kind ("fisheye-equisolid"), and back; false for
// an unknown name.
const char* ProjectionName(ProjectionKind kind);
bool ProjectionFromName(const std::string& name, ProjectionKind* kind);

// Lens distortion coefficients on normalised image coordinates (u to the right,
// v upwards, in units of the focal length). The pinhole kinds scale the ideal
// point by 1 + k1 r^2 + k2 r^4 + k3 r^6 and, for the tangential kind, add the
// decentring terms (t2 along u, t1 along v); the polynomial fisheye uses k1,
// k2 and k3 on the angle (theta^3, theta^5, theta^7).
struct Distortion {
  double k1 = 0.0;
  double k2 = 0.0;
  double k3 = 0.0;
  double t1 = 0.0;
  double t2 = 0.0;
};

// One camera projection between directions in the camera's frame and image
// positions. Written from the lenses' textbook formulas and deliberately
// sharing nothing with the module's camera code, which is tested against it.
// The distorted kinds are inverted numerically (safeguarded Newton in one
// dimension, plain Newton in two for the tangential terms), and each kind's
// domain stops where its mapping stops being one-to-one, so that every
// direction inside has exactly one image position. A value.
class Projection {
 public:
  // focal in pixels; centre is the image position of the view axis.
  // maxAngle (radians from the view axis) bounds the two ideal fisheyes and
  // the polynomial one; the other kinds have their own natural domain.
  Projection(ProjectionKind kind, double focal, Point2 centre, Distortion distortion = {},
             double maxAngle = 1.5707963267948966);

  ProjectionKind Kind() const { return kind_; }
  double Focal() const { return focal_; }
  Point2 Centre() const { return centre_; }
  const Distortion& Coefficients() const { return distortion_; }

  // A unit direction to its image position; false outside the domain.
  bool ToImage(const Vec3& direction, Point2* out) const;
  // An image position to its unit direction; false where no direction of
  // the domain lands there (or the inversion does not converge).
  bool ToDirection(const Point2& point, Vec3* out) const;

 private:
  // Distorted radius of an ideal one for the radially symmetric kinds, and
  // its inverse on [0, radiusLimit_].
  double DistortRadius(double ideal) const;
  double DistortRadiusSlope(double ideal) const;
  bool UndistortRadius(double distorted, double* ideal) const;
  void DistortTangential(double u, double v, double* du, double* dv) const;
  bool UndistortTangential(double du, double dv, double* u, double* v) const;
  // Where the distorted radius stops growing, searched from 0 up to limit.
  double FoldRadius(double limit) const;

  ProjectionKind kind_;
  double focal_;
  Point2 centre_;
  Distortion distortion_;
  double maxAngle_;
  // Largest ideal radius (tan of the angle, or the angle for the fisheyes)
  // inside the domain of the distorted kinds.
  double radiusLimit_ = 0.0;
};

}  // namespace Synth
