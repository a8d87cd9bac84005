#pragma once

#include <gtest/gtest.h>

#include <cmath>
#include <initializer_list>
#include <memory>

#include "solver/constraints/ConstraintList.h"
#include "solver/constraints/PlaneConstraint.h"
#include "solver/frame/Solver.h"
#include "solver/frame/SolverContext.h"
#include "solver/geodesic/Vec3.h"
#include "tests/support/SolverTestContext.h"

namespace Project {

// The filter's side: a photo of 1200 x 800 shown in a preview of 600 x 400,
// with the source shown so that curves come in photo pixels.
class SceneContext : public testing::SolverTestContext {
 public:
  SceneContext(std::int32_t model, float focal) : SolverTestContext(kWidth, kHeight, model, focal) {
    settings.regularizerModel = PSettings::kRegularizerStereographic;
    settings.previewResult = 0;
  }

  static constexpr std::int32_t kWidth = 1200;
  static constexpr std::int32_t kHeight = 800;
};

// A constraint list on a solved perspective photo (focal 700 pixels, about
// 81 by 60 degrees). A pinhole picture shows every great circle as a
// straight line, so a traced line must lie on the chord between its ends.
// Test points keep off x = 300 and y = 200: those are grid lines, and the
// cell finder may answer either neighbour for a point on one.
struct ConstraintScene {
  explicit ConstraintScene(std::int32_t model = PSettings::kModelPerspective)
      : context(model, kFocal), list(context) {
    list.GetSolver().RebuildGrid(false);
    list.GetSolver().Solve(true, false);
  }
  Solver& solver() { return list.GetSolver(); }
  void UpdateAll() { list.UpdateDisplays(list.GetSolver(), -1); }

  // A rectangle in the middle of the photo, (200, 120) to (400, 280), its
  // top edge Horizontal, added and shown.
  PlaneConstraint& AddRectangle() {
    auto owned = std::make_unique<PlaneConstraint>();
    owned->AddCorner({200, 120}, 2);
    owned->AddCorner({400, 120}, 1);
    owned->AddCorner({400, 280}, 1);
    owned->AddCorner({200, 280}, 1);
    PlaneConstraint& plane = *owned;
    EXPECT_TRUE(list.Add(std::move(owned)));
    UpdateAll();
    return plane;
  }
  // Corners of the polygon a tool is drawing, in the preview, traced as the
  // solver's draft.
  void AddDraftPoints(std::initializer_list<Point2f> points) {
    for (const Point2f p : points) {
      const float view[2] = {p.x, p.y};
      float fraction[2];
      solver().ViewToPlane(view, fraction, 0);
      solver().GetLines()->AddDraftPoint(fraction, false, 0);
    }
  }

  // The sphere direction of a preview point of the pinhole photo, from its
  // own formula: x = f tan(lon), y = f tan(lat) / cos(lon) about the centre.
  static Vec3 PinholeDirection(Point2f preview) {
    const double x = (preview.x / 600.0 - 0.5) * SceneContext::kWidth;
    const double y = (0.5 - preview.y / 400.0) * SceneContext::kHeight;
    const Vec3 d{kFocal, x, y};
    return (1.0 / Length(d)) * d;
  }

  static constexpr float kFocal = 700.0f;
  SceneContext context;
  ConstraintList list;
};

}  // namespace Project
