#pragma once

#include <cstdint>
#include <functional>
#include <set>
#include <span>
#include <utility>
#include <vector>

#include "framework/core/CRect.h"
#include "solver/frame/Solver.h"

namespace Project {

// Which mesh cells and which source texels each 128 x 128 tile of a result
// needs, and the tile's mesh as arrays to draw. Built from the solver's mesh
// for a result of a given size: an index of the cells that cover each tile
// and of the source tiles under each cell. From it a tile's texture is
// placed (the source rectangle its pixels read, with a border of zeros
// where its cells reach past the picture) and its vertices, texture
// coordinates and triangles made. Nothing here touches the GL. It owns the
// index only: the mesh stays the solver's and is handed in on each call,
// as it stands then.
class PTileGeometry {
 public:
  static constexpr std::int32_t kTile = 128;

  // Mesh cells and source tiles, as (column, row).
  using CellSet = std::set<std::pair<std::int32_t, std::int32_t>>;

  // The solved mesh, as the solver keeps it: vertex (i, j) at (j * gridSize
  // + i) * 2, result-plane positions with y up and photograph texture
  // coordinates in [0, 1] with v up.
  struct Mesh {
    std::int32_t gridSize = 0;
    std::int32_t cells = 0;
    std::span<const float> positions;
    std::span<const float> texCoords;
    std::function<bool(std::int32_t, std::int32_t)> cellInMask;
    std::function<bool(std::int32_t, std::int32_t)> vertexInside;
    // Whether a cell is cut along its (i, j) to (i + 1, j + 1) diagonal.
    std::function<bool(std::int32_t, std::int32_t)> splitsMainDiagonal;
  };

  // The result: its size in pixels, the part of the plane it shows
  // (viewWidth x viewHeight around the centre of the mesh's fit box), where
  // its pixels lie in the source's coordinates, and whether a texture may
  // have any size (else a power of two a side).
  struct Target {
    std::int32_t width = 0;
    std::int32_t height = 0;
    BoxFit fit;
    Tarsa::CPoint sourceOrigin;
    bool anyTextureSize = true;
  };

  // Where a tile's texture takes the source's pixels from, and its size.
  struct Placement {
    // The source's pixels in the texture, in the result's coordinates.
    std::int32_t sourceLeft = 0;
    std::int32_t sourceTop = 0;
    std::int32_t sourceWidth = 0;
    std::int32_t sourceHeight = 0;
    std::int32_t textureWidth = 0;
    std::int32_t textureHeight = 0;
    // Where they lie in the texture.
    std::int32_t padLeft = 0;
    std::int32_t padTop = 0;
    // The mesh vertices the tile's cells use, last ones included.
    std::int32_t firstI = 0;
    std::int32_t firstJ = 0;
    std::int32_t lastI = 0;
    std::int32_t lastJ = 0;
    // The source rectangle, in the source's coordinates.
    Tarsa::CRect source;

    bool operator==(const Placement&) const = default;
  };

  // A tile's mesh: its vertices (plane positions) and texture coordinates
  // over the placement's vertex range, row by row, zero where a vertex is
  // outside the warp, and its cells as triangles or as quads.
  struct Drawing {
    std::vector<float> vertices;
    std::vector<float> texCoords;
    std::vector<std::uint32_t> triangles;
    std::vector<std::uint32_t> quads;
  };

  // Indexes mesh for target; a mesh without cells leaves every tile empty.
  void Build(const Mesh& mesh, const Target& target);
  void Clear();

  std::int32_t TilesAcross() const { return tilesAcross_; }
  std::int32_t TilesDown() const { return tilesDown_; }
  // The plane point at the view's centre and the view's size in the plane.
  float OriginX() const { return originX_; }
  float OriginY() const { return originY_; }
  float ScaleX() const { return scaleX_; }
  float ScaleY() const { return scaleY_; }

  // The cells that cover tile (col, row); none outside the tiles.
  const CellSet& TileCells(std::int32_t col, std::int32_t row) const;
  // The source tiles under cell (i, j); none outside the cells.
  const CellSet& CellSources(std::int32_t i, std::int32_t j) const;

  // The texture placement of tile (col, row) over mesh, the one Build
  // indexed; false for a tile with no cells or no texture. A tile is
  // placed for its texture ahead and again for its geometry: the last
  // placement is kept.
  bool Place(const Mesh& mesh, std::int32_t col, std::int32_t row, Placement& place) const;
  // Tile (col, row)'s mesh for place, its cells as triangles split as the
  // lines were traced, or as quads.
  void Draw(const Mesh& mesh, std::int32_t col, std::int32_t row, const Placement& place,
            bool triangles, Drawing& out) const;

 private:
  bool PlaceAnew(const Mesh& mesh, std::int32_t col, std::int32_t row, Placement& place) const;
  // Narrows place to the source pixels the tile's own pixels read: the
  // parts of its cells' triangles inside the tile, mapped to the source,
  // with the kernel's reach around them. Most of a tile's cells reach well
  // beyond it; a texture of all of them holds several times the pixels the
  // tile shows.
  void Narrow(const Mesh& mesh, std::int32_t col, std::int32_t row, Placement& place) const;

  Target target_;
  std::int32_t cells_ = 0;
  float originX_ = 0;
  float originY_ = 0;
  float scaleX_ = 1;
  float scaleY_ = 1;
  std::int32_t tilesAcross_ = 0;
  std::int32_t tilesDown_ = 0;
  std::vector<CellSet> tileCells_;
  std::vector<CellSet> cellTiles_;
  // The placement last made, for the tile it was made for.
  struct {
    bool valid = false;
    std::int32_t col = 0;
    std::int32_t row = 0;
    bool placed = false;
    Placement place;
  } mutable last_;
};

}  // namespace Project
