#include "filter/PResult.h"

#include <algorithm>
#include <array>
#include <cmath>
#include <cstring>

#include "filter/PFilter.h"
#include "filter/PImageHub.h"
#include "filter/PSource.h"
#include "framework/pixels/CMemoryPixmap.h"
#include "framework/pixels/SampleInterleave.h"
#include "gpu/POpenGLManager.h"
#include "gpu/POpenGLTile.h"
#include "lens/sphere/PhotoToSphere.h"
#include "solver/frame/Solver.h"

#if defined(__x86_64__) || defined(__i386__)
#include <immintrin.h>
#define ARCHWAY_X86_TEXELS 1
#endif

namespace Project {

namespace {

constexpr std::int32_t kTile = 128;
// Texels go to the GL in bands of some 64 KiB, still in the cache from
// their making.
constexpr std::size_t kBandBytes = 64 * 1024;

// The source planes that fill a texture's R, G, B and A. Gray repeats its
// one plane in R, G and B; a fifth plane goes in a second pass's A.
std::array<std::uint32_t, 4> TexturePlanes(std::uint32_t planes, std::uint32_t pass) {
  if (planes <= 2) return {0, 0, 0, planes - 1};
  if (pass == 1) return {0, 0, 0, 4};
  return {0, 1, 2, 3};
}

std::uint16_t UpTo16(std::uint32_t s) { return s < 32768 ? std::uint16_t(2 * s) : 65535; }
std::uint16_t DownFrom16(std::uint32_t x) { return x < 65535 ? std::uint16_t(x / 2) : 32768; }

std::uint16_t Load16(const std::uint8_t* at) {
  std::uint16_t v;
  std::memcpy(&v, at, 2);
  return v;
}

void Store16(std::uint8_t* at, std::uint16_t v) { std::memcpy(at, &v, 2); }

// Texture rows are made from one row of each channel's plane: the channels
// are interleaved into RGBA texels, count of them at out.
using ChannelRows = std::array<const std::uint8_t*, 4>;

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

// 16-bit samples widened to the texture's full range.
void Interleave16(const ChannelRows& in, std::size_t count, std::uint8_t* out) {
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

#if defined(ARCHWAY_X86_TEXELS) && defined(__SSE2__)
// As Interleave16, each widened sample as the half float of its share of
// 65535, rounded to nearest even: what the GL stores for a 16-bit integer
// in a half-float texture, so the texture holds the same bits either way.
constexpr float kHalfScale = 1.0f / 65535.0f;

// Eight samples from at.
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

__attribute__((target("f16c"))) void InterleaveHalf(const ChannelRows& in, std::size_t count,
                                                    std::uint8_t* out) {
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

bool CanMakeHalves() {
  static const bool has = __builtin_cpu_supports("f16c") != 0;
  return has;
}
#else
void InterleaveHalf(const ChannelRows& in, std::size_t count, std::uint8_t* out) {
  Interleave16(in, count, out);
}

bool CanMakeHalves() { return false; }
#endif

// RGBA read back into four planes' rows, count pixels.
using PlaneRows = std::array<std::uint8_t*, 4>;

// 16-bit samples back to the range of the planes.
void Deinterleave16(const std::uint8_t* in, std::size_t count, const PlaneRows& out) {
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

// Rows of the source's planes that fill a texture's channels, interleaved
// into texels.
class TexelRows {
 public:
  TexelRows(std::uint32_t planes, std::uint32_t pass, std::uint32_t depth, bool halves,
            std::vector<std::uint8_t>& buffer, std::size_t width)
      : sampleBytes_(depth == 16 ? 2 : 1), halves_(halves), buffer_(buffer) {
    // Each plane is read once a row, whatever number of channels it fills.
    const std::array<std::uint32_t, 4> from = TexturePlanes(planes, pass);
    std::array<std::size_t, 4> slot{};
    for (std::size_t c = 0; c < 4; ++c) {
      slot[c] =
          std::size_t(std::find(read_.begin(), read_.begin() + distinct_, from[c]) - read_.begin());
      if (slot[c] == distinct_) read_[distinct_++] = from[c];
    }
    rowBytes_ = width * sampleBytes_;
    buffer_.resize(distinct_ * rowBytes_);
    for (std::size_t c = 0; c < 4; ++c) in_[c] = buffer_.data() + slot[c] * rowBytes_;
  }

  // width texels (at most the constructor's) from (x, y) of the source.
  void Read(const Tarsa::CPixmap& source, std::int32_t x, std::int32_t y, std::size_t width,
            std::uint8_t* out) const {
    for (std::size_t k = 0; k < distinct_; ++k)
      source.ReadRow(read_[k], x, y, std::uint32_t(width), buffer_.data() + k * rowBytes_);
    if (sampleBytes_ == 1) {
      Tarsa::PlanesToPixels<std::uint8_t>(in_, width, 4, out);
    } else if (halves_) {
      InterleaveHalf(in_, width, out);
    } else {
      Interleave16(in_, width, out);
    }
  }

 private:
  std::size_t sampleBytes_;
  bool halves_;
  std::vector<std::uint8_t>& buffer_;
  std::array<std::uint32_t, 4> read_{};
  std::size_t distinct_ = 0;
  std::size_t rowBytes_ = 0;
  ChannelRows in_{};
};

// A point of a mesh triangle in result pixels, with its source point.
struct MappedPoint {
  double x, y, u, v;
};

// Grows box (u0, v0, u1, v1) by the source points of the part of triangle
// (a, b, c) that lies in [x0, x1] x [y0, y1]. The map is affine over the
// triangle, so a point on an edge takes its source point by the same share.
void AddClippedTriangle(const MappedPoint& a, const MappedPoint& b, const MappedPoint& c, double x0,
                        double y0, double x1, double y1, double box[4]) {
  std::array<MappedPoint, 9> points{a, b, c}, kept{};
  std::size_t count = 3;
  // Keeps the side of one edge of the rectangle: side(p) >= 0 inside.
  const auto clip = [&](auto side) {
    std::size_t out = 0;
    for (std::size_t k = 0; k < count; ++k) {
      const MappedPoint& p = points[k];
      const MappedPoint& q = points[(k + 1) % count];
      const double sp = side(p), sq = side(q);
      if (sp >= 0) kept[out++] = p;
      if ((sp >= 0) != (sq >= 0)) {
        const double t = sp / (sp - sq);
        kept[out++] = {p.x + t * (q.x - p.x), p.y + t * (q.y - p.y), p.u + t * (q.u - p.u),
                       p.v + t * (q.v - p.v)};
      }
    }
    points = kept;
    count = out;
  };
  clip([&](const MappedPoint& p) { return p.x - x0; });
  clip([&](const MappedPoint& p) { return x1 - p.x; });
  clip([&](const MappedPoint& p) { return p.y - y0; });
  clip([&](const MappedPoint& p) { return y1 - p.y; });
  for (std::size_t k = 0; k < count; ++k) {
    box[0] = std::min(box[0], points[k].u), box[2] = std::max(box[2], points[k].u);
    box[1] = std::min(box[1], points[k].v), box[3] = std::max(box[3], points[k].v);
  }
}

std::int32_t NextPowerOfTwo(std::int32_t n) {
  std::int32_t p = 1;
  while (p < n) p *= 2;
  return p;
}

}  // namespace

PResult::PResult(PImageHub& hub, PFilter& filter)
    : hub_(hub),
      filter_(filter),
      imageMode_(filter.FilterRecord() != nullptr ? filter.FilterRecord()->imageMode : 0),
      colorPlanes_(filter.ColorPlanes()),
      depth_(filter.Depth()),
      pixelLayout_(filter.PixelLayout()),
      planes_(colorPlanes_ + 1) {}

PResult::~PResult() { DeleteTextures(); }

const PResult::CellSet& PResult::TileCells(std::int32_t col, std::int32_t row) const {
  static const CellSet kNone;
  if (col < 0 || row < 0 || col >= tilesAcross_ || row >= tilesDown_) return kNone;
  return tileCells_[std::size_t(row) * std::size_t(tilesAcross_) + std::size_t(col)];
}

void PResult::SetRect(const Tarsa::CRect& rect) {
  currentCol_ = currentRow_ = -1;
  ahead_.valid = false;
  inflight_.valid = false;
  DropBlocks();
  if (rect.IsEmpty()) {
    pixels_.reset();
    rect_ = {};
    tileCells_.clear();
    cellTiles_.clear();
    Clear();
    return;
  }
  PlaceStagePixels(pixels_, rect, depth_, planes_);
  rect_ = rect;
  resultWidth_ = std::int32_t(rect.Width());
  resultHeight_ = std::int32_t(rect.Height());
  Layout(rect, TileRect({rect.left, rect.top}, 0, 0));
  SetStepsPerCell(1);
  BuildTileIndex();
}

void PResult::Invalidate(const Tarsa::CRect& area) {
  const Tarsa::CRect stale = area.Intersect(rect_);
  if (stale.IsEmpty()) return;
  ClearCounts(stale);
  currentCol_ = currentRow_ = -1;
  // The source may have changed under it.
  ahead_.valid = false;
  inflight_.valid = false;
  DropBlocks();
  hub_.ResultChanged(stale);
}

void PResult::InvalidateAll() {
  if (rect_.IsEmpty()) return;
  const Tarsa::CRect rect = rect_;
  rect_ = {};  // SetRect takes the same rectangle as new
  SetRect(rect);
}

void PResult::BuildTileIndex() {
  lastPlacement_.valid = false;
  tilesAcross_ = (resultWidth_ + kTile - 1) / kTile;
  tilesDown_ = (resultHeight_ + kTile - 1) / kTile;
  tileCells_.assign(std::size_t(tilesAcross_) * std::size_t(tilesDown_), {});

  const Solver& solver = filter_.Constraints().GetSolver();
  const std::int32_t n = solver.GridSize();
  const std::int32_t cells = solver.CellCount();
  const std::vector<float>& positions = solver.Positions();
  const std::vector<float>& tex = solver.TexCoords();
  cellTiles_.assign(std::size_t(std::max(cells, 0)) * std::size_t(std::max(cells, 0)), {});
  if (cells <= 0 || n < cells + 1 || positions.size() < std::size_t(n) * n * 2 ||
      tex.size() < std::size_t(n) * n * 2)
    return;

  const BoxFit fit = solver.FitBox(0);
  meshScaleX_ = fit.viewWidth;
  meshScaleY_ = fit.viewHeight;
  meshOriginX_ = 0.5f * (fit.fitLeft + fit.fitRight);
  meshOriginY_ = 0.5f * (fit.fitBottom + fit.fitTop);
  const double width = resultWidth_, height = resultHeight_;
  const double tileW = kTile / width * meshScaleX_;
  const double tileH = kTile / height * meshScaleY_;
  // The tiles' lattice in the plane: the view is centred on the mesh origin.
  const double gridLeft = meshOriginX_ - 0.5 * meshScaleX_;
  const double gridTop = meshOriginY_ + 0.5 * meshScaleY_;
  // A cell's box is widened by a hundredth of a cell, so that a cell whose
  // edge lies on a tile's edge reaches the tile whose pixel centres it may
  // cover.
  const double growX = fit.fitWidth / cells * 0.01;
  const double growY = fit.fitHeight / cells * 0.01;
  const double sourceTilesX = width / kTile, sourceTilesY = height / kTile;

  for (std::int32_t j = 0; j < cells; ++j) {
    for (std::int32_t i = 0; i < cells; ++i) {
      if (!solver.IsCellInMask(i, j)) continue;
      double minX = INFINITY, maxX = -INFINITY, minY = INFINITY, maxY = -INFINITY;
      double minU = INFINITY, maxU = -INFINITY, minV = INFINITY, maxV = -INFINITY;
      for (int k = 0; k < 4; ++k) {
        const std::size_t at =
            (std::size_t(j + k / 2) * std::size_t(n) + std::size_t(i + k % 2)) * 2;
        minX = std::min<double>(minX, positions[at]);
        maxX = std::max<double>(maxX, positions[at]);
        minY = std::min<double>(minY, positions[at + 1]);
        maxY = std::max<double>(maxY, positions[at + 1]);
        minU = std::min<double>(minU, tex[at]);
        maxU = std::max<double>(maxU, tex[at]);
        minV = std::min<double>(minV, 1.0 - tex[at + 1]);
        maxV = std::max<double>(maxV, 1.0 - tex[at + 1]);
      }
      minX -= growX, maxX += growX, minY -= growY, maxY += growY;

      // Result tiles, rows counted downwards from the top.
      const double x0 = (minX - gridLeft) / tileW, x1 = (maxX - gridLeft) / tileW;
      const double y0 = (gridTop - maxY) / tileH, y1 = (gridTop - minY) / tileH;
      const auto c0 = std::int32_t(std::clamp(std::floor(x0), 0.0, double(tilesAcross_ - 1)));
      const auto c1 = std::int32_t(std::clamp(std::floor(x1), 0.0, double(tilesAcross_ - 1)));
      const auto r0 = std::int32_t(std::clamp(std::floor(y0), 0.0, double(tilesDown_ - 1)));
      const auto r1 = std::int32_t(std::clamp(std::floor(y1), 0.0, double(tilesDown_ - 1)));
      for (std::int32_t r = r0; r <= r1; ++r) {
        for (std::int32_t c = c0; c <= c1; ++c) {
          if (c < x1 && c + 1 > x0 && r < y1 && r + 1 > y0)
            tileCells_[std::size_t(r) * std::size_t(tilesAcross_) + std::size_t(c)].insert({i, j});
        }
      }

      // Source tiles under the cell's texture coordinates.
      const double u0 = minU * sourceTilesX, u1 = maxU * sourceTilesX;
      const double v0 = minV * sourceTilesY, v1 = maxV * sourceTilesY;
      const auto sc0 = std::int32_t(std::clamp(std::floor(u0), 0.0, double(tilesAcross_ - 1)));
      const auto sc1 = std::int32_t(std::clamp(std::floor(u1), 0.0, double(tilesAcross_ - 1)));
      const auto sr0 = std::int32_t(std::clamp(std::floor(v0), 0.0, double(tilesDown_ - 1)));
      const auto sr1 = std::int32_t(std::clamp(std::floor(v1), 0.0, double(tilesDown_ - 1)));
      CellSet& sources = cellTiles_[std::size_t(j) * std::size_t(cells) + std::size_t(i)];
      for (std::int32_t r = sr0; r <= sr1; ++r) {
        for (std::int32_t c = sc0; c <= sc1; ++c) {
          if (c < u1 && c + 1 > u0 && r < v1 && r + 1 > v0) sources.insert({c, r});
        }
      }
    }
  }
}

void PResult::NarrowTexture(std::int32_t col, std::int32_t row, TexturePlacement& place) const {
  const Solver& solver = filter_.Constraints().GetSolver();
  const std::int32_t n = solver.GridSize();
  const std::vector<float>& positions = solver.Positions();
  const std::vector<float>& tex = solver.TexCoords();
  const double width = resultWidth_, height = resultHeight_;
  const double gridLeft = meshOriginX_ - 0.5 * meshScaleX_;
  const double gridTop = meshOriginY_ + 0.5 * meshScaleY_;
  const auto corner = [&](std::int32_t i, std::int32_t j) {
    const std::size_t at = (std::size_t(j) * std::size_t(n) + std::size_t(i)) * 2;
    return MappedPoint{(positions[at] - gridLeft) / meshScaleX_ * width,
                       (gridTop - positions[at + 1]) / meshScaleY_ * height, tex[at] * width,
                       (1.0 - tex[at + 1]) * height};
  };
  // The tile's pixels, a little wider than their centres reach.
  constexpr double kSlack = 2.0;
  const double x0 = col * kTile - kSlack, y0 = row * kTile - kSlack;
  const double x1 = std::min<double>((col + 1) * kTile, width) + kSlack;
  const double y1 = std::min<double>((row + 1) * kTile, height) + kSlack;
  double box[4] = {INFINITY, INFINITY, -INFINITY, -INFINITY};
  for (const auto& [i, j] : TileCells(col, row)) {
    const MappedPoint a = corner(i, j), b = corner(i + 1, j);
    const MappedPoint c = corner(i + 1, j + 1), d = corner(i, j + 1);
    // Either diagonal may split the cell as it is drawn.
    AddClippedTriangle(a, b, c, x0, y0, x1, y1, box);
    AddClippedTriangle(a, c, d, x0, y0, x1, y1, box);
    AddClippedTriangle(a, b, d, x0, y0, x1, y1, box);
    AddClippedTriangle(b, c, d, x0, y0, x1, y1, box);
  }
  if (!(box[0] <= box[2] && box[1] <= box[3])) return;

  // The bicubic kernel reads from a texel before the point's to two after,
  // the point being half a texel off the texels' corners.
  constexpr double kReach = 3.0;
  const auto left = std::int32_t(std::floor(box[0] - kReach));
  const auto top = std::int32_t(std::floor(box[1] - kReach));
  const auto right = std::int32_t(std::ceil(box[2] + kReach));
  const auto bottom = std::int32_t(std::ceil(box[3] + kReach));
  // The window within the texture as placed: the picture's part of it, and
  // the zeros around the picture where the window reaches them.
  const std::int32_t spanLeft = place.sourceLeft - place.padLeft;
  const std::int32_t spanTop = place.sourceTop - place.padTop;
  const std::int32_t spanRight = spanLeft + place.textureWidth;
  const std::int32_t spanBottom = spanTop + place.textureHeight;
  const std::int32_t keepLeft = std::max(left, place.sourceLeft);
  const std::int32_t keepTop = std::max(top, place.sourceTop);
  const std::int32_t keepRight = std::min(right, place.sourceLeft + place.sourceWidth);
  const std::int32_t keepBottom = std::min(bottom, place.sourceTop + place.sourceHeight);
  if (keepLeft >= keepRight || keepTop >= keepBottom) return;
  const std::int32_t padLeft = std::max(0, keepLeft - std::max(left, spanLeft));
  const std::int32_t padTop = std::max(0, keepTop - std::max(top, spanTop));
  const std::int32_t padRight = std::max(0, std::min(right, spanRight) - keepRight);
  const std::int32_t padBottom = std::max(0, std::min(bottom, spanBottom) - keepBottom);
  // Sizes in steps of 32 texels, so that textures kept from tile to tile
  // fit most tiles; the texels added are zeros the kernel does not reach.
  const auto step = [](std::int32_t size) { return (size + 31) / 32 * 32; };
  const std::int32_t textureWidth = step(padLeft + (keepRight - keepLeft) + padRight);
  const std::int32_t textureHeight = step(padTop + (keepBottom - keepTop) + padBottom);
  if (textureWidth >= place.textureWidth && textureHeight >= place.textureHeight) return;
  place.sourceLeft = keepLeft;
  place.sourceTop = keepTop;
  place.sourceWidth = keepRight - keepLeft;
  place.sourceHeight = keepBottom - keepTop;
  place.padLeft = padLeft;
  place.padTop = padTop;
  place.textureWidth = textureWidth;
  place.textureHeight = textureHeight;
}

bool PResult::PlaceTexture(std::int32_t col, std::int32_t row, TexturePlacement& place) const {
  // A tile is placed for its texture ahead and again for its geometry.
  if (!lastPlacement_.valid || lastPlacement_.col != col || lastPlacement_.row != row) {
    lastPlacement_.placed = Place(col, row, lastPlacement_.place);
    lastPlacement_.col = col;
    lastPlacement_.row = row;
    lastPlacement_.valid = true;
  }
  place = lastPlacement_.place;
  return lastPlacement_.placed;
}

bool PResult::Place(std::int32_t col, std::int32_t row, TexturePlacement& place) const {
  place = {};
  const CellSet& cellSet = TileCells(col, row);
  if (cellSet.empty()) return false;

  const Solver& solver = filter_.Constraints().GetSolver();
  const std::int32_t n = solver.GridSize();
  const std::int32_t cells = solver.CellCount();
  const std::vector<float>& tex = solver.TexCoords();
  const double width = resultWidth_, height = resultHeight_;

  std::int32_t i0 = INT32_MAX, i1 = INT32_MIN, j0 = INT32_MAX, j1 = INT32_MIN;
  double uMin = 3.4e38, uMax = -3.4e38, vMin = 3.4e38, vMax = -3.4e38;
  for (const auto& [i, j] : cellSet) {
    i0 = std::min(i0, i), i1 = std::max(i1, i), j0 = std::min(j0, j), j1 = std::max(j1, j);
    for (int k = 0; k < 4; ++k) {
      const std::size_t at = (std::size_t(j + k / 2) * std::size_t(n) + std::size_t(i + k % 2)) * 2;
      uMin = std::min<double>(uMin, tex[at]), uMax = std::max<double>(uMax, tex[at]);
      vMin = std::min<double>(vMin, tex[at + 1]), vMax = std::max<double>(vMax, tex[at + 1]);
    }
  }

  // Coordinates beyond the picture sample a border of zeros around the
  // source, so the outside comes out transparent rather than as repeated
  // edge pixels. Both axes get the border as soon as either needs it. In y
  // the high v is the top: texture rows run the other way.
  std::int32_t extraX = 0, extraY = 0;
  if (uMin < 0 || uMax > 1 || vMin < 0 || vMax > 1) {
    place.padLeft = std::int32_t((std::max(0.0, uMin) - uMin) * width) + 1;
    extraX = place.padLeft + std::int32_t((uMax - std::min(uMax, 1.0)) * width) + 1;
    place.padTop = std::int32_t((vMax - std::min(vMax, 1.0)) * height) + 1;
    extraY = place.padTop + std::int32_t((std::max(0.0, vMin) - vMin) * height) + 1;
  }
  // From cells to vertices.
  i1 = std::min(i1 + 1, cells);
  j1 = std::min(j1 + 1, cells);

  std::int32_t firstCol = INT32_MAX, lastCol = INT32_MIN, firstRow = INT32_MAX, lastRow = INT32_MIN;
  for (std::int32_t j = j0; j < j1; ++j) {
    for (std::int32_t i = i0; i < i1; ++i) {
      for (const auto& [c, r] : cellTiles_[std::size_t(j) * std::size_t(cells) + std::size_t(i)]) {
        firstCol = std::min(firstCol, c), lastCol = std::max(lastCol, c);
        firstRow = std::min(firstRow, r), lastRow = std::max(lastRow, r);
      }
    }
  }
  if (firstCol != INT32_MAX) {
    place.sourceLeft = std::min(firstCol * kTile, resultWidth_ - 1);
    place.sourceTop = std::min(firstRow * kTile, resultHeight_ - 1);
    place.sourceWidth = std::min(
        {129 + (lastCol - firstCol) * kTile, resultWidth_, resultWidth_ - place.sourceLeft});
    place.sourceHeight = std::min(
        {129 + (lastRow - firstRow) * kTile, resultHeight_, resultHeight_ - place.sourceTop});
  }
  place.textureWidth = place.sourceWidth + extraX;
  place.textureHeight = place.sourceHeight + extraY;
  if (place.textureWidth < 1 || place.textureHeight < 1) return false;
  NarrowTexture(col, row, place);
  if (!hub_.NpotTextures()) {
    // The source moves to the far side of the larger texture.
    const std::int32_t w = NextPowerOfTwo(place.textureWidth);
    const std::int32_t h = NextPowerOfTwo(place.textureHeight);
    place.padLeft += w - place.textureWidth;
    place.padTop += h - place.textureHeight;
    place.textureWidth = w;
    place.textureHeight = h;
  }
  place.firstI = i0;
  place.firstJ = j0;
  place.lastI = i1;
  place.lastJ = j1;
  const Tarsa::CRect sourceRect = hub_.SourceRect();
  place.source = Tarsa::CRect{sourceRect.left + place.sourceLeft, sourceRect.top + place.sourceTop,
                              sourceRect.left + place.sourceLeft + place.sourceWidth,
                              sourceRect.top + place.sourceTop + place.sourceHeight};
  return true;
}

bool PResult::PrepareTile(std::int32_t col, std::int32_t row, Tarsa::CRect& out) {
  vertexArray_.clear();
  texCoordArray_.clear();
  triangles_.clear();
  quads_.clear();
  if (!PlaceTexture(col, row, placement_)) return false;
  const TexturePlacement& place = placement_;

  const Solver& solver = filter_.Constraints().GetSolver();
  const std::int32_t n = solver.GridSize();
  const std::vector<float>& positions = solver.Positions();
  const std::vector<float>& tex = solver.TexCoords();
  const double width = resultWidth_, height = resultHeight_;
  const std::int32_t i0 = place.firstI, j0 = place.firstJ, i1 = place.lastI, j1 = place.lastJ;

  const std::int32_t across = i1 - i0 + 1;
  const std::int32_t down = j1 - j0 + 1;
  vertexArray_.assign(std::size_t(across) * std::size_t(down) * 2, 0.0f);
  texCoordArray_.assign(vertexArray_.size(), 0.0f);
  const SphereWarp& warp = *solver.GetWarp();
  for (std::int32_t j = j0; j <= j1; ++j) {
    for (std::int32_t i = i0; i <= i1; ++i) {
      if (!warp.IsVertexInside(i, j)) continue;
      const std::size_t at = (std::size_t(j) * std::size_t(n) + std::size_t(i)) * 2;
      const std::size_t to = (std::size_t(j - j0) * std::size_t(across) + std::size_t(i - i0)) * 2;
      vertexArray_[to] = positions[at];
      vertexArray_[to + 1] = positions[at + 1];
      texCoordArray_[to] =
          float((tex[at] * width - place.sourceLeft + place.padLeft) / place.textureWidth);
      texCoordArray_[to + 1] = float(
          ((1.0 - tex[at + 1]) * height - place.sourceTop + place.padTop) / place.textureHeight);
    }
  }

  const PSettings& settings = filter_.Settings();
  const OctaMap& sphere = *solver.GetOctaMap();
  const auto w = std::uint32_t(across);
  for (const auto& [c, r] : TileCells(col, row)) {
    const auto k = std::uint32_t((r - j0) * across + (c - i0));
    if (settings.meshUseTriangle == 0) {
      quads_.insert(quads_.end(), {k, k + w, k + w + 1, k + 1});
      continue;
    }
    // Split as the lines were traced.
    if (sphere.SplitsAlongMainDiagonal(c, r)) {
      triangles_.insert(triangles_.end(), {k, k + w, k + w + 1, k, k + 1, k + w + 1});
    } else {
      triangles_.insert(triangles_.end(), {k, k + w, k + 1, k + w, k + w + 1, k + 1});
    }
  }

  out = place.source;
  return true;
}

int PResult::Advance(std::int32_t col, std::int32_t row, std::uint32_t& stepCount, bool wait,
                     std::intptr_t /*arg1*/, std::intptr_t /*arg2*/) {
  if (Counter(col, row) >= StepsOf(col, row)) return 1;
  const Tarsa::CRect tile = TileRect({rect_.left, rect_.top}, col, row).Intersect(rect_);
  if (tile.IsEmpty()) {
    SetCount(col, row, StepsOf(col, row));
    ++stepCount;
    return 1;
  }
  PSource& source = hub_.Source();
  if (col != currentCol_ || row != currentRow_) {
    currentSourceRect_ = {};
    currentHasCells_ = PrepareTile(col, row, currentSourceRect_);
    currentCol_ = col;
    currentRow_ = row;
  }

  // Drawn tiles come back whole, every plane; a tile without cells stays
  // transparent.
  const bool drawn = hub_.GLUsable() && currentHasCells_;
  Tarsa::CMemoryPixmap dest(
      tile, planes_, depth_,
      drawn ? Tarsa::CMemoryPixmap::Contents::kUnset : Tarsa::CMemoryPixmap::Contents::kZeros);
  if (!hub_.GLUsable()) {
    // No warp without OpenGL: the result is the source.
    if (!BringUpToDate(source, tile, wait, stepCount)) return 1;
    dest.CopyFrom(*source.Pixels(), tile);
  } else if (currentHasCells_) {
    if (!currentSourceRect_.IsEmpty() &&
        !BringUpToDate(source, currentSourceRect_, wait, stepCount))
      return 1;
    const Tarsa::CPixmap* from = source.Pixels();
    std::unique_ptr<Tarsa::CMemoryPixmap> cut;
    if (filter_.Settings().projectionModel == PSettings::kModelFullSpherical) {
      // Near the poles and across the seam the equirectangular picture is
      // left out: the result sees empty source there.
      const auto mx = std::int32_t(0.02 * double(resultWidth_));
      const auto my = std::int32_t(0.105 * double(resultHeight_));
      const Tarsa::CRect inner{rect_.left + mx, rect_.top + my, rect_.right - mx,
                               rect_.bottom - my};
      const Tarsa::CRect kept = currentSourceRect_.Intersect(inner);
      if (kept != currentSourceRect_) {
        cut = std::make_unique<Tarsa::CMemoryPixmap>(currentSourceRect_, planes_, depth_);
        if (!kept.IsEmpty()) cut->CopyFrom(*from, kept);
        from = cut.get();
      }
    }
    RenderTile(dest, *from, currentSourceRect_, col, row);
    DrawAhead(col, row, stepCount);
  }
  pixels_->CopyFrom(dest, tile);
  SetCount(col, row, StepsOf(col, row));
  ++stepCount;
  return 1;
}

void PResult::Pack(const Tarsa::CPixmap& source, const TexturePlacement& place, std::uint32_t pass,
                   std::int32_t x0, std::int32_t y0, std::int32_t x1, std::int32_t y1) {
  const std::size_t texelBytes = depth_ == 16 ? 8 : 4;
  const std::size_t lineBytes = std::size_t(x1 - x0) * texelBytes;
  texels_.resize(lineBytes * std::size_t(y1 - y0));

  // The picture's texels, clipped to the block.
  const Tarsa::CRect& rect = place.source;
  const std::int32_t left = std::max(x0, place.padLeft);
  const std::int32_t right = std::min(x1, place.padLeft + std::int32_t(rect.Width()));
  const std::int32_t top = std::max(y0, place.padTop);
  const std::int32_t bottom = std::min(y1, place.padTop + std::int32_t(rect.Height()));
  const std::size_t width = right > left ? std::size_t(right - left) : 0;
  const TexelRows rows(planes_, pass, depth_, halfTexels_, sourceRows_, width);

  const std::size_t before = width > 0 ? std::size_t(left - x0) * texelBytes : lineBytes;
  const std::size_t after = width > 0 ? std::size_t(x1 - right) * texelBytes : 0;
  for (std::int32_t y = y0; y < y1; ++y) {
    std::uint8_t* line = texels_.data() + std::size_t(y - y0) * lineBytes;
    if (y < top || y >= bottom || width == 0) {
      std::memset(line, 0, lineBytes);
      continue;
    }
    std::memset(line, 0, before);
    std::memset(line + lineBytes - after, 0, after);
    rows.Read(source, rect.left + (left - place.padLeft), rect.top + (y - place.padTop), width,
              line + before);
  }
}

void PResult::Fill(const Tarsa::CPixmap& source, const TexturePlacement& place, std::uint32_t pass,
                   std::uint32_t texture) {
  const POpenGLTilePass format = TexelFormat(place.textureWidth, place.textureHeight);
  const std::size_t lineBytes = std::size_t(place.textureWidth) * (depth_ == 16 ? 8 : 4);
  const auto band = std::int32_t(std::max<std::size_t>(1, kBandBytes / lineBytes));
  for (std::int32_t y = 0; y < place.textureHeight; y += band) {
    const std::int32_t end = std::min(place.textureHeight, y + band);
    Pack(source, place, pass, 0, y, place.textureWidth, end);
    FillTileTexture(texture, format, 0, y, place.textureWidth, end - y, texels_.data(),
                    place.textureWidth);
  }
}

void PResult::FillMargins(const TexturePlacement& place, std::uint32_t texture) {
  const POpenGLTilePass format = TexelFormat(place.textureWidth, place.textureHeight);
  const std::int32_t width = place.textureWidth, height = place.textureHeight;
  const std::int32_t left = place.padLeft, top = place.padTop;
  const std::int32_t right = std::min(width, left + std::int32_t(place.source.Width()));
  const std::int32_t bottom = std::min(height, top + std::int32_t(place.source.Height()));
  if (left == 0 && top == 0 && right == width && bottom == height) return;
  const std::size_t lineBytes = std::size_t(width) * (depth_ == 16 ? 8 : 4);
  const auto band = std::int32_t(std::max<std::size_t>(1, kBandBytes / lineBytes));
  if (zeros_.size() < lineBytes * std::size_t(band)) zeros_.resize(lineBytes * std::size_t(band));
  // Rows of zeros from the top and the bottom, then the sides.
  const auto fill = [&](std::int32_t x0, std::int32_t y0, std::int32_t x1, std::int32_t y1) {
    for (std::int32_t y = y0; y < y1 && x0 < x1; y += band) {
      const std::int32_t end = std::min(y1, y + band);
      FillTileTexture(texture, format, x0, y, x1 - x0, end - y, zeros_.data(), x1 - x0);
    }
  };
  fill(0, 0, width, top);
  fill(0, bottom, width, height);
  fill(0, top, left, bottom);
  fill(right, top, width, bottom);
}

void PResult::FillPicture(const Tarsa::CPixmap& source, const TexturePlacement& place,
                          std::uint32_t texture, const std::vector<Tarsa::CRect>& parts,
                          std::vector<Tarsa::CRect>* late) {
  const POpenGLTilePass format = TexelFormat(place.textureWidth, place.textureHeight);
  const std::size_t texelBytes = depth_ == 16 ? 8 : 4;
  PSource& stage = hub_.Source();
  for (const Tarsa::CRect& part : parts) {
    std::int32_t firstCol = 0, firstRow = 0;
    std::uint32_t columns = 0, rows = 0;
    if (!stage.CellSpan(part, firstCol, firstRow, columns, rows)) continue;
    for (std::uint32_t r = 0; r < rows; ++r) {
      for (std::uint32_t c = 0; c < columns; ++c) {
        const std::int32_t col = firstCol + std::int32_t(c), row = firstRow + std::int32_t(r);
        Tarsa::CRect cell;
        if (!stage.CellRect(col, row, cell)) continue;
        const Tarsa::CRect area = cell.Intersect(part);
        if (area.IsEmpty()) continue;
        if (late != nullptr) {
          // Reading a tile the stage has not read would see other pixels
          // than the tile will.
          std::uint32_t steps = 0;
          if (!BringUpToDate(stage, cell, false, steps)) {
            late->push_back(area);
            continue;
          }
        }
        const TexelBlock& block = Block(source, col, row, cell);
        const std::uint8_t* texels =
            block.texels.data() + (std::size_t(area.top - cell.top) * std::size_t(cell.Width()) +
                                   std::size_t(area.left - cell.left)) *
                                      texelBytes;
        FillTileTexture(texture, format, place.padLeft + (area.left - place.source.left),
                        place.padTop + (area.top - place.source.top), std::int32_t(area.Width()),
                        std::int32_t(area.Height()), texels, std::int32_t(cell.Width()));
      }
    }
  }
}

const PResult::TexelBlock& PResult::Block(const Tarsa::CPixmap& source, std::int32_t col,
                                          std::int32_t row, const Tarsa::CRect& rect) {
  const PSource& stage = hub_.Source();
  if (blockSource_ != &source || blockHalves_ != halfTexels_ ||
      blockColumns_ != std::int32_t(stage.Columns()) ||
      blockIndex_.size() != std::size_t(stage.Columns()) * stage.Rows()) {
    DropBlocks();
    blockSource_ = &source;
    blockHalves_ = halfTexels_;
    blockColumns_ = std::int32_t(stage.Columns());
    blockIndex_.assign(std::size_t(stage.Columns()) * stage.Rows(), -1);
  }
  std::int32_t& index =
      blockIndex_[std::size_t(row) * std::size_t(blockColumns_) + std::size_t(col)];
  if (index >= 0) {
    TexelBlock& block = blocks_[std::size_t(index)];
    block.lastUse = ++blockUses_;
    return block;
  }

  // Source tiles enough for the textures of a few rows of tiles, which
  // reach some four rows of source tiles, within a few tens of MiB; past
  // that the one used least recently goes.
  constexpr std::size_t kBlockRows = 6;
  constexpr std::size_t kBlockBudget = 48u << 20;
  const std::size_t texelBytes = depth_ == 16 ? 8 : 4;
  const std::size_t blockBytes = std::size_t(kTile) * kTile * texelBytes;
  const std::size_t capacity = std::max<std::size_t>(
      16, std::min(std::size_t(blockColumns_) * kBlockRows, kBlockBudget / blockBytes));
  std::size_t slot = blocks_.size();
  if (slot >= capacity) {
    slot = std::size_t(std::min_element(blocks_.begin(), blocks_.end(),
                                        [](const TexelBlock& a, const TexelBlock& b) {
                                          return a.lastUse < b.lastUse;
                                        }) -
                       blocks_.begin());
    const TexelBlock& old = blocks_[slot];
    blockIndex_[std::size_t(old.row) * std::size_t(blockColumns_) + std::size_t(old.col)] = -1;
  } else {
    blocks_.emplace_back();
  }
  TexelBlock& block = blocks_[slot];
  block.col = col;
  block.row = row;
  block.rect = rect;
  block.lastUse = ++blockUses_;
  const auto width = std::size_t(rect.Width());
  block.texels.resize(width * std::size_t(rect.Height()) * texelBytes);
  const TexelRows rows(planes_, 0, depth_, halfTexels_, sourceRows_, width);
  for (std::int32_t y = rect.top; y < rect.bottom; ++y) {
    rows.Read(source, rect.left, y, width,
              block.texels.data() + std::size_t(y - rect.top) * width * texelBytes);
  }
  index = std::int32_t(slot);
  return block;
}

void PResult::DropBlocks() {
  blocks_.clear();
  blockIndex_.clear();
  blockSource_ = nullptr;
}

void PResult::FillAhead(const Tarsa::CPixmap& source, std::int32_t col, std::int32_t row,
                        std::uint32_t drawing, std::uint32_t* stepCount) {
  ahead_.valid = false;
  // Tiles go row by row.
  std::int32_t nextCol = col + 1, nextRow = row;
  if (nextCol >= tilesAcross_) nextCol = 0, ++nextRow;
  if (nextRow >= tilesDown_ || Counter(nextCol, nextRow) >= StepsOf(nextCol, nextRow)) return;
  TexturePlacement& next = ahead_.placement;
  if (!PlaceTexture(nextCol, nextRow, next) || next.source.IsEmpty() ||
      !source.Bounds().Contains(next.source))
    return;
  ahead_.col = nextCol;
  ahead_.row = nextRow;
  ahead_.texture = TextureOfSize(next.textureWidth, next.textureHeight, drawing);
  ahead_.late.clear();
  if (stepCount != nullptr && !BringUpToDate(hub_.Source(), next.source, true, *stepCount)) return;
  FillMargins(next, ahead_.texture);
  FillPicture(source, next, ahead_.texture, {next.source}, &ahead_.late);
  ahead_.valid = true;
}

POpenGLTilePass PResult::TexelFormat(std::int32_t width, std::int32_t height) const {
  POpenGLTilePass format;
  format.textureWidth = width;
  format.textureHeight = height;
  format.textureFormat = hub_.TextureFormat();
  format.pixelFormat = hub_.PixelFormat();
  format.pixelType = hub_.PixelType();
  format.halfTexels = halfTexels_;
  return format;
}

void PResult::Unpack(Tarsa::CMemoryPixmap& dest, const Tarsa::CRect& tile,
                     std::uint32_t pass) const {
  // Target row 0 is the tile's top row: the view puts the plane's top there.
  const Tarsa::CRect area = dest.Bounds();
  const auto width = std::int32_t(area.Width());
  const bool wide = depth_ == 16;
  // (plane, channel) pairs that come back from this pass.
  std::array<std::pair<std::uint32_t, std::uint32_t>, 4> back{};
  std::size_t count = 0;
  if (planes_ <= 2) {
    back[count++] = {0, 0};
    back[count++] = {planes_ - 1, 3};
  } else if (pass == 1) {
    back[count++] = {4, 3};
  } else {
    for (std::uint32_t c = 0; c < 4; ++c) back[count++] = {c, c};
  }
  for (std::int32_t y = area.top; y < area.bottom; ++y) {
    const std::size_t line = std::size_t(y - tile.top) * POpenGLManager::kSurfaceSize +
                             std::size_t(area.left - tile.left);
    if (count == 4) {
      // Every channel to its own plane.
      const PlaneRows to{dest.Address(0, area.left, y), dest.Address(1, area.left, y),
                         dest.Address(2, area.left, y), dest.Address(3, area.left, y)};
      if (wide) {
        Deinterleave16(readback_.data() + line * 8, std::size_t(width), to);
      } else {
        Tarsa::PixelsToPlanes<std::uint8_t>(readback_.data() + line * 4, 4, std::size_t(width), to,
                                            255);
      }
      continue;
    }
    for (std::size_t k = 0; k < count; ++k) {
      const auto [plane, channel] = back[k];
      std::uint8_t* to = dest.Address(plane, area.left, y);
      if (wide) {
        const std::uint8_t* in = readback_.data() + line * 8 + channel * 2;
        for (std::int32_t x = 0; x < width; ++x)
          Store16(to + std::size_t(x) * 2, DownFrom16(Load16(in + std::size_t(x) * 8)));
      } else {
        const std::uint8_t* in = readback_.data() + line * 4 + channel;
        for (std::int32_t x = 0; x < width; ++x) to[x] = in[std::size_t(x) * 4];
      }
    }
  }
}

POpenGLTilePass PResult::TilePass(const Tarsa::CPixmap& source, const Tarsa::CRect& sourceRect,
                                  std::int32_t col, std::int32_t row) {
  const TexturePlacement& place = placement_;
  const double s = std::max(meshScaleX_, meshScaleY_);
  const double fx = double(kTile) / resultWidth_;
  const double fy = double(kTile) / resultHeight_;
  const double view = std::min(fx, fy) * 2;
  const double aspect = double(resultWidth_) / resultHeight_;

  POpenGLTilePass pass;
  pass.left = -std::min(aspect, 1.0);
  pass.right = view - std::min(aspect, 1.0);
  pass.bottom = std::min(1.0 / aspect, 1.0);
  pass.top = pass.bottom - view;
  pass.zoom = float(2.0 / s);
  pass.shiftX = float(-col * meshScaleX_ * fx - meshOriginX_);
  pass.shiftY = float(row * meshScaleY_ * fy - meshOriginY_);
  pass.drawGeometry = currentHasCells_ && source.Bounds().Contains(sourceRect);
  pass.textured = filter_.Settings().textureRendering != 0;
  pass.textureWidth = place.textureWidth;
  pass.textureHeight = place.textureHeight;
  pass.pictureTexels[0] = float(place.padLeft);
  pass.pictureTexels[1] = float(place.padTop);
  pass.pictureTexels[2] = float(place.padLeft + place.sourceWidth - 1);
  pass.pictureTexels[3] = float(place.padTop + place.sourceHeight - 1);
  SetCover(pass, 0);
  pass.textureFormat = hub_.TextureFormat();
  pass.pixelFormat = hub_.PixelFormat();
  pass.pixelType = hub_.PixelType();
  pass.vertices = vertexArray_.data();
  pass.texCoords = texCoordArray_.data();
  pass.triangles = triangles_.data();
  pass.triangleIndices = triangles_.size();
  pass.quads = quads_.data();
  pass.quadIndices = quads_.size();
  const std::size_t sampleBytes = depth_ == 16 ? 2 : 1;
  readback_.resize(std::size_t(POpenGLManager::kSurfaceSize) * POpenGLManager::kSurfaceSize * 4 *
                   sampleBytes);
  pass.readback = readback_.data();
  return pass;
}

void PResult::SetCover(POpenGLTilePass& pass, std::uint32_t passIndex) const {
  const TexturePlacement& place = placement_;
  const std::shared_ptr<PhotoToSphere>& model = filter_.Constraints().GetSolver().GetImageModel();
  float uv[2], radius = 0;
  if (model != nullptr && model->CoverCircle(uv, radius)) {
    // Into the texture as the texture coordinates go (see Place); rows run
    // from the top.
    pass.coverCircle[0] = float(uv[0] * resultWidth_ - place.sourceLeft + place.padLeft - 0.5);
    pass.coverCircle[1] =
        float((1.0 - uv[1]) * resultHeight_ - place.sourceTop + place.padTop - 0.5);
    pass.coverCircle[2] = float(double(radius) * resultWidth_ / model->GetImage()->width);
  }
  // With transparency the edge fades the alpha, the last plane, which
  // rides in the last pass's A; without, every channel fades to the black
  // of the outside.
  const bool fadeAll = !hub_.Source().HasAlpha();
  const bool lastPass = passIndex + 1 == (planes_ < 5 ? 1u : 2u);
  for (int c = 0; c < 4; ++c) pass.coverScale[c] = fadeAll || (lastPass && c == 3) ? 1.0f : 0.0f;
}

void PResult::RenderTile(Tarsa::CMemoryPixmap& dest, const Tarsa::CPixmap& source,
                         const Tarsa::CRect& sourceRect, std::int32_t col, std::int32_t row) {
  POpenGLManager& gl = hub_.GLManager();
  placement_.source = sourceRect;
  const TexturePlacement& place = placement_;
  POpenGLTilePass pass = TilePass(source, sourceRect, col, row);
  const Tarsa::CRect tile = TileRect({rect_.left, rect_.top}, col, row);

  const std::uint32_t passes = planes_ < 5 ? 1 : 2;
  const bool textured = pass.drawGeometry && pass.textured;
  // With one pass and the stage's own source, textures come from the kept
  // source tiles, and the next tile's is filled while this one draws.
  const bool fromBlocks = textured && passes == 1 && &source == hub_.Source().Pixels();
  const bool drawn = inflight_.valid && inflight_.col == col && inflight_.row == row &&
                     inflight_.placement == place && inflight_.draw == gl.DrawCount() && fromBlocks;
  inflight_.valid = false;
  gl.MakeCurrent();
  try {
    halfTexels_ = depth_ == 16 && pass.textureFormat == PImageHub::kGLRGBA16F &&
                  pass.pixelType == PImageHub::kGLUnsignedShort && CanMakeHalves() &&
                  TakesHalfFloatTexels();
    pass.halfTexels = halfTexels_;
    const bool ready = fromBlocks && ahead_.valid && ahead_.col == col && ahead_.row == row &&
                       ahead_.placement == place && blockSource_ == &source &&
                       blockHalves_ == halfTexels_;
    if (!drawn) ahead_.valid = false;
    for (std::uint32_t p = 0; p < passes; ++p) {
      std::uint32_t made = 0;
      SetCover(pass, p);
      if (!drawn) {
        if (ready) {
          // What was left out has been read by now.
          pass.texture = ahead_.texture;
          FillPicture(source, place, pass.texture, ahead_.late, nullptr);
        } else if (fromBlocks) {
          pass.texture = TextureOfSize(place.textureWidth, place.textureHeight, 0);
          FillMargins(place, pass.texture);
          FillPicture(source, place, pass.texture, {place.source}, nullptr);
        } else if (textured) {
          pass.texture = TextureOfSize(place.textureWidth, place.textureHeight, 0);
          Fill(source, place, p, pass.texture);
        }
        made = DrawTilePass(gl, pass);
        if (fromBlocks) FillAhead(source, col, row, pass.texture);
      }
      ReadTilePass(pass, made);
      Unpack(dest, tile, p);
    }
    // After the last tile the kept source tiles have served their turn.
    if (col + 1 >= tilesAcross_ && row + 1 >= tilesDown_) DropBlocks();
  } catch (...) {
    ahead_.valid = false;
    gl.ReleaseCurrent();
    throw;
  }
  gl.ReleaseCurrent();
}

void PResult::DrawAhead(std::int32_t col, std::int32_t row, std::uint32_t& stepCount) {
  inflight_.valid = false;
  if (!ahead_.valid || planes_ >= 5 || !hub_.GLUsable() ||
      filter_.Settings().projectionModel == PSettings::kModelFullSpherical)
    return;
  // Only the tile that comes next, and only from the texture ahead.
  std::int32_t nextCol = col + 1, nextRow = row;
  if (nextCol >= tilesAcross_) nextCol = 0, ++nextRow;
  if (ahead_.col != nextCol || ahead_.row != nextRow) return;
  PSource& source = hub_.Source();
  const Tarsa::CPixmap* pixels = source.Pixels();
  if (pixels == nullptr || blockSource_ != pixels || blockHalves_ != halfTexels_) return;
  if (!BringUpToDate(source, ahead_.placement.source, true, stepCount)) return;

  Tarsa::CRect sourceRect;
  currentHasCells_ = PrepareTile(nextCol, nextRow, sourceRect);
  currentSourceRect_ = sourceRect;
  currentCol_ = nextCol;
  currentRow_ = nextRow;
  if (!currentHasCells_ || !(placement_ == ahead_.placement)) return;
  POpenGLTilePass pass = TilePass(*pixels, sourceRect, nextCol, nextRow);
  if (!pass.drawGeometry || !pass.textured) return;
  pass.halfTexels = halfTexels_;

  POpenGLManager& gl = hub_.GLManager();
  gl.MakeCurrent();
  try {
    pass.texture = ahead_.texture;
    FillPicture(*pixels, placement_, pass.texture, ahead_.late, nullptr);
    ahead_.valid = false;
    DrawTilePass(gl, pass);
    inflight_ = {true, nextCol, nextRow, placement_, gl.DrawCount()};
    FillAhead(*pixels, nextCol, nextRow, pass.texture, &stepCount);
  } catch (...) {
    ahead_.valid = false;
    inflight_.valid = false;
    gl.ReleaseCurrent();
    throw;
  }
  gl.ReleaseCurrent();
}

std::uint32_t PResult::TextureOfSize(std::int32_t width, std::int32_t height, std::uint32_t busy) {
  KeptTexture* pick = nullptr;
  for (KeptTexture& kept : textures_) {
    if (kept.name != 0 && kept.name != busy && kept.width == width && kept.height == height) {
      pick = &kept;
      break;
    }
  }
  if (pick == nullptr) {
    for (KeptTexture& kept : textures_) {
      const bool free = kept.name == 0 || kept.name != busy;
      if (free && (pick == nullptr || kept.lastUse < pick->lastUse)) pick = &kept;
    }
    DefineTileTexture(hub_.GLManager(), pick->name, TexelFormat(width, height));
    pick->width = width;
    pick->height = height;
  }
  pick->lastUse = ++textureUses_;
  return pick->name;
}

void PResult::DeleteTextures() {
  ahead_.valid = false;
  inflight_.valid = false;
  if (std::all_of(textures_.begin(), textures_.end(),
                  [](const KeptTexture& kept) { return kept.name == 0; }))
    return;
  // The names belong to the manager's context; without it they went with it.
  POpenGLManager& gl = hub_.GLManager();
  gl.MakeCurrent();
  if (gl.MadeCurrent()) {
    for (KeptTexture& kept : textures_) DeleteTileTexture(kept.name);
  }
  gl.ReleaseCurrent();
  textures_ = {};
}

}  // namespace Project
