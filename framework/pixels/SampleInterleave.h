#pragma once

#include <cstddef>
#include <cstdint>
#include <span>

namespace Tarsa {

// Rows of planar samples and rows of interleaved pixels, one into the other:
// the host's blocks hold pixels, the framework's pixmaps hold planes. A pixel
// has `stride` samples, of which the first planes.size() are the planes' in
// order; the rest are left as they are. With as many planes as samples a
// pixel (one to five) the loops are unrolled for the compiler to vectorise;
// anything else takes the plain strided loop.

template <typename Sample>
void PlanesToPixels(std::span<const Sample* const> planes, std::size_t count, std::size_t stride,
                    Sample* pixels);

// Each sample is capped at `cap` on its way into its plane.
template <typename Sample>
void PixelsToPlanes(const Sample* pixels, std::size_t stride, std::size_t count,
                    std::span<Sample* const> planes, Sample cap);

}  // namespace Tarsa
