#include "tests/support/QualityScene.h"

#include <algorithm>
#include <cmath>
#include <cstdlib>
#include <memory>
#include <utility>

#include "solver/constraints/PlaneConstraint.h"
#include "tools/synth/lib/TruthTracer.h"

namespace Project::testing {
namespace {

double CurveLength(const std::vector<Synth::Point2>& points) {
  double length = 0.0;
  for (std::size_t k = 1; k < points.size(); ++k) {
    length += std::hypot(points[k].x - points[k - 1].x, points[k].y - points[k - 1].y);
  }
  return length;
}

}  // namespace

bool CellLocator::Locate(Synth::Point2 p, float fraction[2], OctaMap::Cell& cell) {
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

std::vector<PickedLine> PickLines(const Synth::Scene& scene, const Synth::Camera& camera,
                                  std::size_t count, bool pin, const OnMesh& onMesh,
                                  double minLength) {
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

ScenePlane RoomFarWall() { return {{8.0, -2.7, 0.3}, {0.0, 5.4, 0.0}, {0.0, 0.0, 2.4}}; }

ScenePlane FacadeWall() {
  const Synth::Vec3 along{-0.5, std::sqrt(0.75), 0.0};
  const Synth::Vec3 corner = Synth::Vec3{14.0, 0.0, 0.0} - 14.0 * along;
  return {corner + 4.0 * along + Synth::Vec3{0.0, 0.0, 1.0}, 20.0 * along, {0.0, 0.0, 7.0}};
}

ScenePlane CheckerBoard() { return {{2.0, -1.4, -1.0}, {0.0, 2.8, 0.0}, {0.0, 0.0, 2.0}}; }

QualityScene::QualityScene(const CameraCase& c, const std::function<void(PSettings&)>& adjust)
    : shot(c),
      scene(Synth::Scene::Make(c.scene)),
      camera(MakeCamera(scene, c)),
      context(c, camera),
      list(context) {
  if (adjust) adjust(context.settings);
  solver().RebuildGrid(false);
  solver().Solve(true, false);
}

std::size_t QualityScene::AddLines(std::vector<PickedLine>& lines) {
  std::size_t traced = 0;
  for (PickedLine& line : lines) {
    const Synth::Point2 a = line.curve.front(), b = line.curve.back();
    auto constraint =
        std::make_unique<LineConstraint>(Point2f{static_cast<float>(a.x), static_cast<float>(a.y)},
                                         Point2f{static_cast<float>(b.x), static_cast<float>(b.y)});
    constraint->StoreOrientation(line.orientation, 0.0f);
    LineConstraint* raw = constraint.get();
    if (list.Add(std::move(constraint))) ++traced;
    line.constraintId = raw->GetId();
  }
  return traced;
}

bool QualityScene::AddPolygon(const ScenePlane& plane) {
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

bool QualityScene::OnMesh(const std::vector<Synth::Point2>& points, std::size_t& first,
                          std::size_t& last) {
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

std::vector<PickedLine> QualityScene::Pick(std::size_t count, bool pin) {
  return PickLines(scene, camera, count, pin,
                   [this](const std::vector<Synth::Point2>& points, std::size_t& first,
                          std::size_t& last) { return OnMesh(points, first, last); });
}

}  // namespace Project::testing
