#pragma once

// Solved scenes from the synthetic photograph generator, and the measures of
// how straight, level and flat the solve leaves what the scene says is
// straight, level and flat. Shared by the quality test and the line solve
// benchmark. Every measure is taken on the solved mesh from the generator's
// own geometry (its image curves of the scene's edges, its projection of
// scene points) and fitted here, not by the solver.

#include <algorithm>
#include <array>
#include <cmath>
#include <cstdint>
#include <cstdlib>
#include <functional>
#include <limits>
#include <memory>
#include <numbers>
#include <set>
#include <stdexcept>
#include <string>
#include <utility>
#include <vector>

#include "lens/camera/PFisheyeCameraModel.h"
#include "lens/camera/PTangentialDistortCameraModel.h"
#include "lens/metadata/PXmpMeta.h"
#include "lens/metadata/PhotoInfo.h"
#include "lens/sphere/ChoosePhotoToSphere.h"
#include "solver/constraints/ConstraintList.h"
#include "solver/constraints/LineConstraint.h"
#include "solver/constraints/PlaneConstraint.h"
#include "solver/frame/Solver.h"
#include "solver/frame/SolverContext.h"
#include "solver/iterative/IterativeWarpSolver.h"
#include "tests/support/StraightLineFit.h"
#include "tools/synth/lib/Camera.h"
#include "tools/synth/lib/Projection.h"
#include "tools/synth/lib/RenderSpec.h"
#include "tools/synth/lib/Scene.h"
#include "tools/synth/lib/TruthTracer.h"

