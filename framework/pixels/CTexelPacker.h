#pragma once

#include <array>
#include <cstddef>
#include <cstdint>
#include <vector>

#include "framework/core/CRect.h"

namespace Tarsa {

class CMemoryPixmap;
class CPixmap;

// One texture pass's RGBA texels made from a pixmap's planes, and the texels
// a pass drew put back into planes. A pass carries four planes: gray repeats
// its one plane in R, G and B with the last plane in A; a fifth plane rides
// alone in a second pass's A. 8-bit samples go as bytes. 16-bit samples (0
// to 32768) are widened to the texture's full range, as 16-bit integers or
// as the half floats the GL would make of those integers, and narrowed back
// on the way out. A packer is a value made for one pass and owns nothing:
// rows pass through a scratch buffer that the caller keeps from use to use,
// so that a row costs no allocation.
class CTexelPacker {
 public:
  // One row of samples for each of R, G, B and A; one row of each of four
  // planes.
  using ChannelRows = std::array<const std::uint8_t*, 4>;
  using PlaneRows = std::array<std::uint8_t*, 4>;

  // planes: the pixmap's, one to five; pass: 0, or 1 for a fifth plane;
  // halves: 16-bit samples go as half floats (see CanMakeHalves).
  CTexelPacker(std::uint32_t planes, std::uint32_t pass, std::uint32_t depth, bool halves);

  // The planes that fill R, G, B and A in pass.
  static std::array<std::uint32_t, 4> ChannelPlanes(std::uint32_t planes, std::uint32_t pass);
  // Whether this processor converts to half floats; without, halves must
  // not be asked for.
  static bool CanMakeHalves();

  std::size_t TexelBytes() const { return sampleBytes_ * 4; }

  // width texels from (x, y) of source into out, rightwards.
  void Read(const CPixmap& source, std::int32_t x, std::int32_t y, std::size_t width,
            std::uint8_t* out, std::vector<std::uint8_t>& scratch) const;
  // Texels [x0, x1) x [y0, y1) of a texture that holds source's pixels over
  // picture (source coordinates) with its top left at texel (at.x, at.y),
  // and zeros elsewhere: into out, resized to rows of x1 - x0 texels.
  void Pack(const CPixmap& source, const CRect& picture, CPoint at, std::int32_t x0,
            std::int32_t y0, std::int32_t x1, std::int32_t y1, std::vector<std::uint8_t>& out,
            std::vector<std::uint8_t>& scratch) const;
  // The planes this pass carries, from texels into dest over its bounds:
  // rows of stride texels whose first texel lies at origin of dest's
  // coordinates.
  void Unpack(const std::uint8_t* texels, std::size_t stride, CPoint origin,
              CMemoryPixmap& dest) const;

  // The row kernels, count texels each. 16-bit samples widened (a doubling
  // that saturates at 65535) into texels of integers or of half floats
  // (the widened value's share of 65535, rounded to nearest even); and
  // texels of 16-bit integers narrowed back (halved, 65535 to 32768).
  static void Widen16(const ChannelRows& in, std::size_t count, std::uint8_t* out);
  static void WidenToHalves(const ChannelRows& in, std::size_t count, std::uint8_t* out);
  static void Narrow16(const std::uint8_t* in, std::size_t count, const PlaneRows& out);

 private:
  std::uint32_t planes_;
  std::uint32_t pass_;
  std::size_t sampleBytes_;
  bool halves_;
  // The distinct planes read, each once a row whatever number of channels
  // it fills, and for each channel its plane's place among them.
  std::array<std::uint32_t, 4> read_{};
  std::size_t distinct_ = 0;
  std::array<std::size_t, 4> slot_{};
};

}  // namespace Tarsa
