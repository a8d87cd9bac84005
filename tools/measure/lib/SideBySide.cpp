#include "tools/measure/lib/SideBySide.h"

#include <algorithm>
#include <cmath>

#include "tools/measure/lib/MeasureError.h"

namespace Measure {
namespace {

// The gap's gray: light, and apart from both pictures' black surrounds.
constexpr int kGapGray = 236;

// Copies an image into the composite at column x0, scaled to the
// composite's height by averaging the source pixels each target covers.
void Paste(const Host::HostDocument& source, Host::HostDocument* target, int x0, int width) {
  const int height = target->Height();
  const double scale = static_cast<double>(source.Height()) / height;
  const bool gray = source.Model() == Host::ColourModel::kGray;
  const double toByte = 255.0 / source.MaxSample();
  for (int y = 0; y < height; ++y) {
    const int sy0 = std::min(source.Height() - 1, static_cast<int>(std::floor(y * scale)));
    const int sy1 =
        std::max(sy0 + 1, std::min(source.Height(), static_cast<int>(std::ceil((y + 1) * scale))));
    for (int x = 0; x < width; ++x) {
      const int sx0 = std::min(source.Width() - 1, static_cast<int>(std::floor(x * scale)));
      const int sx1 =
          std::max(sx0 + 1, std::min(source.Width(), static_cast<int>(std::ceil((x + 1) * scale))));
      for (int p = 0; p < 3; ++p) {
        double sum = 0.0;
        for (int sy = sy0; sy < sy1; ++sy) {
          for (int sx = sx0; sx < sx1; ++sx) sum += source.Sample(gray ? 0 : p, sx, sy);
        }
        const double mean = sum / ((sy1 - sy0) * (sx1 - sx0));
        target->SetSample(p, x0 + x, y,
                          std::clamp(static_cast<int>(std::lround(mean * toByte)), 0, 255));
      }
    }
  }
}

}  // namespace

std::unique_ptr<Host::HostDocument> SideBySide::Compose(const Host::HostDocument& left,
                                                        const Host::HostDocument& right) {
  for (const Host::HostDocument* image : {&left, &right}) {
    if (image->Model() != Host::ColourModel::kRgb && image->Model() != Host::ColourModel::kGray) {
      throw MeasureError("only gray and RGB images can be put side by side");
    }
  }
  const int height = std::min(left.Height(), right.Height());
  const auto scaledWidth = [height](const Host::HostDocument& image) {
    return std::max(1, static_cast<int>(std::lround(static_cast<double>(image.Width()) * height /
                                                    image.Height())));
  };
  const int leftWidth = scaledWidth(left), rightWidth = scaledWidth(right);
  auto composite =
      Host::HostDocument::Create(leftWidth + kGap + rightWidth, height, Host::ImageMode::kRgb);
  for (int y = 0; y < height; ++y) {
    for (int x = leftWidth; x < leftWidth + kGap; ++x) {
      for (int p = 0; p < 3; ++p) composite->SetSample(p, x, y, kGapGray);
    }
  }
  Paste(left, composite.get(), 0, leftWidth);
  Paste(right, composite.get(), leftWidth + kGap, rightWidth);
  return composite;
}

}  // namespace Measure
