#include "solver/iterative/LineSolve.h"

#include <cmath>
#include <utility>

namespace Project {

namespace {

// The homography rows' weight; the line weight setting does not reach it.
constexpr double kPlaneWeight = 10.0;

}  // namespace

LineSolve::LineSolve(std::shared_ptr<const OctaMap> octaMap,
                     std::shared_ptr<const PhotoToSphere> imageModel,
                     std::shared_ptr<GeodesicLines> lines, const IterativeWarpSettings& settings,
                     const LineSolveWeights& weights)
    : IterativeWarpSolver(std::move(octaMap), std::move(imageModel), settings),
      lines_(std::move(lines)),
      weights_(weights) {}

void LineSolve::AddSimilarityRows(double weight, Vertex a, Vertex b, Vertex c) {
  float pa[3], pb[3], pc[3], east[3], north[3];
  octaMap_->GetRotatedPoint(a.i, a.j, pa);
  octaMap_->GetRotatedPoint(b.i, b.j, pb);
  octaMap_->GetRotatedPoint(c.i, c.j, pc);
  octaMap_->GetTangentFrame(a.i, a.j, east, north);
  // Chords, not arcs, projected on the tangent plane at a.
  float e1[3], e2[3];
  for (int k = 0; k < 3; ++k) {
    e1[k] = pb[k] - pa[k];
    e2[k] = pc[k] - pa[k];
  }
  const double p1x = e1[0] * east[0] + e1[1] * east[1] + e1[2] * east[2];
  const double p1y = e1[0] * north[0] + e1[1] * north[1] + e1[2] * north[2];
  const double p2x = e2[0] * east[0] + e2[1] * east[1] + e2[2] * east[2];
  const double p2y = e2[0] * north[0] + e2[1] * north[1] + e2[2] * north[2];
  // A step off the map's last row stops on the vertex itself: with no
  // second edge there is no shape to keep.
  if (p2x == 0.0 && p2y == 0.0) return;
  const double s = std::hypot(p1x, p1y) / std::hypot(p2x, p2y);
  const double d = std::atan2(p1y, p1x) - std::atan2(p2y, p2x);
  const double cs = s * std::cos(d), sn = s * std::sin(d);
  const std::int32_t ua = UnknownOf(a.i, a.j), ub = UnknownOf(b.i, b.j), uc = UnknownOf(c.i, c.j);
  const std::int32_t q[6] = {ua, ua + 1, ub, ub + 1, uc, uc + 1};
  const double row1[6] = {weight * (cs - 1), -weight * sn, weight, 0.0, -weight * cs, weight * sn};
  const double row2[6] = {weight * sn, weight * (cs - 1), 0.0, weight, -weight * sn, -weight * cs};
  AddRow(constantBuilder_, q, row1, 6, 0.0, nullptr);
  AddRow(constantBuilder_, q, row2, 6, 0.0, nullptr);
}

void LineSolve::AddConformalQuad(std::int32_t i, std::int32_t j) {
  const double w = weights_.conformalWeight;
  AddSimilarityRows(w, {i, j}, {i + 1, j}, {i, j + 1});
  AddSimilarityRows(w, {i + 1, j}, {i, j}, {i + 1, j + 1});
  AddSimilarityRows(w, {i + 1, j + 1}, {i, j + 1}, {i + 1, j});
  AddSimilarityRows(w, {i, j + 1}, {i + 1, j + 1}, {i, j});
}

void LineSolve::AddSmoothnessVertex(std::int32_t i, std::int32_t j) {
  const double w = weights_.smoothnessWeight;
  const std::int32_t h = halfGrid_, last = gridSize_ - 1;
  // At the map's edge midpoints the fold turns a row back on itself.
  if (!(i == h && (j == 0 || j == last))) {
    std::int32_t bi = i, bj = j, ci = i, cj = j;
    StepVertex(bi, bj, -1, 0);
    StepVertex(ci, cj, 1, 0);
    AddSimilarityRows(w, {i, j}, {bi, bj}, {ci, cj});
  }
  if (!(j == h && (i == 0 || i == last))) {
    std::int32_t bi = i, bj = j, ci = i, cj = j;
    StepVertex(bi, bj, 0, -1);
    StepVertex(ci, cj, 0, 1);
    AddSimilarityRows(w, {i, j}, {bi, bj}, {ci, cj});
  }
}

void LineSolve::SampleUnknowns(const LineSample& sample, std::int32_t out[4]) const {
  const std::int32_t i = sample.cellI, j = sample.cellJ;
  out[0] = UnknownOf(i, j);
  out[1] = UnknownOf(i + 1, j);
  out[2] = UnknownOf(i + 1, j + 1);
  out[3] = UnknownOf(i, j + 1);
}

void LineSolve::SamplePoint(const LineSample& sample, double& u, double& v) const {
  u = v = 0.0;
  if (sample.cellI < 0) return;
  std::int32_t q[4];
  SampleUnknowns(sample, q);
  for (int m = 0; m < 4; ++m) {
    u += sample.weights[m] * solution_[q[m]];
    v += sample.weights[m] * solution_[q[m] + 1];
  }
}

std::array<float, 2> LineSolve::HeldNormal(const LineRecord& line) {
  return line.hasFixedNormal ? line.fixedNormal : line.normal;
}

std::vector<LineRecord> LineSolve::ActiveLines() const {
  std::vector<LineRecord> active;
  for (const LineRecord& line : lines_->GetLines()) {
    if (line.active) active.push_back(line);
  }
  for (LineRecord& line : lines_->CollectEdgeLines()) {
    if (line.active) active.push_back(std::move(line));
  }
  return active;
}

void LineSolve::AddChordRows(const LineRecord& line) {
  if (line.samples.size() < 2) return;
  const double l = weights_.lineWeight;
  const LineSample& first = line.samples.front();
  const LineSample& lastSample = line.samples.back();
  std::int32_t qf[4], ql[4], qs[4];
  SampleUnknowns(first, qf);
  SampleUnknowns(lastSample, ql);
  for (const LineSample& sample : line.samples) {
    if (sample.cellI < 0) continue;
    SampleUnknowns(sample, qs);
    const double t = sample.position;
    for (int axis = 0; axis < 2; ++axis) {
      std::int32_t q[12];
      double c[12];
      for (int m = 0; m < 4; ++m) {
        q[m] = qf[m] + axis;
        c[m] = l * (1 - t) * first.weights[m];
        q[4 + m] = qs[m] + axis;
        c[4 + m] = -l * sample.weights[m];
        q[8 + m] = ql[m] + axis;
        c[8 + m] = l * t * lastSample.weights[m];
      }
      AddRow(iterationBuilder_, q, c, 12, 0.0, nullptr);
    }
  }
}

void LineSolve::AddNormalRows(const LineRecord& line) {
  if (line.samples.empty()) return;
  const double l = weights_.lineWeight;
  const std::array<float, 2> n = HeldNormal(line);
  const LineSample& first = line.samples.front();
  std::int32_t qf[4], qs[4];
  SampleUnknowns(first, qf);
  for (const LineSample& sample : line.samples) {
    if (sample.cellI < 0) continue;
    SampleUnknowns(sample, qs);
    std::int32_t q[16];
    double c[16];
    for (int m = 0; m < 4; ++m) {
      q[m] = qf[m];
      c[m] = -l * n[0] * first.weights[m];
      q[4 + m] = qs[m];
      c[4 + m] = l * n[0] * sample.weights[m];
      q[8 + m] = qf[m] + 1;
      c[8 + m] = -l * n[1] * first.weights[m];
      q[12 + m] = qs[m] + 1;
      c[12 + m] = l * n[1] * sample.weights[m];
    }
    AddRow(iterationBuilder_, q, c, 16, 0.0, nullptr);
  }
}

void LineSolve::LineNormal(const LineRecord& line, std::int32_t k, double& nx, double& ny) const {
  nx = line.hasFixedNormal ? line.fixedNormal[0] : std::cos(solution_[k]);
  ny = line.hasFixedNormal ? line.fixedNormal[1] : std::sin(solution_[k]);
}

void LineSolve::AddLineRowsNewton(const LineRecord& line, std::int32_t k) {
  if (line.samples.empty()) return;
  const double l = weights_.lineWeight;
  double nx, ny;
  LineNormal(line, k, nx, ny);
  const LineSample& first = line.samples.front();
  double p0u, p0v;
  SamplePoint(first, p0u, p0v);
  std::int32_t qf[4], qs[4];
  SampleUnknowns(first, qf);
  for (const LineSample& sample : line.samples) {
    if (sample.cellI < 0) continue;
    SampleUnknowns(sample, qs);
    double pu, pv;
    SamplePoint(sample, pu, pv);
    const double ex = pu - p0u, ey = pv - p0v;
    const double r = l * (nx * ex + ny * ey);
    std::int32_t q[17];
    double c[17];
    for (int m = 0; m < 4; ++m) {
      q[m] = qf[m];
      c[m] = -l * nx * first.weights[m];
      q[4 + m] = qs[m];
      c[4 + m] = l * nx * sample.weights[m];
      q[8 + m] = qf[m] + 1;
      c[8 + m] = -l * ny * first.weights[m];
      q[12 + m] = qs[m] + 1;
      c[12 + m] = l * ny * sample.weights[m];
    }
    AddLineRow(line, k, ex, ey, q, c, 16, r);
  }
}

void LineSolve::AddLineRow(const LineRecord& line, std::int32_t k, double ex, double ey,
                           std::int32_t* q, double* c, std::int32_t count, double r) {
  if (!line.hasFixedNormal) {
    const double angle = solution_[k];
    q[count] = k;
    c[count] = weights_.lineWeight * (std::cos(angle) * ey - std::sin(angle) * ex);
    ++count;
  } else {
    // The reserved angle unknown of a fixed line stays where it is.
    iterationBuilder_.Add(k, k, 1.0);
  }
  AddRow(iterationBuilder_, q, c, count, r, &iterationRhs_);
}

void LineSolve::AddLineRowsOffset(const LineRecord& line, std::int32_t k, std::int32_t d) {
  const double l = weights_.lineWeight;
  double nx, ny;
  LineNormal(line, k, nx, ny);
  std::int32_t qs[4];
  for (const LineSample& sample : line.samples) {
    if (sample.cellI < 0) continue;
    SampleUnknowns(sample, qs);
    double pu, pv;
    SamplePoint(sample, pu, pv);
    std::int32_t q[10];
    double c[10];
    for (int m = 0; m < 4; ++m) {
      q[m] = qs[m];
      c[m] = l * nx * sample.weights[m];
      q[4 + m] = qs[m] + 1;
      c[4 + m] = l * ny * sample.weights[m];
    }
    q[8] = d;
    c[8] = -l;
    AddLineRow(line, k, pu, pv, q, c, 9, l * (nx * pu + ny * pv - solution_[d]));
  }
}

void LineSolve::PlaneResiduals(const PlaneSample& sample, std::int32_t k, double& ru,
                               double& rv) const {
  const double* h = &solution_[k];
  const double w = h[6] * sample.s + h[7] * sample.t + 1.0;
  const double x = h[0] * sample.s + h[1] * sample.t + h[2];
  const double y = h[3] * sample.s + h[4] * sample.t + h[5];
  const std::int32_t q = UnknownOf(sample.i, sample.j);
  ru = kPlaneWeight * (solution_[q] - x / w);
  rv = kPlaneWeight * (solution_[q + 1] - y / w);
}

void LineSolve::AddPlaneRows(const PlaneRecord& plane, std::int32_t k) {
  const double* h = &solution_[k];
  for (const PlaneSample& sample : plane.samples) {
    const double s = sample.s, t = sample.t;
    const double w = h[6] * s + h[7] * t + 1.0;
    const double x = h[0] * s + h[1] * t + h[2];
    const double y = h[3] * s + h[4] * t + h[5];
    const std::int32_t q = UnknownOf(sample.i, sample.j);
    double ru, rv;
    PlaneResiduals(sample, k, ru, rv);
    const double g = kPlaneWeight;
    const std::int32_t qu[6] = {q, k, k + 1, k + 2, k + 6, k + 7};
    const double cu[6] = {g,      -g * s / w,          -g * t / w,
                          -g / w, g * s * x / (w * w), g * t * x / (w * w)};
    AddRow(iterationBuilder_, qu, cu, 6, ru, &iterationRhs_);
    const std::int32_t qv[6] = {q + 1, k + 3, k + 4, k + 5, k + 6, k + 7};
    const double cv[6] = {g,      -g * s / w,          -g * t / w,
                          -g / w, g * s * y / (w * w), g * t * y / (w * w)};
    AddRow(iterationBuilder_, qv, cv, 6, rv, &iterationRhs_);
  }
}

void LineSolve::AddIterationTerms(std::int32_t iteration) {
  if (!settings_.useGaussNewton) lines_->FitLines();
  std::int32_t k = 2 * vertexCount_, d = firstOffset_;
  for (const LineRecord& line : ActiveLines()) {
    if (settings_.useGaussNewton && lineForm_ == LineForm::kOffset) {
      AddLineRowsOffset(line, k++, d++);
    } else if (settings_.useGaussNewton) {
      AddLineRowsNewton(line, k++);
    } else if (iteration % 2 == 0 && !line.hasFixedNormal) {
      AddChordRows(line);
    } else {
      AddNormalRows(line);
    }
  }
  // Polygons live in homography unknowns, which only the Gauss-Newton road
  // has; the dialog keeps polygons off the other road.
  if (!settings_.useGaussNewton) return;
  for (const PlaneRecord& plane : lines_->GetPlanes()) {
    AddPlaneRows(plane, k);
    k += 8;
  }
}

bool LineSolve::IterationRowsStayInCells() const {
  return settings_.useGaussNewton && lineForm_ == LineForm::kOffset;
}

void LineSolve::PrepareGaussNewton() {
  for (PlaneRecord& plane : lines_->GetPlanes()) lines_->SamplePlane(plane);
  const std::int32_t planes = static_cast<std::int32_t>(lines_->GetPlanes().size());
  lines_->FitLines();
  const std::vector<LineRecord> active = ActiveLines();
  const auto lineCount = static_cast<std::int32_t>(active.size());
  firstOffset_ = 2 * vertexCount_ + lineCount + 8 * planes;
  ResizeUnknowns(firstOffset_ + (lineForm_ == LineForm::kOffset ? lineCount : 0));
  std::int32_t k = 2 * vertexCount_, d = firstOffset_;
  for (const LineRecord& line : active) {
    solution_[k] = static_cast<float>(std::atan2(line.normal[1], line.normal[0]));
    if (lineForm_ == LineForm::kOffset) {
      // The offset that fits the samples best at this angle: their mean.
      double nx, ny, sum = 0.0;
      std::int32_t count = 0;
      LineNormal(line, k, nx, ny);
      for (const LineSample& sample : line.samples) {
        if (sample.cellI < 0) continue;
        double pu, pv;
        SamplePoint(sample, pu, pv);
        sum += nx * pu + ny * pv;
        ++count;
      }
      solution_[d++] = count > 0 ? sum / count : 0.0;
    }
    ++k;
  }
  lines_->FitHomographies();
  for (const PlaneRecord& plane : lines_->GetPlanes()) {
    for (int m = 0; m < 8; ++m) solution_[k + m] = plane.homography[m];
    k += 8;
  }
}

std::vector<std::vector<Point2f>> LineSolve::CurrentEnds(
    const std::vector<LineRecord>& lines) const {
  std::vector<std::vector<Point2f>> ends;
  ends.reserve(lines.size());
  for (const LineRecord& line : lines) ends.push_back(lines_->TraceSamples(line, 2));
  return ends;
}

double LineSolve::ConvergenceMeasure() {
  const std::vector<LineRecord> active = ActiveLines();
  std::vector<LineRecord> planeEdges;
  for (const PlaneRecord& plane : lines_->GetPlanes()) {
    if (!plane.active) continue;
    planeEdges.insert(planeEdges.end(), plane.edges.begin(), plane.edges.end());
  }
  bool changed = false;
  if (lastLineEnds_.size() != active.size()) {
    lastLineEnds_ = CurrentEnds(active);
    changed = true;
  }
  if (lastPlaneEnds_.size() != planeEdges.size()) {
    lastPlaneEnds_ = CurrentEnds(planeEdges);
    return -1.0;
  }
  if (changed) return -1.0;
  if (active.empty() && planeEdges.empty()) return 0.0;
  float sum = 0.0f;
  const std::vector<std::vector<Point2f>> now = CurrentEnds(active);
  for (std::size_t k = 0; k < now.size(); ++k) {
    for (std::size_t e = 0; e < now[k].size() && e < lastLineEnds_[k].size(); ++e) {
      const float dx = now[k][e].x - lastLineEnds_[k][e].x;
      const float dy = now[k][e].y - lastLineEnds_[k][e].y;
      sum += dx * dx + dy * dy;
    }
  }
  lastLineEnds_ = now;
  return sum;
}

double LineSolve::LineEnergy(const LineRecord& line, std::int32_t angleIndex) const {
  if (line.samples.empty()) return 0.0;
  double nx, ny;
  if (line.hasFixedNormal) {
    nx = line.fixedNormal[0];
    ny = line.fixedNormal[1];
  } else if (settings_.useGaussNewton && angleIndex < unknownCount_) {
    nx = std::cos(solution_[angleIndex]);
    ny = std::sin(solution_[angleIndex]);
  } else {
    nx = line.normal[0];
    ny = line.normal[1];
  }
  // The offset form measures from the line through its offset unknown, and
  // skips the samples off the mesh as its rows do.
  const std::int32_t offset = firstOffset_ + angleIndex - 2 * vertexCount_;
  const bool fromOffset = settings_.useGaussNewton && lineForm_ == LineForm::kOffset &&
                          angleIndex >= 2 * vertexCount_ && offset < unknownCount_;
  double p0u, p0v;
  SamplePoint(line.samples.front(), p0u, p0v);
  const double origin = fromOffset ? solution_[offset] : nx * p0u + ny * p0v;
  double energy = 0.0;
  for (const LineSample& sample : line.samples) {
    if (fromOffset && sample.cellI < 0) continue;
    double pu, pv;
    SamplePoint(sample, pu, pv);
    const double r = weights_.lineWeight * (nx * pu + ny * pv - origin);
    energy += 0.5 * r * r;
  }
  return energy;
}

double LineSolve::ConstraintEnergy() const {
  float energy = 0.0f;
  std::int32_t k = 2 * vertexCount_;
  for (const LineRecord& line : ActiveLines()) {
    energy += static_cast<float>(LineEnergy(line, k++));
  }
  if (!settings_.useGaussNewton) return energy;
  for (const PlaneRecord& plane : lines_->GetPlanes()) {
    if (k + 8 > unknownCount_) break;
    for (const PlaneSample& sample : plane.samples) {
      double ru, rv;
      PlaneResiduals(sample, k, ru, rv);
      energy += static_cast<float>(0.5 * ru * ru + 0.5 * rv * rv);
    }
    k += 8;
  }
  return energy;
}

}  // namespace Project
