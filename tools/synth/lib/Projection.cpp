#include "tools/synth/lib/Projection.h"

#include <algorithm>
#include <cmath>
#include <numbers>

namespace Synth {
namespace {

struct NamedKind {
  const char* name;
  ProjectionKind kind;
};

constexpr NamedKind kNames[] = {
    {"rectilinear", ProjectionKind::kRectilinear},
    {"fisheye-equisolid", ProjectionKind::kFisheyeEquisolid},
    {"fisheye-equidistant", ProjectionKind::kFisheyeEquidistant},
    {"cylindrical", ProjectionKind::kCylindrical},
    {"equirectangular", ProjectionKind::kEquirectangular},
    {"radial", ProjectionKind::kRadial},
    {"tangential", ProjectionKind::kTangential},
    {"fisheye-poly", ProjectionKind::kFisheyePoly},
};

// Pinhole kinds beyond this normalised radius (89.94 degrees off axis) are
// out of the domain: nothing that far out images usefully, and it bounds the
// search for a fold.
constexpr double kPinholeRadiusCap = 1000.0;

}  // namespace

const char* ProjectionName(ProjectionKind kind) {
  for (const NamedKind& entry : kNames) {
    if (entry.kind == kind) return entry.name;
  }
  return "?";
}

bool ProjectionFromName(const std::string& name, ProjectionKind* kind) {
  for (const NamedKind& entry : kNames) {
    if (name == entry.name) {
      *kind = entry.kind;
      return true;
    }
  }
  return false;
}

Projection::Projection(ProjectionKind kind, double focal, Point2 centre, Distortion distortion,
                       double maxAngle)
    : kind_(kind),
      focal_(focal),
      centre_(centre),
      distortion_(distortion),
      maxAngle_(std::clamp(maxAngle, 0.0, std::numbers::pi)) {
  if (kind_ == ProjectionKind::kRadial || kind_ == ProjectionKind::kTangential) {
    radiusLimit_ = FoldRadius(kPinholeRadiusCap);
  } else if (kind_ == ProjectionKind::kFisheyePoly) {
    radiusLimit_ = FoldRadius(maxAngle_);
  }
}

double Projection::DistortRadius(double r) const {
  const double r2 = r * r;
  return r * (1.0 + r2 * (distortion_.k1 + r2 * (distortion_.k2 + r2 * distortion_.k3)));
}

double Projection::DistortRadiusSlope(double r) const {
  const double r2 = r * r;
  return 1.0 +
         r2 * (3.0 * distortion_.k1 + r2 * (5.0 * distortion_.k2 + r2 * 7.0 * distortion_.k3));
}

double Projection::FoldRadius(double limit) const {
  // Steps grow with the radius: fine near the axis, where folds of real
  // lenses lie, and still few out to the cap.
  double previous = 0.0;
  for (double r = 0.0; r < limit;) {
    r = std::min(limit, r + 0.002 * (1.0 + r));
    if (DistortRadiusSlope(r) <= 0.0) {
      double low = previous;
      double high = r;
      for (int i = 0; i < 200 && high - low > 1e-15 * high; ++i) {
        const double middle = 0.5 * (low + high);
        (DistortRadiusSlope(middle) > 0.0 ? low : high) = middle;
      }
      return low;
    }
    previous = r;
  }
  return limit;
}

bool Projection::UndistortRadius(double distorted, double* ideal) const {
  double low = 0.0;
  double high = radiusLimit_;
  if (distorted < 0.0 || distorted > DistortRadius(high)) return false;
  double r = std::min(distorted, high);
  for (int i = 0; i < 200; ++i) {
    const double residual = DistortRadius(r) - distorted;
    (residual > 0.0 ? high : low) = r;
    double next = r - residual / DistortRadiusSlope(r);
    // The distorted radius rises monotonically on [0, limit], so the root
    // stays bracketed; a Newton step that leaves the bracket is replaced by
    // halving it.
    if (!(next >= low && next <= high)) next = 0.5 * (low + high);
    if (std::abs(next - r) <= 1e-15 * (1.0 + r)) {
      *ideal = next;
      return true;
    }
    r = next;
  }
  return false;
}

void Projection::DistortTangential(double u, double v, double* du, double* dv) const {
  const Distortion& d = distortion_;
  const double r2 = u * u + v * v;
  const double s = 1.0 + r2 * (d.k1 + r2 * (d.k2 + r2 * d.k3));
  *du = u * s + 2.0 * d.t1 * u * v + d.t2 * (r2 + 2.0 * u * u);
  *dv = v * s + d.t1 * (r2 + 2.0 * v * v) + 2.0 * d.t2 * u * v;
}

namespace {

// The Jacobian of the tangential distortion at (u, v), row-major.
void TangentialJacobian(const Distortion& d, double u, double v, double jacobian[4]) {
  const double r2 = u * u + v * v;
  const double s = 1.0 + r2 * (d.k1 + r2 * (d.k2 + r2 * d.k3));
  const double sSlope = d.k1 + r2 * (2.0 * d.k2 + r2 * 3.0 * d.k3);  // ds / d(r^2)
  const double cross = 2.0 * u * v * sSlope + 2.0 * d.t1 * u + 2.0 * d.t2 * v;
  jacobian[0] = s + 2.0 * u * u * sSlope + 2.0 * d.t1 * v + 6.0 * d.t2 * u;
  jacobian[1] = cross;
  jacobian[2] = cross;
  jacobian[3] = s + 2.0 * v * v * sSlope + 6.0 * d.t1 * v + 2.0 * d.t2 * u;
}

double Determinant(const double m[4]) { return m[0] * m[3] - m[1] * m[2]; }

}  // namespace

bool Projection::UndistortTangential(double du, double dv, double* u, double* v) const {
  // Start from the radial part alone: the decentring terms are small.
  double x = du;
  double y = dv;
  const double rho = std::hypot(du, dv);
  double r = 0.0;
  if (rho > 0.0 && UndistortRadius(std::min(rho, DistortRadius(radiusLimit_)), &r)) {
    x = du * r / rho;
    y = dv * r / rho;
  }
  for (int i = 0; i < 100; ++i) {
    double fx = 0.0;
    double fy = 0.0;
    DistortTangential(x, y, &fx, &fy);
    fx -= du;
    fy -= dv;
    double j[4];
    TangentialJacobian(distortion_, x, y, j);
    const double det = Determinant(j);
    if (!(det > 0.0)) return false;
    const double stepX = (j[3] * fx - j[1] * fy) / det;
    const double stepY = (j[0] * fy - j[2] * fx) / det;
    x -= stepX;
    y -= stepY;
    if (std::hypot(stepX, stepY) <= 1e-15 * (1.0 + std::hypot(x, y))) {
      if (std::hypot(x, y) > radiusLimit_) return false;
      TangentialJacobian(distortion_, x, y, j);
      if (!(Determinant(j) > 0.0)) return false;
      *u = x;
      *v = y;
      return true;
    }
  }
  return false;
}

bool Projection::ToImage(const Vec3& d, Point2* out) const {
  const double rho = std::hypot(d.y, d.z);
  const double theta = std::atan2(rho, d.x);
  double u = 0.0;
  double v = 0.0;
  // Radially symmetric kinds: the image radius, then along (y, z).
  double radius = -1.0;
  switch (kind_) {
    case ProjectionKind::kRectilinear:
      if (!(d.x > 0.0)) return false;
      u = d.y / d.x;
      v = d.z / d.x;
      break;
    case ProjectionKind::kRadial:
    case ProjectionKind::kTangential: {
      if (!(d.x > 0.0)) return false;
      u = d.y / d.x;
      v = d.z / d.x;
      if (std::hypot(u, v) > radiusLimit_) return false;
      if (kind_ == ProjectionKind::kRadial) {
        const double r2 = u * u + v * v;
        const double s = 1.0 + r2 * (distortion_.k1 + r2 * (distortion_.k2 + r2 * distortion_.k3));
        u *= s;
        v *= s;
      } else {
        double j[4];
        TangentialJacobian(distortion_, u, v, j);
        if (!(Determinant(j) > 0.0)) return false;
        DistortTangential(u, v, &u, &v);
      }
      break;
    }
    case ProjectionKind::kFisheyeEquisolid:
      if (theta > maxAngle_) return false;
      radius = 2.0 * std::sin(0.5 * theta);
      break;
    case ProjectionKind::kFisheyeEquidistant:
      if (theta > maxAngle_) return false;
      radius = theta;
      break;
    case ProjectionKind::kFisheyePoly:
      if (theta > radiusLimit_) return false;
      radius = DistortRadius(theta);
      break;
    case ProjectionKind::kCylindrical: {
      const double flat = std::hypot(d.x, d.y);
      if (!(flat > 0.0)) return false;
      u = std::atan2(d.y, d.x);
      v = d.z / flat;
      break;
    }
    case ProjectionKind::kEquirectangular: {
      const double flat = std::hypot(d.x, d.y);
      u = flat > 0.0 ? std::atan2(d.y, d.x) : 0.0;
      v = std::atan2(d.z, flat);
      break;
    }
  }
  if (radius >= 0.0 && rho > 0.0) {
    u = radius * d.y / rho;
    v = radius * d.z / rho;
  }
  *out = {centre_.x + focal_ * u, centre_.y - focal_ * v};
  return std::isfinite(out->x) && std::isfinite(out->y);
}

bool Projection::ToDirection(const Point2& p, Vec3* out) const {
  double u = (p.x - centre_.x) / focal_;
  double v = (centre_.y - p.y) / focal_;
  const double rho = std::hypot(u, v);
  double theta = -1.0;  // set by the radially symmetric kinds
  switch (kind_) {
    case ProjectionKind::kRectilinear:
      *out = Normalised({1.0, u, v});
      return true;
    case ProjectionKind::kRadial: {
      double r = 0.0;
      if (!UndistortRadius(rho, &r)) return false;
      const double s = rho > 0.0 ? r / rho : 1.0;
      *out = Normalised({1.0, u * s, v * s});
      return true;
    }
    case ProjectionKind::kTangential: {
      double x = 0.0;
      double y = 0.0;
      if (!UndistortTangential(u, v, &x, &y)) return false;
      *out = Normalised({1.0, x, y});
      return true;
    }
    case ProjectionKind::kFisheyeEquisolid:
      if (0.5 * rho > std::sin(0.5 * maxAngle_)) return false;
      theta = 2.0 * std::asin(0.5 * rho);
      break;
    case ProjectionKind::kFisheyeEquidistant:
      if (rho > maxAngle_) return false;
      theta = rho;
      break;
    case ProjectionKind::kFisheyePoly:
      if (!UndistortRadius(rho, &theta)) return false;
      break;
    case ProjectionKind::kCylindrical:
      if (std::abs(u) > std::numbers::pi) return false;
      *out = DirectionOf(u, std::atan(v));
      return true;
    case ProjectionKind::kEquirectangular:
      if (std::abs(u) > std::numbers::pi || std::abs(v) > 0.5 * std::numbers::pi) return false;
      *out = DirectionOf(u, v);
      return true;
  }
  if (rho == 0.0) {
    *out = {1.0, 0.0, 0.0};
  } else {
    const double s = std::sin(theta) / rho;
    *out = {std::cos(theta), s * u, s * v};
  }
  return true;
}

}  // namespace Synth
