#include "tools/synth/lib/PixelEncoder.h"

#include <algorithm>
#include <cmath>

namespace Synth {
namespace {

double Linear(double c) { return c <= 0.04045 ? c / 12.92 : std::pow((c + 0.055) / 1.055, 2.4); }

double LabCurve(double t) {
  constexpr double kDelta = 6.0 / 29.0;
  return t > kDelta * kDelta * kDelta ? std::cbrt(t) : t / (3.0 * kDelta * kDelta) + 4.0 / 29.0;
}

}  // namespace

PixelEncoder::PixelEncoder(Host::HostDocument* document)
    : document_(document), model_(document->Model()), maxSample_(document->MaxSample()) {}

void PixelEncoder::Store(size_t index, const double* values) {
  for (int plane = 0; plane < document_->ColourPlanes(); ++plane) {
    const double sample = std::round(std::clamp(values[plane], 0.0, 1.0) * maxSample_);
    if (document_->Depth() == 16) {
      document_->Plane16(plane)[index] = static_cast<uint16_t>(sample);
    } else {
      document_->Plane8(plane)[index] = static_cast<uint8_t>(sample);
    }
  }
}

void PixelEncoder::Put(int32_t x, int32_t y, const Rgb& c) {
  const size_t index = static_cast<size_t>(y) * document_->Width() + x;
  double values[4] = {c.r, c.g, c.b, 0.0};
  switch (model_) {
    case Host::ColourModel::kRgb:
      break;
    case Host::ColourModel::kGray:
      values[0] = 0.299 * c.r + 0.587 * c.g + 0.114 * c.b;
      break;
    case Host::ColourModel::kCmyk: {
      // The host's CMYK planes hold full scale for no ink.
      const double black = 1.0 - std::max({c.r, c.g, c.b});
      const double rest = 1.0 - black;
      const double ink[3] = {rest > 0.0 ? (rest - c.r) / rest : 0.0,
                             rest > 0.0 ? (rest - c.g) / rest : 0.0,
                             rest > 0.0 ? (rest - c.b) / rest : 0.0};
      values[0] = 1.0 - ink[0];
      values[1] = 1.0 - ink[1];
      values[2] = 1.0 - ink[2];
      values[3] = 1.0 - black;
      break;
    }
    case Host::ColourModel::kLab: {
      const double r = Linear(c.r);
      const double g = Linear(c.g);
      const double b = Linear(c.b);
      const double fx = LabCurve((0.4124 * r + 0.3576 * g + 0.1805 * b) / 0.95047);
      const double fy = LabCurve(0.2126 * r + 0.7152 * g + 0.0722 * b);
      const double fz = LabCurve((0.0193 * r + 0.1192 * g + 0.9505 * b) / 1.08883);
      // L* 0..100 over the full scale; a*, b* one unit a step of 8-bit
      // samples (128 steps of 16-bit ones), 128 (16384) neutral.
      const double steps = document_->Depth() == 16 ? 256.0 : 255.0;
      values[0] = (116.0 * fy - 16.0) / 100.0;
      values[1] = (500.0 * (fx - fy) + 128.0) / steps;
      values[2] = (200.0 * (fy - fz) + 128.0) / steps;
      break;
    }
  }
  Store(index, values);
}

}  // namespace Synth
