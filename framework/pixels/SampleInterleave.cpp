#include "framework/pixels/SampleInterleave.h"

#include <algorithm>
#include <array>
#include <utility>

#if defined(__x86_64__) || defined(__i386__)
#include <immintrin.h>
#define TARSA_X86_SHUFFLES 1
#endif

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

#if defined(TARSA_X86_SHUFFLES)
// Three planes of bytes, 16 pixels at a time, with byte shuffles: each
// vector of 16 bytes is gathered or scattered by a mask, 0x80 leaving a
// zero to be filled from another vector.
struct ShuffleMasks {
  // Pixel vector v's bytes from plane k; plane k's bytes from pixel vector v.
  std::array<std::array<std::array<std::uint8_t, 16>, 3>, 3> toPixels{};  // [v][k]
  std::array<std::array<std::array<std::uint8_t, 16>, 3>, 3> toPlanes{};  // [k][v]
  constexpr ShuffleMasks() {
    for (int v = 0; v < 3; ++v) {
      for (int k = 0; k < 3; ++k) {
        for (int j = 0; j < 16; ++j) {
          const int i = 16 * v + j;  // a byte of the pixels
          toPixels[v][k][j] = i % 3 == k ? std::uint8_t(i / 3) : 0x80;
          const int from = 3 * j + k;  // pixel j's sample k
          toPlanes[k][v][j] = from / 16 == v ? std::uint8_t(from % 16) : 0x80;
        }
      }
    }
  }
};
constexpr ShuffleMasks kMasks;

__m128i Mask(const std::array<std::uint8_t, 16>& bytes) {
  return _mm_loadu_si128(reinterpret_cast<const __m128i*>(bytes.data()));
}

// Both answer how many pixels they took, a multiple of 16.
__attribute__((target("ssse3"))) std::size_t InterleaveThree(const std::uint8_t* a,
                                                             const std::uint8_t* b,
                                                             const std::uint8_t* c,
                                                             std::size_t count,
                                                             std::uint8_t* pixels) {
  std::size_t x = 0;
  for (; x + 16 <= count; x += 16) {
    const __m128i planes[3] = {_mm_loadu_si128(reinterpret_cast<const __m128i*>(a + x)),
                               _mm_loadu_si128(reinterpret_cast<const __m128i*>(b + x)),
                               _mm_loadu_si128(reinterpret_cast<const __m128i*>(c + x))};
    for (int v = 0; v < 3; ++v) {
      __m128i out = _mm_shuffle_epi8(planes[0], Mask(kMasks.toPixels[v][0]));
      out = _mm_or_si128(out, _mm_shuffle_epi8(planes[1], Mask(kMasks.toPixels[v][1])));
      out = _mm_or_si128(out, _mm_shuffle_epi8(planes[2], Mask(kMasks.toPixels[v][2])));
      _mm_storeu_si128(reinterpret_cast<__m128i*>(pixels + 3 * x + 16 * v), out);
    }
  }
  return x;
}

__attribute__((target("ssse3"))) std::size_t DeinterleaveThree(const std::uint8_t* pixels,
                                                               std::size_t count, std::uint8_t cap,
                                                               std::uint8_t* a, std::uint8_t* b,
                                                               std::uint8_t* c) {
  std::uint8_t* const planes[3] = {a, b, c};
  const __m128i top = _mm_set1_epi8(char(cap));
  std::size_t x = 0;
  for (; x + 16 <= count; x += 16) {
    const __m128i in[3] = {_mm_loadu_si128(reinterpret_cast<const __m128i*>(pixels + 3 * x)),
                           _mm_loadu_si128(reinterpret_cast<const __m128i*>(pixels + 3 * x + 16)),
                           _mm_loadu_si128(reinterpret_cast<const __m128i*>(pixels + 3 * x + 32))};
    for (int k = 0; k < 3; ++k) {
      __m128i out = _mm_shuffle_epi8(in[0], Mask(kMasks.toPlanes[k][0]));
      out = _mm_or_si128(out, _mm_shuffle_epi8(in[1], Mask(kMasks.toPlanes[k][1])));
      out = _mm_or_si128(out, _mm_shuffle_epi8(in[2], Mask(kMasks.toPlanes[k][2])));
      _mm_storeu_si128(reinterpret_cast<__m128i*>(planes[k] + x), _mm_min_epu8(out, top));
    }
  }
  return x;
}

bool HasShuffles() {
  static const bool has = __builtin_cpu_supports("ssse3") != 0;
  return has;
}
#endif

