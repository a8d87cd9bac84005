#include "filter/PTileGeometry.h"

#include <algorithm>
#include <array>
#include <climits>
#include <cmath>

namespace Project {

namespace {

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

void PTileGeometry::Clear() {
  last_.valid = false;
  cells_ = 0;
  tilesAcross_ = tilesDown_ = 0;
  tileCells_.clear();
  cellTiles_.clear();
}

void PTileGeometry::Build(const Mesh& mesh, const Target& target) {
  constexpr std::int32_t kT = kTile;
  last_.valid = false;
  target_ = target;
  tilesAcross_ = (target.width + kT - 1) / kT;
  tilesDown_ = (target.height + kT - 1) / kT;
  tileCells_.assign(std::size_t(tilesAcross_) * std::size_t(tilesDown_), {});

  const std::int32_t n = mesh.gridSize;
  const std::int32_t cells = mesh.cells;
  const std::span<const float> positions = mesh.positions;
  const std::span<const float> tex = mesh.texCoords;
  cells_ = std::max(cells, 0);
  cellTiles_.assign(std::size_t(cells_) * std::size_t(cells_), {});
  if (cells <= 0 || n < cells + 1 || positions.size() < std::size_t(n) * n * 2 ||
      tex.size() < std::size_t(n) * n * 2)
    return;

  const BoxFit& fit = target.fit;
  scaleX_ = fit.viewWidth;
  scaleY_ = fit.viewHeight;
  originX_ = 0.5f * (fit.fitLeft + fit.fitRight);
  originY_ = 0.5f * (fit.fitBottom + fit.fitTop);
  const double width = target.width, height = target.height;
  const double tileW = kT / width * scaleX_;
  const double tileH = kT / height * scaleY_;
  // The tiles' lattice in the plane: the view is centred on the mesh origin.
  const double gridLeft = originX_ - 0.5 * scaleX_;
  const double gridTop = originY_ + 0.5 * scaleY_;
  // A cell's box is widened by a hundredth of a cell, so that a cell whose
  // edge lies on a tile's edge reaches the tile whose pixel centres it may
  // cover.
  const double growX = fit.fitWidth / cells * 0.01;
  const double growY = fit.fitHeight / cells * 0.01;
  const double sourceTilesX = width / kT, sourceTilesY = height / kT;

  for (std::int32_t j = 0; j < cells; ++j) {
    for (std::int32_t i = 0; i < cells; ++i) {
      if (!mesh.cellInMask(i, j)) continue;
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

const PTileGeometry::CellSet& PTileGeometry::TileCells(std::int32_t col, std::int32_t row) const {
  static const CellSet kNone;
  if (col < 0 || row < 0 || col >= tilesAcross_ || row >= tilesDown_) return kNone;
  return tileCells_[std::size_t(row) * std::size_t(tilesAcross_) + std::size_t(col)];
}

const PTileGeometry::CellSet& PTileGeometry::CellSources(std::int32_t i, std::int32_t j) const {
  static const CellSet kNone;
  if (i < 0 || j < 0 || i >= cells_ || j >= cells_) return kNone;
  return cellTiles_[std::size_t(j) * std::size_t(cells_) + std::size_t(i)];
}

bool PTileGeometry::Place(const Mesh& mesh, std::int32_t col, std::int32_t row,
                          Placement& place) const {
  if (!last_.valid || last_.col != col || last_.row != row) {
    last_.placed = PlaceAnew(mesh, col, row, last_.place);
    last_.col = col;
    last_.row = row;
    last_.valid = true;
  }
  place = last_.place;
  return last_.placed;
}

bool PTileGeometry::PlaceAnew(const Mesh& mesh, std::int32_t col, std::int32_t row,
                              Placement& place) const {
  place = {};
  const CellSet& cellSet = TileCells(col, row);
  if (cellSet.empty()) return false;

  const std::int32_t n = mesh.gridSize;
  const std::int32_t cells = mesh.cells;
  const std::span<const float> tex = mesh.texCoords;
  const std::int32_t resultWidth = target_.width, resultHeight = target_.height;
  const double width = resultWidth, height = resultHeight;

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
    place.sourceLeft = std::min(firstCol * kTile, resultWidth - 1);
    place.sourceTop = std::min(firstRow * kTile, resultHeight - 1);
    place.sourceWidth =
        std::min({129 + (lastCol - firstCol) * kTile, resultWidth, resultWidth - place.sourceLeft});
    place.sourceHeight = std::min(
        {129 + (lastRow - firstRow) * kTile, resultHeight, resultHeight - place.sourceTop});
  }
  place.textureWidth = place.sourceWidth + extraX;
  place.textureHeight = place.sourceHeight + extraY;
  if (place.textureWidth < 1 || place.textureHeight < 1) return false;
  Narrow(mesh, col, row, place);
  if (!target_.anyTextureSize) {
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
  const Tarsa::CPoint origin = target_.sourceOrigin;
  place.source = Tarsa::CRect{origin.x + place.sourceLeft, origin.y + place.sourceTop,
                              origin.x + place.sourceLeft + place.sourceWidth,
                              origin.y + place.sourceTop + place.sourceHeight};
  return true;
}

void PTileGeometry::Narrow(const Mesh& mesh, std::int32_t col, std::int32_t row,
                           Placement& place) const {
  const std::int32_t n = mesh.gridSize;
  const std::span<const float> positions = mesh.positions;
  const std::span<const float> tex = mesh.texCoords;
  const double width = target_.width, height = target_.height;
  const double gridLeft = originX_ - 0.5 * scaleX_;
  const double gridTop = originY_ + 0.5 * scaleY_;
  const auto corner = [&](std::int32_t i, std::int32_t j) {
    const std::size_t at = (std::size_t(j) * std::size_t(n) + std::size_t(i)) * 2;
    return MappedPoint{(positions[at] - gridLeft) / scaleX_ * width,
                       (gridTop - positions[at + 1]) / scaleY_ * height, tex[at] * width,
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

void PTileGeometry::Draw(const Mesh& mesh, std::int32_t col, std::int32_t row,
                         const Placement& place, bool triangles, Drawing& out) const {
  out.vertices.clear();
  out.texCoords.clear();
  out.triangles.clear();
  out.quads.clear();
  const std::int32_t n = mesh.gridSize;
  const std::span<const float> positions = mesh.positions;
  const std::span<const float> tex = mesh.texCoords;
  const double width = target_.width, height = target_.height;
  const std::int32_t i0 = place.firstI, j0 = place.firstJ, i1 = place.lastI, j1 = place.lastJ;

  const std::int32_t across = i1 - i0 + 1;
  const std::int32_t down = j1 - j0 + 1;
  out.vertices.assign(std::size_t(across) * std::size_t(down) * 2, 0.0f);
  out.texCoords.assign(out.vertices.size(), 0.0f);
  for (std::int32_t j = j0; j <= j1; ++j) {
    for (std::int32_t i = i0; i <= i1; ++i) {
      if (!mesh.vertexInside(i, j)) continue;
      const std::size_t at = (std::size_t(j) * std::size_t(n) + std::size_t(i)) * 2;
      const std::size_t to = (std::size_t(j - j0) * std::size_t(across) + std::size_t(i - i0)) * 2;
      out.vertices[to] = positions[at];
      out.vertices[to + 1] = positions[at + 1];
      out.texCoords[to] =
          float((tex[at] * width - place.sourceLeft + place.padLeft) / place.textureWidth);
      out.texCoords[to + 1] = float(
          ((1.0 - tex[at + 1]) * height - place.sourceTop + place.padTop) / place.textureHeight);
    }
  }

  const auto w = std::uint32_t(across);
  for (const auto& [c, r] : TileCells(col, row)) {
    const auto k = std::uint32_t((r - j0) * across + (c - i0));
    if (!triangles) {
      out.quads.insert(out.quads.end(), {k, k + w, k + w + 1, k + 1});
      continue;
    }
    // Split as the lines were traced.
    if (mesh.splitsMainDiagonal(c, r)) {
      out.triangles.insert(out.triangles.end(), {k, k + w, k + w + 1, k, k + 1, k + w + 1});
    } else {
      out.triangles.insert(out.triangles.end(), {k, k + w, k + 1, k + w, k + w + 1, k + 1});
    }
  }
}

}  // namespace Project
