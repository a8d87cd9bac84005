#pragma once

#include <cstdint>
#include <memory>

#include "host/io/HostDocument.h"
#include "tests/support/TestSupport.h"

namespace Host::Testing {

using TestSupport::ReadBytes;
using TestSupport::ScratchFolder;
using TestSupport::WriteBytes;

// Every sample drawn uniformly from the whole host range, from a fixed seed.
std::unique_ptr<HostDocument> RandomDocument(int32_t width, int32_t height, ImageMode mode,
                                             bool transparency, uint32_t seed);
// Smooth waves with a little noise, like a photograph; lossy codecs are
// judged on these rather than on pure noise.
std::unique_ptr<HostDocument> PhotoLikeDocument(int32_t width, int32_t height, ImageMode mode,
                                                uint32_t seed);
// The largest difference between two documents' samples; -1 when they differ
// in size, mode or planes.
int LargestDifference(const HostDocument& a, const HostDocument& b);

}  // namespace Host::Testing