namespace Project::quality {

// How the module is told about the photograph's lens.
enum class LensKind {
  kFisheye,      // the equisolid fisheye of the focal setting
  kFisheyePoly,  // a fisheye lens profile with its polynomial
  kDistorted,    // a rectilinear lens profile with radial and tangential terms
  kCylindrical,  // a cylindrical panorama recorded in the metadata
};

struct CameraCase {
  std::string name;
  Synth::SceneKind scene = Synth::SceneKind::kRoom;
  LensKind lens = LensKind::kFisheye;
  double focal = 400.0;  // pixels
  int width = 1200;
  int height = 800;
  double yawDegrees = 0.0;
  double pitchDegrees = 0.0;
};

inline Synth::ProjectionKind GeneratorKind(LensKind lens) {
  switch (lens) {
    case LensKind::kFisheye:
      return Synth::ProjectionKind::kFisheyeEquisolid;
    case LensKind::kFisheyePoly:
      return Synth::ProjectionKind::kFisheyePoly;
    case LensKind::kDistorted:
      return Synth::ProjectionKind::kTangential;
    case LensKind::kCylindrical:
      return Synth::ProjectionKind::kCylindrical;
  }
  return Synth::ProjectionKind::kRectilinear;
}

inline Synth::Camera MakeCamera(const Synth::Scene& scene, const CameraCase& c) {
  constexpr double kDegree = std::numbers::pi / 180.0;
  const Synth::ProjectionKind kind = GeneratorKind(c.lens);
  const Synth::Projection projection(kind, c.focal, {0.5 * c.width, 0.5 * c.height},
                                     Synth::DefaultDistortion(kind));
  return Synth::Camera(scene.DefaultPosition(), c.yawDegrees * kDegree, c.pitchDegrees * kDegree,
                       0.0, projection, c.width, c.height);
}

// The filter's side for one generated photograph: default settings, the
// preview as large as the photograph (so view points are photograph pixels),
// and the sphere model the filter would build for the lens.
class QualityContext : public SolverContext {
 public:
  QualityContext(const CameraCase& c, const Synth::Camera& camera)
      : settings(c.width), lens_(c.lens), width_(c.width), height_(c.height) {
    const Synth::Projection& p = camera.Lens();
    const double longer = std::max(c.width, c.height);
    switch (c.lens) {
      case LensKind::kFisheye:
        settings.projectionModel = PSettings::kModelFisheye;
        settings.focalLength = static_cast<float>(p.Focal());
        break;
      case LensKind::kFisheyePoly: {
        settings.projectionModel = PSettings::kModelAuto;
        auto model = std::make_unique<PFisheyeCameraModel>();
        model->focalX = model->focalY = static_cast<float>(p.Focal() / longer);
        model->centerX = model->centerY = 0.5f;
        model->radial1 = static_cast<float>(p.Coefficients().k1);
        model->radial2 = static_cast<float>(p.Coefficients().k2);
        camera_ = std::move(model);
        break;
      }
      case LensKind::kDistorted: {
        settings.projectionModel = PSettings::kModelAuto;
        auto model = std::make_unique<PTangentialDistortCameraModel>();
        model->focalX = model->focalY = static_cast<float>(p.Focal() / longer);
        model->centerX = model->centerY = 0.5f;
        model->radial1 = static_cast<float>(p.Coefficients().k1);
        model->radial2 = static_cast<float>(p.Coefficients().k2);
        model->radial3 = static_cast<float>(p.Coefficients().k3);
        model->tangential1 = static_cast<float>(p.Coefficients().t1);
        model->tangential2 = static_cast<float>(p.Coefficients().t2);
        camera_ = std::move(model);
        break;
      }
      case LensKind::kCylindrical: {
        settings.projectionModel = PSettings::kModelAuto;
        // The record a stitcher leaves, as fractions of the longer side.
        if (!PXmpMeta::Initialize()) throw std::runtime_error("no XMP toolkit");
        toolkitOpen_ = true;
        const std::string packet =
            std::string(
                "<?xpacket begin=\"\"?><rdf:RDF "
                "xmlns:rdf=\"http://www.w3.org/1999/02/22-rdf-syntax-ns#\">"
                "<rdf:Description rdf:about=\"\" xmlns:panorama=\"") +
            PXmpMeta::kPanoramaNamespace + "\" panorama:Transformation=\"Cylindrical\"" +
            " panorama:VirtualFocalLength=\"" + std::to_string(p.Focal() / longer) + "\"" +
            " panorama:VirtualImageXCenter=\"" + std::to_string(p.Centre().x / longer) + "\"" +
            " panorama:VirtualImageYCenter=\"" + std::to_string(p.Centre().y / longer) + "\"" +
            "/></rdf:RDF><?xpacket end=\"w\"?>";
        photo_.SetImageSize(static_cast<std::uint32_t>(c.width),
                            static_cast<std::uint32_t>(c.height));
        photo_.Parse(packet.data(), packet.size());
        if (!photo_.HasPanorama()) throw std::runtime_error("panorama record not read");
        break;
      }
    }
  }
  ~QualityContext() override {
    if (toolkitOpen_) PXmpMeta::Terminate();
  }
  QualityContext(const QualityContext&) = delete;
  QualityContext& operator=(const QualityContext&) = delete;

  PSettings& Settings() override { return settings; }
  const PhotoInfo* Photo() const override {
    return lens_ == LensKind::kCylindrical ? &photo_ : nullptr;
  }
  std::int32_t SourceWidth() const override { return width_; }
  std::int32_t SourceHeight() const override { return height_; }
  std::int32_t PreviewWidth() const override { return width_; }
  std::int32_t PreviewHeight() const override { return height_; }
  bool BuildImageModel(const std::shared_ptr<const Image>& image,
                       std::shared_ptr<PhotoToSphere>& model) override {
    const PanoramaProjection panorama = photo_.Panorama();
    return ChoosePhotoToSphere(settings.projectionModel, image, settings.focalLength,
                               lens_ == LensKind::kCylindrical ? &panorama : nullptr, camera_.get(),
                               1.0f, model);
  }
  void ReportSolve(bool failed) override { failures += failed ? 1 : 0; }
  void RebuildResults() override {}
  void RedrawResults() override {}

  PSettings settings;
  int failures = 0;