#if defined(__SSE2__)
// Four planes of bytes, 16 pixels at a time, by rounds of unpacking (SSE2,
// which every x86-64 has). Both answer how many pixels they took.
std::size_t InterleaveFour(const std::uint8_t* const* planes, std::size_t count,
                           std::uint8_t* pixels) {
  std::size_t x = 0;
  for (; x + 16 <= count; x += 16) {
    const auto load = [x](const std::uint8_t* row) {
      return _mm_loadu_si128(reinterpret_cast<const __m128i*>(row + x));
    };
    const __m128i r = load(planes[0]), g = load(planes[1]);
    const __m128i b = load(planes[2]), a = load(planes[3]);
    const __m128i rgLow = _mm_unpacklo_epi8(r, g), rgHigh = _mm_unpackhi_epi8(r, g);
    const __m128i baLow = _mm_unpacklo_epi8(b, a), baHigh = _mm_unpackhi_epi8(b, a);
    auto* to = reinterpret_cast<__m128i*>(pixels + x * 4);
    _mm_storeu_si128(to, _mm_unpacklo_epi16(rgLow, baLow));
    _mm_storeu_si128(to + 1, _mm_unpackhi_epi16(rgLow, baLow));
    _mm_storeu_si128(to + 2, _mm_unpacklo_epi16(rgHigh, baHigh));
    _mm_storeu_si128(to + 3, _mm_unpackhi_epi16(rgHigh, baHigh));
  }
  return x;
}

std::size_t DeinterleaveFour(const std::uint8_t* pixels, std::size_t count, std::uint8_t cap,
                             std::uint8_t* const* planes) {
  const __m128i top = _mm_set1_epi8(char(cap));
  std::size_t x = 0;
  for (; x + 16 <= count; x += 16) {
    // Three rounds of byte unpacking sort 16 pixels' bytes by channel: R
    // and G in the halves of rg, B and A in those of ba.
    const auto* from = reinterpret_cast<const __m128i*>(pixels + x * 4);
    const __m128i p0 = _mm_loadu_si128(from), p1 = _mm_loadu_si128(from + 1);
    const __m128i p2 = _mm_loadu_si128(from + 2), p3 = _mm_loadu_si128(from + 3);
    const __m128i t0 = _mm_unpacklo_epi8(p0, p1), t1 = _mm_unpackhi_epi8(p0, p1);
    const __m128i t2 = _mm_unpacklo_epi8(p2, p3), t3 = _mm_unpackhi_epi8(p2, p3);
    const __m128i u0 = _mm_unpacklo_epi8(t0, t1), u1 = _mm_unpackhi_epi8(t0, t1);
    const __m128i u2 = _mm_unpacklo_epi8(t2, t3), u3 = _mm_unpackhi_epi8(t2, t3);
    const __m128i rgLow = _mm_unpacklo_epi8(u0, u1), baLow = _mm_unpackhi_epi8(u0, u1);
    const __m128i rgHigh = _mm_unpacklo_epi8(u2, u3), baHigh = _mm_unpackhi_epi8(u2, u3);
    const __m128i out[4] = {_mm_unpacklo_epi64(rgLow, rgHigh), _mm_unpackhi_epi64(rgLow, rgHigh),
                            _mm_unpacklo_epi64(baLow, baHigh), _mm_unpackhi_epi64(baLow, baHigh)};
    for (int k = 0; k < 4; ++k)
      _mm_storeu_si128(reinterpret_cast<__m128i*>(planes[k] + x), _mm_min_epu8(out[k], top));
  }
  return x;
}
#endif

}  // namespace

template <typename Sample>
void PlanesToPixels(std::span<const Sample* const> planes, std::size_t count, std::size_t stride,
                    Sample* pixels) {
  if (planes.size() == stride) {
#if defined(TARSA_X86_SHUFFLES)
    if constexpr (sizeof(Sample) == 1) {
      if (stride == 3 && HasShuffles()) {
        const std::size_t done = InterleaveThree(planes[0], planes[1], planes[2], count, pixels);
        const Sample* rest[3] = {planes[0] + done, planes[1] + done, planes[2] + done};
        return Interleave<3>(rest, count - done, pixels + 3 * done);
      }
    }
#endif
#if defined(__SSE2__)
    if constexpr (sizeof(Sample) == 1) {
      if (stride == 4) {
        const std::size_t done = InterleaveFour(planes.data(), count, pixels);
        const Sample* rest[4] = {planes[0] + done, planes[1] + done, planes[2] + done,
                                 planes[3] + done};
        return Interleave<4>(rest, count - done, pixels + 4 * done);
      }
    }
#endif
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
#if defined(TARSA_X86_SHUFFLES)
    if constexpr (sizeof(Sample) == 1) {
      if (stride == 3 && HasShuffles()) {
        const std::size_t done =
            DeinterleaveThree(pixels, count, cap, planes[0], planes[1], planes[2]);
        Sample* const rest[3] = {planes[0] + done, planes[1] + done, planes[2] + done};
        return Deinterleave<3>(pixels + 3 * done, count - done, rest, cap);
      }
    }
#endif
#if defined(__SSE2__)
    if constexpr (sizeof(Sample) == 1) {
      if (stride == 4) {
        const std::size_t done = DeinterleaveFour(pixels, count, cap, planes.data());
        Sample* const rest[4] = {planes[0] + done, planes[1] + done, planes[2] + done,
                                 planes[3] + done};
        return Deinterleave<4>(pixels + 4 * done, count - done, rest, cap);
      }
    }
#endif
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
