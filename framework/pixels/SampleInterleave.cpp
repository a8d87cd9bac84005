#include "framework/pixels/SampleInterleave.h"

#include <algorithm>
#include <utility>

namespace Tarsa {

namespace {

// One pointer a plane, each restrict, so that the compiler knows the rows
// apart and vectorises the loop.
template <typename Sample, typename... Plane>
void Interleave(std::size_t count, Sample* __restrict pixels, const Plane* __restrict... planes) {
  constexpr std::size_t kN = sizeof...(Plane);
  for (std::size_t x = 0; x < count; ++x) {
    std::size_t k = 0;
    ((pixels[x * kN + k++] = planes[x]), ...);
  }
}

template <typename Sample, typename... Plane>
void Deinterleave(std::size_t count, const Sample* __restrict pixels, Sample cap,
                  Plane* __restrict... planes) {
  constexpr std::size_t kN = sizeof...(Plane);
  for (std::size_t x = 0; x < count; ++x) {
    std::size_t k = 0;
    ((planes[x] = std::min(pixels[x * kN + k++], cap)), ...);
  }
}

template <std::size_t N, typename Sample, std::size_t... K>
void InterleaveRows(const Sample* const* planes, std::size_t count, Sample* pixels,
                    std::index_sequence<K...>) {
  Interleave(count, pixels, planes[K]...);
}

template <std::size_t N, typename Sample, std::size_t... K>
void DeinterleaveRows(const Sample* pixels, std::size_t count, Sample* const* planes, Sample cap,
                      std::index_sequence<K...>) {
  Deinterleave(count, pixels, cap, planes[K]...);
}

template <std::size_t N, typename Sample>
void Interleave(const Sample* const* planes, std::size_t count, Sample* pixels) {
  InterleaveRows<N>(planes, count, pixels, std::make_index_sequence<N>());
}

template <std::size_t N, typename Sample>
void Deinterleave(const Sample* pixels, std::size_t count, Sample* const* planes, Sample cap) {
  DeinterleaveRows<N>(pixels, count, planes, cap, std::make_index_sequence<N>());
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
