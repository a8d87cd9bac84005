// GeodesicLines, continued: what is fitted to the traced constraints (line
// normals, polygon homographies and vertex sets, the automatic rotation) and
// the snapping of a point to a traced arc.

#include <cmath>
#include <numbers>
#include <random>
#include <vector>

#include "solver/geodesic/DenseMatrix.h"
#include "solver/geodesic/GeodesicLines.h"
#include "solver/geodesic/Vec3.h"

// LAPACK's symmetric eigensolver, single precision.
extern "C" void ssyev_(const char* jobz, const char* uplo, const int* n, float* a, const int* lda,
                       float* w, float* work, const int* lwork, int* info);

namespace Project {

namespace {

constexpr std::array<float, 9> kIdentity = {1, 0, 0, 0, 1, 0, 0, 0, 1};

Vec3 Normalised(Vec3 v) { return (1.0 / Length(v)) * v; }

// Two axes of the plane normal to the unit vector c: a = (-c.y, c.x, 0)
// normalised and b = c x a. At the poles that a vanishes and the x axis
// stands in for it.
void PlaneAxes(Vec3 c, Vec3& a, Vec3& b) {
  a = {-c.y, c.x, 0.0};
  a = Length(a) > 0.0 ? Normalised(a) : Vec3{1.0, 0.0, 0.0};
  b = Normalised(Cross(c, a));
}

std::array<float, 9> ToArray(const DenseMatrix<float>& m) {
  std::array<float, 9> out{};
  for (std::size_t k = 0; k < 9; ++k) out[k] = m.Data()[k];
  return out;
}

}  // namespace

// --- Lines ---

void GeodesicLines::FitLines() {
  // Polygon edges carry fixed normals, so their fits would be read by no
  // one: only the lines keep a fit.
  for (LineRecord& line : lines_) {
    if (line.active) FitLine(line);
  }
}

void GeodesicLines::FitLine(LineRecord& line) const {
  const std::vector<Point2f> points = TraceSamples(line, 1);
  if (points.size() < 2) return;
  double cx = 0.0, cy = 0.0;
  for (const Point2f& p : points) {
    cx += p.x;
    cy += p.y;
  }
  cx /= static_cast<double>(points.size());
  cy /= static_cast<double>(points.size());
  double a = 0.0, b = 0.0, d = 0.0;
  for (const Point2f& p : points) {
    a += (p.x - cx) * (p.x - cx);
    b += (p.x - cx) * (p.y - cy);
    d += (p.y - cy) * (p.y - cy);
  }
  // The smaller eigenvalue of the scatter [[a, b], [b, d]]; its eigenvector
  // is the normal. sqrt(m^2 - (a d - b^2)) in a form that cannot go negative.
  const double m = 0.5 * (a + d);
  const double r = std::sqrt(0.25 * (a - d) * (a - d) + b * b);
  const double l = m - r;
  double nx = b, ny = l - a;
  // That form vanishes on an exactly vertical line; the other one does not.
  if (nx == 0.0 && ny == 0.0) {
    nx = l - d;
    ny = b;
  }
  const double length = std::hypot(nx, ny);
  if (length == 0.0) return;  // all samples at one point
  nx /= length;
  ny /= length;
  line.normal = {static_cast<float>(nx), static_cast<float>(ny)};
  // Each sample's place along the line, by its projection on the direction.
  auto along = [&](const Point2f& p) { return (p.x - cx) * -ny + (p.y - cy) * nx; };
  const double first = along(points.front());
  const double span = along(points.back()) - first;
  if (span == 0.0) return;
  for (std::size_t k = 0; k < points.size(); ++k) {
    line.samples[k].position = static_cast<float>((along(points[k]) - first) / span);
  }
}

// --- Polygons ---

void GeodesicLines::FitHomographies() {
  if (warp_ == nullptr) return;
  for (PlaneRecord& plane : planes_) FitHomography(plane);
}

void GeodesicLines::FitHomography(PlaneRecord& plane) const {
  // Fewer than four points leave the normal equations singular.
  if (plane.samples.size() < 4) return;
  std::array<double, 9>& h = plane.homography;
  for (int round = 0; round < 8; ++round) {
    DenseMatrix<double> jtj(8, 8);
    DenseMatrix<double> jtr(8, 1);
    for (const PlaneSample& sample : plane.samples) {
      float u, v;
      warp_->GetVertexPosition(sample.i, sample.j, u, v);
      const double s = sample.s, t = sample.t;
      const double w = h[6] * s + h[7] * t + 1.0;
      const double x = h[0] * s + h[1] * t + h[2];
      const double y = h[3] * s + h[4] * t + h[5];
      const float rows[2][8] = {
          {static_cast<float>(-s / w), static_cast<float>(-t / w), static_cast<float>(-1.0 / w), 0,
           0, 0, static_cast<float>(s * x / (w * w)), static_cast<float>(t * x / (w * w))},
          {0, 0, 0, static_cast<float>(-s / w), static_cast<float>(-t / w),
           static_cast<float>(-1.0 / w), static_cast<float>(s * y / (w * w)),
           static_cast<float>(t * y / (w * w))}};
      const double residuals[2] = {u - x / w, v - y / w};
      for (int k = 0; k < 2; ++k) {
        for (int r = 0; r < 8; ++r) {
          jtr(r, 0) += static_cast<double>(rows[k][r]) * residuals[k];
          for (int c = 0; c < 8; ++c) {
            jtj(r, c) += static_cast<double>(rows[k][r]) * static_cast<double>(rows[k][c]);
          }
        }
      }
    }
    const DenseMatrix<double> step = jtj.Inverse() * jtr;
    // Points on one line leave the system singular: keep the last good H.
    for (int r = 0; r < 8; ++r) {
      if (!std::isfinite(step(r, 0))) return;
    }
    for (int r = 0; r < 8; ++r) h[static_cast<std::size_t>(r)] -= step(r, 0);
    h[8] = 1.0;
  }
}

bool GeodesicLines::SamplePlane(PlaneRecord& plane) {
  plane.samples.clear();
  plane.spherePoints.clear();
  for (const Point2f& corner : plane.corners) {
    const float fraction[2] = {corner.x, corner.y};
    float point[2];
    Cell cell;
    if (!FindResultPoint(fraction, point) || !FindCell(point, cell, 1)) return false;
    float p[3];
    SpherePoint(point, cell, 1, p);
    plane.spherePoints.push_back({p[0], p[1], p[2]});
  }
  if (plane.spherePoints.size() < 3) return false;

  Vec3 sum;
  for (const auto& p : plane.spherePoints) sum = sum + Vec3::From(p.data());
  const Vec3 centre = Normalised(sum);
  Vec3 axisA, axisB;
  PlaneAxes(centre, axisA, axisB);
  // The corners projected from the centre of the sphere onto the plane
  // tangent at the polygon's centre, where its edges are straight.
  struct P2 {
    double x, y;
  };
  auto project = [&](Vec3 p) {
    const Vec3 q = (1.0 / Dot(p, centre)) * p;
    return P2{Dot(q, axisA), Dot(q, axisB)};
  };
  std::vector<P2> polygon;
  for (const auto& p : plane.spherePoints) polygon.push_back(project(Vec3::From(p.data())));

  std::uniform_real_distribution<double> rayAngle(0.0, 2.0 * std::numbers::pi);
  const std::int32_t n = octaMap_->Width();
  for (std::int32_t j = 0; j < n; ++j) {
    for (std::int32_t i = 0; i < n; ++i) {
      if (!warp_->IsVertexInside(i, j)) continue;
      float rotated[3];
      octaMap_->GetRotatedPoint(i, j, rotated);
      const Vec3 p = Vec3::From(rotated);
      if (Dot(p, centre) < 0.0) continue;  // behind: no projection
      const P2 q = project(p);
      // Crossings of a ray in a random direction with the edges; a random
      // direction avoids running along an edge for any regular layout.
      const double angle = rayAngle(random_);
      const P2 ray = {std::cos(angle), std::sin(angle)};
      int crossings = 0;
      for (std::size_t k = 0; k < polygon.size(); ++k) {
        const P2 e0 = polygon[k];
        const P2 e1 = polygon[(k + 1) % polygon.size()];
        const P2 edge = {e1.x - e0.x, e1.y - e0.y};
        const P2 gap = {e0.x - q.x, e0.y - q.y};
        // q + along ray = e0 + at edge.
        const double det = edge.x * ray.y - ray.x * edge.y;
        if (det == 0.0) continue;
        const double along = (edge.x * gap.y - gap.x * edge.y) / det;
        const double at = (ray.x * gap.y - gap.x * ray.y) / det;
        if (along >= 0.0 && at >= 0.0 && at <= 1.0) ++crossings;
      }
      if (crossings % 2 == 1) plane.samples.push_back({i, j, 0.0f, 0.0f});
    }
  }

  for (PlaneSample& sample : plane.samples) {
    float rotated[3];
    octaMap_->GetRotatedPoint(sample.i, sample.j, rotated);
    const P2 q = project(Vec3::From(rotated));
    sample.s = static_cast<float>(q.x);
    sample.t = static_cast<float>(q.y);
  }
  return true;
}

// --- Rotation ---

void GeodesicLines::ComputeAutoRotation(float out[9]) const {
  const std::array<float, 9> rotation = AutoRotation();
  for (std::size_t k = 0; k < 9; ++k) out[k] = rotation[k];
}

std::array<float, 9> GeodesicLines::AutoRotation() const {
  float scatter[9] = {0, 0, 0, 0, 0, 0, 0, 0, 0};
  float last[3] = {0, 0, 0};
  int count = 0;
  auto collect = [&](const LineRecord& line) {
    // Vertical constraints only: a fixed normal along x.
    if (!line.active || !line.hasFixedNormal || line.samples.empty()) return;
    if (!(0.001f * std::fabs(line.fixedNormal[0]) > std::fabs(line.fixedNormal[1]))) return;
    const LineSample& first = line.samples.front();
    const LineSample& end = line.samples.back();
    if ((first.cellI == -1 && first.cellJ == -1) || (end.cellI == -1 && end.cellJ == -1)) return;
    // The ends' stored directions: the rotation is found for the unrotated
    // sphere.
    auto endPoint = [&](const LineSample& sample) {
      float corners[12];
      GetCellSpherePoints(sample.cellI, sample.cellJ, 0, corners);
      Vec3 p;
      for (int k = 0; k < 4; ++k) {
        p = p + static_cast<double>(sample.weights[static_cast<std::size_t>(k)]) *
                    Vec3::From(corners + 3 * k);
      }
      return p;
    };
    const Vec3 cross = Cross(endPoint(first), endPoint(end));
    if (!(Length(cross) > 0.0)) return;
    const Vec3 unit = Normalised(cross);
    const float n[3] = {static_cast<float>(unit.x), static_cast<float>(unit.y),
                        static_cast<float>(unit.z)};
    for (int r = 0; r < 3; ++r) {
      for (int c = 0; c < 3; ++c) scatter[r * 3 + c] += n[r] * n[c];
      last[r] = n[r];
    }
    ++count;
  };
  for (const LineRecord& line : lines_) collect(line);
  for (const LineRecord& line : CollectEdgeLines()) collect(line);

  if (count == 0) return kIdentity;
  if (count == 1) {
    // Turn about y until the one circle's plane holds the z axis, by the
    // smaller of the two turns that do.
    float a = std::atan2(last[2], last[0]);
    if (std::fabs(a) > 1.570796325f) a += 3.1415927f;
    return ToArray(DenseMatrix<float>::Rotation(1, -a));
  }

  // The common vertical is the direction most nearly normal to every
  // circle's normal: the eigenvector of the smallest eigenvalue.
  const int n = 3;
  int info = 0;
  float eigenvalues[3];
  float query = 0.0f;
  int lwork = -1;
  ssyev_("V", "U", &n, scatter, &n, eigenvalues, &query, &lwork, &info);
  if (info != 0) return kIdentity;
  lwork = static_cast<int>(query);
  std::vector<float> work(static_cast<std::size_t>(lwork));
  ssyev_("V", "U", &n, scatter, &n, eigenvalues, work.data(), &lwork, &info);
  if (info != 0) return kIdentity;
  // Column-major: eigenvector k is scatter[3k .. 3k + 2], in ascending order.
  Vec3 e0 = Vec3::From(scatter);
  if (e0.z < 0.0) e0 = -e0;
  const Vec3 e1 = Vec3::From(scatter + 3);
  const Vec3 e2 = Cross(e1, e0);
  DenseMatrix<float> e(3, 3);
  const Vec3 rows[3] = {e2, e1, e0};
  for (int r = 0; r < 3; ++r) {
    e(r, 0) = static_cast<float>(rows[r].x);
    e(r, 1) = static_cast<float>(rows[r].y);
    e(r, 2) = static_cast<float>(rows[r].z);
  }
  // Then about the new vertical, so that the view axis keeps its heading.
  const float a = std::atan2(static_cast<float>(e1.x), static_cast<float>(e2.x));
  return ToArray(DenseMatrix<float>::Rotation(2, a) * e);
}

// --- Snapping ---

bool GeodesicLines::FindSpherePoint(const float direction[3], std::int32_t mode,
                                    float outPoint[2]) const {
  if (warp_ == nullptr) return false;
  const Vec3 ray = Vec3::From(direction);
  const std::int32_t cells = octaMap_->Width() - 1;
  double bestDistance = 0.0;
  bool hit = false;
  for (std::int32_t j = 0; j < cells; ++j) {
    for (std::int32_t i = 0; i < cells; ++i) {
      if (!warp_->IsQuadInside(i, j)) continue;
      float sphere[12];
      GetCellSpherePoints(i, j, mode, sphere);
      Vec3 p[4];
      for (int k = 0; k < 4; ++k) p[k] = Vec3::From(sphere + 3 * k);
      float plane[8];
      GetCellCorners(i, j, mode, plane);
      const bool alongFirst = octaMap_->SplitsAlongMainDiagonal(i, j);
      const int triangles[2][3] = {{0, 1, alongFirst ? 2 : 3}, {alongFirst ? 0 : 1, 2, 3}};
      for (const auto& tri : triangles) {
        // The ray from the centre against the triangle's plane, with the
        // hit's barycentric coordinates.
        const Vec3 v0 = p[tri[0]];
        const Vec3 edge1 = p[tri[1]] - v0;
        const Vec3 edge2 = p[tri[2]] - v0;
        const Vec3 pv = Cross(ray, edge2);
        const double det = Dot(edge1, pv);
        if (std::fabs(det) < 1e-6) continue;
        const Vec3 tv = -v0;
        const double u = Dot(tv, pv) / det;
        if (u < 0.0 || u > 1.0) continue;
        const Vec3 qv = Cross(tv, edge1);
        const double v = Dot(ray, qv) / det;
        if (v < 0.0 || u + v > 1.0) continue;
        const double along = Dot(edge2, qv) / det;
        const Vec3 gap = along * ray - ray;
        const double distance = Dot(gap, gap);
        if (hit && distance >= bestDistance) continue;
        hit = true;
        bestDistance = distance;
        const double w[3] = {1.0 - u - v, u, v};
        double x = 0.0, y = 0.0;
        for (int k = 0; k < 3; ++k) {
          x += w[k] * plane[2 * tri[k]];
          y += w[k] * plane[2 * tri[k] + 1];
        }
        outPoint[0] = static_cast<float>(x);
        outPoint[1] = static_cast<float>(y);
      }
    }
  }
  return hit;
}

bool GeodesicLines::SnapToArc(const float point[2], const float a[2], const float b[2],
                              std::int32_t mode, const float pixelsPerUnit[2],
                              float outPoint[2]) const {
  auto toSphere = [&](const float q[2], Vec3& out) {
    Cell cell;
    if (!FindCell(q, cell, mode)) return false;
    float s[3];
    SpherePoint(q, cell, mode, s);
    out = Normalised(Vec3::From(s));
    return true;
  };
  Vec3 endA, endB, p;
  if (!toSphere(a, endA) || !toSphere(b, endB) || !toSphere(point, p)) return false;
  const Vec3 n = Cross(endA, endB);
  // The nearest direction to p on the circle, on the ends' side of it.
  Vec3 nearest = Cross(Cross(n, p), n);
  if (!(Length(nearest) > 0.0)) return false;
  nearest = Normalised(nearest);
  if (Dot(nearest, endA + endB) < 0.0) nearest = -nearest;
  const float direction[3] = {static_cast<float>(nearest.x), static_cast<float>(nearest.y),
                              static_cast<float>(nearest.z)};
  float snapped[2];
  if (!FindSpherePoint(direction, mode, snapped)) return false;
  const double dx = (snapped[0] - point[0]) * static_cast<double>(pixelsPerUnit[0]);
  const double dy = (snapped[1] - point[1]) * static_cast<double>(pixelsPerUnit[1]);
  if (dx * dx + dy * dy > static_cast<double>(kMaxSnapPixels) * kMaxSnapPixels) return false;
  outPoint[0] = snapped[0];
  outPoint[1] = snapped[1];
  return true;
}

}  // namespace Project
