#include <gtest/gtest.h>

#include <cmath>
#include <functional>
#include <memory>
#include <numbers>
#include <random>
#include <string>
#include <vector>

#include "lens/camera/PFisheyeCameraModel.h"
#include "lens/camera/PGenericCameraModel.h"
#include "lens/camera/PTangentialDistortCameraModel.h"
#include "lens/sphere/ChoosePhotoToSphere.h"
#include "lens/sphere/CylindricalImage.h"
#include "lens/sphere/FisheyeImage.h"
#include "lens/sphere/OrvaneFisheye.h"
#include "lens/sphere/OrvanePerspective.h"
#include "lens/sphere/PerspectiveImage.h"
#include "lens/sphere/SphericalImage.h"

namespace Project {
namespace {

constexpr int kWidth = 640;
constexpr int kHeight = 480;

struct Direction {
  double x, y, z;  // x the view axis, y towards positive longitude, z up
};

Direction FromAngles(double lon, double lat) {
  return {std::cos(lat) * std::cos(lon), std::cos(lat) * std::sin(lon), std::sin(lat)};
}

// One model and, written from its geometry on the direction vector, the
// centred image position (y upwards) that it should give.
struct Case {
  std::string name;
  std::shared_ptr<PhotoToSphere> model;
  std::function<void(const Direction&, double&, double&)> expected;
};

std::vector<Case> Cases(const std::shared_ptr<const Image>& image) {
  std::vector<Case> cases;
  // Equisolid fisheye: radius 2 f sin(t / 2) at angle t from the axis.
  cases.push_back({"FisheyeImage", std::make_shared<FisheyeImage>(image, 300.0f, 1.0f, 2.0f),
                   [](const Direction& d, double& x, double& y) {
                     const double side = std::hypot(d.y, d.z);
                     const double r = 2 * 300.0 * std::sin(std::atan2(side, d.x) / 2);
                     x = r * d.y / side;
                     y = r * d.z / side;
                   }});
  // Pinhole about a centre at (300, 250) px from the top left.
  cases.push_back({"PerspectiveImage",
                   std::make_shared<PerspectiveImage>(image, 400.0f, 300.0f, 250.0f),
                   [](const Direction& d, double& x, double& y) {
                     x = 400.0 * d.y / d.x - 20.0;
                     y = 400.0 * d.z / d.x - 10.0;
                   }});
  // Cylinder of radius f about the vertical axis, unrolled.
  cases.push_back({"CylindricalImage",
                   std::make_shared<CylindricalImage>(image, 200.0f, 330.0f, 230.0f),
                   [](const Direction& d, double& x, double& y) {
                     x = 200.0 * std::atan2(d.y, d.x) + 10.0;
                     y = 200.0 * d.z / std::hypot(d.x, d.y) + 10.0;
                   }});
  // Equirectangular.
  cases.push_back({"SphericalImage",
                   std::make_shared<SphericalImage>(image, 150.0f, 320.0f, 250.0f),
                   [](const Direction& d, double& x, double& y) {
                     x = 150.0 * std::atan2(d.y, d.x);
                     y = 150.0 * std::asin(d.z) - 10.0;
                   }});
  // Profile fisheye: equidistant with odd polynomial, focal and centre in
  // units of the longer side (640 px); the offsets are added.
  cases.push_back(
      {"OrvaneFisheye",
       std::make_shared<OrvaneFisheye>(image, 0.25f, 0.27f, 0.52f, 0.47f, -0.02f, 0.003f),
       [](const Direction& d, double& x, double& y) {
         const double side = std::hypot(d.y, d.z);
         const double t = std::atan2(side, d.x);
         const double p = t - 0.02 * std::pow(t, 3) + 0.003 * std::pow(t, 5);
         x = 640 * double(0.25f) * p * d.y / side + 640 * (double(0.52f) - 0.5);
         y = 640 * double(0.27f) * p * d.z / side + 640 * (0.5 - double(0.47f));
       }});
  // Profile rectilinear: Brown-Conrady on the pinhole plane; the offsets are
  // subtracted.
  cases.push_back({"OrvanePerspective",
                   std::make_shared<OrvanePerspective>(image, 0.8f, 0.82f, 0.6f, 0.45f, -0.05f,
                                                       0.01f, -0.002f, 0.003f, -0.004f),
                   [](const Direction& d, double& x, double& y) {
                     const double u = d.y / d.x, v = d.z / d.x, r2 = u * u + v * v;
                     const double k1 = double(-0.05f), k2 = double(0.01f), k3 = double(-0.002f);
                     const double t1 = double(0.003f), t2 = double(-0.004f);
                     const double f = 1 + k1 * r2 + k2 * r2 * r2 + k3 * r2 * r2 * r2;
                     const double bx = u * f + 2 * t1 * u * v + t2 * (r2 + 2 * u * u);
                     const double by = v * f + t1 * (r2 + 2 * v * v) + 2 * t2 * u * v;
                     x = 640 * double(0.8f) * bx - 640 * (double(0.6f) - 0.5);
                     y = 640 * double(0.82f) * by - 640 * (0.5 - double(0.45f));
                   }});
  return cases;
}

TEST(SphereModelTest, TexCoordMatchesAnIndependentProjection) {
  const auto image = std::make_shared<const Image>(kWidth, kHeight);
  std::mt19937 rng(3);
  std::uniform_real_distribution<float> angle(-1.0f, 1.0f);
  for (const Case& c : Cases(image)) {
    SCOPED_TRACE(c.name);
    for (int i = 0; i < 200; ++i) {
      const float lon = angle(rng), lat = angle(rng);
      double x = 0, y = 0;
      c.expected(FromAngles(lon, lat), x, y);
      float uv[2] = {0, 0};
      c.model->GetTexCoord(lon, lat, uv);
      // Positions are single precision throughout; 1e-6 of the width is
      // under a thousandth of a pixel.
      EXPECT_NEAR(uv[0], x / kWidth + 0.5, 1e-6);
      EXPECT_NEAR(uv[1], y / kHeight + 0.5, 1e-6);
    }
  }
}

TEST(SphereModelTest, ContainsAtItsBounds) {
  const auto image = std::make_shared<const Image>(kWidth, kHeight);
  const float justBelow = std::nextafter(1.57f, 0.0f);  // 1.57f itself lies above 1.57
  PerspectiveImage perspective(image, 400.0f, 320.0f, 240.0f);
  OrvaneFisheye fisheye(image, 0.25f, 0.25f, 0.5f, 0.5f, 0.0f, 0.0f);
  OrvanePerspective rectilinear(image, 0.8f, 0.8f, 0.5f, 0.5f, 0, 0, 0, 0, 0);
  for (float sign : {1.0f, -1.0f}) {
    EXPECT_TRUE(perspective.Contains(sign * justBelow, 3.0f));  // any latitude passes
    EXPECT_FALSE(perspective.Contains(sign * 1.57f, 0.0f));
    for (const PhotoToSphere* m : {static_cast<const PhotoToSphere*>(&fisheye),
                                   static_cast<const PhotoToSphere*>(&rectilinear)}) {
      EXPECT_TRUE(m->Contains(sign * justBelow, sign * justBelow));
      EXPECT_FALSE(m->Contains(sign * 1.57f, 0.0f));
      EXPECT_FALSE(m->Contains(0.0f, sign * 1.57f));
    }
  }

  // The equisolid fisheye takes the front half sphere: walking out along the
  // equator one float at a time, it stops within a few ulps of a right angle.
  FisheyeImage equisolid(image, 300.0f, 320.0f, 240.0f);
  float lon = 1.5705f;
  while (equisolid.Contains(lon, 0.0f)) lon = std::nextafter(lon, 2.0f);
  EXPECT_NEAR(lon, std::numbers::pi / 2, 5e-7);  // float angle and radius rounding
  EXPECT_TRUE(equisolid.Contains(std::nextafter(lon, 0.0f), 0.0f));

  // Panoramas: the pixel, truncated towards zero, lies in the picture. With
  // focal 1 and the centre in the middle the position is the angle itself.
  const auto small = std::make_shared<const Image>(4, 4);
  SphericalImage spherical(small, 1.0f, 2.0f, 2.0f);
  CylindricalImage cylindrical(small, 1.0f, 2.0f, 2.0f);
  for (const PhotoToSphere* m : {static_cast<const PhotoToSphere*>(&spherical),
                                 static_cast<const PhotoToSphere*>(&cylindrical)}) {
    // The picture spans halfWidth + x in (-1, 4): half a pixel left of the
    // first column still counts.
    EXPECT_FALSE(m->Contains(-3.0f, 0.0f));
    EXPECT_TRUE(m->Contains(std::nextafter(-3.0f, 0.0f), 0.0f));
    EXPECT_TRUE(m->Contains(std::nextafter(4.0f, 0.0f) - 2.0f, 0.0f));
    EXPECT_FALSE(m->Contains(2.0f, 0.0f));
  }
  EXPECT_FALSE(cylindrical.Contains(0.0f, 1.5f));  // tan(1.5) = 14 rows up
}

TEST(SphereModelTest, GetColorIsBilinear) {
  // Pixel (column, row) at (2 * row + column) * 3; exactly 12 bytes, so the
  // sanitizer build catches any read past the end.
  const std::vector<std::uint8_t> pixels = {0, 0,   255, 100, 0,   255,  // row 0
                                            0, 200, 255, 100, 200, 0};   // row 1
  // Focal 1, centre in the middle: the position is (lon, lat), and the
  // buffer is read at (1 + lon, 1 + lat).
  SphericalImage model(std::make_shared<const Image>(2, 2, pixels.data()), 1.0f, 1.0f, 1.0f);
  auto color = [&](float lon, float lat) {
    std::vector<float> rgb(3);
    model.GetColor(lon, lat, rgb.data());
    return rgb;
  };
  auto expect = [](std::vector<float> got, float r, float g, float b) {
    // Sums of at most four byte values and a division: float rounding.
    EXPECT_NEAR(got[0], r, 1e-6);
    EXPECT_NEAR(got[1], g, 1e-6);
    EXPECT_NEAR(got[2], b, 1e-6);
  };
  // (0.25, 0.5): weights 3/8, 1/8, 1/8, 3/8 on (0,0), (1,0), (1,1), (0,1).
  expect(color(-0.75f, -0.5f), 25 / 255.0f, 100 / 255.0f, 0.875f);
  // Last column: no right neighbour, half of (1,0) and half of (1,1).
  expect(color(0.5f, -0.5f), 100 / 255.0f, 100 / 255.0f, 0.5f);
  // Last column and row: the corner pixel alone.
  expect(color(0.5f, 0.5f), 100 / 255.0f, 200 / 255.0f, 0.0f);
  // Off the picture: black.
  expect(color(1.5f, 0.0f), 0, 0, 0);
}

TEST(SphereModelTest, ChoiceOfModel) {
  const auto image = std::make_shared<const Image>(kWidth, kHeight);
  std::shared_ptr<PhotoToSphere> model;
  auto chosen = [&](std::int32_t projection, const PanoramaProjection* panorama,
                    const PGenericCameraModel* camera) {
    return ChoosePhotoToSphere(projection, image, 500.0f, panorama, camera, 1.5f, model);
  };
  PFisheyeCameraModel fisheyeLens;
  PTangentialDistortCameraModel tangentialLens;
  PGenericCameraModel genericLens;
  PanoramaProjection unknown;

  EXPECT_TRUE(chosen(1, nullptr, nullptr) && std::dynamic_pointer_cast<FisheyeImage>(model));
  EXPECT_TRUE(chosen(2, nullptr, nullptr) && std::dynamic_pointer_cast<PerspectiveImage>(model));
  EXPECT_TRUE(chosen(3, nullptr, &fisheyeLens) && std::dynamic_pointer_cast<OrvaneFisheye>(model));
  EXPECT_TRUE(chosen(3, nullptr, &tangentialLens) &&
              std::dynamic_pointer_cast<OrvanePerspective>(model));
  // No model for a generic lens, no lens, or an unknown panorama: the
  // previous one stays.
  const auto previous = model;
  EXPECT_FALSE(chosen(3, nullptr, &genericLens));
  EXPECT_FALSE(chosen(3, nullptr, nullptr));
  EXPECT_FALSE(chosen(3, &unknown, &fisheyeLens));
  EXPECT_EQ(model, previous);

  // A cylindrical panorama is centred on the middle of the metadata's width.
  PanoramaProjection cylinder{PanoramaProjection::kCylindrical, 200.0f, 10.0f, 250.0f, 700.0f};
  ASSERT_TRUE(chosen(3, &cylinder, nullptr) && std::dynamic_pointer_cast<CylindricalImage>(model));
  float uv[2];
  model->GetTexCoord(0.0f, 0.0f, uv);
  EXPECT_FLOAT_EQ(uv[0], (350.0f - 320.0f) / kWidth + 0.5f);
  EXPECT_FLOAT_EQ(uv[1], (240.0f - 250.0f) / kHeight + 0.5f);

  // Full spherical: the height spans pi.
  ASSERT_TRUE(chosen(4, nullptr, nullptr) && std::dynamic_pointer_cast<SphericalImage>(model));
  model->GetTexCoord(0.0f, float(std::numbers::pi / 4), uv);
  EXPECT_NEAR(uv[1], 0.75f, 1e-6);  // float pi and position rounding
}

}  // namespace
}  // namespace Project
