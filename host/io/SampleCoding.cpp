#include "host/io/SampleCoding.h"

#include <cstring>
#include <limits>
#include <type_traits>

namespace Host {

namespace {

template <typename T>
void Spread(const T* in, int stride, int firstPlane, int planes, HostDocument& document, int32_t x,
            int32_t y, int32_t count, std::span<T> (HostDocument::*plane)(int)) {
  const size_t start = static_cast<size_t>(y) * document.Width() + x;
  for (int k = 0; k < planes; ++k) {
    T* out = (document.*plane)(firstPlane + k).data() + start;
    const T* from = in + k;
    if (stride == 1) {
      std::memcpy(out, from, sizeof(T) * count);
      continue;
    }
    for (int32_t i = 0; i < count; ++i) out[i] = from[static_cast<size_t>(i) * stride];
  }
}

// Divides premultiplied file samples by their transparency. Unsigned samples
// are premultiplied toward 0; signed ones toward their zero as well.
template <typename T>
void Unpremultiply(T* samples, const T* alpha, size_t count, SampleCoding coding) {
  using Signed = std::make_signed_t<T>;
  constexpr int64_t kMax = static_cast<int64_t>(static_cast<T>(~T{0}));
  for (size_t i = 0; i < count; ++i) {
    const int64_t a = alpha[i];
    if (a == 0 || a == kMax) continue;
    if (coding == SampleCoding::kSignedCentre) {
      const int64_t s = static_cast<Signed>(samples[i]);
      const int64_t scaled = s >= 0 ? (s * kMax + a / 2) / a : -((-s * kMax + a / 2) / a);
      const int64_t lo = std::numeric_limits<Signed>::min();
      const int64_t hi = std::numeric_limits<Signed>::max();
      samples[i] = static_cast<T>(static_cast<Signed>(std::clamp(scaled, lo, hi)));
    } else {
      const int64_t scaled = (static_cast<int64_t>(samples[i]) * kMax + a / 2) / a;
      samples[i] = static_cast<T>(std::min(scaled, kMax));
    }
  }
}

void Decode8(std::span<uint8_t> plane, SampleCoding coding) {
  switch (coding) {
    case SampleCoding::kDirect:
      return;
    case SampleCoding::kInverted:
      for (uint8_t& v : plane) v = static_cast<uint8_t>(255 - v);
      return;
    case SampleCoding::kSignedCentre:
      for (uint8_t& v : plane) v = static_cast<uint8_t>(v ^ 0x80);
      return;
  }
}

uint16_t HostFromSigned16(uint16_t file) {
  // Half steps round up, so that the file's largest value, 32767 (a* just
  // under +128), comes back as the host's full scale.
  const int32_t s = static_cast<int16_t>(file);
  return static_cast<uint16_t>(std::clamp(16384 + ((s + 1) >> 1), 0, 32768));
}

uint16_t SignedFromHost16(uint16_t host) {
  const int32_t s = std::clamp(2 * (static_cast<int32_t>(host) - 16384), -32768, 32767);
  return static_cast<uint16_t>(static_cast<int16_t>(s));
}

void Decode16(std::span<uint16_t> plane, SampleCoding coding) {
  switch (coding) {
    case SampleCoding::kDirect:
      for (uint16_t& v : plane) v = HostFromFile16(v);
      return;
    case SampleCoding::kInverted:
      for (uint16_t& v : plane) v = HostFromFile16(static_cast<uint16_t>(65535 - v));
      return;
    case SampleCoding::kSignedCentre:
      for (uint16_t& v : plane) v = HostFromSigned16(v);
      return;
  }
}

template <typename T>
void Encode(const T* plane, SampleCoding coding, T* out, int stride, int32_t count) {
  for (int32_t i = 0; i < count; ++i) {
    const T v = plane[i];
    T coded;
    if constexpr (sizeof(T) == 1) {
      switch (coding) {
        case SampleCoding::kDirect:
          coded = v;
          break;
        case SampleCoding::kInverted:
          coded = static_cast<T>(255 - v);
          break;
        default:
          coded = static_cast<T>(v ^ 0x80);
          break;
      }
    } else {
      switch (coding) {
        case SampleCoding::kDirect:
          coded = FileFromHost16(v);
          break;
        case SampleCoding::kInverted:
          coded = static_cast<T>(65535 - FileFromHost16(v));
          break;
        default:
          coded = SignedFromHost16(v);
          break;
      }
    }
    out[static_cast<size_t>(i) * stride] = coded;
  }
}

}  // namespace

void SpreadSamples(const void* in, int stride, int firstPlane, int planes, HostDocument& document,
                   int32_t x, int32_t y, int32_t count) {
  if (document.Depth() == 16) {
    Spread(static_cast<const uint16_t*>(in), stride, firstPlane, planes, document, x, y, count,
           static_cast<std::span<uint16_t> (HostDocument::*)(int)>(&HostDocument::Plane16));
  } else {
    Spread(static_cast<const uint8_t*>(in), stride, firstPlane, planes, document, x, y, count,
           static_cast<std::span<uint8_t> (HostDocument::*)(int)>(&HostDocument::Plane8));
  }
}

void DecodePlanes(HostDocument& document, std::span<const SampleCoding> colourCodings,
                  bool associatedAlpha) {
  const bool unpremultiply = associatedAlpha && document.HasTransparency();
  const int alphaPlane = document.TransparencyPlane();
  for (int p = 0; p < document.ColourPlanes(); ++p) {
    const SampleCoding coding = colourCodings[p];
    if (document.Depth() == 16) {
      if (unpremultiply) {
        Unpremultiply(document.Plane16(p).data(), document.Plane16(alphaPlane).data(),
                      document.SamplesPerPlane(), coding);
      }
      Decode16(document.Plane16(p), coding);
    } else {
      if (unpremultiply) {
        Unpremultiply(document.Plane8(p).data(), document.Plane8(alphaPlane).data(),
                      document.SamplesPerPlane(), coding);
      }
      Decode8(document.Plane8(p), coding);
    }
  }
  if (document.HasTransparency() && document.Depth() == 16) {
    Decode16(document.Plane16(alphaPlane), SampleCoding::kDirect);
  }
}

void EncodeRow(const HostDocument& document, int32_t y, std::span<const SampleCoding> colourCodings,
               void* out) {
  const int planes = document.PlaneCount();
  const size_t start = static_cast<size_t>(y) * document.Width();
  for (int p = 0; p < planes; ++p) {
    const SampleCoding coding =
        p < document.ColourPlanes() ? colourCodings[p] : SampleCoding::kDirect;
    if (document.Depth() == 16) {
      Encode(document.Plane16(p).data() + start, coding, static_cast<uint16_t*>(out) + p, planes,
             document.Width());
    } else {
      Encode(document.Plane8(p).data() + start, coding, static_cast<uint8_t*>(out) + p, planes,
             document.Width());
    }
  }
}

}  // namespace Host
