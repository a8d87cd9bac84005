#pragma once

#include <cstdint>

namespace Host {

// The host's image modes, numbered as the plug-in interface numbers them. Only
// these eight are ever handed to the module.
enum class ImageMode : int16_t {
  kGray = 1,
  kRgb = 3,
  kCmyk = 4,
  kLab = 9,
  kGray16 = 10,
  kRgb48 = 11,
  kLab48 = 12,
  kCmyk64 = 13,
};

// The colour model of a mode, regardless of depth.
enum class ColourModel { kGray, kRgb, kCmyk, kLab };

// Host sample conventions. 16-bit planes run from 0 to 32768, not 65535.
// CMYK planes hold 255 (32768) for no ink and 0 for full ink. Lab planes hold
// L* 0..100 as 0..255 (0..32768) and a*, b* with 128 (16384) as neutral.
inline constexpr int kMax8 = 255;
inline constexpr int kMax16 = 32768;

constexpr int DepthOf(ImageMode mode) { return static_cast<int>(mode) >= 10 ? 16 : 8; }

constexpr ColourModel ColourModelOf(ImageMode mode) {
  switch (mode) {
    case ImageMode::kGray:
    case ImageMode::kGray16:
      return ColourModel::kGray;
    case ImageMode::kRgb:
    case ImageMode::kRgb48:
      return ColourModel::kRgb;
    case ImageMode::kCmyk:
    case ImageMode::kCmyk64:
      return ColourModel::kCmyk;
    case ImageMode::kLab:
    case ImageMode::kLab48:
      return ColourModel::kLab;
  }
  return ColourModel::kGray;
}

constexpr int ColourPlanesOf(ColourModel model) {
  switch (model) {
    case ColourModel::kGray:
      return 1;
    case ColourModel::kRgb:
    case ColourModel::kLab:
      return 3;
    case ColourModel::kCmyk:
      return 4;
  }
  return 1;
}

constexpr int ColourPlanesOf(ImageMode mode) { return ColourPlanesOf(ColourModelOf(mode)); }

// The mode of a colour model at depth 8 or 16.
constexpr ImageMode ModeOf(ColourModel model, int depth) {
  const bool deep = depth == 16;
  switch (model) {
    case ColourModel::kGray:
      return deep ? ImageMode::kGray16 : ImageMode::kGray;
    case ColourModel::kRgb:
      return deep ? ImageMode::kRgb48 : ImageMode::kRgb;
    case ColourModel::kCmyk:
      return deep ? ImageMode::kCmyk64 : ImageMode::kCmyk;
    case ColourModel::kLab:
      return deep ? ImageMode::kLab48 : ImageMode::kLab;
  }
  return ImageMode::kGray;
}

// Whether a number is one of the eight modes.
constexpr bool IsImageMode(int value) {
  switch (value) {
    case 1:
    case 3:
    case 4:
    case 9:
    case 10:
    case 11:
    case 12:
    case 13:
      return true;
    default:
      return false;
  }
}

// A short name for messages, e.g. "RGB 16-bit".
const char* ModeName(ImageMode mode);

}  // namespace Host
