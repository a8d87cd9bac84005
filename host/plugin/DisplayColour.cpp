#include "host/plugin/DisplayColour.h"

#include <lcms2.h>

#include <algorithm>
#include <cmath>
#include <cstddef>
#include <new>
#include <utility>

#include "host/plugin/HostCodes.h"
#include "host/plugin/HostRecord.h"

namespace Host {

namespace {

struct ProfileCloser {
  void operator()(void* profile) const { cmsCloseProfile(profile); }
};
using Profile = std::unique_ptr<void, ProfileCloser>;

// The sample of plane k at (x, y) of a block.
uint8_t* At(const Tarsa::HostSampleBlock& block, int k, int32_t x, int32_t y) {
  return block.planes[k] + static_cast<std::ptrdiff_t>(y) * block.rowBytes +
         static_cast<std::ptrdiff_t>(x) * block.columnBytes;
}

bool HasPlanes(const Tarsa::HostSampleBlock& block, int count) {
  for (int k = 0; k < count; ++k) {
    if (block.planes[k] == nullptr) return false;
  }
  return true;
}

// A usable CMYK input profile: CMYK data, and a class that converts to the
// profile connection space (not a device link or an abstract profile).
bool IsCmykInput(cmsHPROFILE profile) {
  if (profile == nullptr || cmsGetColorSpace(profile) != cmsSigCmykData) return false;
  const cmsProfileClassSignature kind = cmsGetDeviceClass(profile);
  return kind == cmsSigOutputClass || kind == cmsSigInputClass || kind == cmsSigDisplayClass ||
         kind == cmsSigColorSpaceClass;
}

Tarsa::HostStatus ConvertForActiveRecord(int16_t mode, int32_t width, int32_t height,
                                         const Tarsa::HostSampleBlock* source,
                                         const Tarsa::HostSampleBlock* destination) {
  if (source == nullptr || destination == nullptr || width < 1 || height < 1 ||
      width > Tarsa::kDisplayBlockSide || height > Tarsa::kDisplayBlockSide) {
    return HostCodes::kParamErr;
  }
  HostRecord* record = HostRecord::Active();
  if (record == nullptr) return HostCodes::kParamErr;
  try {
    return record->Display().Convert(mode, width, height, *source, *destination)
               ? HostCodes::kNoError
               : HostCodes::kNotAvailable;
  } catch (const std::bad_alloc&) {  // nothing may leave a C entry
    return HostCodes::kMemFullErr;
  }
}

constexpr Tarsa::HostDisplayColourSuite kSuite = {ConvertForActiveRecord};

}  // namespace

void DisplayColour::TransformCloser::operator()(void* transform) const {
  cmsDeleteTransform(transform);
}

DisplayColour::DisplayColour(std::vector<uint8_t> documentProfile, std::string defaultCmykProfile)
    : documentProfile_(std::move(documentProfile)),
      defaultCmykProfile_(std::move(defaultCmykProfile)) {}

DisplayColour::~DisplayColour() = default;

const Tarsa::HostDisplayColourSuite* DisplayColour::Suite() { return &kSuite; }

DisplayColour::Transform DisplayColour::MakeCmykTransform() {
  // Black point compensation: the deepest black a press makes is a dark
  // gray; scaled to the screen's black the picture keeps its depth.
  const auto make = [](cmsHPROFILE cmyk) {
    if (!IsCmykInput(cmyk)) return Transform();
    Profile srgb(cmsCreate_sRGBProfile());
    if (!srgb) return Transform();
    // The host counts paper, not ink: 255 is no ink, as in the _REV types.
    // Precalculated at 8 bits on the finer grid: the profile is itself a
    // sampled table, and this keeps a block at a fifth of the float road's
    // time.
    return Transform(cmsCreateTransform(cmyk, TYPE_CMYK_8_REV, srgb.get(), TYPE_RGB_8,
                                        INTENT_RELATIVE_COLORIMETRIC,
                                        cmsFLAGS_BLACKPOINTCOMPENSATION | cmsFLAGS_HIGHRESPRECALC));
  };
  if (!documentProfile_.empty()) {
    Profile own(cmsOpenProfileFromMem(documentProfile_.data(),
                                      static_cast<cmsUInt32Number>(documentProfile_.size())));
    if (Transform transform = make(own.get())) {
      cmykProfile_ = CmykProfile::kDocument;
      return transform;
    }
  }
  Profile fallback(cmsOpenProfileFromFile(defaultCmykProfile_.c_str(), "r"));
  if (Transform transform = make(fallback.get())) {
    cmykProfile_ = CmykProfile::kDefault;
    return transform;
  }
  cmykProfile_ = CmykProfile::kNone;
  return Transform();
}

void* DisplayColour::TransformOf(ColourModel model) {
  if (model == ColourModel::kLab) {
    if (!lab_) {
      Profile lab(cmsCreateLab4Profile(nullptr));  // D50
      Profile srgb(cmsCreate_sRGBProfile());
      // In floating point: precalculated for 8 bits, the transform samples
      // Lab on a grid, and the cells that straddle sRGB's gamut boundary
      // are off by tens of levels (grays not even neutral).
      if (lab && srgb) {
        lab_.reset(cmsCreateTransform(lab.get(), TYPE_Lab_FLT, srgb.get(), TYPE_RGB_FLT,
                                      INTENT_RELATIVE_COLORIMETRIC, cmsFLAGS_NOCACHE));
      }
    }
    return lab_.get();
  }
  if (!cmykTried_) {
    cmyk_ = MakeCmykTransform();
    cmykTried_ = true;
  }
  return cmyk_.get();
}

void DisplayColour::LabRow(void* transform, size_t count) {
  // The host's Lab: L* 0..100 as 0..255, a* and b* with 128 as neutral.
  float* lab = rowFloat_.data();
  float* rgb = lab + 3 * count;
  for (size_t i = 0; i < count; ++i) {
    lab[3 * i] = rowIn_[3 * i] * (100.0f / 255.0f);
    lab[3 * i + 1] = rowIn_[3 * i + 1] - 128.0f;
    lab[3 * i + 2] = rowIn_[3 * i + 2] - 128.0f;
  }
  cmsDoTransform(transform, lab, rgb, static_cast<cmsUInt32Number>(count));
  for (size_t i = 0; i < 3 * count; ++i) {
    rowOut_[i] = static_cast<uint8_t>(std::lround(std::clamp(rgb[i], 0.0f, 1.0f) * 255.0f));
  }
}

DisplayColour::CmykProfile DisplayColour::CmykProfileInUse() {
  TransformOf(ColourModel::kCmyk);
  return cmykProfile_;
}

bool DisplayColour::Convert(int16_t mode, int32_t width, int32_t height,
                            const Tarsa::HostSampleBlock& source,
                            const Tarsa::HostSampleBlock& destination) {
  if (!IsImageMode(mode) || width < 0 || height < 0) return false;
  const ColourModel model = ColourModelOf(static_cast<ImageMode>(mode));
  const int channels = ColourPlanesOf(model);
  if (!HasPlanes(source, channels) || !HasPlanes(destination, 3)) return false;
  void* transform = nullptr;
  if (model == ColourModel::kLab || model == ColourModel::kCmyk) {
    transform = TransformOf(model);
    if (transform == nullptr) return false;
  }
  const auto count = static_cast<size_t>(width);
  rowIn_.resize(count * channels);
  rowOut_.resize(count * 3);
  if (model == ColourModel::kLab) rowFloat_.resize(count * 6);
  for (int32_t y = 0; y < height; ++y) {
    // Gathered into one interleaved row, whatever the caller's strides, so
    // that every model takes the same road to the destination.
    for (int32_t x = 0; x < width; ++x) {
      for (int k = 0; k < channels; ++k) rowIn_[x * channels + k] = *At(source, k, x, y);
    }
    const uint8_t* rgb = rowOut_.data();
    switch (model) {
      case ColourModel::kRgb:
        rgb = rowIn_.data();
        break;
      case ColourModel::kGray:
        for (size_t x = 0; x < count; ++x) {
          rowOut_[3 * x] = rowOut_[3 * x + 1] = rowOut_[3 * x + 2] = rowIn_[x];
        }
        break;
      case ColourModel::kCmyk:
        cmsDoTransform(transform, rowIn_.data(), rowOut_.data(),
                       static_cast<cmsUInt32Number>(count));
        break;
      case ColourModel::kLab:
        LabRow(transform, count);
        break;
    }
    for (int32_t x = 0; x < width; ++x) {
      for (int k = 0; k < 3; ++k) *At(destination, k, x, y) = rgb[3 * x + k];
    }
  }
  return true;
}

}  // namespace Host
