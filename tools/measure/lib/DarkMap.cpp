#include "tools/measure/lib/DarkMap.h"

#include <algorithm>
#include <array>

#include "tools/measure/lib/MeasureError.h"

namespace Measure {
namespace {

// Samples at most this fraction of full scale in every colour plane are
// black: the fill outside a corrected picture, never the meter's ink.
constexpr double kBlackFraction = 0.03;
// The outside is widened by this many pixels, for the resampled rim.
constexpr int kRim = 3;
// Lightness differences below this are rounding, not ink.
constexpr float kInkFloor = 0.015f;
constexpr int kHistogramBins = 1024;

}  // namespace

DarkMap::DarkMap(const Host::HostDocument& image)
    : width_(image.Width()),
      height_(image.Height()),
      lightness_(image.SamplesPerPlane()),
      outside_(image.SamplesPerPlane(), 0) {
  if (image.Model() == Host::ColourModel::kCmyk) {
    throw MeasureError("CMYK images cannot be measured; convert them to RGB first");
  }
  const double scale = 1.0 / image.MaxSample();
  const bool rgb = image.Model() == Host::ColourModel::kRgb;
  for (int y = 0; y < height_; ++y) {
    for (int x = 0; x < width_; ++x) {
      // Lab's first plane is L*; gray's only plane is the gray.
      const double value = rgb ? 0.299 * image.Sample(0, x, y) + 0.587 * image.Sample(1, x, y) +
                                     0.114 * image.Sample(2, x, y)
                               : image.Sample(0, x, y);
      lightness_[Index(x, y)] = static_cast<float>(value * scale);
    }
  }
  MarkOutside(image);

  std::array<std::size_t, kHistogramBins> histogram{};
  std::size_t inside = 0;
  for (std::size_t i = 0; i < lightness_.size(); ++i) {
    if (outside_[i]) continue;
    const int bin =
        std::clamp(static_cast<int>(lightness_[i] * kHistogramBins), 0, kHistogramBins - 1);
    ++histogram[bin];
    ++inside;
  }
  if (inside == 0) throw MeasureError("the image holds no picture, only its outside");
  std::size_t seen = 0;
  for (int bin = 0; bin < kHistogramBins; ++bin) {
    seen += histogram[bin];
    if (2 * seen >= inside) {
      background_ = (bin + 0.5) / kHistogramBins;
      break;
    }
  }
}

void DarkMap::MarkOutside(const Host::HostDocument& image) {
  const int planes = image.Model() == Host::ColourModel::kRgb ? 3 : 1;
  const double blackest = kBlackFraction * image.MaxSample();
  const auto black = [&](int x, int y) {
    for (int p = 0; p < planes; ++p) {
      if (image.Sample(p, x, y) > blackest) return false;
    }
    return true;
  };
  std::vector<std::uint8_t> seed(outside_.size(), 0);
  if (image.HasTransparency()) {
    const int half = image.MaxSample() / 2;
    for (int y = 0; y < height_; ++y) {
      for (int x = 0; x < width_; ++x) {
        if (image.Sample(image.TransparencyPlane(), x, y) < half) seed[Index(x, y)] = 1;
      }
    }
  }
  // Flood the black from the border (4-connected).
  std::vector<std::pair<int, int>> stack;
  const auto push = [&](int x, int y) {
    if (x < 0 || y < 0 || x >= width_ || y >= height_) return;
    std::uint8_t& mark = seed[Index(x, y)];
    if (mark == 2 || !black(x, y)) return;
    mark = 2;
    stack.emplace_back(x, y);
  };
  for (int x = 0; x < width_; ++x) {
    push(x, 0);
    push(x, height_ - 1);
  }
  for (int y = 0; y < height_; ++y) {
    push(0, y);
    push(width_ - 1, y);
  }
  while (!stack.empty()) {
    const auto [x, y] = stack.back();
    stack.pop_back();
    push(x + 1, y);
    push(x - 1, y);
    push(x, y + 1);
    push(x, y - 1);
  }
  // Widen by kRim in each direction: rows, then columns.
  std::vector<std::uint8_t> rows(outside_.size(), 0);
  for (int y = 0; y < height_; ++y) {
    for (int x = 0; x < width_; ++x) {
      if (!seed[Index(x, y)]) continue;
      for (int dx = std::max(0, x - kRim); dx <= std::min(width_ - 1, x + kRim); ++dx) {
        rows[Index(dx, y)] = 1;
      }
    }
  }
  for (int y = 0; y < height_; ++y) {
    for (int x = 0; x < width_; ++x) {
      if (!rows[Index(x, y)]) continue;
      for (int dy = std::max(0, y - kRim); dy <= std::min(height_ - 1, y + kRim); ++dy) {
        outside_[Index(x, dy)] = 1;
      }
    }
  }
}

bool DarkMap::Dark(int x, int y) const {
  const std::size_t i = Index(x, y);
  return !outside_[i] && lightness_[i] < kDarkFraction * background_;
}

float DarkMap::Ink(int x, int y) const {
  const std::size_t i = Index(x, y);
  if (outside_[i]) return 0.0f;
  return std::max(0.0f, static_cast<float>(background_) - lightness_[i] - kInkFloor);
}

}  // namespace Measure
