#include "solver/frame/Solver.h"

#include <gtest/gtest.h>

#include <cmath>
#include <random>

#include "tests/support/SolverTestContext.h"

namespace Project {
namespace {

using TestContext = testing::SolverTestContext;

// A solved perspective photo: the mesh, its boxes and every conversion,
// each checked against its inverse or the mesh itself.
TEST(Solver, MeshBoxesAndConversions) {
  TestContext context(1200, 800, PSettings::kModelPerspective, 700.0f);
  context.settings.regularizerModel = PSettings::kRegularizerStereographic;
  Solver solver(context);
  solver.RebuildGrid(false);
  solver.Solve(true, false);
  EXPECT_TRUE(solver.Solved());
  EXPECT_EQ(context.rebuilds, 1);
  EXPECT_EQ(context.failures, 0);
  EXPECT_FALSE(solver.IsWide());  // about 81 by 60 degrees

  // The box holds every visible cell's corners and touches them.
  const int n = solver.GridSize();
  const ViewBox& full = solver.FullBox();
  float minX = 1e9f, maxX = -1e9f;
  for (int j = 0; j + 1 < n; ++j) {
    for (int i = 0; i + 1 < n; ++i) {
      EXPECT_EQ(solver.IsCellInMask(i, j), solver.GetWarp()->IsQuadInside(i, j));
      if (!solver.IsCellVisible(i, j)) continue;
      for (int c = 0; c < 4; ++c) {
        const float x = solver.Positions()[((j + c / 2) * n + i + c % 2) * 2];
        minX = std::min(minX, x);
        maxX = std::max(maxX, x);
      }
    }
  }
  EXPECT_EQ(full.left, minX);
  EXPECT_EQ(full.right, maxX);
  EXPECT_GT(full.texWidth, 0.9f);  // the mesh spans the picture
  EXPECT_LE(full.texWidth, 1.0f);

  std::mt19937 random(7);
  std::uniform_real_distribution<float> x(0.0f, 600.0f), y(0.0f, 400.0f);
  for (int k = 0; k < 50; ++k) {
    const float p[2] = {x(random), y(random)};
    for (int mode : {0, 1}) {
      float plane[2], back[2];
      solver.ViewToPlane(p, plane, mode);
      solver.PlaneToView(plane, back, mode);
      // A scale and a shift in single precision, each way.
      EXPECT_NEAR(back[0], p[0], 1e-3f);
      EXPECT_NEAR(back[1], p[1], 1e-3f);
      solver.PreviewToResult(p, plane, mode);
      solver.PreviewToResult(plane, back, 1 - mode);
      EXPECT_NEAR(back[0], p[0], 1e-3f);
      EXPECT_NEAR(back[1], p[1], 1e-3f);
    }
  }
  // Photograph to result and back, through the mesh both ways: the same
  // weights on the same cell, so only rounding separates them.
  std::uniform_real_distribution<float> sx(30.0f, 570.0f), sy(30.0f, 370.0f);
  for (int k = 0; k < 50; ++k) {
    const float p[2] = {sx(random), sy(random)};
    float view[2];
    ASSERT_TRUE(solver.SourceToPreview(p, view));
    ASSERT_TRUE(solver.PreviewToSource(view));
    // Inverting the bilinear weights in float, about 1e-5 of the preview.
    EXPECT_NEAR(view[0], p[0], 0.02f);
    EXPECT_NEAR(view[1], p[1], 0.02f);
  }
  // The centre of the photograph lands in the middle of the result.
  float view[2];
  const float centre[2] = {300.0f, 200.0f};
  ASSERT_TRUE(solver.SourceToPreview(centre, view));
  float plane[2];
  solver.ViewToPlane(view, plane, 1);
  EXPECT_NEAR(plane[0], 0.0f, 1e-3f);  // the axis maps to the origin, up to mesh interpolation
  EXPECT_NEAR(plane[1], 0.0f, 1e-3f);

  // A view centre far off is pulled back into its limits.
  context.settings.imageCenterX = 5.0f;
  solver.ApplyView(true);
  EXPECT_EQ(context.settings.imageCenterX, solver.CenterLimits()[2]);
}

// The fall back of a wide picture to the stereographic model: a stored
// model is rewritten, one the user picked is kept, Auto stays Auto.
TEST(Solver, WidePictureFallsBackToStereographic) {
  struct Case {
    std::int32_t stored;
    bool userChanged;
    std::int32_t storedAfter, warpModel;
  };
  const Case cases[] = {{PSettings::kRegularizerMercator, false, 1, 1},
                        {PSettings::kRegularizerMercator, true, 2, 2},
                        {PSettings::kRegularizerAuto, false, 4, 1},
                        {PSettings::kRegularizerAuto, true, 4, 1}};
  for (const Case& c : cases) {
    // A fisheye of 1200 pixels at focal 380: about 180 degrees across.
    TestContext context(1200, 800, PSettings::kModelFisheye, 380.0f);
    context.settings.regularizerModel = c.stored;
    Solver solver(context);
    solver.RebuildGrid(c.userChanged);
    EXPECT_TRUE(solver.IsWide());
    EXPECT_EQ(context.settings.regularizerModel, c.storedAfter) << c.stored << c.userChanged;
    EXPECT_EQ(solver.WarpModel(), c.warpModel) << c.stored << c.userChanged;
  }
  // Narrow, Auto: Panini.
  TestContext narrow(1200, 800, PSettings::kModelPerspective, 1400.0f);
  Solver solver(narrow);
  solver.RebuildGrid(false);
  EXPECT_FALSE(solver.IsWide());
  EXPECT_EQ(solver.WarpModel(), PSettings::kRegularizerPanini);
}

// A full spherical picture: Mercator under Auto, never wide, and limited to
// 74 degrees of latitude and 176 of longitude.
TEST(Solver, FullSphericalIsLimited) {
  TestContext context(2000, 1000, PSettings::kModelFullSpherical, 600.0f);
  Solver solver(context);
  solver.RebuildGrid(false);
  EXPECT_EQ(solver.WarpModel(), PSettings::kRegularizerMercator);
  EXPECT_FALSE(solver.IsWide());
  EXPECT_TRUE(solver.IsLimited());
  float latMin, latMax, lonMin, lonMax;
  solver.GetLimits(latMin, latMax, lonMin, lonMax);
  EXPECT_FLOAT_EQ(latMax, 74.0f * 3.14159265f / 180.0f);
  EXPECT_FLOAT_EQ(lonMin, -176.0f * 3.14159265f / 180.0f);
}

}  // namespace
}  // namespace Project
