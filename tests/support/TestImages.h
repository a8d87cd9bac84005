#pragma once

#include <cstdint>
#include <initializer_list>
#include <memory>

#include "host/io/HostDocument.h"
#include "tests/support/TestSupport.h"

namespace Host::testing {

using Tarsa::testing::ReadBytes;
using Tarsa::testing::ScratchFolder;
using Tarsa::testing::WriteBytes;

// Every sample drawn uniformly from the whole host range, from a fixed seed.
std::unique_ptr<HostDocument> RandomDocument(int32_t width, int32_t height, ImageMode mode,
                                             bool transparency, uint32_t seed);
// Smooth waves with a little noise, like a photograph; lossy codecs are
// judged on these rather than on pure noise.
std::unique_ptr<HostDocument> PhotoLikeDocument(int32_t width, int32_t height, ImageMode mode,
                                                uint32_t seed);
// Fills over the whole of a document, every plane.
// A pattern with detail at every scale, so that a box or a copy misplaced
// by one sample shows (8-bit values).
void FillDetail(HostDocument& document);
// Waves, a different phase in each plane so that planes put in the wrong
// place show. The fine one, about seven pixels long, tells a bicubic kernel
// from a bilinear one.
void FillWaves(HostDocument& document);
// One value in each plane, in plane order.
void FillPlanes(HostDocument& document, std::initializer_list<int> values);

std::unique_ptr<HostDocument> CopyDocument(const HostDocument& document);

// The largest difference between two documents' samples; -1 when they differ
// in size, mode or planes.
int LargestDifference(const HostDocument& a, const HostDocument& b);

}  // namespace Host::testing
