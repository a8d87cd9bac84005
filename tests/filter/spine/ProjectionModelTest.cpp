// How the projection model and the focal length follow from the image, the
// metadata and the lens profiles.

#include <algorithm>
#include <string>
#include <vector>

#include <gtest/gtest.h>

#include "filter/PFilter.h"
#include "tests/support/FilterFixture.h"
#include "tests/support/RecordingPresenter.h"

namespace Project::testing {
namespace {

using Tarsa::testing::ScopedRecorder;
using Texts = std::vector<std::string>;

constexpr std::int32_t kFisheye = PSettings::kModelFisheye;
constexpr std::int32_t kPerspective = PSettings::kModelPerspective;
constexpr std::int32_t kAuto = PSettings::kModelAuto;
constexpr std::int32_t kSpherical = PSettings::kModelFullSpherical;

class ProjectionModel : public Tarsa::testing::PluginRunTest {
 protected:
  void TearDown() override {
    filter.reset();
    PluginRunTest::TearDown();
  }
  // A filter serving an image of width x height.
  TestPFilter& Make(std::int32_t width, std::int32_t height) {
    host.Coords().imageWidth = width;
    host.Coords().imageHeight = height;
    host.Coords().enabled = 1;
    filter.reset();  // one process at a time
    filter = std::make_unique<TestPFilter>();
    EXPECT_EQ(filter->HandleParameters(host.Record(), nullptr), 0);
    return *filter;
  }
  std::int32_t Model() { return filter->Settings().projectionModel; }