 private:
  LensKind lens_;
  std::int32_t width_, height_;
  std::unique_ptr<PGenericCameraModel> camera_;
  PhotoInfo photo_;
  bool toolkitOpen_ = false;
};

// Finds the mesh cell of photograph points that come one after another
// along a curve: first around the last point's cell, then by the solver's
// full search.
class CellLocator {
 public:
  CellLocator(const Solver& solver, const QualityContext& context)
      : solver_(solver), width_(context.SourceWidth()), height_(context.SourceHeight()) {}

  // The point's texture fraction and its cell; false off the mesh.
  bool Locate(Synth::Point2 p, float fraction[2], OctaMap::Cell& cell) {
    fraction[0] = static_cast<float>(p.x / width_);
    fraction[1] = static_cast<float>(1.0 - p.y / height_);
    const GeodesicLines& lines = *solver_.GetLines();
    const std::int32_t cells = solver_.CellCount();
    if (last_.i >= 0) {
      for (std::int32_t ring = 0; ring <= 2; ++ring) {
        for (std::int32_t dj = -ring; dj <= ring; ++dj) {
          for (std::int32_t di = -ring; di <= ring; ++di) {
            if (std::max(std::abs(di), std::abs(dj)) != ring) continue;
            const OctaMap::Cell near{last_.i + di, last_.j + dj};
            if (near.i < 0 || near.j < 0 || near.i >= cells || near.j >= cells) continue;
            if (!solver_.GetWarp()->IsQuadInside(near.i, near.j)) continue;
            if (lines.IsPointInCell(fraction, near, 0)) {
              cell = last_ = near;
              return true;
            }
          }
        }
      }
    }
    if (!lines.FindCell(fraction, cell, 0)) return false;
    last_ = cell;
    return true;
  }

  const Solver& solver() const { return solver_; }

