#pragma once

#include <algorithm>
#include <cstdint>
#include <span>

#include "host/io/HostDocument.h"

namespace Host {

// How a file codes the samples of one colour plane, relative to the host's
// coding of the same plane. Transparency is always kDirect.
enum class SampleCoding {
  kDirect,        // same meaning; 16-bit samples rescaled between 65535 and 32768
  kInverted,      // full scale and zero swapped: ink amounts, white-is-zero gray
  kSignedCentre,  // two's complement around zero where the host has the centre: Lab a*, b*
};

// 16-bit samples: files run from 0 to 65535, the host from 0 to 32768. Both
// directions round to nearest, so host -> file -> host is exact.
constexpr uint16_t HostFromFile16(uint16_t file) {
  return static_cast<uint16_t>((static_cast<uint32_t>(file) * 32768u + 32767u) / 65535u);
}
constexpr uint16_t FileFromHost16(uint16_t host) {
  const uint32_t h = std::min<uint32_t>(host, 32768u);
  return static_cast<uint16_t>((h * 65535u + 16384u) / 32768u);
}

// Copies `count` pixels of interleaved file samples, `stride` samples per
// pixel, into planes firstPlane.. of the document at (x, y) onwards, as they
// are: sample k of each pixel goes to plane firstPlane + k, for k < planes.
// `in` holds uint8 or (native order) uint16 samples by the document's depth.
void SpreadSamples(const void* in, int stride, int firstPlane, int planes, HostDocument& document,
                   int32_t x, int32_t y, int32_t count);

// Turns a document whose planes hold raw file samples into host samples, in
// place. `colourCodings` has one entry per colour plane. With
// `associatedAlpha` the colour samples are premultiplied by transparency in
// the file and are divided out first.
void DecodePlanes(HostDocument& document, std::span<const SampleCoding> colourCodings,
                  bool associatedAlpha);

// Writes row y of the document, pixel-interleaved and coded for a file, to
// `out`: all planes, transparency last; uint8 or native-order uint16 samples.
void EncodeRow(const HostDocument& document, int32_t y, std::span<const SampleCoding> colourCodings,
               void* out);

}  // namespace Host
