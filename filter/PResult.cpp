#include "filter/PResult.h"

#include <algorithm>
#include <array>
#include <cmath>
#include <cstring>

#include "filter/PFilter.h"
#include "filter/PImageHub.h"
#include "filter/PSource.h"
#include "framework/pixels/CMemoryPixmap.h"
#include "gpu/POpenGLManager.h"
#include "gpu/POpenGLTile.h"
#include "solver/frame/Solver.h"

namespace Project {

namespace {

constexpr std::int32_t kTile = 128;

// The source planes that fill a texture's R, G, B and A. Gray repeats its
// one plane in R, G and B; a fifth plane goes in a second pass's A.
std::array<std::uint32_t, 4> TexturePlanes(std::uint32_t planes, std::uint32_t pass) {
  if (planes <= 2) return {0, 0, 0, planes - 1};
  if (pass == 1) return {0, 0, 0, 4};
  return {0, 1, 2, 3};
}

std::uint16_t UpTo16(std::uint32_t s) { return s < 32768 ? std::uint16_t(2 * s) : 65535; }
std::uint16_t DownFrom16(std::uint32_t x) { return x < 65535 ? std::uint16_t(x / 2) : 32768; }

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

const PResult::CellSet& PResult::TileCells(std::int32_t col, std::int32_t row) const {
  static const CellSet kNone;
  if (col < 0 || row < 0 || col >= tilesAcross_ || row >= tilesDown_) return kNone;
  return tileCells_[std::size_t(row) * std::size_t(tilesAcross_) + std::size_t(col)];
}

void PResult::SetRect(const Tarsa::CRect& rect) {
  currentCol_ = currentRow_ = -1;
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
  hub_.ResultChanged(stale);
}

void PResult::InvalidateAll() {
  if (rect_.IsEmpty()) return;
  const Tarsa::CRect rect = rect_;
  rect_ = {};  // SetRect takes the same rectangle as new
  SetRect(rect);
}

void PResult::BuildTileIndex() {
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

bool PResult::PrepareTile(std::int32_t col, std::int32_t row, Tarsa::CRect& out) {
  vertexArray_.clear();
  texCoordArray_.clear();
  triangles_.clear();
  quads_.clear();
  const CellSet& cellSet = TileCells(col, row);
  if (cellSet.empty()) return false;

  const Solver& solver = filter_.Constraints().GetSolver();
  const std::int32_t n = solver.GridSize();
  const std::int32_t cells = solver.CellCount();
  const std::vector<float>& positions = solver.Positions();
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
  padLeft_ = padTop_ = 0;
  if (uMin < 0 || uMax > 1 || vMin < 0 || vMax > 1) {
    padLeft_ = std::int32_t((std::max(0.0, uMin) - uMin) * width) + 1;
    extraX = padLeft_ + std::int32_t((uMax - std::min(uMax, 1.0)) * width) + 1;
    padTop_ = std::int32_t((vMax - std::min(vMax, 1.0)) * height) + 1;
    extraY = padTop_ + std::int32_t((std::max(0.0, vMin) - vMin) * height) + 1;
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
  if (firstCol == INT32_MAX) {
    sourceLeft_ = sourceTop_ = sourceWidth_ = sourceHeight_ = 0;
  } else {
    sourceLeft_ = std::min(firstCol * kTile, resultWidth_ - 1);
    sourceTop_ = std::min(firstRow * kTile, resultHeight_ - 1);
    sourceWidth_ =
        std::min({129 + (lastCol - firstCol) * kTile, resultWidth_, resultWidth_ - sourceLeft_});
    sourceHeight_ =
        std::min({129 + (lastRow - firstRow) * kTile, resultHeight_, resultHeight_ - sourceTop_});
  }
  textureWidth_ = sourceWidth_ + extraX;
  textureHeight_ = sourceHeight_ + extraY;
  if (textureWidth_ < 1 || textureHeight_ < 1) return false;
  if (!hub_.NpotTextures()) {
    // The source moves to the far side of the larger texture.
    const std::int32_t w = NextPowerOfTwo(textureWidth_), h = NextPowerOfTwo(textureHeight_);
    padLeft_ += w - textureWidth_;
    padTop_ += h - textureHeight_;
    textureWidth_ = w;
    textureHeight_ = h;
  }

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
      texCoordArray_[to] = float((tex[at] * width - sourceLeft_ + padLeft_) / textureWidth_);
      texCoordArray_[to + 1] =
          float(((1.0 - tex[at + 1]) * height - sourceTop_ + padTop_) / textureHeight_);
    }
  }

  const PSettings& settings = filter_.Settings();
  const OctaMap& sphere = *solver.GetOctaMap();
  const auto w = std::uint32_t(across);
  for (const auto& [c, r] : cellSet) {
    const auto k = std::uint32_t((r - j0) * across + (c - i0));
    if (settings.meshUseTriangle == 0) {
      quads_.insert(quads_.end(), {k, k + w, k + w + 1, k + 1});
      continue;
    }
    // Split along the shorter diagonal on the sphere.
    float a[3], b[3], p[3], q[3];
    sphere.GetPoint(c, r, a);
    sphere.GetPoint(c + 1, r + 1, b);
    sphere.GetPoint(c + 1, r, p);
    sphere.GetPoint(c, r + 1, q);
    const auto squared = [](const float* x, const float* y) {
      return (x[0] - y[0]) * (x[0] - y[0]) + (x[1] - y[1]) * (x[1] - y[1]) +
             (x[2] - y[2]) * (x[2] - y[2]);
    };
    if (squared(a, b) > squared(p, q)) {
      triangles_.insert(triangles_.end(), {k, k + w, k + 1, k + w, k + w + 1, k + 1});
    } else {
      triangles_.insert(triangles_.end(), {k, k + w, k + w + 1, k, k + 1, k + w + 1});
    }
  }

  const Tarsa::CRect sourceRect = hub_.SourceRect();
  out = Tarsa::CRect{sourceRect.left + sourceLeft_, sourceRect.top + sourceTop_,
                     sourceRect.left + sourceLeft_ + sourceWidth_,
                     sourceRect.top + sourceTop_ + sourceHeight_};
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

  Tarsa::CMemoryPixmap dest(tile, planes_, depth_);
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
  }
  pixels_->CopyFrom(dest, tile);
  SetCount(col, row, StepsOf(col, row));
  ++stepCount;
  return 1;
}

void PResult::Pack(const Tarsa::CPixmap& source, const Tarsa::CRect& sourceRect, std::uint32_t pass,
                   std::vector<std::uint8_t>& texels) const {
  std::fill(texels.begin(), texels.end(), 0);
  if (sourceRect.IsEmpty()) return;
  const std::array<std::uint32_t, 4> from = TexturePlanes(planes_, pass);
  const auto width = std::uint32_t(sourceRect.Width());
  const bool wide = depth_ == 16;
  std::vector<std::uint8_t> row(std::size_t(width) * 2);
  for (std::int32_t y = sourceRect.top; y < sourceRect.bottom; ++y) {
    const std::size_t line =
        std::size_t(padTop_ + (y - sourceRect.top)) * std::size_t(textureWidth_) + padLeft_;
    for (std::uint32_t channel = 0; channel < 4; ++channel) {
      source.ReadRow(from[channel], sourceRect.left, y, width, row.data());
      if (wide) {
        auto* to = reinterpret_cast<std::uint16_t*>(texels.data()) + line * 4 + channel;
        const auto* in = reinterpret_cast<const std::uint16_t*>(row.data());
        for (std::uint32_t x = 0; x < width; ++x) to[std::size_t(x) * 4] = UpTo16(in[x]);
      } else {
        std::uint8_t* to = texels.data() + line * 4 + channel;
        for (std::uint32_t x = 0; x < width; ++x) to[std::size_t(x) * 4] = row[x];
      }
    }
  }
}

void PResult::Unpack(const std::vector<std::uint8_t>& readback, Tarsa::CMemoryPixmap& dest,
                     const Tarsa::CRect& tile, std::uint32_t pass) const {
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
    for (std::size_t k = 0; k < count; ++k) {
      const auto [plane, channel] = back[k];
      std::uint8_t* to = dest.Address(plane, area.left, y);
      if (wide) {
        const auto* in = reinterpret_cast<const std::uint16_t*>(readback.data()) + line * 4;
        auto* out = reinterpret_cast<std::uint16_t*>(to);
        for (std::int32_t x = 0; x < width; ++x)
          out[x] = DownFrom16(in[std::size_t(x) * 4 + channel]);
      } else {
        const std::uint8_t* in = readback.data() + line * 4;
        for (std::int32_t x = 0; x < width; ++x) to[x] = in[std::size_t(x) * 4 + channel];
      }
    }
  }
}

