#include "framework/plugin/CDisplayConversion.h"

#include <algorithm>
#include <cmath>
#include <cstddef>

#include "framework/core/CException.h"

namespace Tarsa {

namespace {

constexpr const char* kBadPixmapText =
    "$$$/Tarsa/Display/Error/Pixmap=The colours for the screen were asked of an image they cannot "
    "be made from.";

enum class EModel { kGray, kRgb, kCmyk, kLab };

EModel ModelOf(std::int32_t mode) {
  switch (mode) {
    case kHostModeRGB:
    case kHostModeRGB48:
      return EModel::kRgb;
    case kHostModeCMYK:
    case kHostModeCMYK64:
      return EModel::kCmyk;
    case kHostModeLab:
    case kHostModeLab48:
      return EModel::kLab;
    default:
      return EModel::kGray;
  }
}

std::uint32_t ColourPlanesOf(EModel model) {
  switch (model) {
    case EModel::kGray:
      return 1;
    case EModel::kCmyk:
      return 4;
    default:
      return 3;
  }
}

std::uint8_t* At(const HostSampleBlock& block, int k, std::int32_t x, std::int32_t y) {
  return block.planes[k] + std::ptrdiff_t(y) * block.rowBytes +
         std::ptrdiff_t(x) * block.columnBytes;
}

// A block of the pixmap from (x, y), in the wire form. The host only reads a
// source, so its planes may be handed over without const.
HostSampleBlock BlockOf(const CBasicPixmap& pixmap, std::uint32_t planes, std::int32_t x,
                        std::int32_t y) {
  HostSampleBlock block{};
  for (std::uint32_t k = 0; k < planes; ++k) {
    block.planes[k] = const_cast<std::uint8_t*>(pixmap.Address(k, x, y));
  }
  block.rowBytes = std::int32_t(pixmap.RowBytes());
  block.columnBytes = std::int32_t(pixmap.ColumnBytes());
  return block;
}

std::uint8_t Encode(double linear) {
  const double c = linear <= 0.0031308 ? 12.92 * linear : 1.055 * std::pow(linear, 1 / 2.4) - 0.055;
  return std::uint8_t(std::lround(std::clamp(c, 0.0, 1.0) * 255));
}

// Lab with L* 0..100 as 0..255 and a*, b* around 128, white D50; to sRGB
// through XYZ, with sRGB's matrix adapted to D50 by Bradford's transform.
void LabToRgb(const std::uint8_t lab[3], std::uint8_t rgb[3]) {
  const auto inverse = [](double t) {
    constexpr double kDelta = 6.0 / 29.0;
    return t > kDelta ? t * t * t : 3 * kDelta * kDelta * (t - 4.0 / 29.0);
  };
  const double fy = (lab[0] * (100.0 / 255.0) + 16) / 116;
  const double x = 0.9642 * inverse(fy + (lab[1] - 128) / 500.0);
  const double y = inverse(fy);
  const double z = 0.8249 * inverse(fy - (lab[2] - 128) / 200.0);
  rgb[0] = Encode(3.1338561 * x - 1.6168667 * y - 0.4906146 * z);
  rgb[1] = Encode(-0.9787684 * x + 1.9161415 * y + 0.0334540 * z);
  rgb[2] = Encode(0.0719453 * x - 0.2289914 * y + 1.4052427 * z);
}

// The host's CMYK counts paper (255 is no ink): each ink takes its share of
// one primary, black of all three.
void CmykToRgb(const std::uint8_t cmyk[4], std::uint8_t rgb[3]) {
  for (int k = 0; k < 3; ++k) rgb[k] = std::uint8_t((cmyk[k] * cmyk[3] + 127) / 255);
}

}  // namespace

void CDisplayConversion::ConvertPlainly(std::int32_t mode, std::int32_t width, std::int32_t height,
                                        const HostSampleBlock& source,
                                        const HostSampleBlock& destination) {
  const EModel model = ModelOf(mode);
  const std::uint32_t planes = ColourPlanesOf(model);
  for (std::int32_t y = 0; y < height; ++y) {
    for (std::int32_t x = 0; x < width; ++x) {
      std::uint8_t in[4];
      for (std::uint32_t k = 0; k < planes; ++k) in[k] = *At(source, int(k), x, y);
      std::uint8_t out[3];
      switch (model) {
        case EModel::kGray:
          out[0] = out[1] = out[2] = in[0];
          break;
        case EModel::kRgb:
          std::copy_n(in, 3, out);
          break;
        case EModel::kCmyk:
          CmykToRgb(in, out);
          break;
        case EModel::kLab:
          LabToRgb(in, out);
          break;
      }
      for (int k = 0; k < 3; ++k) *At(destination, k, x, y) = out[k];
    }
  }
}

void CDisplayConversion::Convert(std::int32_t mode, const CBasicPixmap& source, const CRect& area,
                                 CBasicPixmap& destination, CPoint to) const {
  if (area.IsEmpty()) return;
  const std::uint32_t planes = ColourPlanesOf(ModelOf(mode));
  const CRect target = area.Offset(to.x - area.left, to.y - area.top);
  if (source.Depth() != 8 || destination.Depth() != 8 || source.Planes() < planes ||
      destination.Planes() < 3 || !source.Bounds().Contains(area) ||
      !destination.Bounds().Contains(target)) {
    throw CError(kBadPixmapText);
  }
  for (std::int32_t top = area.top; top < area.bottom; top += kDisplayBlockSide) {
    for (std::int32_t left = area.left; left < area.right; left += kDisplayBlockSide) {
      const auto width = std::int32_t(std::min<std::int64_t>(kDisplayBlockSide, area.right - left));
      const auto height =
          std::int32_t(std::min<std::int64_t>(kDisplayBlockSide, area.bottom - top));
      const HostSampleBlock from = BlockOf(source, planes, left, top);
      const HostSampleBlock into =
          BlockOf(destination, 3, target.left + (left - area.left), target.top + (top - area.top));
      if (suite_ == nullptr || suite_->convertToDisplay == nullptr ||
          suite_->convertToDisplay(std::int16_t(mode), width, height, &from, &into) != 0) {
        ConvertPlainly(mode, width, height, from, into);
      }
    }
  }
}

}  // namespace Tarsa
