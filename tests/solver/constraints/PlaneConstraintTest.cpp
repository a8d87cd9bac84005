#include "solver/constraints/PlaneConstraint.h"

#include <gtest/gtest.h>

#include "tests/solver/constraints/ConstraintScene.h"

namespace Project {
namespace {

const PlaneRecord* RecordOf(ConstraintScene& scene, std::int32_t id) {
  for (const PlaneRecord& record : scene.solver().GetLines()->GetPlanes()) {
    if (record.id == id) return &record;
  }
  return nullptr;
}

// A traced rectangle: its record with one edge per corner and the edges'
// pinned normals, and picking at its known corners and sides (a pinhole
// photo shows its traced edges straight).
TEST(PlaneConstraint, RebuildAndPick) {
  ConstraintScene scene;
  PlaneConstraint& plane = scene.AddRectangle();
  ASSERT_TRUE(plane.IsValid(scene.solver()));
  const PlaneRecord* record = RecordOf(scene, plane.GetId());
  ASSERT_NE(record, nullptr);
  ASSERT_EQ(record->edges.size(), 4u);
  EXPECT_EQ(record->edges[0].fixedNormal, (std::array<float, 2>{0, 1}));
  EXPECT_FALSE(record->edges[1].hasFixedNormal);
  plane.SetEdgeOrientation(scene.solver(), 1, 3);
  EXPECT_EQ(record->edges[1].fixedNormal, (std::array<float, 2>{1, 0}));
  EXPECT_EQ(plane.GetEdgeOrientation(1), 3);

  ASSERT_EQ(plane.GetEdgeCurves().size(), 4u);
  const Solver& solver = scene.solver();
  EXPECT_EQ(plane.PickCorner({401, 281}, false, 3.0f), 2);
  EXPECT_EQ(plane.PickEdge(solver, {398, 200}, false, 3.0f), 1);
  // The closing side, from the last corner back to the first.
  EXPECT_EQ(plane.PickEdge(solver, {201, 200}, false, 3.0f), 3);
  EXPECT_EQ(plane.PickZone(solver, {200, 121}, false, 3.0f), PlaneConstraint::kZoneCorner);
  EXPECT_EQ(plane.PickZone(solver, {300, 278}, false, 3.0f), PlaneConstraint::kZoneEdge);
  EXPECT_EQ(plane.PickZone(solver, {300, 200}, false, 3.0f), PlaneConstraint::kZoneNone);
  // A clone has shown nothing yet.
  EXPECT_EQ(static_cast<PlaneConstraint&>(*plane.Clone()).PickCorner({200, 120}, false, 3.0f), -1);
}

// A corner dragged off the image drops the record at once; the polygon still
// answers by its straight sides, takes an edge kind without a record, and
// comes back with that kind when the corner is usable again.
TEST(PlaneConstraint, UnusableCornerDropsTheRecord) {
  ConstraintScene scene;
  PlaneConstraint& plane = scene.AddRectangle();
  plane.SetCorner(scene.solver(), 2, {400, 280}, false);
  EXPECT_FALSE(plane.IsValid(scene.solver()));
  EXPECT_EQ(RecordOf(scene, plane.GetId()), nullptr);
  scene.UpdateAll();
  EXPECT_TRUE(plane.GetEdgeCurves().empty());
  EXPECT_EQ(plane.PickEdge(scene.solver(), {300, 122}, false, 3.0f), 0);
  EXPECT_TRUE(plane.HitTest(scene.list.Env(), {399, 200}, false, 3.0f));

  plane.SetEdgeOrientation(scene.solver(), 0, 3);
  plane.SetCorner(scene.solver(), 2, {400, 280}, true);
  const PlaneRecord* record = RecordOf(scene, plane.GetId());
  ASSERT_NE(record, nullptr);
  EXPECT_EQ(record->edges[0].fixedNormal, (std::array<float, 2>{1, 0}));
}

// Edge angles by hand, and the defaults out of range.
TEST(PlaneConstraint, EdgeAnglesAndDefaults) {
  PlaneConstraint triangle;
  triangle.AddCorner({0, 0}, 1);
  triangle.AddCorner({100, 100}, 1);
  triangle.AddCorner({0, 100}, 1);
  // acos(1 / sqrt 2) in float.
  EXPECT_NEAR(triangle.GetEdgeAngle(0, false), 45.0f, 1e-5f);
  EXPECT_EQ(triangle.GetEdgeAngle(1, false), 0.0f);
  EXPECT_EQ(triangle.GetEdgeAngle(2, false), 90.0f);
  EXPECT_EQ(triangle.GetEdgeAngle(0, true), 0.0f);  // nothing shown yet
  EXPECT_EQ(triangle.GetEdgeOrientation(-1), 1);
  EXPECT_EQ(triangle.GetEdgeOrientation(3), 1);
  EXPECT_EQ(triangle.GetSerializedSize(), 8u + 3u * 12u);
  PlaneConstraint single;
  single.AddCorner({5, 5}, 1);
  EXPECT_EQ(single.GetEdgeAngle(0, false), 0.0f);
}

}  // namespace
}  // namespace Project
