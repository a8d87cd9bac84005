#include "solver/warp/ClosedFormWarp.h"

#include <gtest/gtest.h>

#include <cmath>
#include <memory>

#include "lens/sphere/PerspectiveImage.h"
#include "solver/warp/EquirectangularClosedForm.h"
#include "solver/warp/MercatorClosedForm.h"
#include "solver/warp/PaniniProjection.h"
#include "solver/warp/StereographicClosedForm.h"

namespace Project {
namespace {

struct Fixture {
  std::shared_ptr<OctaMap> map = std::make_shared<OctaMap>(4, false);
  std::shared_ptr<const PhotoToSphere> model = std::make_shared<PerspectiveImage>(
      std::make_shared<Image>(1000, 800), 500.0f, 500.0f, 400.0f);
};

// Each projection written from the direction vector rather than from its
// angles, in double: u, v of the unit vector (x, y, z), r = |(x, y)|.
// gain is how much the form magnifies a rounding of the longitude.
void Reference(std::int32_t model, const float p[3], double& u, double& v, double& gain) {
  const double x = p[0], y = p[1], z = p[2], r = std::hypot(x, y);
  gain = 1;
  switch (model) {
    case 1:  // stereographic from the antipode of +x
      u = 2 * y / (1 + x);
      v = 2 * z / (1 + x);
      break;
    case 2:  // Mercator
      u = std::atan2(y, x);
      v = std::atanh(z);
      break;
    case 3: {  // Panini with the offset constants, which are floats
      const double d = double{2.001f} / (x / r + double{1.001f});
      u = y / r * d;
      v = z / r * d;
      gain = d;
      break;
    }
    default:  // equirectangular
      u = std::atan2(y, x);
      v = std::asin(z);
  }
}

// Every class against its reference at every vertex of its domain, before
// and after a rotation of the grid; the domain rules; and the factory.
TEST(ClosedFormWarp, ProjectionsMatchVectorFormulas) {
  Fixture f;
  const int n = f.map->Width(), c = n / 2;
  const float turn[9] = {0.8f, -0.6f, 0, 0.6f, 0.8f, 0, 0, 0, 1};
  for (bool rotated : {false, true}) {
    if (rotated) f.map->SetRotation(turn);
    for (std::int32_t model : {1, 2, 3, 1000}) {
      const auto warp = MakeClosedFormWarp(model, f.map, f.model);
      for (int j = 0; j < n; ++j) {
        for (int i = 0; i < n; ++i) {
          float p[3];
          f.map->GetRotatedPoint(i, j, p);
          const bool inDomain = model == 1   ? std::abs(i - c) + std::abs(j - c) <= c
                                : model == 2 ? (j >= 1 && j < n - 1)
                                             : true;
          ASSERT_EQ(warp->IsInDomain(i, j), inDomain) << model << " " << i << "," << j;
          // Skip where the angles themselves are ill-defined: the poles'
          // longitude, and the antipode's neighbourhood for the
          // longitude-based forms.
          if (!inDomain || std::hypot(p[0], p[1]) < 1e-3 || (model != 1 && p[0] < -0.999f)) {
            continue;
          }
          float u, v;
          warp->GetVertexPosition(i, j, u, v);
          double ru, rv, gain;
          Reference(model, p, ru, rv, gain);
          // Single-precision angles feed the formulas, about 1e-7 rad each;
          // Panini's scale d magnifies that towards the back and its
          // tangent towards the poles, hence the gain and a relative bound.
          EXPECT_NEAR(u, ru, 2e-5 * (1 + std::fabs(ru)) + 2e-7 * gain)
              << model << " " << i << "," << j;
          EXPECT_NEAR(v, rv, 2e-5 * (1 + std::fabs(rv)) * (1 + std::fabs(rv)))
              << model << " " << i << "," << j;
        }
      }
    }
  }
}

// The landmarks: the axis maps to the origin in every form, -y sits on the
// stereographic diamond's border at (-2, 0), the corners (-x) give Panini's
// largest scale, and out-of-domain vertices answer (0, 0).
TEST(ClosedFormWarp, Landmarks) {
  Fixture f;
  const int n = f.map->Width(), c = n / 2;
  for (std::int32_t model : {1, 2, 3, 1000}) {
    float u, v;
    MakeClosedFormWarp(model, f.map, f.model)->GetVertexPosition(c, c, u, v);
    EXPECT_NEAR(u, 0.0f, 1e-7);  // exact axis, up to tan(pi/4) rounding
    EXPECT_NEAR(v, 0.0f, 1e-7);
  }
  float u, v;
  StereographicClosedForm(f.map, f.model).GetVertexPosition(0, c, u, v);
  EXPECT_NEAR(u, -2.0f, 1e-6);  // k = 2 on the equator's edge, float rounding
  EXPECT_NEAR(v, 0.0f, 1e-6);
  StereographicClosedForm(f.map, f.model).GetVertexPosition(0, 0, u, v);
  EXPECT_EQ(u, 0.0f);
  EXPECT_EQ(v, 0.0f);
  MercatorClosedForm(f.map, f.model).GetVertexPosition(c, 0, u, v);
  EXPECT_EQ(v, 0.0f);  // the pole row is outside Mercator's domain
  // sin(pi) in float is about -8.7e-8, times d = 2001.
  PaniniProjection(f.map, f.model).GetVertexPosition(0, 0, u, v);
  EXPECT_NEAR(std::fabs(u), 2001.0 * 8.742278e-8, 1e-5);
  EXPECT_EQ(v, 0.0f);

  // The inside test reads the picture on the unrotated grid: a turn of the
  // sphere moves positions, never the mesh's outline.
  StereographicClosedForm warp(f.map, f.model);
  bool before[4];
  const int probes[4][2] = {{c, c}, {c + n / 4, c}, {0, c}, {c, 1}};
  for (int k = 0; k < 4; ++k) before[k] = warp.IsVertexInside(probes[k][0], probes[k][1]);
  const float turn[9] = {0, -1, 0, 1, 0, 0, 0, 0, 1};
  f.map->SetRotation(turn);
  for (int k = 0; k < 4; ++k) {
    EXPECT_EQ(warp.IsVertexInside(probes[k][0], probes[k][1]), before[k]);
  }
  EXPECT_TRUE(before[0]);
  EXPECT_FALSE(before[2]);  // -y is 90 degrees off a perspective axis
}

}  // namespace
}  // namespace Project