 private:
  const Solver& solver_;
  double width_, height_;
  OctaMap::Cell last_;
};

// A straight scene edge chosen as a constraint: its image curve from the
// generator, cut back to the mesh, and how it is pinned.
struct PickedLine {
  std::string id;
  std::vector<Synth::Point2> curve;
  std::int32_t orientation = LineConstraint::kUnfixed;
  std::int32_t constraintId = -1;
};

inline double CurveLength(const std::vector<Synth::Point2>& points) {
  double length = 0.0;
  for (std::size_t k = 1; k < points.size(); ++k) {
    length += std::hypot(points[k].x - points[k - 1].x, points[k].y - points[k - 1].y);
  }
  return length;
}

// Edges of the scene as the camera sees it, taken in turn from the longest
// vertical, level-and-square-to-the-view and other edges: verticals pinned
// vertical and level ones horizontal when `pin` is set, the rest free. Each
// run is cut back to the stretch about its middle that lies on the mesh,
// and 2 pixels more, as a user's clicks would: a run may end on the
// picture's border or where the lens's field ends, beyond the mesh's last
// whole cell. `onMesh(points, first, last)` narrows [first, last] so.
template <typename OnMesh>
std::vector<PickedLine> PickLines(const Synth::Scene& scene, const Synth::Camera& camera,
                                  std::size_t count, bool pin, OnMesh onMesh,
                                  double minLength = 100.0) {
  const Synth::Vec3 forward = camera.ToWorld({1.0, 0.0, 0.0});
  // Vertical, horizontal, free; each longest first.
  std::vector<std::pair<double, PickedLine>> kinds[3];
  for (const Synth::TruthSegment& run : Synth::TruthTracer(scene, camera).Trace()) {
    if (run.points.size() < 3 || CurveLength(run.points) < minLength) continue;
    std::size_t first = 0, last = run.points.size() - 1;
    if (!onMesh(run.points, first, last)) continue;
    constexpr double kInset = 2.0;  // pixels
    for (double walked = 0.0; walked < kInset && first < last; ++first) {
      walked += std::hypot(run.points[first + 1].x - run.points[first].x,
                           run.points[first + 1].y - run.points[first].y);
    }
    for (double walked = 0.0; walked < kInset && first < last; --last) {
      walked += std::hypot(run.points[last].x - run.points[last - 1].x,
                           run.points[last].y - run.points[last - 1].y);
    }
    if (first >= last) continue;
    PickedLine line;
    line.id = run.id;
    line.curve.assign(run.points.begin() + static_cast<std::ptrdiff_t>(first),
                      run.points.begin() + static_cast<std::ptrdiff_t>(last) + 1);
    const double length = CurveLength(line.curve);
    if (length < minLength) continue;
    const Synth::Vec3 d = Synth::Normalised(run.end - run.start);
    int kind = 2;
    if (pin && std::fabs(d.z) > 0.9999) {
      line.orientation = LineConstraint::kVertical;
      kind = 0;
    } else if (pin && std::fabs(d.z) < 1e-4 && std::fabs(Synth::Dot(d, forward)) < 1e-4) {
      line.orientation = LineConstraint::kHorizontal;
      kind = 1;
    }
    kinds[kind].emplace_back(length, std::move(line));
  }
  for (auto& list : kinds) {
    std::stable_sort(list.begin(), list.end(),
                     [](const auto& a, const auto& b) { return a.first > b.first; });
  }
  std::vector<PickedLine> picked;
  for (std::size_t rank = 0; picked.size() < count; ++rank) {
    bool any = false;
    for (auto& list : kinds) {
      if (rank >= list.size() || picked.size() == count) continue;
      picked.push_back(std::move(list[rank].second));
      any = true;
    }
    if (!any) break;
  }
  return picked;
}

// A planar rectangle of the scene, by its corner and two edge vectors.
struct ScenePlane {
  Synth::Vec3 origin;
  Synth::Vec3 u;
  Synth::Vec3 v;
  Synth::Vec3 At(double s, double t) const { return origin + s * u + t * v; }
};

// The far wall of the room, a little inside its edges.
inline ScenePlane RoomFarWall() { return {{8.0, -2.7, 0.3}, {0.0, 5.4, 0.0}, {0.0, 0.0, 2.4}}; }

// The middle of the facade's wall, which is turned 30 degrees from square.
inline ScenePlane FacadeWall() {
  const Synth::Vec3 along{-0.5, std::sqrt(0.75), 0.0};
  const Synth::Vec3 corner = Synth::Vec3{14.0, 0.0, 0.0} - 14.0 * along;
  return {corner + 4.0 * along + Synth::Vec3{0.0, 0.0, 1.0}, 20.0 * along, {0.0, 0.0, 7.0}};
}

// The checker board, a little inside its edges.
inline ScenePlane CheckerBoard() { return {{2.0, -1.4, -1.0}, {0.0, 2.8, 0.0}, {0.0, 0.0, 2.0}}; }

// One generated photograph with a constraint list on its solver, solved
// once without constraints as the filter starts. `adjust` may change the
// default settings first.
struct QualityScene {
  explicit QualityScene(const CameraCase& c,
                        const std::function<void(PSettings&)>& adjust = nullptr)
      : shot(c),
        scene(Synth::Scene::Make(c.scene)),
        camera(MakeCamera(scene, c)),
        context(c, camera),
        list(context) {
    if (adjust) adjust(context.settings);
    solver().RebuildGrid(false);
    solver().Solve(true, false);
  }
  Solver& solver() { return list.GetSolver(); }

  // Adds the lines as constraints; answers how many traced.
  std::size_t AddLines(std::vector<PickedLine>& lines) {
    std::size_t traced = 0;
    for (PickedLine& line : lines) {
      const Synth::Point2 a = line.curve.front(), b = line.curve.back();
      auto constraint = std::make_unique<LineConstraint>(
          Point2f{static_cast<float>(a.x), static_cast<float>(a.y)},
          Point2f{static_cast<float>(b.x), static_cast<float>(b.y)});
      constraint->StoreOrientation(line.orientation, 0.0f);
      LineConstraint* raw = constraint.get();
      if (list.Add(std::move(constraint))) ++traced;
      line.constraintId = raw->GetId();
    }
    return traced;
  }

