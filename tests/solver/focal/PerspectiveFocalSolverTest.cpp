#include "solver/focal/PerspectiveFocalSolver.h"

#include <gtest/gtest.h>

#include "tests/solver/focal/FocalContext.h"

namespace Project {
namespace {

// Hand-computed drags. A grid too coarse for the cell finder sends every
// corner down the off-mesh road of SourceToPreview: the zoom's affine map.
// At 200 % about the middle of the 600 x 400 preview that is
// (2x - 300, 2y - 200), so corner 1, at (600, 0), is shown at (900, -200)
// and corner 0 at (-300, -200).
TEST(PerspectiveFocalSolver, DragLengthTurnsIntoFocalLength) {
  FocalContext context;
  context.settings.meshResolution = 2;
  context.settings.imageScale = 200;
  context.settings.imageCenterX = 0.5f;
  context.settings.imageCenterY = 0.5f;
  context.settings.focalLength = 700.0f;
  Solver shown(context);
  shown.Initialize();
  PerspectiveFocalSolver solver(context);

  struct Case {
    std::int32_t corner, x, y;
    double focal;
  };
  const Case cases[] = {
      // Corner 1 brought to (930, -160): a drag of (-30, -40), 50 long, and
      // both the corner and the drag lie left of the target: 700 - 250.
      {1, 930, -160, 450.0},
      // To (800, -200): a drag of (100, 0), but the corner's source x lies
      // left of the target and the drag points right: 700 + 500.
      {1, 800, -200, 1200.0},
      // Corner 0 to (-280, -185): a drag of (-20, -15), 25 long; the source
      // corner lies right of the target, the drag points left: 700 + 125.
      {0, -280, -185, 825.0},
      // No movement at all leaves the focal length.
      {0, -300, -200, 700.0},
  };
  for (const Case& c : cases) {
    solver.SetTarget(c.x, c.y);
    // Every length is a whole number: exact in single precision.
    EXPECT_EQ(solver.GetFocal(c.corner, shown), c.focal) << c.corner << " " << c.x;
  }
  EXPECT_EQ(solver.GetFocal(PerspectiveFocalSolver::kNoCorner, shown), 0.0);
}

}  // namespace
}  // namespace Project
