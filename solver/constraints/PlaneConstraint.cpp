#include "solver/constraints/PlaneConstraint.h"

#include <algorithm>
#include <cmath>
#include <numbers>

#include "solver/frame/Solver.h"

namespace Project {

namespace {

// Pins an edge's normal by its orientation; other values leave it alone.
void ApplyEdgeOrientation(LineRecord& edge, std::int32_t orientation) {
  switch (orientation) {
    case 1:
      edge.hasFixedNormal = false;
      edge.fixedNormal = {0.0f, 0.0f};
      break;
    case 2:
      edge.hasFixedNormal = true;
      edge.fixedNormal = {0.0f, 1.0f};
      break;
    case 3:
      edge.hasFixedNormal = true;
      edge.fixedNormal = {1.0f, 0.0f};
      break;
    default:
      break;
  }
}

Point2f At(const PlaneCorner& corner) { return {corner.x, corner.y}; }

void RemoveRecord(std::vector<PlaneRecord>& planes, std::int32_t id) {
  std::erase_if(planes, [id](const PlaneRecord& r) { return r.id == id; });
}

}  // namespace

PlaneConstraint& PlaneConstraint::operator=(const PlaneConstraint& other) {
  if (this == &other) return *this;
  SetId(other.GetId());
  valid_ = other.valid_;
  corners_ = other.corners_;
  return *this;
}

std::unique_ptr<Constraint> PlaneConstraint::Clone() const {
  auto clone = std::make_unique<PlaneConstraint>();
  *clone = *this;
  return clone;
}

bool PlaneConstraint::HitTest(const ConstraintEnv& env, Point2f point, bool inWarpedView,
                              float tolerance) const {
  return PickCorner(point, inWarpedView, tolerance) >= 0 ||
         PickEdge(env.solver, point, inWarpedView, tolerance) >= 0;
}

const PlaneRecord* PlaneConstraint::FindRecord(const Solver& solver) const {
  const auto& lines = solver.GetLines();
  if (!lines) return nullptr;
  for (const PlaneRecord& record : lines->GetPlanes()) {
    if (record.id == GetId()) return &record;
  }
  return nullptr;
}

void PlaneConstraint::Update(const ConstraintEnv& env) {
  displayCorners_ = corners_;
  for (PlaneCorner& corner : displayCorners_) {
    if (!corner.usable) continue;
    const float in[2] = {corner.x, corner.y};
    float out[2];
    env.solver.SourceToPreview(in, out);
    corner.x = out[0];
    corner.y = out[1];
  }
  edgeCurves_.clear();
  const PlaneRecord* record = valid_ ? FindRecord(env.solver) : nullptr;
  if (record == nullptr) return;
  const std::int32_t mode = env.ShowsResult() ? 1 : 0;
  for (const LineRecord& edge : record->edges) {
    std::vector<Point2f>& curve = edgeCurves_.emplace_back();
    for (const Point2f& p : env.solver.GetLines()->TraceSamples(edge, mode)) {
      const float in[2] = {p.x, p.y};
      float out[2];
      env.solver.PlaneToView(in, out, mode);
      curve.push_back({out[0], out[1]});
    }
  }
}

void PlaneConstraint::Unregister(Solver& solver) const {
  if (const auto& lines = solver.GetLines()) RemoveRecord(lines->GetPlanes(), GetId());
}

void PlaneConstraint::AddCorner(Point2f point, std::int32_t edgeOrientation) {
  corners_.push_back({point.x, point.y, true, edgeOrientation});
}

void PlaneConstraint::SetCorner(Solver& solver, std::int32_t index, Point2f point, bool usable) {
  if (index >= 0 && static_cast<std::size_t>(index) < corners_.size()) {
    PlaneCorner& corner = corners_[index];
    corner.x = point.x;
    corner.y = point.y;
    corner.usable = usable;
  }
  Rebuild(solver);
}

std::int32_t PlaneConstraint::GetEdgeOrientation(std::int32_t index) const {
  if (index < 0 || static_cast<std::size_t>(index) >= corners_.size()) return 1;
  return corners_[index].edgeOrientation;
}

void PlaneConstraint::SetEdgeOrientation(Solver& solver, std::int32_t index,
                                         std::int32_t orientation) {
  if (index < 0) return;
  if (static_cast<std::size_t>(index) < corners_.size()) {
    corners_[index].edgeOrientation = orientation;
  }
  // An edge's samples do not depend on its orientation: no retrace.
  const auto& lines = solver.GetLines();
  if (!lines) return;
  for (PlaneRecord& record : lines->GetPlanes()) {
    if (record.id != GetId()) continue;
    if (static_cast<std::size_t>(index) < record.edges.size()) {
      ApplyEdgeOrientation(record.edges[index], orientation);
    }
    return;
  }
}

float PlaneConstraint::GetEdgeAngle(std::int32_t index, bool inWarpedView) const {
  const std::vector<PlaneCorner>& list = inWarpedView ? displayCorners_ : corners_;
  if (list.size() < 2 || index < 0 || static_cast<std::size_t>(index) >= list.size()) return 0.0f;
  const PlaneCorner& a = list[index];
  const PlaneCorner& b = list[(static_cast<std::size_t>(index) + 1) % list.size()];
  const float dx = b.x - a.x, dy = b.y - a.y;
  const float length = std::hypot(dx, dy);
  if (length == 0.0f) return 0.0f;
  const float c = std::clamp(std::fabs(dx / length), 0.0f, 1.0f);
  return static_cast<float>(std::acos(c) * 180.0 / std::numbers::pi);
}

std::vector<Point2f> PlaneConstraint::GetEdgeCurve(std::int32_t index) const {
  if (index < 0 || static_cast<std::size_t>(index) >= edgeCurves_.size()) return {};
  return edgeCurves_[index];
}

std::int32_t PlaneConstraint::PickCorner(Point2f point, bool inWarpedView, float tolerance) const {
  const std::size_t count = std::min(corners_.size(), displayCorners_.size());
  for (std::size_t k = 0; k < count; ++k) {
    const PlaneCorner& corner = inWarpedView ? displayCorners_[k] : corners_[k];
    if (InSquare(point, At(corner), tolerance)) return static_cast<std::int32_t>(k);
  }
  return -1;
}

std::int32_t PlaneConstraint::PickEdge(const Solver& solver, Point2f point, bool inWarpedView,
                                       float tolerance) const {
  const float limit = tolerance * tolerance;
  if (!valid_) {
    // The straight sides, for as far as both corner lists go.
    const std::vector<PlaneCorner>& list = inWarpedView ? displayCorners_ : corners_;
    const std::size_t n = corners_.size();
    const std::size_t count = std::min(n, displayCorners_.size());
    for (std::size_t k = 0; k < count; ++k) {
      const std::size_t next = k + 1 == n ? 0 : k + 1;
      if (next >= count) return -1;
      if (SegmentDistanceSquared(point, At(list[k]), At(list[next])) <= limit) {
        return static_cast<std::int32_t>(k);
      }
    }
    return -1;
  }
  const PlaneRecord* record = FindRecord(solver);
  if (record == nullptr) return -1;
  const std::size_t edges = std::min(record->edges.size(), edgeCurves_.size());
  for (std::size_t k = 0; k < edges; ++k) {
    const std::vector<Point2f>& curve = edgeCurves_[k];
    for (std::size_t s = 1; s < curve.size(); ++s) {
      if (SegmentDistanceSquared(point, curve[s - 1], curve[s]) <= limit) {
        return static_cast<std::int32_t>(k);
      }
    }
  }
  return -1;
}

std::int32_t PlaneConstraint::PickZone(const Solver& solver, Point2f point, bool inWarpedView,
                                       float tolerance) const {
  if (PickCorner(point, inWarpedView, tolerance) >= 0) return kZoneCorner;
  if (PickEdge(solver, point, inWarpedView, tolerance) >= 0) return kZoneEdge;
  return kZoneNone;
}

bool PlaneConstraint::Rebuild(Solver& solver) {
  const auto& lines = solver.GetLines();
  if (!lines) return true;
  GeodesicLines& store = *lines;
  const bool usable = std::all_of(corners_.begin(), corners_.end(),
                                  [](const PlaneCorner& corner) { return corner.usable; });
  valid_ = usable;
  if (usable) {
    store.ClearDraftPlane();
    // Each corner as a photograph fraction; coming back to the first one
    // closes the polygon, so n corners trace n edges.
    float first[2] = {0.0f, 0.0f};
    for (std::size_t k = 0; k < corners_.size(); ++k) {
      const float in[2] = {corners_[k].x, corners_[k].y};
      float fraction[2];
      solver.ViewToPlane(in, fraction, 0);
      if (k == 0) std::copy(fraction, fraction + 2, first);
      store.AddDraftPoint(fraction, false, 0);
    }
    if (!corners_.empty()) store.AddDraftPoint(first, true, 0);
    PlaneRecord& draft = store.GetDraftPlane();
    valid_ = std::all_of(draft.edges.begin(), draft.edges.end(),
                         [](const LineRecord& edge) { return edge.active; });
    if (valid_) {
      draft.id = GetId();
      draft.active = true;
      const std::size_t edges = std::min(draft.edges.size(), corners_.size());
      for (std::size_t k = 0; k < edges; ++k) {
        ApplyEdgeOrientation(draft.edges[k], corners_[k].edgeOrientation);
      }
      std::vector<PlaneRecord>& planes = store.GetPlanes();
      auto it = std::find_if(planes.begin(), planes.end(),
                             [&](const PlaneRecord& r) { return r.id == GetId(); });
      if (it != planes.end()) {
        *it = draft;
      } else {
        planes.push_back(draft);
      }
    }
  }
  if (!valid_) RemoveRecord(store.GetPlanes(), GetId());
  store.ClearDraftPlane();
  return true;
}

}  // namespace Project
