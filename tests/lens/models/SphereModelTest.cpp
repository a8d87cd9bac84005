#include <gtest/gtest.h>

#include <cmath>
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
#include "tools/synth/lib/Projection.h"

namespace Project {
namespace {

constexpr int kWidth = 640;
constexpr int kHeight = 480;

// One model and the generator's projection of the same camera. The
// generator's cameras have square pixels; a profile's unequal focal lengths
// stretch the picture along x by focalX / focalY about the optical centre.
// Directions are drawn with lon and lat within plus or minus the limits.
struct GeneratorCase {
  std::string name;
  std::shared_ptr<PhotoToSphere> model;
  Synth::Projection generator;
  double stretchX;
  float lonLimit;
  float latLimit;
};

std::vector<GeneratorCase> GeneratorCases() {
  // Odd sides: the picture's middle is then half a pixel off any pixel
  // corner, so halving the width in integers would show.
  const int w = 641, h = 481;
  const auto image = std::make_shared<const Image>(w, h);
  const double m = w;  // the longer side, the profile's unit
  using Synth::ProjectionKind;
  std::vector<GeneratorCase> cases;
  // The equisolid fisheye ignores the centre it is given: it projects about
  // the middle. Its whole domain is the front half sphere.
  cases.push_back({"FisheyeImage", std::make_shared<FisheyeImage>(image, 250.0f, 1.0f, 2.0f),
                   Synth::Projection(ProjectionKind::kFisheyeEquisolid, 250.0, {w / 2.0, h / 2.0}),
                   1.0, 1.57f, 1.57f});
  // Model and generator both take the centre in pixels from the top left,
  // y downwards. The pinhole domain runs on towards 1.57 rad, where positions
  // reach a thousand focal lengths and single precision cannot hold 1e-4 of
  // the picture; at 1.3 rad they are already 13 focal lengths out.
  cases.push_back(
      {"PerspectiveImage", std::make_shared<PerspectiveImage>(image, 400.0f, 300.5f, 250.25f),
       Synth::Projection(ProjectionKind::kRectilinear, 400.0, {300.5, 250.25}), 1.0, 1.3f, 1.3f});
  cases.push_back(
      {"CylindricalImage", std::make_shared<CylindricalImage>(image, 200.0f, 330.0f, 230.0f),
       Synth::Projection(ProjectionKind::kCylindrical, 200.0, {330.0, 230.0}), 1.0, 3.1f, 1.3f});
  cases.push_back({"SphericalImage",
                   std::make_shared<SphericalImage>(image, 150.0f, 320.0f, 250.0f),
                   Synth::Projection(ProjectionKind::kEquirectangular, 150.0, {320.0, 250.0}), 1.0,
                   3.1f, 1.57f});

  // The profile models come from lens profile camera models through the
  // chooser, their focal lengths times the crop ratio. Profile centres are
  // fractions of the sides from the top left, scaled by the longer side.
  constexpr float kCrop = 1.25f;
  std::shared_ptr<PhotoToSphere> model;
  PFisheyeCameraModel fisheye;
  fisheye.centerX = 0.52f;
  fisheye.centerY = 0.47f;
  fisheye.focalX = 0.25f;
  fisheye.focalY = 0.27f;
  fisheye.radial1 = -0.04f;
  fisheye.radial2 = 0.004f;
  EXPECT_TRUE(ChoosePhotoToSphere(3, image, 0.0f, nullptr, &fisheye, kCrop, model));
  cases.push_back({"OrvaneFisheye", model,
                   Synth::Projection(ProjectionKind::kFisheyePoly, m * fisheye.focalY * kCrop,
                                     {w / 2.0 + (fisheye.centerX - 0.5) * m,
                                      h / 2.0 + (fisheye.centerY - 0.5) * m},
                                     {fisheye.radial1, fisheye.radial2}),
                   double(fisheye.focalX) / fisheye.focalY, 1.57f, 1.57f});

  // The rectilinear profile subtracts its centre's offsets, so the
  // generator's centre is the profile's mirrored about the middle. Its terms
  // never fold (the radial slope stays positive); within 1 rad, positions stay
  // within a few pictures of the middle.
  PTangentialDistortCameraModel pinhole;
  pinhole.centerX = 0.6f;
  pinhole.centerY = 0.45f;
  pinhole.focalX = 0.5f;
  pinhole.focalY = 0.56f;
  pinhole.radial1 = -0.12f;
  pinhole.radial2 = 0.02f;
  pinhole.radial3 = 0.001f;
  pinhole.tangential1 = 0.004f;
  pinhole.tangential2 = -0.003f;
  EXPECT_TRUE(ChoosePhotoToSphere(3, image, 0.0f, nullptr, &pinhole, kCrop, model));
  cases.push_back({"OrvanePerspective", model,
                   Synth::Projection(ProjectionKind::kTangential, m * pinhole.focalY * kCrop,
                                     {w / 2.0 - (pinhole.centerX - 0.5) * m,
                                      h / 2.0 - (pinhole.centerY - 0.5) * m},
                                     {pinhole.radial1, pinhole.radial2, pinhole.radial3,
                                      pinhole.tangential1, pinhole.tangential2}),
                   double(pinhole.focalX) / pinhole.focalY, 1.0f, 1.0f});
  return cases;
}

TEST(SphereModelTest, TexCoordMatchesTheGenerator) {
  std::mt19937 rng(3);
  for (const GeneratorCase& c : GeneratorCases()) {
    SCOPED_TRACE(c.name);
    const Image& image = *c.model->GetImage();
    std::uniform_real_distribution<float> lonOf(-c.lonLimit, c.lonLimit);
    std::uniform_real_distribution<float> latOf(-c.latLimit, c.latLimit);
    for (int i = 0; i < 500; ++i) {
      const float lon = lonOf(rng), lat = latOf(rng);
      Synth::Point2 p;
      ASSERT_TRUE(c.generator.ToImage(Synth::DirectionOf(lon, lat), &p)) << lon << " " << lat;
      const double x = c.generator.Centre().x + (p.x - c.generator.Centre().x) * c.stretchX;
      float uv[2] = {0, 0};
      c.model->GetTexCoord(lon, lat, uv);
      // The generator's positions run from the top left corner with y
      // downwards, pixel i covering [i, i + 1): its texture fraction is
      // (x / W, 1 - y / H), the same edge-to-edge span as the model's, whose
      // v grows upwards. Tolerance: the accepted agreement, 1e-4 in texture
      // units (a fraction of the picture's side); single-precision positions
      // a few pictures out account for at most 2e-6 of it.
      EXPECT_NEAR(uv[0], x / image.width, 1e-4);
      EXPECT_NEAR(uv[1], 1.0 - p.y / image.height, 1e-4);
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
