#include "solver/constraints/LineConstraint.h"

#include <gtest/gtest.h>

#include <cmath>

#include "solver/constraints/TraceConstraint.h"
#include "tests/solver/constraints/ConstraintScene.h"

namespace Project {
namespace {

// The distance from p to the infinite line through a and b.
float OffLine(Point2f p, Point2f a, Point2f b) {
  const float dx = b.x - a.x, dy = b.y - a.y;
  return std::fabs((p.x - a.x) * dy - (p.y - a.y) * dx) / std::hypot(dx, dy);
}

// Lines across the photo: each traced sample's direction lies on the great
// circle through the two ends' directions, between them and in order, and
// the shown curve lies on the chord, as a pinhole photo shows that circle.
TEST(LineConstraint, TraceFollowsTheGreatCircle) {
  ConstraintScene scene;
  const Point2f ends[][2] = {
      {{50, 60}, {560, 350}}, {{296, 20}, {310, 380}}, {{30, 380}, {580, 30}}};
  for (const auto& end : ends) {
    auto owned = std::make_unique<LineConstraint>(end[0], end[1]);
    LineConstraint& line = *owned;
    ASSERT_TRUE(scene.list.Add(std::move(owned)));
    scene.UpdateAll();
    const LineRecord& record = LineRecordOf(scene.solver(), line.GetId());
    ASSERT_EQ(record.id, line.GetId());
    ASSERT_GT(record.samples.size(), 10u);

    const Vec3 a = ConstraintScene::PinholeDirection(end[0]);
    const Vec3 b = ConstraintScene::PinholeDirection(end[1]);
    const Vec3 n = (1.0 / Length(Cross(a, b))) * Cross(a, b);
    const double arc = AngleBetween(a, b);
    float lastT = 0.0f;
    for (const LineSample& s : record.samples) {
      float corners[12];
      scene.solver().GetLines()->GetCellSpherePoints(s.cellI, s.cellJ, 0, corners);
      Vec3 d;
      for (int k = 0; k < 4; ++k) d = d + double(s.weights[k]) * Vec3::From(corners + 3 * k);
      d = (1.0 / Length(d)) * d;
      // Bilinear interpolation on cells of pi/64: the patch bends from the
      // sphere by (pi/64)^2 / 8 = 3e-4, and the ends' inverse map adds as much.
      EXPECT_NEAR(Dot(n, d), 0.0, 1e-3);
      EXPECT_NEAR(AngleBetween(a, d) + AngleBetween(d, b), arc, 1e-3);  // same bound
      EXPECT_GE(s.position, lastT);
      lastT = s.position;
    }
    EXPECT_EQ(lastT, 1.0f);

    // The same bound times the preview focal of 350 pixels, with margin.
    const float pixels = 0.5f;
    ASSERT_EQ(line.GetCurve().size(), record.samples.size());
    for (const Point2f& p : line.GetCurve()) EXPECT_LT(OffLine(p, end[0], end[1]), pixels);
    EXPECT_NEAR(line.GetCurve().front().x, end[0].x, pixels);
    EXPECT_NEAR(line.GetCurve().back().y, end[1].y, pixels);
  }
}

// Picking in the source view at places known from the chord: the end
// handles win over the line, the body within the tolerance, nothing beyond,
// and the focal handle at the middle only on a fisheye photo.
TEST(LineConstraint, PickLineAtKnownPlaces) {
  for (const std::int32_t model : {PSettings::kModelPerspective, PSettings::kModelFisheye}) {
    ConstraintScene scene(model);
    auto owned = std::make_unique<LineConstraint>(Point2f{100, 100}, Point2f{500, 300});
    LineConstraint& line = *owned;
    ASSERT_TRUE(scene.list.Add(std::move(owned)));
    scene.UpdateAll();
    const ConstraintEnv env = scene.list.Env();
    const float tolerance = 3.0f;
    // Unit normal of the chord (400, 200).
    const float nx = -200.0f / std::hypot(400.0f, 200.0f), ny = 400.0f / std::hypot(400.0f, 200.0f);
    EXPECT_EQ(line.PickLine(env, {101, 102}, false, tolerance), LineConstraint::kPickStart);
    EXPECT_EQ(line.PickLine(env, {498, 299}, false, tolerance), LineConstraint::kPickEnd);
    const bool fisheye = model == PSettings::kModelFisheye;
    const Point2f middle = line.GetPointAlong(env, 0.5f);
    EXPECT_EQ(line.PickLine(env, middle, false, tolerance),
              fisheye ? LineConstraint::kPickFocal : LineConstraint::kPickLine);
    if (!fisheye) {
      // The pinhole's curve is the chord: half its length is its middle.
      EXPECT_NEAR(middle.x, 300.0f, 0.5f);  // the trace's bound of the test above
      EXPECT_NEAR(middle.y, 200.0f, 0.5f);
      EXPECT_EQ(line.PickLine(env, {200 + 2 * nx, 150 + 2 * ny}, false, tolerance),
                LineConstraint::kPickLine);
      EXPECT_EQ(line.PickLine(env, {200 + 6 * nx, 150 + 6 * ny}, false, tolerance),
                LineConstraint::kPickNone);
    }
    EXPECT_TRUE(line.HitTest(env, {101, 102}, false, tolerance));
    EXPECT_FALSE(line.HitTest(env, {300, 100}, false, tolerance));
  }
}

// A line whose trace failed is picked by its straight ends:
// the shown ones in the warped view, the photo's otherwise.
TEST(LineConstraint, FailedTraceFallsBackToTheEnds) {
  ConstraintScene scene;
  auto owned = std::make_unique<LineConstraint>(Point2f{310, 210}, Point2f{310, 250});
  LineConstraint& line = *owned;
  scene.list.Add(std::move(owned));
  scene.UpdateAll();
  FindLineRecord(scene.solver(), line.GetId())->active = false;
  line.SetDisplayStart({100, 100});
  line.SetDisplayEnd({200, 100});
  const ConstraintEnv env = scene.list.Env();
  EXPECT_FALSE(line.IsValid(scene.solver()));
  EXPECT_EQ(line.PickLine(env, {150, 102}, true, 3.0f), LineConstraint::kPickLine);
  EXPECT_EQ(line.PickLine(env, {150, 102}, false, 3.0f), LineConstraint::kPickNone);
  EXPECT_EQ(line.PickLine(env, {311, 230}, false, 3.0f), LineConstraint::kPickLine);
  EXPECT_EQ(line.GetPointAlong(env, 0.5f), (Point2f{310, 230}));
  scene.context.settings.previewResult = 1;
  EXPECT_EQ(line.GetPointAlong(env, 0.5f), (Point2f{150, 100}));
}

// The orientation table by hand: reported angles with y growing downwards,
// the normals each kind pins on the traced record, and a clone keeping the
// angle an Unfixed line reports.
TEST(LineConstraint, OrientationNormalsAndAngles) {
  float angle = 0.0f;
  LineConstraint down({10, 10}, {10, 50});
  down.GetOrientation(&angle);
  EXPECT_EQ(angle, 90.0f);
  LineConstraint up({10, 50}, {10, 10});
  up.GetOrientation(&angle);
  EXPECT_EQ(angle, -90.0f);
  LineConstraint rising({0, 0}, {100, -1});
  rising.GetOrientation(&angle);
  // atan(-0.01) = -0.0099996667 rad, over 3.1416 times 180; float rounding.
  EXPECT_NEAR(angle, -0.572937f, 1e-5f);

  ConstraintScene scene;
  auto owned = std::make_unique<LineConstraint>(Point2f{100, 100}, Point2f{500, 300});
  LineConstraint& line = *owned;
  scene.list.Add(std::move(owned));
  const LineRecord& record = LineRecordOf(scene.solver(), line.GetId());
  EXPECT_FALSE(record.hasFixedNormal);
  struct Case {
    std::int32_t orientation;
    float angle, reported, nx, ny;
  };
  // Kind 4: a = (angle + 180) / 180 * 3.1416, normal (sin a, cos a).
  const Case cases[] = {{2, 0, 0, 0, 1},
                        {3, 0, 90, 1, 0},
                        {4, 0, 0, -7.3464e-6f, -1},
                        {4, 90, 90, -1, 1.10196e-5f},
                        {4, -30, -30, 0.499995f, -0.866028f}};
  for (const Case& c : cases) {
    line.SetOrientation(scene.solver(), c.orientation, c.angle);
    EXPECT_EQ(line.GetOrientation(&angle), c.orientation);
    EXPECT_EQ(angle, c.reported);
    EXPECT_TRUE(record.hasFixedNormal);
    // The hand values carry six digits.
    EXPECT_NEAR(record.fixedNormal[0], c.nx, 2e-6f) << c.orientation << " " << c.angle;
    EXPECT_NEAR(record.fixedNormal[1], c.ny, 2e-6f) << c.orientation << " " << c.angle;
  }
  line.SetOrientation(scene.solver(), 1, 0);
  EXPECT_FALSE(record.hasFixedNormal);
  // A retrace keeps the pinned normal of the kind.
  line.SetOrientation(scene.solver(), 3, 0);
  RetraceConstraint(scene.solver(), line, 2);
  EXPECT_EQ(LineRecordOf(scene.solver(), line.GetId()).fixedNormal, (std::array<float, 2>{1, 0}));

  const auto clone = rising.CloneLine();
  EXPECT_EQ(clone->GetOrientation(&angle), LineConstraint::kUnfixed);
  EXPECT_NEAR(angle, -0.572937f, 1e-5f);  // as above
  EXPECT_TRUE(clone->GetCurve().empty());
}

// The rotation cursor's sectors, by hand from the table.
TEST(LineConstraint, RotationCursorSectors) {
  struct Case {
    float angle, dx, dy;
    std::int32_t cursor;
  };
  const Case cases[] = {{0, 1, 0, 26059},     {0, -1, 0, 26057},    {180, 1, 0, 26059},
                        {-170, -1, 0, 26057}, {22.5f, 1, 0, 26063}, {-135, -1, 0, 26060},
                        {90, 0, 1, 26058},    {-90, 0, -1, 26056},  {135, -1, 0, 26062},
                        {-45, 1, 0, 26061},   {-22.5f, 1, 0, 26059}};
  for (const Case& c : cases) {
    EXPECT_EQ(LineConstraint::RotationCursor(c.angle, c.dx, c.dy), c.cursor) << c.angle;
  }
}

}  // namespace
}  // namespace Project
