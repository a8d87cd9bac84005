#include "framework/pixels/CTexelPacker.h"

#include <algorithm>
#include <cstring>
#include <utility>

#include "framework/pixels/CMemoryPixmap.h"
#include "framework/pixels/CPixmap.h"
#include "framework/pixels/SampleInterleave.h"

#if defined(__x86_64__) || defined(__i386__)
#include <cpuid.h>
#include <immintrin.h>
#define TARSA_X86_TEXELS 1
#endif

namespace Tarsa {

namespace {

std::uint16_t UpTo16(std::uint32_t s) { return s < 32768 ? std::uint16_t(2 * s) : 65535; }
std::uint16_t DownFrom16(std::uint32_t x) { return x < 65535 ? std::uint16_t(x / 2) : 32768; }

std::uint16_t Load16(const std::uint8_t* at) {
  std::uint16_t v;
  std::memcpy(&v, at, 2);
  return v;
}

void Store16(std::uint8_t* at, std::uint16_t v) { std::memcpy(at, &v, 2); }

#if defined(__SSE2__)
// Eight RGBA texels of 16-bit channels from eight samples of each channel.
inline void StoreTexels16(__m128i r, __m128i g, __m128i b, __m128i a, std::uint8_t* out) {
  const __m128i rgLow = _mm_unpacklo_epi16(r, g), rgHigh = _mm_unpackhi_epi16(r, g);
  const __m128i baLow = _mm_unpacklo_epi16(b, a), baHigh = _mm_unpackhi_epi16(b, a);
  auto* to = reinterpret_cast<__m128i*>(out);
  _mm_storeu_si128(to, _mm_unpacklo_epi32(rgLow, baLow));
  _mm_storeu_si128(to + 1, _mm_unpackhi_epi32(rgLow, baLow));
  _mm_storeu_si128(to + 2, _mm_unpacklo_epi32(rgHigh, baHigh));
  _mm_storeu_si128(to + 3, _mm_unpackhi_epi32(rgHigh, baHigh));
}
#endif

#if defined(TARSA_X86_TEXELS) && defined(__SSE2__)
constexpr float kHalfScale = 1.0f / 65535.0f;

// Eight samples from at, widened, as half floats.
__attribute__((target("f16c"))) __m128i EightHalves(const std::uint8_t* at) {
  const __m128i zero = _mm_setzero_si128();
  const __m128 scale = _mm_set1_ps(kHalfScale);
  __m128i s = _mm_loadu_si128(reinterpret_cast<const __m128i*>(at));
  s = _mm_adds_epu16(s, s);
  const __m128 low = _mm_mul_ps(_mm_cvtepi32_ps(_mm_unpacklo_epi16(s, zero)), scale);
  const __m128 high = _mm_mul_ps(_mm_cvtepi32_ps(_mm_unpackhi_epi16(s, zero)), scale);
  return _mm_unpacklo_epi64(_mm_cvtps_ph(low, _MM_FROUND_TO_NEAREST_INT),
                            _mm_cvtps_ph(high, _MM_FROUND_TO_NEAREST_INT));
}

__attribute__((target("f16c"))) void InterleaveHalf(const CTexelPacker::ChannelRows& in,
                                                    std::size_t count, std::uint8_t* out) {
  std::size_t x = 0;
  for (; x + 8 <= count; x += 8) {
    const __m128i r = EightHalves(in[0] + x * 2), g = EightHalves(in[1] + x * 2);
    const __m128i b = EightHalves(in[2] + x * 2), a = EightHalves(in[3] + x * 2);
    StoreTexels16(r, g, b, a, out + x * 8);
  }
  for (; x < count; ++x) {
    for (std::size_t c = 0; c < 4; ++c) {
      const float value = float(UpTo16(Load16(in[c] + x * 2))) * kHalfScale;
      Store16(out + x * 8 + c * 2, _cvtss_sh(value, _MM_FROUND_TO_NEAREST_INT));
    }
  }
}

// Asked of the processor directly, since clang 14's __builtin_cpu_supports
// knows no "f16c": the instructions are there and, as they use the AVX
// registers, the system saves those registers.
bool HasHalves() {
  static const bool has = [] {
    unsigned eax = 0, ebx = 0, ecx = 0, edx = 0;
    if (__get_cpuid(1, &eax, &ebx, &ecx, &edx) == 0) return false;
    if ((ecx & bit_F16C) == 0 || (ecx & bit_OSXSAVE) == 0) return false;
    unsigned low = 0, high = 0;
    __asm__("xgetbv" : "=a"(low), "=d"(high) : "c"(0));
    return (low & 6u) == 6u;  // the SSE and AVX register states
  }();
  return has;
}
#else
void InterleaveHalf(const CTexelPacker::ChannelRows& in, std::size_t count, std::uint8_t* out) {
  CTexelPacker::Widen16(in, count, out);
}

bool HasHalves() { return false; }
#endif

}  // namespace

CTexelPacker::CTexelPacker(std::uint32_t planes, std::uint32_t pass, std::uint32_t depth,
                           bool halves)
    : planes_(planes), pass_(pass), sampleBytes_(depth == 16 ? 2 : 1), halves_(halves) {
  const std::array<std::uint32_t, 4> from = ChannelPlanes(planes, pass);
  for (std::size_t c = 0; c < 4; ++c) {
    slot_[c] =
        std::size_t(std::find(read_.begin(), read_.begin() + distinct_, from[c]) - read_.begin());
    if (slot_[c] == distinct_) read_[distinct_++] = from[c];
  }
}

std::array<std::uint32_t, 4> CTexelPacker::ChannelPlanes(std::uint32_t planes, std::uint32_t pass) {
  if (planes <= 2) return {0, 0, 0, planes - 1};
  if (pass == 1) return {0, 0, 0, 4};
  return {0, 1, 2, 3};
}

bool CTexelPacker::CanMakeHalves() { return HasHalves(); }

void CTexelPacker::Read(const CPixmap& source, std::int32_t x, std::int32_t y, std::size_t width,
                        std::uint8_t* out, std::vector<std::uint8_t>& scratch) const {
  const std::size_t rowBytes = width * sampleBytes_;
  if (scratch.size() < distinct_ * rowBytes) scratch.resize(distinct_ * rowBytes);
  for (std::size_t k = 0; k < distinct_; ++k)
    source.ReadRow(read_[k], x, y, std::uint32_t(width), scratch.data() + k * rowBytes);
  ChannelRows in{};
  for (std::size_t c = 0; c < 4; ++c) in[c] = scratch.data() + slot_[c] * rowBytes;
  if (sampleBytes_ == 1) {
    PlanesToPixels<std::uint8_t>(in, width, 4, out);
  } else if (halves_) {
    InterleaveHalf(in, width, out);
  } else {
    Widen16(in, width, out);
  }
}

void CTexelPacker::Pack(const CPixmap& source, const CRect& picture, CPoint at, std::int32_t x0,
                        std::int32_t y0, std::int32_t x1, std::int32_t y1,
                        std::vector<std::uint8_t>& out, std::vector<std::uint8_t>& scratch) const {
  const std::size_t texelBytes = TexelBytes();
  const std::size_t lineBytes = std::size_t(x1 - x0) * texelBytes;
  out.resize(lineBytes * std::size_t(y1 - y0));

  // The picture's texels, clipped to the window.
  const std::int32_t left = std::max(x0, at.x);
  const std::int32_t right = std::min(x1, at.x + std::int32_t(picture.Width()));
  const std::int32_t top = std::max(y0, at.y);
  const std::int32_t bottom = std::min(y1, at.y + std::int32_t(picture.Height()));
  const std::size_t width = right > left ? std::size_t(right - left) : 0;

  const std::size_t before = width > 0 ? std::size_t(left - x0) * texelBytes : lineBytes;
  const std::size_t after = width > 0 ? std::size_t(x1 - right) * texelBytes : 0;
  for (std::int32_t y = y0; y < y1; ++y) {
    std::uint8_t* line = out.data() + std::size_t(y - y0) * lineBytes;
    if (y < top || y >= bottom || width == 0) {
      std::memset(line, 0, lineBytes);
      continue;
    }
    std::memset(line, 0, before);
    std::memset(line + lineBytes - after, 0, after);
    Read(source, picture.left + (left - at.x), picture.top + (y - at.y), width, line + before,
         scratch);
  }
}

void CTexelPacker::Unpack(const std::uint8_t* texels, std::size_t stride, CPoint origin,
                          CMemoryPixmap& dest) const {
  const CRect area = dest.Bounds();
  const auto width = std::int32_t(area.Width());
  const bool wide = sampleBytes_ == 2;
  const std::size_t texelBytes = TexelBytes();
  // (plane, channel) pairs that come back from this pass.
  std::array<std::pair<std::uint32_t, std::uint32_t>, 4> back{};
  std::size_t count = 0;
  if (planes_ <= 2) {
    back[count++] = {0, 0};
    back[count++] = {planes_ - 1, 3};
  } else if (pass_ == 1) {
    back[count++] = {4, 3};
  } else {
    for (std::uint32_t c = 0; c < 4; ++c) back[count++] = {c, c};
  }
  for (std::int32_t y = area.top; y < area.bottom; ++y) {
    const std::uint8_t* line =
        texels +
        (std::size_t(y - origin.y) * stride + std::size_t(area.left - origin.x)) * texelBytes;
    if (count == 4) {
      // Every channel to its own plane.
      const PlaneRows to{dest.Address(0, area.left, y), dest.Address(1, area.left, y),
                         dest.Address(2, area.left, y), dest.Address(3, area.left, y)};
      if (wide) {
        Narrow16(line, std::size_t(width), to);
      } else {
        PixelsToPlanes<std::uint8_t>(line, 4, std::size_t(width), to, 255);
      }
      continue;
    }
    for (std::size_t k = 0; k < count; ++k) {
      const auto [plane, channel] = back[k];
      std::uint8_t* to = dest.Address(plane, area.left, y);
      if (wide) {
        const std::uint8_t* in = line + channel * 2;
        for (std::int32_t x = 0; x < width; ++x)
          Store16(to + std::size_t(x) * 2, DownFrom16(Load16(in + std::size_t(x) * 8)));
      } else {
        const std::uint8_t* in = line + channel;
        for (std::int32_t x = 0; x < width; ++x) to[x] = in[std::size_t(x) * 4];
      }
    }
  }
}

void CTexelPacker::Widen16(const ChannelRows& in, std::size_t count, std::uint8_t* out) {
  std::size_t x = 0;
#if defined(__SSE2__)
  for (; x + 8 <= count; x += 8) {
    // A saturating doubling is UpTo16.
    const auto load = [x](const std::uint8_t* row) {
      const __m128i s = _mm_loadu_si128(reinterpret_cast<const __m128i*>(row + x * 2));
      return _mm_adds_epu16(s, s);
    };
    const __m128i r = load(in[0]), g = load(in[1]), b = load(in[2]), a = load(in[3]);
    StoreTexels16(r, g, b, a, out + x * 8);
  }
#endif
  for (; x < count; ++x) {
    for (std::size_t c = 0; c < 4; ++c) Store16(out + x * 8 + c * 2, UpTo16(Load16(in[c] + x * 2)));
  }
}

void CTexelPacker::WidenToHalves(const ChannelRows& in, std::size_t count, std::uint8_t* out) {
  InterleaveHalf(in, count, out);
}

void CTexelPacker::Narrow16(const std::uint8_t* in, std::size_t count, const PlaneRows& out) {
  std::size_t x = 0;
#if defined(__SSE2__)
  const __m128i top = _mm_set1_epi16(-1);
  for (; x + 8 <= count; x += 8) {
    const auto* from = reinterpret_cast<const __m128i*>(in + x * 8);
    const __m128i p0 = _mm_loadu_si128(from), p1 = _mm_loadu_si128(from + 1);
    const __m128i p2 = _mm_loadu_si128(from + 2), p3 = _mm_loadu_si128(from + 3);
    const __m128i t0 = _mm_unpacklo_epi16(p0, p1), t1 = _mm_unpackhi_epi16(p0, p1);
    const __m128i t2 = _mm_unpacklo_epi16(p2, p3), t3 = _mm_unpackhi_epi16(p2, p3);
    const __m128i rgLow = _mm_unpacklo_epi16(t0, t1), baLow = _mm_unpackhi_epi16(t0, t1);
    const __m128i rgHigh = _mm_unpacklo_epi16(t2, t3), baHigh = _mm_unpackhi_epi16(t2, t3);
    const auto store = [x, top](std::uint8_t* row, __m128i v) {
      // DownFrom16: halved, and 65535 to 32768.
      v = _mm_sub_epi16(_mm_srli_epi16(v, 1), _mm_cmpeq_epi16(v, top));
      _mm_storeu_si128(reinterpret_cast<__m128i*>(row + x * 2), v);
    };
    store(out[0], _mm_unpacklo_epi64(rgLow, rgHigh));
    store(out[1], _mm_unpackhi_epi64(rgLow, rgHigh));
    store(out[2], _mm_unpacklo_epi64(baLow, baHigh));
    store(out[3], _mm_unpackhi_epi64(baLow, baHigh));
  }
#endif
  for (; x < count; ++x) {
    for (std::size_t c = 0; c < 4; ++c)
      Store16(out[c] + x * 2, DownFrom16(Load16(in + x * 8 + c * 2)));
  }
}

}  // namespace Tarsa
