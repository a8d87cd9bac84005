#include "tests/support/QualityMeasures.h"

#include <algorithm>
#include <cmath>
#include <limits>
#include <numbers>
#include <set>
#include <utility>

#include "solver/iterative/IterativeWarpSolver.h"

namespace Project::testing {
namespace {

struct Point {
  double x = 0.0;
  double y = 0.0;
};

// Result-plane units to pixels of an output of the photograph's size that
// shows the whole solved mesh: the full box fitted to the photograph's
// aspect, as the final rendering frames it.
double PixelsPerUnit(const Solver& solver, const QualityContext& context) {
  return context.SourceWidth() / static_cast<double>(solver.FitBox(1).viewWidth);
}

// The photograph point's place in the result plane through the mesh as the
// result is drawn: each cell is drawn as two triangles split as the grid
// says, and a triangle maps its texture coordinates to its positions
// affinely.
bool ResultPoint(CellLocator& locator, Synth::Point2 p, Point& out) {
  float fraction[2];
  OctaMap::Cell cell;
  if (!locator.Locate(p, fraction, cell)) return false;
  const Solver& solver = locator.solver();
  const std::int32_t n = solver.GridSize();
  const std::int32_t ci[4] = {0, 1, 1, 0}, cj[4] = {0, 0, 1, 1};
  double tex[4][2], pos[4][2];
  for (int k = 0; k < 4; ++k) {
    const std::int32_t i = cell.i + ci[k], j = cell.j + cj[k];
    const std::size_t at = (static_cast<std::size_t>(j) * static_cast<std::size_t>(n) + i) * 2;
    for (int d = 0; d < 2; ++d) {
      tex[k][d] = solver.TexCoords()[at + d];
      pos[k][d] = solver.Positions()[at + d];
    }
  }
  // Corners 0 to 3 are (i, j), (i + 1, j), (i + 1, j + 1), (i, j + 1).
  const int split[2][2][3] = {{{0, 3, 1}, {3, 2, 1}}, {{0, 3, 2}, {0, 1, 2}}};
  const auto& triangles = split[solver.GetOctaMap()->SplitsAlongMainDiagonal(cell.i, cell.j)];
  double best = -1e300, result[2] = {0.0, 0.0};
  for (const auto& t : triangles) {
    const double* a = tex[t[0]];
    const double* b = tex[t[1]];
    const double* c = tex[t[2]];
    const double det = (b[0] - a[0]) * (c[1] - a[1]) - (c[0] - a[0]) * (b[1] - a[1]);
    if (det == 0.0) continue;
    const double px = fraction[0] - a[0], py = fraction[1] - a[1];
    const double wb = (px * (c[1] - a[1]) - (c[0] - a[0]) * py) / det;
    const double wc = ((b[0] - a[0]) * py - px * (b[1] - a[1])) / det;
    const double wa = 1.0 - wb - wc;
    const double worst = std::min({wa, wb, wc});
    if (worst <= best) continue;  // the triangle that holds the point best
    best = worst;
    for (int d = 0; d < 2; ++d) {
      result[d] = wa * pos[t[0]][d] + wb * pos[t[1]][d] + wc * pos[t[2]][d];
    }
  }
  out = {result[0], result[1]};
  return best > -1e300;
}

// How far a fitted direction is from the one a pinned line must take.
double DirectionError(const StraightLineFit& fit, std::int32_t orientation) {
  const double a = std::fabs(fit.angle) * 180.0 / std::numbers::pi;  // 0 to 90
  if (orientation == LineConstraint::kHorizontal) return a;
  if (orientation == LineConstraint::kVertical) return 90.0 - a;
  return 0.0;
}

// Both measures of one constrained line. The generator's curve is taken at
// most every `step` pixels along it.
LineQuality MeasureLine(const Solver& solver, const QualityContext& context, const PickedLine& line,
                        double step = 4.0) {
  LineQuality quality;
  const GeodesicLines& store = *solver.GetLines();
  // Where the second and the last but one samples lie on the photograph.
  Synth::Point2 innerFrom = line.curve.front(), innerTo = line.curve.back();
  for (const LineRecord& record : store.GetLines()) {
    if (record.id != line.constraintId) continue;
    std::vector<Point> points;
    for (const Point2f& p : store.TraceSamples(record, 1)) points.push_back({p.x, p.y});
    quality.samples = FitStraightLine(points);
    if (points.size() > 3) {
      quality.innerSamples =
          FitStraightLine(std::vector<Point>(points.begin() + 1, points.end() - 1));
      const std::vector<Point2f> photo = store.TraceSamples(record, 0);
      innerFrom = {photo[1].x * context.SourceWidth(), (1.0 - photo[1].y) * context.SourceHeight()};
      const Point2f last = photo[photo.size() - 2];
      innerTo = {last.x * context.SourceWidth(), (1.0 - last.y) * context.SourceHeight()};
    }
  }
  // The curve's points nearest to the inner ends.
  std::size_t innerFirst = 0, innerLast = line.curve.size() - 1;
  double nearFrom = 1e300, nearTo = 1e300;
  for (std::size_t k = 0; k < line.curve.size(); ++k) {
    const double dFrom = std::hypot(line.curve[k].x - innerFrom.x, line.curve[k].y - innerFrom.y);
    const double dTo = std::hypot(line.curve[k].x - innerTo.x, line.curve[k].y - innerTo.y);
    if (dFrom < nearFrom) nearFrom = dFrom, innerFirst = k;
    if (dTo < nearTo) nearTo = dTo, innerLast = k;
  }
  if (innerFirst > innerLast) std::swap(innerFirst, innerLast);
  std::vector<Point> points, inner;
  CellLocator locator(solver, context);
  double since = step;
  for (std::size_t k = 0; k < line.curve.size(); ++k) {
    if (k > 0) {
      since +=
          std::hypot(line.curve[k].x - line.curve[k - 1].x, line.curve[k].y - line.curve[k - 1].y);
    }
    if (since < step && k + 1 != line.curve.size() && k != innerFirst && k != innerLast) {
      continue;
    }
    since = 0.0;
    Point p;
    if (ResultPoint(locator, line.curve[k], p)) {
      points.push_back(p);
      if (k >= innerFirst && k <= innerLast) inner.push_back(p);
    }
  }
  quality.truth = FitStraightLine(points);
  quality.innerTruth = FitStraightLine(inner);
  quality.directionError = DirectionError(quality.truth, line.orientation);
  quality.innerDirectionError = DirectionError(quality.innerTruth, line.orientation);
  return quality;
}

// Solves the n x n system a x = b in place by elimination with partial
// pivoting; false when it is singular.
bool SolveDense(std::vector<double>& a, std::vector<double>& b, int n) {
  for (int c = 0; c < n; ++c) {
    int pivot = c;
    for (int r = c + 1; r < n; ++r) {
      if (std::fabs(a[r * n + c]) > std::fabs(a[pivot * n + c])) pivot = r;
    }
    if (a[pivot * n + c] == 0.0) return false;
    for (int k = 0; k < n; ++k) std::swap(a[c * n + k], a[pivot * n + k]);
    std::swap(b[c], b[pivot]);
    for (int r = c + 1; r < n; ++r) {
      const double f = a[r * n + c] / a[c * n + c];
      for (int k = c; k < n; ++k) a[r * n + k] -= f * a[c * n + k];
      b[r] -= f * b[c];
    }
  }
  for (int c = n - 1; c >= 0; --c) {
    for (int k = c + 1; k < n; ++k) b[c] -= a[c * n + k] * b[k];
    b[c] /= a[c * n + c];
  }
  return true;
}

// The largest distance of the points `to` from the homography of `from`
// that fits them best (in the sum of squared distances): a linear fit, then
// Gauss-Newton on the distances. Both point sets are centred and scaled first.
double HomographyResidual(const std::vector<Point>& from, const std::vector<Point>& to) {
  const std::size_t count = from.size();
  if (count < 5 || to.size() != count) return -1.0;
  auto normaliser = [](const std::vector<Point>& points, double& cx, double& cy, double& scale) {
    cx = cy = 0.0;
    for (const Point& p : points) {
      cx += p.x;
      cy += p.y;
    }
    cx /= static_cast<double>(points.size());
    cy /= static_cast<double>(points.size());
    double spread = 0.0;
    for (const Point& p : points) spread += std::hypot(p.x - cx, p.y - cy);
    scale = spread / static_cast<double>(points.size());
  };
  double fx, fy, fs, tx, ty, ts;
  normaliser(from, fx, fy, fs);
  normaliser(to, tx, ty, ts);
  std::vector<Point> a(count), b(count);
  for (std::size_t k = 0; k < count; ++k) {
    a[k] = {(from[k].x - fx) / fs, (from[k].y - fy) / fs};
    b[k] = {(to[k].x - tx) / ts, (to[k].y - ty) / ts};
  }
  // h0 .. h7 of H with h8 = 1; first the algebraic fit u (h6 s + h7 t + 1) =
  // h0 s + h1 t + h2, which is linear.
  std::vector<double> h(8, 0.0);
  {
    std::vector<double> m(64, 0.0), r(8, 0.0);
    for (std::size_t k = 0; k < count; ++k) {
      const double s = a[k].x, t = a[k].y, u = b[k].x, v = b[k].y;
      const double rowU[8] = {s, t, 1, 0, 0, 0, -u * s, -u * t};
      const double rowV[8] = {0, 0, 0, s, t, 1, -v * s, -v * t};
      for (int i = 0; i < 8; ++i) {
        for (int j = 0; j < 8; ++j) m[i * 8 + j] += rowU[i] * rowU[j] + rowV[i] * rowV[j];
        r[i] += rowU[i] * u + rowV[i] * v;
      }
    }
    if (!SolveDense(m, r, 8)) return -1.0;
    h = r;
  }
  auto residuals = [&](std::size_t k, double& ru, double& rv, double& w, double& x, double& y) {
    const double s = a[k].x, t = a[k].y;
    w = h[6] * s + h[7] * t + 1.0;
    x = h[0] * s + h[1] * t + h[2];
    y = h[3] * s + h[4] * t + h[5];
    ru = x / w - b[k].x;
    rv = y / w - b[k].y;
  };
  for (int round = 0; round < 10; ++round) {
    std::vector<double> m(64, 0.0), g(8, 0.0);
    for (std::size_t k = 0; k < count; ++k) {
      double ru, rv, w, x, y;
      residuals(k, ru, rv, w, x, y);
      const double s = a[k].x, t = a[k].y;
      const double ju[8] = {s / w, t / w, 1 / w, 0, 0, 0, -s * x / (w * w), -t * x / (w * w)};
      const double jv[8] = {0, 0, 0, s / w, t / w, 1 / w, -s * y / (w * w), -t * y / (w * w)};
      for (int i = 0; i < 8; ++i) {
        for (int j = 0; j < 8; ++j) m[i * 8 + j] += ju[i] * ju[j] + jv[i] * jv[j];
        g[i] -= ju[i] * ru + jv[i] * rv;
      }
    }
    if (!SolveDense(m, g, 8)) break;
    for (int i = 0; i < 8; ++i) h[i] += g[i];
  }
  double worst = 0.0;
  for (std::size_t k = 0; k < count; ++k) {
    double ru, rv, w, x, y;
    residuals(k, ru, rv, w, x, y);
    worst = std::max(worst, std::hypot(ru, rv) * ts);
  }
  return worst;
}

// How far the scene plane's image in the result is from one homography of
// the plane, in result-plane units: a grid of its points through the
// camera and the mesh, less a margin at its border.
double MeasurePlane(const QualityScene& scene, const ScenePlane& plane, int steps = 12) {
  std::vector<Point> from, to;
  CellLocator locator(const_cast<QualityScene&>(scene).solver(), scene.context);
  for (int a = 0; a <= steps; ++a) {
    for (int b = 0; b <= steps; ++b) {
      const double s = 0.02 + 0.96 * a / steps, t = 0.02 + 0.96 * b / steps;
      Synth::Point2 image;
      Point result;
      if (!scene.camera.Project(plane.At(s, t), &image)) continue;
      if (!ResultPoint(locator, image, result)) continue;
      from.push_back({s, t});
      to.push_back(result);
    }
  }
  return HomographyResidual(from, to);
}

// The same at the grid vertices that the polygon holds: each vertex's
// direction meets the scene plane at the plane coordinates it should map
// from. Free of the mesh's interpolation between vertices.
double MeasurePlaneVertices(const QualityScene& scene, const ScenePlane& plane) {
  Solver& solver = const_cast<QualityScene&>(scene).solver();
  const Synth::Vec3 normal = Synth::Cross(plane.u, plane.v);
  const Synth::Vec3 eye = scene.camera.Position();
  const std::size_t n = static_cast<std::size_t>(solver.GridSize());
  std::vector<Point> from, to;
  for (const PlaneRecord& record : solver.GetLines()->GetPlanes()) {
    for (const PlaneSample& sample : record.samples) {
      float p[3];
      solver.GetOctaMap()->GetPoint(sample.i, sample.j, p);  // the camera's own frame
      const Synth::Vec3 d = scene.camera.ToWorld({p[0], p[1], p[2]});
      const double along = Synth::Dot(plane.origin - eye, normal) / Synth::Dot(d, normal);
      const Synth::Vec3 offset = eye + along * d - plane.origin;
      from.push_back({Synth::Dot(offset, plane.u) / Synth::Dot(plane.u, plane.u),
                      Synth::Dot(offset, plane.v) / Synth::Dot(plane.v, plane.v)});
      const std::size_t at = (static_cast<std::size_t>(sample.j) * n + sample.i) * 2;
      to.push_back({solver.Positions()[at], solver.Positions()[at + 1]});
    }
  }
  return HomographyResidual(from, to);
}

// The cells that hold a sample of any constraint: a line's samples, a
// polygon's edges and the cells around its inner vertices.
std::set<std::pair<std::int32_t, std::int32_t>> ConstrainedCells(const Solver& solver) {
  const GeodesicLines& lines = *solver.GetLines();
  std::set<std::pair<std::int32_t, std::int32_t>> held;
  auto holdLine = [&](const LineRecord& line) {
    for (const LineSample& sample : line.samples) held.insert({sample.cellI, sample.cellJ});
  };
  for (const LineRecord& line : lines.GetLines()) holdLine(line);
  for (const PlaneRecord& plane : lines.GetPlanes()) {
    for (const LineRecord& edge : plane.edges) holdLine(edge);
    for (const PlaneSample& sample : plane.samples) {
      for (std::int32_t dj = -1; dj <= 0; ++dj) {
        for (std::int32_t di = -1; di <= 0; ++di) held.insert({sample.i + di, sample.j + dj});
      }
    }
  }
  return held;
}

// The ratio of the larger to the smaller singular value of each cell's map
// from the sphere's tangent plane at its middle to the result plane (the
// least-squares affine map of its four corners), over the visible cells not
// in `held`. 1 is conformal. The ratio does not depend on the grid's
// rotation, which moves every tangent plane rigidly.
Conformality MeasureConformality(const Solver& solver,
                                 const std::set<std::pair<std::int32_t, std::int32_t>>& held) {
  const OctaMap& grid = *solver.GetOctaMap();
  const std::int32_t n = solver.GridSize(), cells = solver.CellCount();
  std::vector<double> ratios;
  const std::int32_t ci[4] = {0, 1, 1, 0}, cj[4] = {0, 0, 1, 1};
  for (std::int32_t j = 0; j < cells; ++j) {
    for (std::int32_t i = 0; i < cells; ++i) {
      if (!solver.IsCellInMask(i, j) || !solver.IsCellVisible(i, j) || held.count({i, j}) != 0) {
        continue;
      }
      double sphere[4][3], middle[3] = {0, 0, 0};
      for (int k = 0; k < 4; ++k) {
        float p[3];
        grid.GetRotatedPoint(i + ci[k], j + cj[k], p);
        for (int d = 0; d < 3; ++d) {
          sphere[k][d] = p[d];
          middle[d] += p[d];
        }
      }
      const double length =
          std::sqrt(middle[0] * middle[0] + middle[1] * middle[1] + middle[2] * middle[2]);
      for (double& m : middle) m /= length;
      // A tangent frame at the middle: any pair of orthonormal axes will do,
      // since only the singular values are kept.
      const double helper[3] = {std::fabs(middle[2]) < 0.9 ? 0.0 : 1.0, 0.0,
                                std::fabs(middle[2]) < 0.9 ? 1.0 : 0.0};
      double e1[3] = {helper[1] * middle[2] - helper[2] * middle[1],
                      helper[2] * middle[0] - helper[0] * middle[2],
                      helper[0] * middle[1] - helper[1] * middle[0]};
      const double e1Length = std::sqrt(e1[0] * e1[0] + e1[1] * e1[1] + e1[2] * e1[2]);
      for (double& e : e1) e /= e1Length;
      const double e2[3] = {middle[1] * e1[2] - middle[2] * e1[1],
                            middle[2] * e1[0] - middle[0] * e1[2],
                            middle[0] * e1[1] - middle[1] * e1[0]};
      // Least squares of P = J q + c over the four corners, q the gnomonic
      // tangent coordinates.
      double m[9] = {0, 0, 0, 0, 0, 0, 0, 0, 0}, ru[3] = {0, 0, 0}, rv[3] = {0, 0, 0};
      for (int k = 0; k < 4; ++k) {
        const double dot =
            sphere[k][0] * middle[0] + sphere[k][1] * middle[1] + sphere[k][2] * middle[2];
        const double q[3] = {
            (sphere[k][0] * e1[0] + sphere[k][1] * e1[1] + sphere[k][2] * e1[2]) / dot,
            (sphere[k][0] * e2[0] + sphere[k][1] * e2[1] + sphere[k][2] * e2[2]) / dot, 1.0};
        const std::size_t at =
            (static_cast<std::size_t>(j + cj[k]) * static_cast<std::size_t>(n) + i + ci[k]) * 2;
        const double pu = solver.Positions()[at], pv = solver.Positions()[at + 1];
        for (int r = 0; r < 3; ++r) {
          for (int c = 0; c < 3; ++c) m[r * 3 + c] += q[r] * q[c];
          ru[r] += q[r] * pu;
          rv[r] += q[r] * pv;
        }
      }
      std::vector<double> mu(m, m + 9), mv(m, m + 9), bu(ru, ru + 3), bv(rv, rv + 3);
      if (!SolveDense(mu, bu, 3) || !SolveDense(mv, bv, 3)) continue;
      // Singular values of [a b; c d] from its conformal and anticonformal parts.
      const double a = bu[0], b = bu[1], c = bv[0], d = bv[1];
      const double q = std::hypot(0.5 * (a + d), 0.5 * (c - b));
      const double r = std::hypot(0.5 * (a - d), 0.5 * (c + b));
      // A folded cell (q < r) counts by its distortion all the same.
      ratios.push_back(q == r ? std::numeric_limits<double>::infinity()
                              : (q + r) / std::fabs(q - r));
    }
  }
  Conformality result;
  result.cells = ratios.size();
  if (ratios.empty()) return result;
  std::sort(ratios.begin(), ratios.end());
  result.median = ratios[ratios.size() / 2];
  result.p95 = ratios[std::min(ratios.size() - 1, ratios.size() * 95 / 100)];
  return result;
}

}  // namespace

SceneReport RunScene(QualityScene& scene, std::size_t lineCount, bool pin,
                     const ScenePlane* polygon) {
  SceneReport report;
  std::vector<PickedLine> lines = scene.Pick(lineCount, pin);
  report.picked = lines.size();
  report.traced = scene.AddLines(lines);
  for (const PickedLine& line : lines) {
    if (line.orientation != LineConstraint::kUnfixed) ++report.pinned;
  }
  if (polygon != nullptr) report.polygon = scene.AddPolygon(*polygon);
  Solver& solver = scene.solver();
  const auto held = ConstrainedCells(solver);
  report.plain = MeasureConformality(solver, held);  // the mesh is still the plain solve's
  const int failuresBefore = scene.context.failures;
  solver.Solve(true, false);
  report.succeeded = scene.context.failures == failuresBefore;
  if (const auto* warp = dynamic_cast<const IterativeWarpSolver*>(solver.GetWarp().get())) {
    report.iterations = warp->IterationsRun();
  }
  report.constrained = MeasureConformality(solver, held);
  const double scale = PixelsPerUnit(solver, scene.context);
  report.pixelsPerUnit = scale;
  for (const PickedLine& line : lines) {
    const LineQuality q = MeasureLine(solver, scene.context, line);
    report.qualities.push_back(q);
    report.samplesMax = std::max(report.samplesMax, q.samples.maxDeviation * scale);
    report.samplesRms = std::max(report.samplesRms, q.samples.rms * scale);
    report.truthMax = std::max(report.truthMax, q.truth.maxDeviation * scale);
    report.truthRms = std::max(report.truthRms, q.truth.rms * scale);
    report.directionError = std::max(report.directionError, q.directionError);
    report.innerSamplesMax = std::max(report.innerSamplesMax, q.innerSamples.maxDeviation * scale);
    report.innerSamplesRms = std::max(report.innerSamplesRms, q.innerSamples.rms * scale);
    report.innerTruthMax = std::max(report.innerTruthMax, q.innerTruth.maxDeviation * scale);
    report.innerTruthRms = std::max(report.innerTruthRms, q.innerTruth.rms * scale);
    report.innerDirectionError = std::max(report.innerDirectionError, q.innerDirectionError);
  }
  if (report.polygon) {
    report.polygonError = MeasurePlane(scene, *polygon) * scale;
    report.polygonVertexError = MeasurePlaneVertices(scene, *polygon) * scale;
  }
  report.lines = std::move(lines);
  return report;
}

}  // namespace Project::testing
