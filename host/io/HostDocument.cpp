#include "host/io/HostDocument.h"

#include <unistd.h>

#include <algorithm>
#include <atomic>
#include <cmath>
#include <stdexcept>

#include "host/io/HostError.h"

namespace Host {

namespace {

// The machine's physical memory in bytes; 0 when the system does not say.
uint64_t PhysicalMemory() {
  const long pages = sysconf(_SC_PHYS_PAGES);
  const long pageSize = sysconf(_SC_PAGE_SIZE);
  if (pages <= 0 || pageSize <= 0) return 0;
  return static_cast<uint64_t>(pages) * static_cast<uint64_t>(pageSize);
}

std::string SizeText(int32_t width, int32_t height) {
  return std::to_string(width) + " x " + std::to_string(height);
}

// A blank sample of each plane: white, no ink, neutral, opaque.
int BlankSample(ImageMode mode, int plane, int colourPlanes) {
  const int max = DepthOf(mode) == 16 ? kMax16 : kMax8;
  if (plane >= colourPlanes) return max;
  if (ColourModelOf(mode) == ColourModel::kLab && plane > 0)
    return DepthOf(mode) == 16 ? 16384 : 128;
  return max;
}

// 0 until set: the physical memory then.
std::atomic<uint64_t> memoryLimit{0};

}  // namespace

uint64_t HostDocument::MemoryLimit() {
  const uint64_t set = memoryLimit.load(std::memory_order_relaxed);
  return set != 0 ? set : PhysicalMemory();
}

void HostDocument::SetMemoryLimit(uint64_t bytes) {
  memoryLimit.store(bytes, std::memory_order_relaxed);
}

HostDocument::HostDocument(int32_t width, int32_t height, ImageMode mode, bool hasTransparency)
    : width_(width), height_(height), mode_(mode), hasTransparency_(hasTransparency) {}

std::unique_ptr<HostDocument> HostDocument::Duplicate() const {
  std::unique_ptr<HostDocument> copy = CreateUnfilled(width_, height_, mode_, hasTransparency_);
  for (int p = 0; p < PlaneCount(); ++p) {
    if (Depth() == 16) {
      std::ranges::copy(Plane16(p), copy->Plane16(p).begin());
    } else {
      std::ranges::copy(Plane8(p), copy->Plane8(p).begin());
    }
  }
  copy->SetResolution(resolutionX_, resolutionY_);
  copy->SetSource(sourcePath_, sourceFormat_);
  copy->SetColourProfile(colourProfile_);
  return copy;
}

std::unique_ptr<HostDocument> HostDocument::CreateUnfilled(int32_t width, int32_t height,
                                                           ImageMode mode, bool hasTransparency) {
  if (!IsImageMode(static_cast<int>(mode))) {
    throw HostError("image mode " + std::to_string(static_cast<int>(mode)) +
                    " is not one the host supports");
  }
  if (width < 1 || height < 1 || width > kMaxSide || height > kMaxSide) {
    throw HostError("an image of " + SizeText(width, height) +
                    " pixels is outside the range 1 to " + std::to_string(kMaxSide) + " per side");
  }
  std::unique_ptr<HostDocument> document(new HostDocument(width, height, mode, hasTransparency));
  const size_t samples = document->SamplesPerPlane();
  const int planes = document->PlaneCount();
  const uint64_t bytes = static_cast<uint64_t>(samples) * planes * (DepthOf(mode) / 8);
  const uint64_t limit = MemoryLimit();
  if (limit != 0 && bytes > limit) {
    const bool set = memoryLimit.load(std::memory_order_relaxed) != 0;
    throw HostError("an image of " + SizeText(width, height) + " pixels in " + ModeName(mode) +
                    " needs " + std::to_string(bytes >> 20) + " MiB, more than " +
                    (set ? "the " + std::to_string(limit >> 20) + " MiB a document may take"
                         : std::string("this machine's memory")));
  }
  // Left unfilled so that pages are only touched as a reader fills them.
  for (int p = 0; p < planes; ++p) {
    if (DepthOf(mode) == 16) {
      document->planes16_.push_back(std::make_unique_for_overwrite<uint16_t[]>(samples));
    } else {
      document->planes8_.push_back(std::make_unique_for_overwrite<uint8_t[]>(samples));
    }
  }
  return document;
}

std::unique_ptr<HostDocument> HostDocument::Create(int32_t width, int32_t height, ImageMode mode,
                                                   bool hasTransparency) {
  std::unique_ptr<HostDocument> document = CreateUnfilled(width, height, mode, hasTransparency);
  const int colourPlanes = document->ColourPlanes();
  for (int p = 0; p < document->PlaneCount(); ++p) {
    const int blank = BlankSample(mode, p, colourPlanes);
    if (document->Depth() == 16) {
      std::ranges::fill(document->Plane16(p), static_cast<uint16_t>(blank));
    } else {
      std::ranges::fill(document->Plane8(p), static_cast<uint8_t>(blank));
    }
  }
  return document;
}

void HostDocument::CheckPlane(int plane, int depth) const {
  if (plane < 0 || plane >= PlaneCount()) {
    throw std::out_of_range("plane " + std::to_string(plane) + " of a document with " +
                            std::to_string(PlaneCount()));
  }
  if (depth != Depth()) {
    throw std::logic_error("a " + std::to_string(Depth()) + "-bit document's plane read as " +
                           std::to_string(depth) + "-bit");
  }
}

std::span<uint8_t> HostDocument::Plane8(int plane) {
  CheckPlane(plane, 8);
  return {planes8_[plane].get(), SamplesPerPlane()};
}

std::span<const uint8_t> HostDocument::Plane8(int plane) const {
  CheckPlane(plane, 8);
  return {planes8_[plane].get(), SamplesPerPlane()};
}

std::span<uint16_t> HostDocument::Plane16(int plane) {
  CheckPlane(plane, 16);
  return {planes16_[plane].get(), SamplesPerPlane()};
}

std::span<const uint16_t> HostDocument::Plane16(int plane) const {
  CheckPlane(plane, 16);
  return {planes16_[plane].get(), SamplesPerPlane()};
}

int HostDocument::Sample(int plane, int32_t x, int32_t y) const {
  if (x < 0 || y < 0 || x >= width_ || y >= height_) {
    throw std::out_of_range("pixel outside the document");
  }
  const size_t at = static_cast<size_t>(y) * width_ + x;
  return Depth() == 16 ? Plane16(plane)[at] : Plane8(plane)[at];
}

void HostDocument::SetSample(int plane, int32_t x, int32_t y, int value) {
  if (x < 0 || y < 0 || x >= width_ || y >= height_) {
    throw std::out_of_range("pixel outside the document");
  }
  const size_t at = static_cast<size_t>(y) * width_ + x;
  const int clamped = std::clamp(value, 0, MaxSample());
  if (Depth() == 16) {
    Plane16(plane)[at] = static_cast<uint16_t>(clamped);
  } else {
    Plane8(plane)[at] = static_cast<uint8_t>(clamped);
  }
}

void HostDocument::SetResolution(double x, double y) {
  // A file's missing or nonsensical resolution falls back to the usual 72.
  resolutionX_ = std::isfinite(x) && x > 0 ? x : 72.0;
  resolutionY_ = std::isfinite(y) && y > 0 ? y : 72.0;
}

void HostDocument::SetSource(std::string path, FileFormat format) {
  sourcePath_ = std::move(path);
  sourceFormat_ = format;
}

}  // namespace Host