  // A polygon on the plane's corners; false when a corner is off the photo.
  bool AddPolygon(const ScenePlane& plane) {
    auto polygon = std::make_unique<PlaneConstraint>();
    for (const auto& [s, t] : {std::pair{0.0, 0.0}, {1.0, 0.0}, {1.0, 1.0}, {0.0, 1.0}}) {
      Synth::Point2 p;
      if (!camera.Project(plane.At(s, t), &p)) return false;
      polygon->AddCorner({static_cast<float>(p.x), static_cast<float>(p.y)},
                         LineConstraint::kUnfixed);
    }
    PlaneConstraint* raw = polygon.get();
    list.Add(std::move(polygon));
    return raw->IsValid(solver());
  }

  void RemoveAll() { list.RemoveAll(); }

  // Narrows [first, last] of a curve to the stretch about its middle that
  // lies on the mesh; false when its middle does not.
  bool OnMesh(const std::vector<Synth::Point2>& points, std::size_t& first, std::size_t& last) {
    const std::size_t middle = (first + last) / 2;
    float fraction[2];
    OctaMap::Cell cell;
    CellLocator down(solver(), context), up(solver(), context);
    if (!down.Locate(points[middle], fraction, cell)) return false;
    up.Locate(points[middle], fraction, cell);
    std::size_t k = middle;
    while (k > first && down.Locate(points[k - 1], fraction, cell)) --k;
    first = k;
    k = middle;
    while (k < last && up.Locate(points[k + 1], fraction, cell)) ++k;
    last = k;
    return true;
  }
  std::vector<PickedLine> Pick(std::size_t count, bool pin) {
    return PickLines(scene, camera, count, pin,
                     [this](const std::vector<Synth::Point2>& points, std::size_t& first,
                            std::size_t& last) { return OnMesh(points, first, last); });
  }

