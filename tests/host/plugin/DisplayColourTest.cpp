// The host's display conversion: Lab against the CIE formulas worked here,
// CMYK through the default press profile and through a document's own, and
// the layouts and limits of the suite.

#include <lcms2.h>

#include <gtest/gtest.h>

#include <algorithm>
#include <array>
#include <cmath>
#include <cstdint>
#include <vector>

#include "host/plugin/DisplayColour.h"
#include "host/plugin/HostCodes.h"
#include "host/plugin/HostRecord.h"
#include "host/plugin/RunObserver.h"

namespace Host {
namespace {

using Rgb = std::array<int, 3>;

// Lab (D50) to 8-bit sRGB the long way: XYZ, Bradford's cone space adapted
// from D50 to D65, then the sRGB standard's matrix and transfer curve.
Rgb ReferenceSrgb(double L, double a, double b) {
  const auto finv = [](double t) {
    return t > 6.0 / 29 ? t * t * t : 3 * (6.0 / 29) * (6.0 / 29) * (t - 4.0 / 29);
  };
  const double fy = (L + 16) / 116;
  const double d50[3] = {0.96422, 1.0, 0.82521};
  const double d65[3] = {0.95047, 1.0, 1.08883};
  const double xyz[3] = {d50[0] * finv(fy + a / 500), finv(fy), d50[2] * finv(fy - b / 200)};
  const double bradford[3][3] = {
      {0.8951, 0.2664, -0.1614}, {-0.7502, 1.7135, 0.0367}, {0.0389, -0.0685, 1.0296}};
  const auto cone = [&](const double* v, int i) {
    return bradford[i][0] * v[0] + bradford[i][1] * v[1] + bradford[i][2] * v[2];
  };
  double adapted[3];
  for (int i = 0; i < 3; ++i) adapted[i] = cone(xyz, i) * cone(d65, i) / cone(d50, i);
  // Back from cone space: the inverse of the matrix above.
  const double inverse[3][3] = {{0.9869929, -0.1470543, 0.1599627},
                                {0.4323053, 0.5183603, 0.0492912},
                                {-0.0085287, 0.0400428, 0.9684867}};
  double x65[3];
  for (int i = 0; i < 3; ++i) {
    x65[i] = inverse[i][0] * adapted[0] + inverse[i][1] * adapted[1] + inverse[i][2] * adapted[2];
  }
  const double toRgb[3][3] = {
      {3.2406, -1.5372, -0.4986}, {-0.9689, 1.8758, 0.0415}, {0.0557, -0.2040, 1.0570}};
  Rgb out;
  for (int i = 0; i < 3; ++i) {
    const double lin = toRgb[i][0] * x65[0] + toRgb[i][1] * x65[1] + toRgb[i][2] * x65[2];
    const double c = lin <= 0.0031308 ? 12.92 * lin : 1.055 * std::pow(lin, 1 / 2.4) - 0.055;
    out[i] = int(std::lround(std::clamp(c, 0.0, 1.0) * 255));
  }
  return out;
}

// Planar samples in, interleaved RGB out, as the suite's blocks describe them.
class Blocks {
 public:
  Blocks(int planes, int width, int height)
      : width_(width),
        height_(height),
        in_(std::size_t(planes) * width * height),
        out_(std::size_t(3) * width * height) {}

  void Set(int x, int y, std::initializer_list<int> samples) {
    int k = 0;
    for (int s : samples) in_[(std::size_t(k++) * height_ + y) * width_ + x] = std::uint8_t(s);
  }
  Rgb Get(int x, int y) const {
    const std::uint8_t* p = &out_[(std::size_t(y) * width_ + x) * 3];
    return {p[0], p[1], p[2]};
  }
  Tarsa::HostSampleBlock Source() {
    Tarsa::HostSampleBlock block{};
    for (int k = 0; k < 4 && std::size_t(k) * width_ * height_ < in_.size(); ++k) {
      block.planes[k] = in_.data() + std::size_t(k) * width_ * height_;
    }
    block.rowBytes = width_;
    block.columnBytes = 1;
    return block;
  }
  Tarsa::HostSampleBlock Destination() {
    return {{out_.data(), out_.data() + 1, out_.data() + 2, nullptr}, width_ * 3, 3};
  }
  bool Convert(DisplayColour& colour, ImageMode mode) {
    const Tarsa::HostSampleBlock source = Source();
    const Tarsa::HostSampleBlock destination = Destination();
    return colour.Convert(int16_t(mode), width_, height_, source, destination);
  }

