#include "workspace/MeshPainter.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <cmath>
#include <vector>

#include "tests/solver/constraints/ConstraintScene.h"
#include "tests/workspace/DrawnImage.h"

namespace Project {
namespace {

using testing::DrawnImage;

struct Segment {
  Point2f a, b;
};

float Distance(Point2f p, const Segment& s) {
  const float dx = s.b.x - s.a.x, dy = s.b.y - s.a.y;
  const float length2 = dx * dx + dy * dy;
  float t = length2 > 0 ? ((p.x - s.a.x) * dx + (p.y - s.a.y) * dy) / length2 : 0.0f;
  t = std::clamp(t, 0.0f, 1.0f);
  return std::hypot(s.a.x + t * dx - p.x, s.a.y + t * dy - p.y);
}

// A coarse mesh (level 2: 8 x 8 cells) on the pinhole photo of the
// constraint scenes, drawn at half size, moved by (10, 6), over the source.
// Each cell in the solver's mask is the closed outline of its corners,
// whose texture fractions (u, v) stand at (600 u, 400 (1 - v)) of the
// preview: the edges' middles show the mesh colour, made opaque, and
// nothing is drawn away from the outlines.
TEST(MeshPainter, CellOutlinesStandAtTheirVertices) {
  SceneContext context(PSettings::kModelPerspective, ConstraintScene::kFocal);
  context.settings.meshResolution = 2;
  ConstraintList list(context);
  Solver& solver = list.GetSolver();
  solver.RebuildGrid(false);
  solver.Solve(true, false);
  ASSERT_EQ(solver.GridSize(), 9);

  const ScreenTransform screen{0.5f, 10.0f, 6.0f, 0.0f, 0.0f};
  const auto window = [&](std::int32_t i, std::int32_t j) {
    const float* t = &solver.TexCoords()[(std::size_t(j) * 9 + std::size_t(i)) * 2];
    return Point2f{10.0f + 600.0f * t[0] * 0.5f, 6.0f + 400.0f * (1.0f - t[1]) * 0.5f};
  };
  std::vector<Segment> edges;
  for (std::int32_t j = 0; j < 8; ++j) {
    for (std::int32_t i = 0; i < 8; ++i) {
      if (!solver.IsCellInMask(i, j)) continue;
      const Point2f c[4] = {window(i, j), window(i, j + 1), window(i + 1, j + 1), window(i + 1, j)};
      for (int k = 0; k < 4; ++k) edges.push_back({c[k], c[(k + 1) % 4]});
    }
  }
  ASSERT_FALSE(edges.empty());

  DrawnImage image(320, 220);
  const std::uint32_t colour = 0x804AFF4A;
  DrawMesh(list.Env(), image.Port(), screen, colour);
  image.Read();

  int shown = 0;
  for (const Segment& e : edges) {
    const Point2f mid{(e.a.x + e.b.x) / 2, (e.a.y + e.b.y) / 2};
    if (mid.x < 2 || mid.y < 2 || mid.x > 318 || mid.y > 218) continue;
    SCOPED_TRACE(::testing::Message() << mid.x << "," << mid.y);
    testing::ExpectColour(image.Strongest(mid.x, mid.y, 1), colour);
    ++shown;
  }
  EXPECT_GT(shown, 8);
  std::uint8_t strongest = 0;
  for (int y = 0; y < image.Height(); ++y) {
    for (int x = 0; x < image.Width(); ++x) {
      const DrawnImage::Pixel p = image.At(x, y);
      strongest = std::max(strongest, p.a);
      if (p.a == 0) continue;
      // A pixel a 1-pixel pen touches has its centre within 0.5 + 0.71 of
      // the path.
      const Point2f centre{x + 0.5f, y + 0.5f};
      float nearest = 1e9f;
      for (const Segment& e : edges) nearest = std::min(nearest, Distance(centre, e));
      EXPECT_LT(nearest, 1.25f) << x << "," << y;
    }
  }
  EXPECT_EQ(strongest, 255);
}

}  // namespace
}  // namespace Project
