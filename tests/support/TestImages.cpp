#include "tests/support/TestImages.h"

#include <algorithm>
#include <cmath>
#include <random>

namespace Host::testing {

std::unique_ptr<HostDocument> RandomDocument(int32_t width, int32_t height, ImageMode mode,
                                             bool transparency, uint32_t seed) {
  auto document = HostDocument::Create(width, height, mode, transparency);
  std::mt19937 random(seed);
  std::uniform_int_distribution<int> sample(0, document->MaxSample());
  for (int p = 0; p < document->PlaneCount(); ++p) {
    for (int32_t i = 0; i < width * height; ++i)
      document->SetSample(p, i % width, i / width, sample(random));
  }
  return document;
}

std::unique_ptr<HostDocument> PhotoLikeDocument(int32_t width, int32_t height, ImageMode mode,
                                                uint32_t seed) {
  auto document = HostDocument::Create(width, height, mode);
  std::mt19937 random(seed);
  std::uniform_int_distribution<int> noise(-3, 3);
  for (int p = 0; p < document->PlaneCount(); ++p) {
    for (int32_t y = 0; y < height; ++y) {
      for (int32_t x = 0; x < width; ++x) {
        const double wave = 0.5 + 0.4 * std::sin(0.05 * x + 1.3 * p) * std::cos(0.07 * y - p);
        document->SetSample(p, x, y,
                            static_cast<int>(wave * document->MaxSample()) + noise(random));
      }
    }
  }
  return document;
}

void FillDetail(HostDocument& document) {
  for (int p = 0; p < document.PlaneCount(); ++p) {
    for (int32_t y = 0; y < document.Height(); ++y) {
      for (int32_t x = 0; x < document.Width(); ++x)
        document.SetSample(p, x, y, (x * 7 + y * 13 + p * 50 + (x * y) % 17) % 256);
    }
  }
}

void FillWaves(HostDocument& document) {
  const int max = document.MaxSample();
  for (int p = 0; p < document.PlaneCount(); ++p) {
    for (int32_t y = 0; y < document.Height(); ++y) {
      for (int32_t x = 0; x < document.Width(); ++x) {
        const double wave = 0.5 +
                            0.25 * std::sin(x * 0.21 + p * 1.3) * std::cos(y * 0.17 + p * 0.7) +
                            0.2 * std::sin(x * 0.9 + y * 0.7 + p);
        document.SetSample(p, x, y, int(std::lround(wave * max)));
      }
    }
  }
}

void FillPlanes(HostDocument& document, std::initializer_list<int> values) {
  int p = 0;
  for (const int value : values) {
    for (int32_t y = 0; y < document.Height(); ++y) {
      for (int32_t x = 0; x < document.Width(); ++x) document.SetSample(p, x, y, value);
    }
    if (++p == document.PlaneCount()) break;
  }
}

std::unique_ptr<HostDocument> CopyDocument(const HostDocument& document) {
  auto copy = HostDocument::Create(document.Width(), document.Height(), document.Mode(),
                                   document.HasTransparency());
  for (int p = 0; p < document.PlaneCount(); ++p) {
    for (int32_t y = 0; y < document.Height(); ++y) {
      for (int32_t x = 0; x < document.Width(); ++x)
        copy->SetSample(p, x, y, document.Sample(p, x, y));
    }
  }
  return copy;
}

int LargestDifference(const HostDocument& a, const HostDocument& b) {
  if (a.Width() != b.Width() || a.Height() != b.Height() || a.Mode() != b.Mode() ||
      a.PlaneCount() != b.PlaneCount()) {
    return -1;
  }
  int largest = 0;
  for (int p = 0; p < a.PlaneCount(); ++p) {
    for (int32_t i = 0; i < a.Width() * a.Height(); ++i) {
      const int32_t x = i % a.Width();
      const int32_t y = i / a.Width();
      largest = std::max(largest, std::abs(a.Sample(p, x, y) - b.Sample(p, x, y)));
    }
  }
  return largest;
}

}  // namespace Host::testing