 private:
  int width_;
  int height_;
  std::vector<std::uint8_t> in_;
  std::vector<std::uint8_t> out_;
};

// One CMYK pixel (host samples, 255 is no ink) through a conversion.
Rgb ConvertCmyk(DisplayColour& colour, int c, int m, int y, int k) {
  Blocks blocks(4, 1, 1);
  blocks.Set(0, 0, {c, m, y, k});
  EXPECT_TRUE(blocks.Convert(colour, ImageMode::kCmyk));
  return blocks.Get(0, 0);
}

// A CMYK printer profile unlike any press: every ink turns the paper red.
std::vector<std::uint8_t> RedInkProfile() {
  cmsHPROFILE profile = cmsCreateProfilePlaceholder(nullptr);
  cmsSetProfileVersion(profile, 4.3);
  cmsSetDeviceClass(profile, cmsSigOutputClass);
  cmsSetColorSpace(profile, cmsSigCmykData);
  cmsSetPCS(profile, cmsSigLabData);
  cmsPipeline* pipeline = cmsPipelineAlloc(nullptr, 4, 3);
  cmsStage* grid = cmsStageAllocCLut16bit(nullptr, 5, 4, 3, nullptr);
  const auto sampler = [](const cmsUInt16Number in[], cmsUInt16Number out[], void*) -> int {
    const double ink = *std::max_element(in, in + 4) / 65535.0;
    const cmsCIELab lab{100 - 50 * ink, 70 * ink, 50 * ink};
    cmsFloat2LabEncoded(out, &lab);
    return 1;
  };
  cmsStageSampleCLut16bit(grid, sampler, nullptr, 0);
  // The v4 form of the table wants curves on both sides of the grid.
  cmsPipelineInsertStage(pipeline, cmsAT_END, cmsStageAllocToneCurves(nullptr, 4, nullptr));
  cmsPipelineInsertStage(pipeline, cmsAT_END, grid);
  cmsPipelineInsertStage(pipeline, cmsAT_END, cmsStageAllocToneCurves(nullptr, 3, nullptr));
  cmsWriteTag(profile, cmsSigAToB0Tag, pipeline);
  cmsWriteTag(profile, cmsSigMediaWhitePointTag, cmsD50_XYZ());
  cmsUInt32Number size = 0;
  cmsSaveProfileToMem(profile, nullptr, &size);
  std::vector<std::uint8_t> bytes(size);
  cmsSaveProfileToMem(profile, bytes.data(), &size);
  cmsPipelineFree(pipeline);
  cmsCloseProfile(profile);
  return bytes;
}

TEST(DisplayColourTest, LabMatchesTheCieFormulas) {
  // Lab in the host's encoding: L* 0..100 as 0..255, a* and b* around 128.
  const std::vector<std::array<int, 3>> samples = {
      {0, 128, 128},   {64, 128, 128},  {128, 128, 128}, {191, 128, 128}, {255, 128, 128},
      {128, 188, 168}, {150, 88, 188},  {100, 148, 68},  {140, 178, 88},  {200, 118, 198},
      {30, 150, 110},  {230, 120, 140}, {120, 200, 180}, {170, 60, 140}};
  DisplayColour colour;
  Blocks blocks(3, int(samples.size()), 1);
  for (std::size_t i = 0; i < samples.size(); ++i) {
    blocks.Set(int(i), 0, {samples[i][0], samples[i][1], samples[i][2]});
  }
  ASSERT_TRUE(blocks.Convert(colour, ImageMode::kLab48));  // 16-bit: the same 8-bit road
  for (std::size_t i = 0; i < samples.size(); ++i) {
    const auto& s = samples[i];
    SCOPED_TRACE(::testing::Message() << s[0] << "," << s[1] << "," << s[2]);
    const Rgb want = ReferenceSrgb(s[0] * 100.0 / 255, s[1] - 128, s[2] - 128);
    const Rgb got = blocks.Get(int(i), 0);
    for (int k = 0; k < 3; ++k) {
      // LittleCMS keeps the profile's matrix in 16.16 fixed point: a
      // rounding apart at most.
      EXPECT_NEAR(got[k], want[k], 1) << "channel " << k;
    }
    if (s[1] == 128 && s[2] == 128) {
      EXPECT_EQ(got[0], got[1]);  // neutral stays neutral
      EXPECT_EQ(got[1], got[2]);
    }
  }
  EXPECT_EQ(blocks.Get(0, 0), (Rgb{0, 0, 0}));
  EXPECT_EQ(blocks.Get(4, 0), (Rgb{255, 255, 255}));
}

TEST(DisplayColourTest, CmykThroughTheDefaultPressProfile) {
  DisplayColour colour;
  ASSERT_EQ(colour.CmykProfileInUse(), DisplayColour::CmykProfile::kDefault)
      << "the set-up installs " << DisplayColour::kDefaultCmykProfile;
  // Paper is white; relative colorimetric maps it to the screen's white.
  EXPECT_EQ(ConvertCmyk(colour, 255, 255, 255, 255), (Rgb{255, 255, 255}));
  // Full black ink alone: a press's black is not quite the deepest it can
  // print (that is all four inks), so a dark neutral, not 0.
  const Rgb black = ConvertCmyk(colour, 255, 255, 255, 0);
  EXPECT_LE(*std::max_element(black.begin(), black.end()), 48);
  EXPECT_LE(
      *std::max_element(black.begin(), black.end()) - *std::min_element(black.begin(), black.end()),
      6);
  EXPECT_EQ(ConvertCmyk(colour, 0, 0, 0, 0), (Rgb{0, 0, 0}));  // black point compensation
  // Each ink reads as itself: its own primary absent, the other two strong.
  const Rgb cyan = ConvertCmyk(colour, 0, 255, 255, 255);
  EXPECT_LT(cyan[0], 40);
  EXPECT_GT(cyan[1], 140);
  EXPECT_GT(cyan[2], 200);
  const Rgb magenta = ConvertCmyk(colour, 255, 0, 255, 255);
  EXPECT_GT(magenta[0], 200);
  EXPECT_LT(magenta[1], 40);
  const Rgb yellow = ConvertCmyk(colour, 255, 255, 0, 255);
  EXPECT_GT(std::min(yellow[0], yellow[1]), 200);
  EXPECT_LT(yellow[2], 60);
}

TEST(DisplayColourTest, CmykTakesTheDocumentsOwnProfileWhenItIsUsable) {
  DisplayColour own(RedInkProfile());
  EXPECT_EQ(own.CmykProfileInUse(), DisplayColour::CmykProfile::kDocument);
  EXPECT_EQ(ConvertCmyk(own, 255, 255, 255, 255), (Rgb{255, 255, 255}));
  const Rgb cyan = ConvertCmyk(own, 0, 255, 255, 255);  // red, by that profile
  EXPECT_GT(cyan[0], cyan[1] + 60);
  EXPECT_GT(cyan[0], cyan[2] + 60);

  // Bytes that are no profile, and a profile of another colour space, are
  // passed over for the default.
  DisplayColour defaultOnly;
  const Rgb pressCyan = ConvertCmyk(defaultOnly, 0, 255, 255, 255);
  const std::vector<std::uint8_t> noProfile(200, 0x5a);
  cmsHPROFILE srgb = cmsCreate_sRGBProfile();
  cmsUInt32Number size = 0;
  cmsSaveProfileToMem(srgb, nullptr, &size);
  std::vector<std::uint8_t> rgbProfile(size);
  cmsSaveProfileToMem(srgb, rgbProfile.data(), &size);
  cmsCloseProfile(srgb);
  for (const auto& bytes : {noProfile, rgbProfile}) {
    DisplayColour colour(bytes);
    EXPECT_EQ(colour.CmykProfileInUse(), DisplayColour::CmykProfile::kDefault);
    EXPECT_EQ(ConvertCmyk(colour, 0, 255, 255, 255), pressCyan);
  }

  // With no profile at all CMYK is declined; the other models still convert.
  DisplayColour none({}, "/nonexistent/cmyk.icc");
  Blocks blocks(4, 1, 1);
  EXPECT_FALSE(blocks.Convert(none, ImageMode::kCmyk));
  EXPECT_EQ(none.CmykProfileInUse(), DisplayColour::CmykProfile::kNone);
  EXPECT_TRUE(blocks.Convert(none, ImageMode::kLab));
}

TEST(DisplayColourTest, RgbPassesAndGrayRepeatsExactlyWhateverTheStrides) {
  // Gray from a planar plane into a BGRA surface: each byte of a pixel is
  // named by its own address, and the fourth is not the conversion's.
  constexpr int kWidth = 5;
  constexpr int kHeight = 3;
  std::vector<std::uint8_t> gray(kWidth * kHeight);
  for (std::size_t i = 0; i < gray.size(); ++i) gray[i] = std::uint8_t(i * 17);
  std::vector<std::uint8_t> bgra(kWidth * kHeight * 4, 0xEE);
  std::uint8_t* surface = bgra.data();
  const Tarsa::HostSampleBlock plane{{gray.data(), nullptr, nullptr, nullptr}, kWidth, 1};
  const Tarsa::HostSampleBlock screen{{surface + 2, surface + 1, surface, nullptr}, kWidth * 4, 4};
  DisplayColour colour;
  ASSERT_TRUE(colour.Convert(int16_t(ImageMode::kGray16), kWidth, kHeight, plane, screen));
  for (std::size_t i = 0; i < gray.size(); ++i) {
    EXPECT_EQ(bgra[4 * i], gray[i]);
    EXPECT_EQ(bgra[4 * i + 1], gray[i]);
    EXPECT_EQ(bgra[4 * i + 2], gray[i]);
    EXPECT_EQ(bgra[4 * i + 3], 0xEE);
  }

  // RGB interleaved in, BGRA out: the same values, reordered by the addresses.
  std::vector<std::uint8_t> rgb(kWidth * kHeight * 3);
  for (std::size_t i = 0; i < rgb.size(); ++i) rgb[i] = std::uint8_t(i * 31 + 7);
  const Tarsa::HostSampleBlock packed{
      {rgb.data(), rgb.data() + 1, rgb.data() + 2, nullptr}, kWidth * 3, 3};
  ASSERT_TRUE(colour.Convert(int16_t(ImageMode::kRgb), kWidth, kHeight, packed, screen));
  for (std::size_t i = 0; i < gray.size(); ++i) {
    EXPECT_EQ(bgra[4 * i + 2], rgb[3 * i]);
    EXPECT_EQ(bgra[4 * i + 1], rgb[3 * i + 1]);
    EXPECT_EQ(bgra[4 * i], rgb[3 * i + 2]);
  }

  // A mode outside the eight, or a plane missing, is declined.
  EXPECT_FALSE(colour.Convert(2, kWidth, kHeight, packed, screen));
  EXPECT_FALSE(colour.Convert(int16_t(ImageMode::kRgb), kWidth, kHeight, plane, screen));
}

TEST(DisplayColourTest, TheSuiteHoldsCallersToItsBlocksAndNeedsARecord) {
  const Tarsa::HostDisplayColourSuite* suite = DisplayColour::Suite();
  std::vector<std::uint8_t> samples(3 * 513);
  const Tarsa::HostSampleBlock block{
      {samples.data(), samples.data() + 1, samples.data() + 2, nullptr}, 3 * 513, 3};
  const auto mode = int16_t(ImageMode::kRgb);
  EXPECT_EQ(suite->convertToDisplay(mode, 513, 1, &block, &block), HostCodes::kParamErr);
  EXPECT_EQ(suite->convertToDisplay(mode, 1, 0, &block, &block), HostCodes::kParamErr);
  EXPECT_EQ(suite->convertToDisplay(mode, 1, 1, nullptr, &block), HostCodes::kParamErr);
  // A block of the right size, but no selector running: no document to ask.
  EXPECT_EQ(suite->convertToDisplay(mode, 512, 1, &block, &block), HostCodes::kParamErr);
}

class QuietObserver : public RunObserver {
 public:
  bool AbortRequested() override { return false; }
  void Progress(int32_t, int32_t) override {}
};

TEST(DisplayColourTest, TheRecordServesTheSuiteWithItsDocumentsProfile) {
  auto document = HostDocument::Create(1, 1, ImageMode::kCmyk);
  document->SetColourProfile(RedInkProfile());
  QuietObserver observer;
  HostRecord record(*document, {}, observer);
  HostRecord::Scope scope(record);
  const auto* access = static_cast<const Tarsa::HostSuiteAccess*>(record.Record()->suiteAccess);
  const void* table = nullptr;
  ASSERT_EQ(access->acquire(Tarsa::kDisplayColourSuite, Tarsa::kDisplayColourSuiteVersion, &table),
            0);
  std::uint8_t cyan[4] = {0, 255, 255, 255};
  std::uint8_t rgb[3] = {};
  const Tarsa::HostSampleBlock source{{cyan, cyan + 1, cyan + 2, cyan + 3}, 4, 4};
  const Tarsa::HostSampleBlock destination{{rgb, rgb + 1, rgb + 2, nullptr}, 3, 3};
  ASSERT_EQ(static_cast<const Tarsa::HostDisplayColourSuite*>(table)->convertToDisplay(
                int16_t(ImageMode::kCmyk), 1, 1, &source, &destination),
            0);
  EXPECT_GT(rgb[0], rgb[1] + 60) << "red, by the document's profile";
  EXPECT_EQ(record.Display().CmykProfileInUse(), DisplayColour::CmykProfile::kDocument);
}

}  // namespace
}  // namespace Host
