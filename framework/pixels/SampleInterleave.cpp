#include "framework/pixels/SampleInterleave.h"

#include <algorithm>

namespace Tarsa {

namespace {

template <std::size_t N, typename Sample>
void Interleave(const Sample* const* planes, std::size_t count, Sample* pixels) {
  for (std::size_t x = 0; x < count; ++x) {
    for (std::size_t k = 0; k < N; ++k) pixels[x * N + k] = planes[k][x];
  }
}

template <std::size_t N, typename Sample>
void Deinterleave(const Sample* pixels, std::size_t count, Sample* const* planes, Sample cap) {
  for (std::size_t x = 0; x < count; ++x) {
    for (std::size_t k = 0; k < N; ++k) planes[k][x] = std::min(pixels[x * N + k], cap);
  }
}

}  // namespace

template <typename Sample>
void PlanesToPixels(std::span<const Sample* const> planes, std::size_t count, std::size_t stride,
                    Sample* pixels) {
  if (planes.size() == stride) {
    switch (stride) {
      case 1:
        return Interleave<1>(planes.data(), count, pixels);
      case 2:
        return Interleave<2>(planes.data(), count, pixels);
      case 3:
        return Interleave<3>(planes.data(), count, pixels);
      case 4:
        return Interleave<4>(planes.data(), count, pixels);
      case 5:
        return Interleave<5>(planes.data(), count, pixels);
      default:
        break;
    }
  }
  for (std::size_t k = 0; k < planes.size(); ++k) {
    const Sample* from = planes[k];
    for (std::size_t x = 0; x < count; ++x) pixels[x * stride + k] = from[x];
  }
}

template <typename Sample>
void PixelsToPlanes(const Sample* pixels, std::size_t stride, std::size_t count,
                    std::span<Sample* const> planes, Sample cap) {
  if (planes.size() == stride) {
    switch (stride) {
      case 1:
        return Deinterleave<1>(pixels, count, planes.data(), cap);
      case 2:
        return Deinterleave<2>(pixels, count, planes.data(), cap);
      case 3:
        return Deinterleave<3>(pixels, count, planes.data(), cap);
      case 4:
        return Deinterleave<4>(pixels, count, planes.data(), cap);
      case 5:
        return Deinterleave<5>(pixels, count, planes.data(), cap);
      default:
        break;
    }
  }
  for (std::size_t k = 0; k < planes.size(); ++k) {
    Sample* to = planes[k];
    for (std::size_t x = 0; x < count; ++x) to[x] = std::min(pixels[x * stride + k], cap);
  }
}

template void PlanesToPixels(std::span<const std::uint8_t* const>, std::size_t, std::size_t,
                             std::uint8_t*);
template void PlanesToPixels(std::span<const std::uint16_t* const>, std::size_t, std::size_t,
                             std::uint16_t*);
template void PixelsToPlanes(const std::uint8_t*, std::size_t, std::size_t,
                             std::span<std::uint8_t* const>, std::uint8_t);
template void PixelsToPlanes(const std::uint16_t*, std::size_t, std::size_t,
                             std::span<std::uint16_t* const>, std::uint16_t);

}  // namespace Tarsa