  Tarsa::testing::RealHost host;
  std::unique_ptr<TestPFilter> filter;
};

TEST_F(ProjectionModel, FullSphericalNeedsTwoToOne) {
  // |3000 - 2 x 1501| / 3000 = 0.00067 is within 0.1 %, but 3000 x 1502
  // (0.0013) is not.
  struct Case {
    std::int32_t width, height;
    std::int32_t model;
  };
  for (const Case& c : {Case{3000, 1500, kSpherical}, Case{3000, 1501, kSpherical},
                        Case{3000, 1502, kFisheye}, Case{4000, 3000, kFisheye}}) {
    SCOPED_TRACE(std::to_string(c.width) + " x " + std::to_string(c.height));
    TestPFilter& f = Make(c.width, c.height);
    f.Settings().projectionModel = kSpherical;
    ScopedRecorder shown;
    f.ResolveProjectionModel(kFisheye, false, false);
    EXPECT_EQ(Model(), c.model);
    EXPECT_TRUE(shown.texts.empty()) << "silent without warn";
    EXPECT_EQ(f.lensAsked, 0) << "nothing further runs for full spherical";
  }
  // With warn the fallback is explained.
  TestPFilter& f = Make(3000, 1600);
  f.Settings().projectionModel = kSpherical;
  ScopedRecorder shown;
  f.ResolveProjectionModel(kPerspective, false, true);
  EXPECT_EQ(Model(), kPerspective);
  EXPECT_EQ(shown.texts,
            Texts{"The aspect ratio is not 1:2, which is invalid for Full Spherical."});
}

TEST_F(ProjectionModel, AutoKeepsAMatchedProfileElseFallsBack) {
  TestPFilter& f = Make(4000, 3000);
  f.Settings().projectionModel = kAuto;
  f.lensMatches = true;
  f.ResolveProjectionModel(kFisheye, false, false);
  EXPECT_EQ(Model(), kAuto);
  f.lensMatches = false;
  f.ResolveProjectionModel(kPerspective, false, false);
  EXPECT_EQ(Model(), kPerspective);
  EXPECT_EQ(f.lensAsked, 2);

  // Complete focal data in the metadata (a panorama) leaves everything alone.
  f.Settings().projectionModel = kAuto;
  f.metadata.complete = true;
  f.ResolveProjectionModel(kFisheye, false, false);
  EXPECT_EQ(Model(), kAuto);
  EXPECT_EQ(f.lensAsked, 2);
}

TEST_F(ProjectionModel, ForcedAutoDecidesBySixteenMillimetresEquivalent) {
  struct Case {
    float focal, crop, equivalent;
    std::int32_t fallback, model;
  };
  const Case cases[] = {
      {0, 0, 15.98f, kFisheye, kFisheye},           // 0.02 under 16
      {0, 0, 16.02f, kFisheye, kPerspective},       // 0.02 over 16
      {0, 0, 16.005f, kPerspective, kPerspective},  // within 0.01: stays at the fallback
      {0, 0, 16.005f, kAuto, kAuto},                // ... which may be Auto itself
      {10, 1.5f, 0, kPerspective, kFisheye},        // 10 mm x 1.5 = 15 mm equivalent
      {24, 1.0f, 0, kFisheye, kPerspective},
      {0, 0, 0, kPerspective, kPerspective},  // nothing known: the fallback
  };
  for (const Case& c : cases) {
    SCOPED_TRACE(c.equivalent > 0 ? c.equivalent : c.focal * c.crop);
    TestPFilter& f = Make(4000, 3000);
    f.metadata = PFilter::FocalData{c.focal, c.crop, c.equivalent, false};
    f.Settings().projectionModel = kFisheye;
    f.ResolveProjectionModel(c.fallback, true, false);
    EXPECT_EQ(Model(), c.model);
    EXPECT_EQ(f.lensAsked, 1) << "forced Auto asks the profiles first";
  }
}

TEST_F(ProjectionModel, LensMatchWithoutTheHostsSuiteFindsNothing) {
  TestPFilter& f = Make(400, 300);
  f.realLensMatch = true;
  const std::string lensKey = std::string(Tarsa::kLensProfilesSuite) + "#2";
  const auto lensCount = [&lensKey](const std::vector<std::string>& log) {
    return std::count(log.begin(), log.end(), lensKey);
  };
  host.AddSuite(Tarsa::kLensProfilesSuite, 2, nullptr);  // a host without the service
  EXPECT_FALSE(f.MatchLensProfile(false));
  EXPECT_EQ(lensCount(host.acquired), 0);

  // With the suite: taken and prepared once, kept for the run.
  static int prepared = 0;
  prepared = 0;
  const Tarsa::HostLensProfilesSuite lens{nullptr, nullptr, [] {
                                            ++prepared;
                                            return Tarsa::HostStatus(0);
                                          }};
  host.AddSuite(Tarsa::kLensProfilesSuite, 2, &lens);
  EXPECT_FALSE(f.MatchLensProfile(false)) << "a service without a query answers nothing";
  EXPECT_FALSE(f.MatchLensProfile(false));
  EXPECT_EQ(prepared, 1);
  EXPECT_EQ(lensCount(host.acquired), 1);
  filter.reset();
  EXPECT_EQ(lensCount(host.released), 1);
}

TEST_F(ProjectionModel, FocalLengthFromMetadataInMillimetresAndPixels) {
  TestPFilter& f = Make(6000, 4000);
  f.metadata = PFilter::FocalData{12, 1.5f, 0, false};
  // 1.5 x 12 mm over a 36 mm frame across 6000 pixels: 3000 pixels (the
  // default is 6000 x 15 / 36 = 2500).
  EXPECT_FLOAT_EQ(f.FocalFromMetadata(true), 3000.0f);
  EXPECT_FLOAT_EQ(f.Settings().physicalFocal, 12.0f);
  EXPECT_FLOAT_EQ(f.Settings().cropFactor, 1.5f);
  EXPECT_FLOAT_EQ(f.Settings().focalLength, 2500.0f) << "initial: only the answer";
  f.FocalFromMetadata(false);
  EXPECT_FLOAT_EQ(f.Settings().focalLength, 3000.0f);
  EXPECT_FLOAT_EQ(f.PhysicalFromImage(), 12.0f);

  // Range: 4000 x 0.1 x 36 / (1.5 x 6000) = 1.6 mm to 48 mm; in pixels x 250.
  float low = 0;
  float high = 0;
  ASSERT_TRUE(f.PhysicalFocalRange(low, high));
  EXPECT_FLOAT_EQ(low, 1.6f);
  EXPECT_FLOAT_EQ(high, 48.0f);
  ASSERT_TRUE(f.ImageFocalRange(low, high));
  EXPECT_FLOAT_EQ(low, 400.0f);
  EXPECT_FLOAT_EQ(high, 12000.0f);
  // A known focal length beyond the range widens it.
  f.metadata.focalLength = 100;
  ASSERT_TRUE(f.PhysicalFocalRange(low, high));
  EXPECT_FLOAT_EQ(high, 100.0f);

  // Only a 35 mm equivalent and no crop factor: the crop factor is 1.
  f.metadata = PFilter::FocalData{0, 0, 24, false};
  f.FocalFromMetadata(true);
  EXPECT_FLOAT_EQ(f.Settings().cropFactor, 1.0f);
  EXPECT_FLOAT_EQ(f.Settings().physicalFocal, 24.0f);
}

}  // namespace
}  // namespace Project::testing