void PResult::RenderTile(Tarsa::CMemoryPixmap& dest, const Tarsa::CPixmap& source,
                         const Tarsa::CRect& sourceRect, std::int32_t col, std::int32_t row) {
  POpenGLManager& gl = hub_.GLManager();
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
  pass.textureWidth = textureWidth_;
  pass.textureHeight = textureHeight_;
  pass.pictureTexels[0] = float(padLeft_);
  pass.pictureTexels[1] = float(padTop_);
  pass.pictureTexels[2] = float(padLeft_ + sourceWidth_ - 1);
  pass.pictureTexels[3] = float(padTop_ + sourceHeight_ - 1);
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
  std::vector<std::uint8_t> texels(std::size_t(std::max(textureWidth_, 0)) *
                                   std::size_t(std::max(textureHeight_, 0)) * 4 * sampleBytes);
  std::vector<std::uint8_t> readback(std::size_t(POpenGLManager::kSurfaceSize) *
                                     POpenGLManager::kSurfaceSize * 4 * sampleBytes);
  pass.texels = texels.data();
  pass.readback = readback.data();
  const Tarsa::CRect tile = TileRect({rect_.left, rect_.top}, col, row);

  const std::uint32_t passes = planes_ < 5 ? 1 : 2;
  gl.MakeCurrent();
  try {
    for (std::uint32_t p = 0; p < passes; ++p) {
      if (pass.drawGeometry) Pack(source, sourceRect, p, texels);
      RenderTilePass(gl, pass);
      Unpack(readback, dest, tile, p);
    }
  } catch (...) {
    gl.ReleaseCurrent();
    throw;
  }
  gl.ReleaseCurrent();
}

}  // namespace Project
