#pragma once

#include <cstddef>
#include <cstdint>
#include <memory>
#include <span>
#include <string>
#include <vector>

#include "host/io/FileFormat.h"
#include "host/io/ImageMode.h"

namespace Host {

// A document as the host holds it: one image in one of the host's modes,
// stored planar, one contiguous buffer per plane (uint8 for 8-bit modes,
// uint16 for 16-bit ones), row after row with no padding. The colour planes
// come first, in the mode's order; the transparency plane, when present, is
// the last plane (0 transparent, full scale opaque). The document owns its
// planes; the file it came from is remembered by name only.
class HostDocument {
 public:
  // Sides beyond this are refused as implausible; 32-bit coordinates hold them.
  static constexpr int32_t kMaxSide = 1000000;

  // The most bytes one document's samples may take: the machine's physical
  // memory, unless set lower (a tool, or the fuzz targets). The readers check
  // a file's stated size against it before anything is allocated, and hold
  // their image libraries' own buffers to it. Setting 0 restores the default.
  static uint64_t MemoryLimit();
  static void SetMemoryLimit(uint64_t bytes);

  // A blank document: white (no ink for CMYK, L* 100 and neutral for Lab),
  // fully opaque. Throws HostError for a size out of range or one that needs
  // more memory than the machine has; std::bad_alloc when allocation fails.
  static std::unique_ptr<HostDocument> Create(int32_t width, int32_t height, ImageMode mode,
                                              bool hasTransparency = false);
  // Same, with the samples left undefined: for readers that fill every sample.
  static std::unique_ptr<HostDocument> CreateUnfilled(int32_t width, int32_t height, ImageMode mode,
                                                      bool hasTransparency);

  // A copy of every sample, the resolution and the source; throws as Create.
  std::unique_ptr<HostDocument> Duplicate() const;

  HostDocument(const HostDocument&) = delete;
  HostDocument& operator=(const HostDocument&) = delete;

  int32_t Width() const { return width_; }
  int32_t Height() const { return height_; }
  ImageMode Mode() const { return mode_; }
  ColourModel Model() const { return ColourModelOf(mode_); }
  int Depth() const { return DepthOf(mode_); }
  // Full scale of a sample: 255 or 32768.
  int MaxSample() const { return Depth() == 16 ? kMax16 : kMax8; }
  int ColourPlanes() const { return ColourPlanesOf(mode_); }
  bool HasTransparency() const { return hasTransparency_; }
  // Colour planes plus the transparency plane.
  int PlaneCount() const { return ColourPlanes() + (hasTransparency_ ? 1 : 0); }
  int TransparencyPlane() const { return ColourPlanes(); }
  size_t SamplesPerPlane() const { return static_cast<size_t>(width_) * height_; }

  // A plane's samples; Plane8 for 8-bit documents, Plane16 for 16-bit ones.
  std::span<uint8_t> Plane8(int plane);
  std::span<const uint8_t> Plane8(int plane) const;
  std::span<uint16_t> Plane16(int plane);
  std::span<const uint16_t> Plane16(int plane) const;

  // One sample, whatever the depth; for tests and small tools, not for loops.
  int Sample(int plane, int32_t x, int32_t y) const;
  void SetSample(int plane, int32_t x, int32_t y, int value);

  // Dots per inch, horizontally and vertically; 72 when the file says nothing.
  double ResolutionX() const { return resolutionX_; }
  double ResolutionY() const { return resolutionY_; }
  void SetResolution(double x, double y);

  // The file the document was read from, and its format; empty and kNone for
  // a document made in memory.
  const std::string& SourcePath() const { return sourcePath_; }
  FileFormat SourceFormat() const { return sourceFormat_; }
  void SetSource(std::string path, FileFormat format);

  // The ICC profile the file embeds, as its bytes; empty when it has none.
  // Kept as read, for the display conversion and for writing back.
  const std::vector<uint8_t>& ColourProfile() const { return colourProfile_; }
  void SetColourProfile(std::vector<uint8_t> profile) { colourProfile_ = std::move(profile); }

 private:
  HostDocument(int32_t width, int32_t height, ImageMode mode, bool hasTransparency);
  void CheckPlane(int plane, int depth) const;

  int32_t width_;
  int32_t height_;
  ImageMode mode_;
  bool hasTransparency_;
  double resolutionX_ = 72.0;
  double resolutionY_ = 72.0;
  std::string sourcePath_;
  FileFormat sourceFormat_ = FileFormat::kNone;
  std::vector<uint8_t> colourProfile_;
  std::vector<std::unique_ptr<uint8_t[]>> planes8_;
  std::vector<std::unique_ptr<uint16_t[]>> planes16_;
};

}  // namespace Host
