#include "solver/geodesic/GeodesicLines.h"

#include <tbb/blocked_range.h>
#include <tbb/parallel_for.h>
#include <tbb/partitioner.h>
#include <tbb/task_group.h>

#include <atomic>
#include <cmath>
#include <optional>
#include <utility>

#include "solver/geodesic/CellGeometry.h"
#include "solver/geodesic/Vec3.h"

namespace Project {

namespace {

// A line that starts exactly on a cell's edge may have been found in the
// cell on the far side, where the only crossing is the start itself, at the
// full angle. In the first cell a crossing that ties with the start counts
// as progress, so the walk steps over into the cell the line runs through;
// any crossing truly nearer the end still wins. The slack is far above the
// rounding of two computations of one point and far below a cell's angle.
constexpr double kStartSlack = 1e-9;
double StartSlack(const OctaMap::Cell& cell, const OctaMap::Cell& cellFrom) {
  return cell == cellFrom ? kStartSlack : 0.0;
}

// The finder cuts the cell rows into this many bands.
constexpr unsigned kBands = 16;
// Below this |n . D| an edge runs along the circle's plane and is not cut.
constexpr double kParallelEdge = 1e-9;

// Where the plane through the centre with normal n cuts the segment from p
// to p + d, as the fraction f in [0, 1); false when it does not.
bool CutEdge(Vec3 n, Vec3 p, Vec3 d, double& f) {
  const double nd = Dot(n, d);
  if (std::fabs(nd) < kParallelEdge) return false;
  f = -Dot(n, p) / nd;
  return f >= 0.0 && f < 1.0;
}

}  // namespace

GeodesicLines::GeodesicLines(std::shared_ptr<const OctaMap> octaMap,
                             std::shared_ptr<const PhotoToSphere> imageModel, bool useTriangles)
    : octaMap_(std::move(octaMap)),
      imageModel_(std::move(imageModel)),
      useTriangles_(useTriangles) {
  CacheTexCoords();
}

void GeodesicLines::SetImageModel(std::shared_ptr<const PhotoToSphere> imageModel) {
  imageModel_ = std::move(imageModel);
  CacheTexCoords();
}

void GeodesicLines::CacheTexCoords() {
  const std::int32_t n = octaMap_->Width();
  texCoords_.assign(static_cast<std::size_t>(n) * static_cast<std::size_t>(n) * 2, 0.0f);
  if (imageModel_ == nullptr) return;
  for (std::int32_t j = 0; j < n; ++j) {
    for (std::int32_t i = 0; i < n; ++i) {
      float lat, lon;
      octaMap_->GetDirection(i, j, lat, lon);
      imageModel_->GetTexCoord(lon, lat, &texCoords_[(std::size_t(j) * std::size_t(n) + i) * 2]);
    }
  }
}

std::vector<LineRecord> GeodesicLines::CollectEdgeLines() const {
  std::vector<LineRecord> edges;
  for (const PlaneRecord& plane : planes_) {
    for (const LineRecord& edge : plane.edges) {
      if (edge.hasFixedNormal) edges.push_back(edge);
    }
  }
  return edges;
}

// --- Cells and points ---

void GeodesicLines::CornerPosition(std::int32_t i, std::int32_t j, std::int32_t mode,
                                   float out[2]) const {
  if (mode == 0) {
    TexCoord(i, j, out);
  } else if (warp_ != nullptr) {
    warp_->GetVertexPosition(i, j, out[0], out[1]);
  } else {
    out[0] = out[1] = 0.0f;
  }
}

void GeodesicLines::CornerSpherePoint(std::int32_t i, std::int32_t j, std::int32_t mode,
                                      float out[3]) const {
  if (mode == 0) {
    octaMap_->GetPoint(i, j, out);
  } else {
    octaMap_->GetRotatedPoint(i, j, out);
  }
}

void GeodesicLines::GetCellCorners(std::int32_t i, std::int32_t j, std::int32_t mode,
                                   float out[8]) const {
  CornerPosition(i, j, mode, out);
  CornerPosition(i + 1, j, mode, out + 2);
  CornerPosition(i + 1, j + 1, mode, out + 4);
  CornerPosition(i, j + 1, mode, out + 6);
}

void GeodesicLines::GetCellSpherePoints(std::int32_t i, std::int32_t j, std::int32_t mode,
                                        float out[12]) const {
  CornerSpherePoint(i, j, mode, out);
  CornerSpherePoint(i + 1, j, mode, out + 3);
  CornerSpherePoint(i + 1, j + 1, mode, out + 6);
  CornerSpherePoint(i, j + 1, mode, out + 9);
}

bool GeodesicLines::IsPointInCell(const float point[2], Cell cell, std::int32_t mode) const {
  float corners[8];
  GetCellCorners(cell.i, cell.j, mode, corners);
  return PointInQuad(corners, point[0], point[1]);
}

bool GeodesicLines::FindCell(const float point[2], Cell& outCell, std::int32_t mode) const {
  if (SearchCell(point, outCell, mode)) return true;
  // The cell test gives a point on a level edge to neither cell beside it
  // (the equator's row of cells in the photograph is one), so such a point
  // is looked up a hair above and below.
  for (const float step : {kLevelNudge, -kLevelNudge}) {
    const float nudged[2] = {point[0], point[1] + step};
    if (SearchCell(nudged, outCell, mode)) return true;
  }
  return false;
}

bool GeodesicLines::SearchCell(const float point[2], Cell& outCell, std::int32_t mode) const {
  outCell = Cell{};
  const std::int32_t cells = octaMap_->Width() - 1;
  const std::int32_t rowsPerBand = cells / static_cast<std::int32_t>(kBands);
  // Fewer than 16 cell rows leave every band empty: nothing is searched.
  if (warp_ == nullptr || rowsPerBand == 0) return false;

  struct BandHit {
    Cell cell;
    bool hit = false;
  };
  std::array<BandHit, kBands> hits{};
  // Shared by the bands only to stop early: a late read costs extra work,
  // never a wrong answer, since each band writes its own slot.
  std::atomic<bool> found{false};
  auto search = [&](const tbb::blocked_range<unsigned>& range) {
    for (unsigned band = range.begin(); band != range.end(); ++band) {
      const std::int32_t firstRow = static_cast<std::int32_t>(band) * rowsPerBand;
      for (std::int32_t j = firstRow; j < firstRow + rowsPerBand; ++j) {
        for (std::int32_t i = 0; i < cells; ++i) {
          if (found.load(std::memory_order_relaxed)) return;
          if (!warp_->IsQuadInside(i, j)) continue;
          if (!IsPointInCell(point, {i, j}, mode)) continue;
          found.store(true, std::memory_order_relaxed);
          hits[band] = {{i, j}, true};
          return;
        }
      }
    }
  };
  tbb::task_group_context context;
  tbb::parallel_for(tbb::blocked_range<unsigned>(0u, kBands, 1), search, tbb::auto_partitioner(),
                    context);
  // Several bands may have hit before they saw the flag: the first wins.
  for (const BandHit& hit : hits) {
    if (hit.hit) {
      outCell = hit.cell;
      return true;
    }
  }
  return false;
}

void GeodesicLines::CellWeights(const float point[2], Cell cell, std::int32_t mode,
                                float outWeights[4]) const {
  float corners[8];
  GetCellCorners(cell.i, cell.j, mode, corners);
  if (useTriangles_) {
    TriangleWeights(corners, point[0], point[1], octaMap_->SplitsAlongMainDiagonal(cell.i, cell.j),
                    outWeights);
  } else {
    BilinearWeights(corners, point[0], point[1], outWeights);
  }
}

void GeodesicLines::SpherePoint(const float point[2], Cell cell, std::int32_t mode,
                                float out[3]) const {
  float weights[4];
  CellWeights(point, cell, mode, weights);
  float corners[12];
  GetCellSpherePoints(cell.i, cell.j, mode, corners);
  for (int c = 0; c < 3; ++c) {
    out[c] = weights[0] * corners[c] + weights[1] * corners[3 + c] + weights[2] * corners[6 + c] +
             weights[3] * corners[9 + c];
  }
}

bool GeodesicLines::FindResultPoint(const float fraction[2], float outPoint[2]) const {
  Cell cell;
  if (!FindCell(fraction, cell, 0)) return false;
  LineSample sample;
  CellWeights(fraction, cell, 0, sample.weights.data());
  sample.cellI = cell.i;
  sample.cellJ = cell.j;
  const Point2f p = SamplePosition(sample, 1);
  outPoint[0] = p.x;
  outPoint[1] = p.y;
  return true;
}

bool GeodesicLines::FindSourcePoint(const float point[2], float outFraction[2]) const {
  Cell cell;
  if (!FindCell(point, cell, 1)) return false;
  LineSample sample;
  CellWeights(point, cell, 1, sample.weights.data());
  sample.cellI = cell.i;
  sample.cellJ = cell.j;
  const Point2f p = SamplePosition(sample, 0);
  outFraction[0] = p.x;
  outFraction[1] = p.y;
  return true;
}

bool GeodesicLines::IsCellVisible(std::int32_t i, std::int32_t j) const {
  if (!QuadInside({i, j})) return false;
  const std::int32_t order[4][2] = {{i, j}, {i, j + 1}, {i + 1, j + 1}, {i + 1, j}};
  for (const auto& corner : order) {
    float uv[2];
    CornerPosition(corner[0], corner[1], 0, uv);
    if (uv[0] >= 0.0f && uv[0] <= 1.0f && uv[1] >= 0.0f && uv[1] <= 1.0f) return true;
  }
  return false;
}

Point2f GeodesicLines::SamplePosition(const LineSample& sample, std::int32_t mode) const {
  if (sample.cellI == -1 && sample.cellJ == -1) return {};
  float corners[8];
  GetCellCorners(sample.cellI, sample.cellJ, mode, corners);
  Point2f p;
  for (int k = 0; k < 4; ++k) {
    p.x += sample.weights[static_cast<std::size_t>(k)] * corners[2 * k];
    p.y += sample.weights[static_cast<std::size_t>(k)] * corners[2 * k + 1];
  }
  return p;
}

LineSample GeodesicLines::EndSample(const float point[2], Cell cell, std::int32_t mode,
                                    bool triangles, float position) const {
  LineSample sample;
  sample.cellI = cell.i;
  sample.cellJ = cell.j;
  sample.position = position;
  if (cell.i == -1 && cell.j == -1) return sample;
  float corners[8];
  GetCellCorners(cell.i, cell.j, mode, corners);
  if (triangles) {
    TriangleWeights(corners, point[0], point[1], octaMap_->SplitsAlongMainDiagonal(cell.i, cell.j),
                    sample.weights.data());
  } else {
    BilinearWeights(corners, point[0], point[1], sample.weights.data());
  }
  return sample;
}

// --- Tracing ---

void GeodesicLines::TraceArc(LineRecord& line, const LineRecord& previous, const float fromIn[2],
                             const float toIn[2], std::int32_t kind, std::int32_t mode) const {
  float from[2] = {fromIn[0], fromIn[1]};
  float to[2] = {toIn[0], toIn[1]};
  // The end that did not move keeps its old cell, when it had one; read it
  // before line is touched, as line may be previous itself.
  auto keptEnd = [&](const LineSample& sample, float point[2], Cell& cell) {
    if (sample.cellI == -1 && sample.cellJ == -1) return false;
    cell = {sample.cellI, sample.cellJ};
    const Point2f p = SamplePosition(sample, mode);
    point[0] = p.x;
    point[1] = p.y;
    return true;
  };
  const bool previousTraced = previous.samples.size() >= 2;
  Cell cellFrom;
  Cell cellTo;
  bool haveFrom = kind == 0 && previousTraced && keptEnd(previous.samples.front(), from, cellFrom);
  bool haveTo = kind == 1 && previousTraced && keptEnd(previous.samples.back(), to, cellTo);
  if (!haveFrom) haveFrom = FindCell(from, cellFrom, mode);
  if (!haveTo) haveTo = FindCell(to, cellTo, mode);

  line.samples.clear();
  if (!haveFrom || !haveTo) {
    line.active = false;
    line.samples.push_back(EndSample(from, cellFrom, mode, useTriangles_, 0.0f));
    line.samples.push_back(EndSample(to, cellTo, mode, useTriangles_, 0.0f));
    return;
  }
  if (useTriangles_) {
    WalkCellsTriangles(line, from, to, cellFrom, cellTo, mode);
  } else {
    WalkCells(line, from, to, cellFrom, cellTo, mode);
  }
}

GeodesicLines::Arc GeodesicLines::ArcBetween(const float from[2], const float to[2], Cell cellFrom,
                                             Cell cellTo, std::int32_t mode) const {
  float a[3], b[3];
  SpherePoint(from, cellFrom, mode, a);
  SpherePoint(to, cellTo, mode, b);
  Arc arc;
  const Vec3 endA = Vec3::From(a);
  arc.endB = Vec3::From(b);
  arc.normal = Cross(endA, arc.endB);
  arc.total = AngleBetween(endA, arc.endB);
  return arc;
}

void GeodesicLines::CellSphereCorners(Cell cell, std::int32_t mode, Vec3 out[4]) const {
  float sphere[12];
  GetCellSpherePoints(cell.i, cell.j, mode, sphere);
  for (int k = 0; k < 4; ++k) out[k] = Vec3::From(sphere + 3 * k);
}

void GeodesicLines::WalkCells(LineRecord& line, const float from[2], const float to[2],
                              Cell cellFrom, Cell cellTo, std::int32_t mode) const {
  const Arc arc = ArcBetween(from, to, cellFrom, cellTo, mode);
  const Vec3& endB = arc.endB;
  const Vec3& n = arc.normal;
  const double total = arc.total;

  line.samples.push_back(EndSample(from, cellFrom, mode, false, 0.0f));
  // Two equal ends span no circle: the line is degenerate.
  bool walkOk = total > 0.0;
  Cell cell = cellFrom;
  double best = total;
  while (walkOk && !(cell == cellTo)) {
    Vec3 corners[4];
    CellSphereCorners(cell, mode, corners);
    float plane[8];
    GetCellCorners(cell.i, cell.j, mode, plane);
    const bool inside = QuadInside(cell);
    bool moved = false;
    Cell next = cell;
    double angleSum = 0.0, xSum = 0.0, ySum = 0.0;
    int hits = 0;
    // Edge k runs from corner k to corner k + 1: top, right, bottom, left,
    // which are also the sides of NeighbourCell.
    for (int k = 0; k < 4; ++k) {
      const int k1 = (k + 1) % 4;
      const Vec3 p = corners[k];
      double f;
      if (!CutEdge(n, p, corners[k1] - p, f)) continue;
      const double angle = AngleBetween(endB, p + f * (corners[k1] - p));
      angleSum += angle;
      xSum += plane[2 * k] + f * (plane[2 * k1] - plane[2 * k]);
      ySum += plane[2 * k + 1] + f * (plane[2 * k1 + 1] - plane[2 * k + 1]);
      ++hits;
      if (angle < best + StartSlack(cell, cellFrom)) {
        best = angle;
        next = octaMap_->NeighbourCell(cell, k);
        moved = true;
      }
    }
    if (hits > 0 && !(cell == cellFrom)) {
      LineSample sample;
      sample.cellI = cell.i;
      sample.cellJ = cell.j;
      BilinearWeights(plane, static_cast<float>(xSum / hits), static_cast<float>(ySum / hits),
                      sample.weights.data());
      sample.position = static_cast<float>(1.0 - angleSum / hits / total);
      line.samples.push_back(sample);
    }
    // Nothing nearer to the end: the walk stands at it. Moved out of the
    // mesh: it has run off.
    if (!moved || !inside) {
      walkOk = moved ? inside : true;
      break;
    }
    cell = next;
  }
  line.samples.push_back(EndSample(to, cellTo, mode, false, 1.0f));
  line.active = walkOk;
}

void GeodesicLines::WalkCellsTriangles(LineRecord& line, const float from[2], const float to[2],
                                       Cell cellFrom, Cell cellTo, std::int32_t mode) const {
  const Arc arc = ArcBetween(from, to, cellFrom, cellTo, mode);
  const Vec3& endB = arc.endB;
  const Vec3& n = arc.normal;
  const double total = arc.total;

  line.samples.push_back(EndSample(from, cellFrom, mode, true, 0.0f));
  bool walkOk = total > 0.0;
  Cell cell = cellFrom;
  double best = total;
  // A crossing of the circle with the segment from corner k0 to k1 of the
  // cell: its angle to the end and its sample.
  struct Crossing {
    double angle = 0.0;
    bool beforeEnd = true;  // on the start's side of the end
    LineSample sample;
  };
  const auto cut = [&](Cell at, const Vec3 corners[4], int k0, int k1) -> std::optional<Crossing> {
    double f;
    if (!CutEdge(n, corners[k0], corners[k1] - corners[k0], f)) return std::nullopt;
    Crossing c;
    const Vec3 point = corners[k0] + f * (corners[k1] - corners[k0]);
    c.angle = AngleBetween(endB, point);
    c.beforeEnd = Dot(Cross(point, endB), n) >= 0.0;
    c.sample.cellI = at.i;
    c.sample.cellJ = at.j;
    c.sample.weights[static_cast<std::size_t>(k0)] = static_cast<float>(1.0 - f);
    c.sample.weights[static_cast<std::size_t>(k1)] = static_cast<float>(f);
    c.sample.position = static_cast<float>(1.0 - c.angle / total);
    return c;
  };
  // The crossing with the cell's diagonal, when it lies strictly between
  // two angles along the walk: a bend of the drawn line, held like the rest.
  const auto diagonalBetween = [&](Cell at, const Vec3 corners[4], double entry, double exit) {
    const int d = octaMap_->SplitsAlongMainDiagonal(at.i, at.j) ? 0 : 1;
    const std::optional<Crossing> c = cut(at, corners, d, d + 2);
    constexpr double kApart = 1e-12;  // radians: not the entry or exit itself
    if (c && c->beforeEnd && c->angle < entry - kApart && c->angle > exit + kApart) {
      line.samples.push_back(c->sample);
    }
  };
  while (walkOk && !(cell == cellTo)) {
    Vec3 corners[4];
    CellSphereCorners(cell, mode, corners);
    const bool inside = QuadInside(cell);
    const double entry = best;
    bool moved = false;
    Cell next = cell;
    std::optional<Crossing> exit;
    for (int k = 0; k < 4; ++k) {
      const std::optional<Crossing> c = cut(cell, corners, k, (k + 1) % 4);
      if (c && c->angle < best + StartSlack(cell, cellFrom)) {
        best = c->angle;
        next = octaMap_->NeighbourCell(cell, k);
        moved = true;
        exit = c;
      }
    }
    // Every corner of the drawn line in the cell is a sample: where it
    // crosses the diagonal, then the edge it leaves by, so that a line held
    // straight is drawn straight through both triangles.
    diagonalBetween(cell, corners, entry, moved ? best : 0.0);
    if (exit) line.samples.push_back(exit->sample);
    if (!moved || !inside) {
      walkOk = moved ? inside : true;
      break;
    }
    cell = next;
  }
  if (walkOk && cell == cellTo) {
    Vec3 corners[4];
    CellSphereCorners(cell, mode, corners);
    diagonalBetween(cell, corners, best, 0.0);
  }
  line.samples.push_back(EndSample(to, cellTo, mode, true, 1.0f));
  line.active = walkOk;
}

std::vector<Point2f> GeodesicLines::TraceSamples(const LineRecord& line, std::int32_t mode) const {
  std::vector<Point2f> points;
  if (mode == 2) {
    if (line.samples.empty()) return points;
    points.push_back(SamplePosition(line.samples.front(), 1));
    if (line.samples.size() > 1) points.push_back(SamplePosition(line.samples.back(), 1));
    return points;
  }
  points.reserve(line.samples.size());
  for (const LineSample& sample : line.samples) points.push_back(SamplePosition(sample, mode));
  return points;
}

// --- The polygon being drawn ---

bool GeodesicLines::AddDraftPoint(const float point[2], bool closing, std::int32_t kind) {
  bool traced = true;
  if (!draftPlane_.corners.empty()) {
    LineRecord edge;
    const Point2f last = draftPlane_.corners.back();
    const Point2f to = closing ? draftPlane_.corners.front() : Point2f{point[0], point[1]};
    const float fromXY[2] = {last.x, last.y};
    const float toXY[2] = {to.x, to.y};
    TraceArc(edge, LineRecord{}, fromXY, toXY, 2, 0);
    if (kind == 1) {
      edge.fixedNormal = {0.0f, 1.0f};
      edge.hasFixedNormal = true;
    } else if (kind == 2) {
      edge.fixedNormal = {1.0f, 0.0f};
      edge.hasFixedNormal = true;
    }
    traced = edge.active;
    if (!edge.active) draftPlane_.active = false;
    draftPlane_.edges.push_back(std::move(edge));
  }
  // Closing goes back to the first corner, which is there already.
  if (!closing) draftPlane_.corners.push_back({point[0], point[1]});
  return traced;
}

void GeodesicLines::RemoveLastDraftEdge() {
  if (!draftPlane_.edges.empty()) draftPlane_.edges.pop_back();
  if (!draftPlane_.corners.empty()) draftPlane_.corners.pop_back();
  draftPlane_.active = true;
  for (const LineRecord& edge : draftPlane_.edges) {
    if (!edge.active) draftPlane_.active = false;
  }
}

void GeodesicLines::ClearDraftPlane() {
  draftPlane_.samples.clear();
  draftPlane_.spherePoints.clear();
  draftPlane_.edges.clear();
  draftPlane_.corners.clear();
  draftPlane_.homography = PlaneRecord{}.homography;
  draftPlane_.active = true;
}

}  // namespace Project
