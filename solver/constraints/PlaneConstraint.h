#pragma once

#include <cstdint>
#include <memory>
#include <vector>

#include "solver/constraints/Constraint.h"

namespace Project {

// One corner of a polygon, in the photograph's pixels (or, among the shown
// corners, the view's).
struct PlaneCorner {
  float x = 0.0f;
  float y = 0.0f;
  // False while a dragged corner lies off the image: the polygon cannot be
  // traced until it is back.
  bool usable = true;
  // Of the edge from this corner to the next (the last one closes the
  // polygon): 1 Unfixed, 2 Horizontal, 3 Vertical.
  std::int32_t edgeOrientation = 1;
};

// A polygon constraint: the user asserts that the region inside a closed
// polygon is a flat surface of the world, so one homography must hold over
// it, and that each edge is straight, possibly horizontal or vertical. The
// corners are the truth; Rebuild traces them into a PlaneRecord of the
// solver's GeodesicLines under this polygon's id, and drops that record
// whenever a corner or an edge cannot be traced. The polygon owns its corner
// lists and, from Update, the shown corners and edge curves.
class PlaneConstraint final : public Constraint {
 public:
  // PickZone's answers.
  static constexpr std::int32_t kZoneNone = 1;
  static constexpr std::int32_t kZoneCorner = 2;
  static constexpr std::int32_t kZoneEdge = 3;

  PlaneConstraint() = default;
  // Takes other's id, validity and corners only; the shown lists wait for
  // the next Update. A cancelled corner drag and ConstraintList::Replace
  // restore a polygon this way.
  PlaneConstraint& operator=(const PlaneConstraint& other);

  std::unique_ptr<Constraint> Clone() const override;
  std::size_t GetSerializedSize() const override { return 8 + 12 * corners_.size(); }
  bool IsValid(const Solver&) const override { return valid_; }
  bool HitTest(const ConstraintEnv& env, Point2f point, bool inWarpedView,
               float tolerance) const override;
  void Update(const ConstraintEnv& env) override;
  bool Register(Solver& solver) override { return Rebuild(solver); }
  void Unregister(Solver& solver) const override;

  // Appends a usable corner; nothing is traced.
  void AddCorner(Point2f point, std::int32_t edgeOrientation);
  // Moves a corner when the index is in range, and rebuilds in any case.
  void SetCorner(Solver& solver, std::int32_t index, Point2f point, bool usable);
  // 1 for an index out of range.
  std::int32_t GetEdgeOrientation(std::int32_t index) const;
  // Stores the orientation and pins the record's edge to match, without a
  // retrace; an untraced polygon takes it at its next Rebuild.
  void SetEdgeOrientation(Solver& solver, std::int32_t index, std::int32_t orientation);
  // The edge's acute angle to the x axis, 0 to 90 degrees, on the shown
  // corners when inWarpedView; 0 when there is no such edge.
  float GetEdgeAngle(std::int32_t index, bool inWarpedView) const;
  // A copy of the edge's shown curve; empty out of range.
  std::vector<Point2f> GetEdgeCurve(std::int32_t index) const;

  // The first corner whose square of half side tolerance holds the point,
  // or -1; only corners that have been shown are tried.
  std::int32_t PickCorner(Point2f point, bool inWarpedView, float tolerance) const;
  // The first edge within the tolerance of the point, or -1: the traced
  // curves of a valid polygon, the straight sides of one that is not.
  std::int32_t PickEdge(const Solver& solver, Point2f point, bool inWarpedView,
                        float tolerance) const;
  // Corner first, then edge.
  std::int32_t PickZone(const Solver& solver, Point2f point, bool inWarpedView,
                        float tolerance) const;

  // Traces the closed polygon into the solver's plane store (replacing its
  // record in place), or takes its record out when it cannot be traced.
  // Always answers true; validity is IsValid.
  bool Rebuild(Solver& solver);

  const std::vector<PlaneCorner>& GetCorners() const { return corners_; }
  const std::vector<PlaneCorner>& GetDisplayCorners() const { return displayCorners_; }
  const std::vector<std::vector<Point2f>>& GetEdgeCurves() const { return edgeCurves_; }

 private:
  // This polygon's record in the solver's plane store, or null.
  const PlaneRecord* FindRecord(const Solver& solver) const;

  std::vector<PlaneCorner> corners_;
  bool valid_ = true;
  std::vector<PlaneCorner> displayCorners_;
  std::vector<std::vector<Point2f>> edgeCurves_;
};

}  // namespace Project
