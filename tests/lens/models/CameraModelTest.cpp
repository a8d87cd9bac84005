#include <gtest/gtest.h>

#include <algorithm>
#include <cmath>
#include <random>

#include "lens/camera/PFisheyeCameraModel.h"
#include "lens/camera/PGenericCameraModel.h"
#include "lens/camera/PRadialDistortCameraModel.h"
#include "lens/camera/PTangentialDistortCameraModel.h"

namespace Project {
namespace {

constexpr int kWidth = 4000;
constexpr int kHeight = 3000;
// Outputs are floats near 4000 px (ulp 2.4e-4 to 4.9e-4) worked from float
// fields that carry their own rounding; the worst seen is 1.8e-4.
constexpr double kPixelTolerance = 1e-3;

// A lens in profile units, floats so that model and test start alike.
struct Lens {
  float cx, cy, fx, fy, scale, corner, k1, k2, k3, t1, t2;
};

Lens RandomLens(std::mt19937& rng) {
  auto uniform = [&](float a, float b) { return std::uniform_real_distribution<float>(a, b)(rng); };
  return {uniform(0.4f, 0.6f),    uniform(0.4f, 0.6f),    uniform(0.3f, 0.8f),
          uniform(0.3f, 0.8f),    uniform(0.9f, 1.1f),    uniform(-0.05f, 0.05f),
          uniform(-0.1f, 0.1f),   uniform(-0.05f, 0.05f), uniform(-0.02f, 0.02f),
          uniform(-0.01f, 0.01f), uniform(-0.01f, 0.01f)};
}

// Gives the model whichever of the lens's terms its class has.
void SetLens(PGenericCameraModel& m, const Lens& l) {
  m.centerX = l.cx;
  m.centerY = l.cy;
  m.focalX = l.fx;
  m.focalY = l.fy;
  m.residualMeanError = 0.25f;
  m.SetCorrection(l.scale, l.corner);
  if (auto* radial = dynamic_cast<PRadialDistortCameraModel*>(&m)) {
    radial->radial1 = l.k1;
    radial->radial2 = l.k2;
    radial->radial3 = l.k3;
  }
  if (auto* tangential = dynamic_cast<PTangentialDistortCameraModel*>(&m)) {
    tangential->tangential1 = l.t1;
    tangential->tangential2 = l.t2;
  }
  if (auto* fisheye = dynamic_cast<PFisheyeCameraModel*>(&m)) {
    fisheye->radial1 = l.k1;
    fisheye->radial2 = l.k2;
  }
}

// The ideal-to-distorted map of a kWidth x kHeight image, in double, written
// from the lens's meaning: the corner term reaches its value at the farthest
// corner, Brown-Conrady on normalised coordinates, and for the fisheye an
// equidistant angle stretched by (scale - 1) + corner at that corner. plain
// drops the corner term and applies scale as a gain.
void Expected(int type, const Lens& l, bool plain, double x, double y, double& ox, double& oy) {
  const double cx = double(l.cx) * kWidth, cy = double(l.cy) * kHeight;
  const double fx = double(l.fx) * kWidth, fy = double(l.fy) * kWidth;  // the longer side
  const double cornerX = std::max(double(l.cx), 1.0 - l.cx) * kWidth;
  const double cornerY = std::max(double(l.cy), 1.0 - l.cy) * kHeight;
  const double u = (x - cx) / fx, v = (y - cy) / fy, r2 = u * u + v * v;
  const double cornerR2 = std::pow(cornerX / fx, 2) + std::pow(cornerY / fy, 2);
  double gain = plain ? l.scale : 1.0;
  double factor = plain ? 1.0 : l.scale + l.corner * r2 / cornerR2;
  double tx = 0, ty = 0;  // decentring, in normalised units
  if (type == PGenericCameraModel::kTypeRadial || type == PGenericCameraModel::kTypeTangential) {
    factor += l.k1 * r2 + l.k2 * r2 * r2 + l.k3 * r2 * r2 * r2;
  }
  if (type == PGenericCameraModel::kTypeTangential) {
    tx = 2 * l.t1 * u * v + l.t2 * (r2 + 2 * u * u);
    ty = l.t1 * (r2 + 2 * v * v) + 2 * l.t2 * u * v;
  }
  if (type == PGenericCameraModel::kTypeFisheye && !plain) {
    const double focal = std::sqrt(fx * fy);
    const double tMax = std::atan(std::hypot(cornerX, cornerY) / focal);
    const double rho = std::hypot(x - cx, y - cy);
    const double t = std::atan(rho / focal);
    const double angle = t + (l.scale - 1.0) * t / tMax + l.corner * std::pow(t / tMax, 3) +
                         l.k1 * std::pow(t, 3) + l.k2 * std::pow(t, 5);
    ox = cx + fx * angle * (x - cx) / rho;
    oy = cy + fy * angle * (y - cy) / rho;
    return;
  }
  ox = cx + gain * fx * (u * factor + tx);
  oy = cy + gain * fy * (v * factor + ty);
}

template <typename Model>
class CameraModelTest : public ::testing::Test {};

using Models = ::testing::Types<PGenericCameraModel, PRadialDistortCameraModel,
                                PTangentialDistortCameraModel, PFisheyeCameraModel>;
TYPED_TEST_SUITE(CameraModelTest, Models);

TYPED_TEST(CameraModelTest, Validity) {
  TypeParam m;
  EXPECT_EQ(m.residualStdDev, -1.0f);
  EXPECT_TRUE(m.IsValid() && m.HasFocalLength() && m.IsNeutral());
  m.SetScale(1.001f);
  EXPECT_FALSE(m.IsNeutral());
  m.focalX = 0.0f;
  EXPECT_TRUE(m.IsValid());
  EXPECT_FALSE(m.HasFocalLength());
  m.centerY = 1.0f;
  EXPECT_TRUE(m.IsValid());
  m.centerY = std::nextafter(1.0f, 2.0f);
  EXPECT_FALSE(m.IsValid());
  m.centerY = std::nanf("");
  EXPECT_FALSE(m.IsValid());
}

TYPED_TEST(CameraModelTest, PrepareAndMapsMatchTheLensFormulas) {
  std::mt19937 rng(7);
  std::uniform_real_distribution<float> px(0.0f, kWidth), py(0.0f, kHeight);
  for (int lensIndex = 0; lensIndex < 5; ++lensIndex) {
    const Lens lens = RandomLens(rng);
    TypeParam m;
    SetLens(m, lens);
    EXPECT_FALSE(m.IsNeutral());
    m.Prepare(kWidth, kHeight, 0.0f, false);
    for (int i = 0; i < 20; ++i) {
      const float x = px(rng), y = py(rng);
      for (bool plain : {false, true}) {
        float ox = 0, oy = 0;
        double ex = 0, ey = 0;
        plain ? m.MapPointPlain(x, y, ox, oy) : m.MapPoint(x, y, ox, oy);
        Expected(m.GetType(), lens, plain, x, y, ex, ey);
        EXPECT_NEAR(ox, ex, kPixelTolerance) << "plain " << plain;
        EXPECT_NEAR(oy, ey, kPixelTolerance) << "plain " << plain;
      }
    }
  }
}

TYPED_TEST(CameraModelTest, FocalOverrideRules) {
  auto expect = [](float fx, float fy, float override, bool keep, float wantX, float wantY) {
    TypeParam m;
    m.focalX = fx;
    m.focalY = fy;
    m.Prepare(kWidth, kHeight, override, keep);
    EXPECT_NEAR(m.focalX, wantX, 1e-3);  // floats near 3000 px: a few ulps
    EXPECT_NEAR(m.focalY, wantY, 1e-3);
  };
  expect(0.5f, 0.6f, 0.0f, false, 2000.0f, 2400.0f);   // the longer side, both axes
  expect(0.5f, 0.6f, 0.75f, false, 3000.0f, 3600.0f);  // the aspect stays
  expect(0.5f, 0.6f, 0.75f, true, 2000.0f, 2400.0f);
  expect(0.0f, 0.6f, 0.75f, true, 3000.0f, 3000.0f);  // no focal: the override wins
}

TYPED_TEST(CameraModelTest, CloneAndTranspose) {
  std::mt19937 rng(11);
  TypeParam m;
  SetLens(m, RandomLens(rng));
  auto prepared = m.Clone();
  prepared->Prepare(kWidth, kHeight, 0.0f, false);
  const auto copy = prepared->Clone();  // stays prepared
  auto twice = m.Clone();
  twice->Transpose();
  twice->Transpose();
  twice->Prepare(kWidth, kHeight, 0.0f, false);
  // A picture turned by 90 degrees: the transposed model on the turned image
  // maps the turned point to the turned result.
  auto turned = m.Clone();
  turned->Transpose();
  turned->Prepare(kHeight, kWidth, 0.0f, false);
  EXPECT_EQ(copy->GetType(), m.GetType());
  EXPECT_TRUE(copy->IsSameCalibration(*prepared) && twice->IsSameCalibration(*prepared));
  std::uniform_real_distribution<float> px(0.0f, kWidth), py(0.0f, kHeight);
  for (int i = 0; i < 10; ++i) {
    const float x = px(rng), y = py(rng);
    float ox = 0, oy = 0, cx = 0, cy = 0, wx = 0, wy = 0, tx = 0, ty = 0;
    prepared->MapPoint(x, y, ox, oy);
    copy->MapPoint(x, y, cx, cy);
    twice->MapPoint(x, y, wx, wy);
    turned->MapPoint(y, x, ty, tx);
    EXPECT_TRUE(cx == ox && cy == oy && wx == ox && wy == oy);
    EXPECT_NEAR(tx, ox, kPixelTolerance);
    EXPECT_NEAR(ty, oy, kPixelTolerance);
  }
}

TEST(CameraModelCases, FisheyeCentreComesBackUnchanged) {
  PFisheyeCameraModel m;
  m.radial1 = 0.1f;
  m.Prepare(kWidth, kHeight, 0.0f, false);
  float ox = -1, oy = -1;
  m.MapPoint(m.centerX, m.centerY, ox, oy);
  EXPECT_EQ(ox, m.centerX);
  EXPECT_EQ(oy, m.centerY);
}

TEST(CameraModelCases, Comparisons) {
  PRadialDistortCameraModel a, b;
  a.radial3 = 0.01f;
  EXPECT_TRUE(a.IsSameCalibration(b));
  EXPECT_FALSE(a.IsSameModel(b));
  b.radial3 = 0.01f;
  EXPECT_TRUE(a.IsSameModel(b));

  PTangentialDistortCameraModel t, u;
  EXPECT_FALSE(a.IsSameCalibration(t));
  EXPECT_FALSE(t.IsSameCalibration(a));
  u.tangential2 = 0.01f;
  // Through the generic slot only the calibration counts; the tangential
  // overload compares the terms.
  EXPECT_TRUE(t.IsSameModel(static_cast<const PGenericCameraModel&>(u)));
  EXPECT_FALSE(t.IsSameModel(u));

  PFisheyeCameraModel f, g;
  g.radial2 = 0.01f;
  EXPECT_TRUE(f.IsSameCalibration(g));
  EXPECT_FALSE(f.IsSameModel(g));
  EXPECT_FALSE(f.IsSameModel(a));
}

}  // namespace
}  // namespace Project