  CameraCase shot;
  Synth::Scene scene;
  Synth::Camera camera;
  QualityContext context;
  ConstraintList list;
};

// --- Measures ---

struct Point {
  double x = 0.0;
  double y = 0.0;
};

// Result-plane units to pixels of an output of the photograph's size that
// shows the whole solved mesh: the full box fitted to the photograph's
// aspect, as the final rendering frames it.
inline double PixelsPerUnit(const Solver& solver, const QualityContext& context) {
  return context.SourceWidth() / static_cast<double>(solver.FitBox(1).viewWidth);
}

// The photograph point's place in the result plane through the mesh as the
// result is drawn: each cell is drawn as two triangles split as the grid
// says, and a triangle maps its texture coordinates to its positions
// affinely.
inline bool ResultPoint(CellLocator& locator, Synth::Point2 p, Point& out) {
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

// The same with the solver's own weights of the point in its cell (those of
// its point finder).
inline bool FinderPoint(CellLocator& locator, Synth::Point2 p, Point& out) {
  float fraction[2], weights[4];
  OctaMap::Cell cell;
  if (!locator.Locate(p, fraction, cell)) return false;
  const Solver& solver = locator.solver();
  solver.GetLines()->CellWeights(fraction, cell, 0, weights);
  const std::size_t n = static_cast<std::size_t>(solver.GridSize());
  const std::int32_t ci[4] = {0, 1, 1, 0}, cj[4] = {0, 0, 1, 1};
  out = {0.0, 0.0};
  for (int k = 0; k < 4; ++k) {
    const std::size_t at = (static_cast<std::size_t>(cell.j + cj[k]) * n + cell.i + ci[k]) * 2;
    out.x += weights[k] * solver.Positions()[at];
    out.y += weights[k] * solver.Positions()[at + 1];
  }
  return true;
}

struct Straightness {
  double maxDeviation = 0.0;  // result-plane units
  double rms = 0.0;
  double angleDegrees = 0.0;  // of the fitted direction to the x axis, in (-90, 90]
  std::size_t points = 0;
};

// The total least-squares line through the points and the points' distances
// to it.
inline Straightness FitStraightLine(const std::vector<Point>& points) {
  const testing::StraightLineFit fit = testing::FitStraightLine(points);
  return {fit.maxDeviation, fit.rms, fit.angle * 180.0 / std::numbers::pi, fit.points};
}

// How far a fitted direction is from the one a pinned line must take.
inline double DirectionError(double angleDegrees, std::int32_t orientation) {
  const double a = std::fabs(angleDegrees);  // 0 to 90
  if (orientation == LineConstraint::kHorizontal) return a;
  if (orientation == LineConstraint::kVertical) return 90.0 - a;
  return 0.0;
}

struct LineQuality {
  Straightness samples;         // the traced samples, as the solve holds them
  Straightness truth;           // the generator's image curve, through the mesh as drawn
  Straightness finder;          // the same curve through the solver's point finder
  double directionError = 0.0;  // degrees, of the truth's fit; 0 for free lines
  // The same without the two end cells, where a line's end sample lies
  // inside a cell rather than on its edges.
  Straightness innerSamples;
  Straightness innerTruth;
  double innerDirectionError = 0.0;
};

// Both measures of one constrained line. The generator's curve is taken at
// most every `step` pixels along it.
inline LineQuality MeasureLine(const Solver& solver, const QualityContext& context,
                               const PickedLine& line, double step = 4.0) {
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
  std::vector<Point> points, found, inner;
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
    if (FinderPoint(locator, line.curve[k], p)) found.push_back(p);
  }
  quality.truth = FitStraightLine(points);
  quality.finder = FitStraightLine(found);
  quality.innerTruth = FitStraightLine(inner);
  quality.directionError = DirectionError(quality.truth.angleDegrees, line.orientation);
  quality.innerDirectionError = DirectionError(quality.innerTruth.angleDegrees, line.orientation);
  return quality;
}

// --- Homographies ---

// Solves the n x n system a x = b in place by elimination with partial
// pivoting; false when it is singular.
inline bool SolveDense(std::vector<double>& a, std::vector<double>& b, int n) {
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
inline double HomographyResidual(const std::vector<Point>& from, const std::vector<Point>& to) {
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
inline double MeasurePlane(const QualityScene& scene, const ScenePlane& plane, int steps = 12) {
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
inline double MeasurePlaneVertices(const QualityScene& scene, const ScenePlane& plane) {
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

// --- Conformality ---

struct Conformality {
  double median = 0.0;
  double p95 = 0.0;
  std::size_t cells = 0;
};

// The cells that hold a sample of any constraint: a line's samples, a
// polygon's edges and the cells around its inner vertices.
inline std::set<std::pair<std::int32_t, std::int32_t>> ConstrainedCells(const Solver& solver) {
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
inline Conformality MeasureConformality(
    const Solver& solver, const std::set<std::pair<std::int32_t, std::int32_t>>& held) {
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

// --- One scene, end to end ---

struct SceneReport {
  std::size_t picked = 0;  // lines asked for and found in the scene
  std::size_t traced = 0;
  std::size_t pinned = 0;  // of them horizontal or vertical
  bool polygon = false;    // a polygon was asked for and traced
  bool succeeded = false;
  std::int32_t iterations = 0;
  double pixelsPerUnit = 0.0;
  // The worst line of each measure, in output pixels and degrees.
  double samplesMax = 0.0, samplesRms = 0.0;
  double truthMax = 0.0, truthRms = 0.0;
  double directionError = 0.0;
  double innerSamplesMax = 0.0, innerSamplesRms = 0.0;
  double innerTruthMax = 0.0, innerTruthRms = 0.0;
  double innerDirectionError = 0.0;
  double polygonError = 0.0;        // pixels, through the mesh; 0 without a polygon
  double polygonVertexError = 0.0;  // pixels, at the polygon's own grid vertices
  Conformality constrained;         // away from the constraints, after the solve
  Conformality plain;               // the same cells, solved without constraints
  std::vector<PickedLine> lines;
  std::vector<LineQuality> qualities;  // per line, in the plane's units
};

// Adds `lineCount` of the scene's longest edges (pinned where `pin`) and,
// when given, a scene plane as a polygon, solves once and measures.
inline SceneReport RunScene(QualityScene& scene, std::size_t lineCount, bool pin,
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

}  // namespace Project::quality
