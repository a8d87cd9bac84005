// The border of a corrected picture, as a user sees it: where a fisheye's
// circle and the photograph's frame bound the result, the border is a
// smooth, anti-aliased curve, never the teeth of the mesh's cells.

#include <gtest/gtest.h>

#include <algorithm>
#include <cmath>
#include <cstdint>
#include <string>
#include <vector>

#include "host/io/HostDocument.h"
#include "host/io/ImageFile.h"
#include "tests/host/app/ProgramRun.h"

namespace Host {
namespace {

#ifdef ARCHWAY_REAL_MODULE

using testing::ProgramRun;
using testing::ScratchFolder;
using testing::WriteBytes;

// The border met along each scan line (a row, or a column when across is
// false), from the start of the line: where the picture's covered share
// crosses a half, to a fraction of a pixel. The picture is one grey level,
// so a pixel's share is its value over that level. Nothing on a line that
// meets no picture or starts in it.
std::vector<std::pair<int, double>> BorderAlong(const HostDocument& image, bool across, int level) {
  const int lines = across ? image.Height() : image.Width();
  const int length = across ? image.Width() : image.Height();
  std::vector<std::pair<int, double>> border;
  for (int line = 0; line < lines; ++line) {
    const auto share = [&](int at) {
      const int value = across ? image.Sample(0, at, line) : image.Sample(0, line, at);
      return double(value) / level;
    };
    for (int at = 0; at < length; ++at) {
      if (share(at) < 0.5) continue;
      // The half-share point between the last pixel under a half and this;
      // a picture that reaches the line's start has no border on it.
      if (at > 0) {
        const double before = share(at - 1);
        border.push_back({line, at - 0.5 + (0.5 - before) / (share(at) - before)});
      }
      break;
    }
  }
  return border;
}

// The largest distance of a border point from a parabola fitted to the 21
// points about it, over the stretches where the border runs steeply across
// the scan lines (under a pixel's step per line). A tooth of the mesh is a
// step of many pixels in and out within a few lines.
double LargestWobble(const std::vector<std::pair<int, double>>& border, int& checked) {
  constexpr int kHalf = 10;
  double largest = 0;
  checked = 0;
  for (size_t k = kHalf; k + kHalf < border.size(); ++k) {
    bool steep = border[k + kHalf].first - border[k - kHalf].first == 2 * kHalf;
    for (size_t m = k - kHalf; m < k + kHalf && steep; ++m)
      steep = std::fabs(border[m + 1].second - border[m].second) < 1.0;
    if (!steep) continue;
    ++checked;
    // Least squares of a + b t + c t^2, t the line about k.
    double s[5] = {}, r[3] = {};
    for (int t = -kHalf; t <= kHalf; ++t) {
      const double v = border[k + t].second;
      double p = 1;
      for (int d = 0; d < 5; ++d, p *= t) s[d] += p;
      r[0] += v, r[1] += v * t, r[2] += v * t * t;
    }
    // Odd sums vanish about the middle: b alone, then a and c from two.
    const double b = r[1] / s[2];
    const double c = (r[2] * s[0] - r[0] * s[2]) / (s[4] * s[0] - s[2] * s[2]);
    const double a = (r[0] - c * s[2]) / s[0];
    for (int t = -kHalf; t <= kHalf; ++t) {
      const double fit = a + b * t + c * t * t;
      largest = std::max(largest, std::fabs(border[k + t].second - fit));
    }
  }
  return largest;
}

// A plain grey photograph through a fisheye whose circle (90 degrees from
// the axis) lies inside the frame at the sides and is cut by it at the top
// and bottom: the result's left and right borders are the circle, its top
// and bottom the frame, bent by the correction.
TEST(ResultBorder, TheFisheyeCircleAndTheFrameComeOutSmoothAndAntiAliased) {
  ScratchFolder folder;
  constexpr int kWidth = 900, kHeight = 600, kLevel = 180;
  auto photo = HostDocument::Create(kWidth, kHeight, ImageMode::kRgb, false);
  testing::FillPlanes(*photo, {kLevel, kLevel, kLevel});
  const std::string input = folder.File("plain.tif"), output = folder.File("plain-out.png");
  ImageFile::Write(*photo, input);
  // 280 px: the circle's radius is 280 sqrt(2) = 396 px, under the half
  // width and over the half height. At 70 % the whole picture shows.
  const std::string action = folder.File("fisheye.action");
  WriteBytes(action,
             "archway-action 1\nprjM enumerated prjM fisP\nfocL float 280\nimgS integer 70\n");

  ProgramRun program({"apply", "--action", action, "-o", output, input}, {});
  ASSERT_TRUE(program.Started());
  const testing::Finished run = program.Finish();
  ASSERT_EQ(run.status, 0) << run.errors;
  const auto result = ImageFile::Read(output);
  ASSERT_EQ(result->Width(), kWidth);

  // Pixels between nothing and the picture: the anti-aliased rim.
  int partial = 0;
  for (int y = 0; y < kHeight; ++y)
    for (int x = 0; x < kWidth; ++x) {
      const int v = result->Sample(0, x, y);
      // Two steps off either end: the rounding of the share and of the kernel.
      partial += v > 2 && v < kLevel - 2;
    }
  EXPECT_GT(partial, kHeight) << "the border is drawn with in-between shares";

  for (const bool across : {true, false}) {
    SCOPED_TRACE(across ? "rows: the sides" : "columns: the top");
    const auto border = BorderAlong(*result, across, kLevel);
    int checked = 0;
    const double wobble = LargestWobble(border, checked);
    EXPECT_GT(checked, 100) << "long smooth stretches of border were found";
    // A smooth curve stays within a fraction of a pixel of its local
    // parabola; the mesh's teeth stood out by ten pixels and more.
    constexpr double kSmooth = 0.35;
    EXPECT_LT(wobble, kSmooth);
  }
}

#endif  // ARCHWAY_REAL_MODULE

}  // namespace
}  // namespace Host
