#pragma once

#include <cstddef>
#include <cstdint>
#include <memory>
#include <string>
#include <vector>

#include "framework/plugin/HostSuites.h"
#include "host/io/ImageMode.h"

namespace Host {

// The display conversion of one document, served to the filter as the
// display colour suite: 8-bit samples of the document's mode to 8-bit sRGB.
// RGB passes as it is (the host does not manage the colours of RGB
// documents) and gray is repeated in all three; Lab (D50, the host's
// encoding) and CMYK go through LittleCMS, relative colorimetric. CMYK is
// read through the document's own ICC profile when it has a usable CMYK
// one, else through a default press profile from the system, with black
// point compensation so that the deepest ink shows as the screen's black.
// The transforms are made on first use and kept for the document's run.
// Owns its profiles and transforms.
class DisplayColour {
 public:
  // The default CMYK profile: a characterised coated press profile of US web
  // offset that the set-up installs with the system's PostScript profiles.
  // A measured press describes CMYK better than any formula could.
  static constexpr const char kDefaultCmykProfile[] =
      "/usr/share/color/icc/ghostscript/default_cmyk.icc";

  // Where a CMYK conversion takes its profile from.
  enum class CmykProfile { kDocument, kDefault, kNone };

  // documentProfile: the ICC profile the file embeds, empty for none.
  explicit DisplayColour(std::vector<uint8_t> documentProfile = {},
                         std::string defaultCmykProfile = kDefaultCmykProfile);
  ~DisplayColour();

  DisplayColour(const DisplayColour&) = delete;
  DisplayColour& operator=(const DisplayColour&) = delete;

  // Converts width x height pixels of source's colour planes in mode (one of
  // the eight; 16-bit modes stand for their 8-bit twins) into destination's
  // planes 0, 1, 2. Any size; the suite is what holds callers to the block
  // limit. False for a mode the host does not know, a plane missing, or
  // CMYK with no profile to be had.
  bool Convert(int16_t mode, int32_t width, int32_t height, const Tarsa::HostSampleBlock& source,
               const Tarsa::HostSampleBlock& destination);

  // Which profile CMYK is read through; makes the transform if need be.
  CmykProfile CmykProfileInUse();

  // The suite. Its entry converts for the record whose selector is running
  // and answers HostCodes::kParamErr for a block outside 1 to 512 a side or
  // with no record, HostCodes::kNotAvailable when Convert fails.
  static const Tarsa::HostDisplayColourSuite* Suite();

 private:
  struct TransformCloser {
    void operator()(void* transform) const;
  };
  using Transform = std::unique_ptr<void, TransformCloser>;

  // The transform of a model that needs one, made on first use; null when
  // it cannot be made.
  void* TransformOf(ColourModel model);
  Transform MakeCmykTransform();
  // rowIn_'s count Lab pixels into rowOut_, through rowFloat_.
  void LabRow(void* transform, size_t count);

  std::vector<uint8_t> documentProfile_;
  std::string defaultCmykProfile_;
  Transform lab_;
  Transform cmyk_;
  CmykProfile cmykProfile_ = CmykProfile::kNone;
  bool cmykTried_ = false;
  std::vector<uint8_t> rowIn_;
  std::vector<uint8_t> rowOut_;
  std::vector<float> rowFloat_;
};

}  // namespace Host
