// Which cells and texels a tile needs, on meshes small enough to work out by
// hand: a regular 4 x 4 cell mesh over a 256 x 256 result of 2 x 2 tiles,
// whose cells are 64 pixels a side and whose texture map is the identity
// (or a shift of 32 pixels, so that cells reach past the picture).
#include <gtest/gtest.h>

#include <cstdint>
#include <set>
#include <utility>
#include <vector>

#include "filter/PTileGeometry.h"

namespace Project::testing {
namespace {

using CellSet = PTileGeometry::CellSet;

// Vertex (i, j) of a 4 x 4 cell mesh at plane (-1 + i / 2, 1 - j / 2), y
// up, and at texture (i / 4 + shiftU, 1 - j / 4), v up. Over 256 pixels a
// side a cell is 64 pixels, and with no shift result pixel and source pixel
// are the same.
struct HandMesh {
  explicit HandMesh(float shiftU = 0) {
    for (std::int32_t j = 0; j <= 4; ++j) {
      for (std::int32_t i = 0; i <= 4; ++i) {
        positions.insert(positions.end(), {-1.0f + 0.5f * float(i), 1.0f - 0.5f * float(j)});
        texCoords.insert(texCoords.end(), {0.25f * float(i) + shiftU, 1.0f - 0.25f * float(j)});
      }
    }
  }

  PTileGeometry::Mesh Mesh() const {
    PTileGeometry::Mesh mesh;
    mesh.gridSize = 5;
    mesh.cells = 4;
    mesh.positions = positions;
    mesh.texCoords = texCoords;
    mesh.cellInMask = [this](std::int32_t i, std::int32_t j) { return masked.count({i, j}) == 0; };
    mesh.vertexInside = [this](std::int32_t i, std::int32_t j) {
      return outside.count({i, j}) == 0;
    };
    // A checkerboard of the two diagonals.
    mesh.splitsMainDiagonal = [](std::int32_t i, std::int32_t j) { return (i + j) % 2 == 0; };
    return mesh;
  }

  std::vector<float> positions;
  std::vector<float> texCoords;
  CellSet masked;
  CellSet outside;
};

// The view of the fit box [-1, 1] x [-1, 1], viewWidth x viewHeight around
// its centre.
PTileGeometry::Target TargetOf(std::int32_t width, std::int32_t height, float viewWidth = 2,
                               float viewHeight = 2) {
  PTileGeometry::Target target;
  target.width = width;
  target.height = height;
  target.fit.fitLeft = -1, target.fit.fitRight = 1, target.fit.fitBottom = -1,
  target.fit.fitTop = 1;
  target.fit.fitWidth = 2, target.fit.fitHeight = 2;
  target.fit.viewWidth = viewWidth, target.fit.viewHeight = viewHeight;
  return target;
}

CellSet Cells(std::vector<std::int32_t> is, std::vector<std::int32_t> js) {
  CellSet cells;
  for (const std::int32_t j : js) {
    for (const std::int32_t i : is) cells.insert({i, j});
  }
  return cells;
}

// A tile is 2 cells a side. The cells next to a tile's edge reach into it by
// the hundredth of a cell a box is widened by, so each tile takes three
// cells a side; a cell's texture, which is not widened, lies in one source
// tile. A masked cell is in no tile and reads no source.
TEST(TileGeometry, EachTileTakesTheCellsOverItAndEachCellItsSourceTile) {
  HandMesh hand;
  hand.masked = {{3, 3}};
  PTileGeometry geometry;
  geometry.Build(hand.Mesh(), TargetOf(256, 256));
  ASSERT_EQ(geometry.TilesAcross(), 2);
  ASSERT_EQ(geometry.TilesDown(), 2);
  EXPECT_EQ(geometry.TileCells(0, 0), Cells({0, 1, 2}, {0, 1, 2}));
  EXPECT_EQ(geometry.TileCells(1, 0), Cells({1, 2, 3}, {0, 1, 2}));
  EXPECT_EQ(geometry.TileCells(0, 1), Cells({0, 1, 2}, {1, 2, 3}));
  CellSet lastTile = Cells({1, 2, 3}, {1, 2, 3});
  lastTile.erase({3, 3});
  EXPECT_EQ(geometry.TileCells(1, 1), lastTile);
  EXPECT_TRUE(geometry.TileCells(2, 0).empty());
  EXPECT_TRUE(geometry.TileCells(-1, 0).empty());

  for (std::int32_t j = 0; j < 4; ++j) {
    for (std::int32_t i = 0; i < 4; ++i) {
      const CellSet expected = i == 3 && j == 3 ? CellSet{} : CellSet{{i / 2, j / 2}};
      EXPECT_EQ(geometry.CellSources(i, j), expected) << "cell " << i << "," << j;
    }
  }
  EXPECT_TRUE(geometry.CellSources(4, 0).empty());

  // The lattice is centred on the fit box: a result three times as wide as
  // high shows 6 x 2 of the plane, and the mesh lies in its middle two
  // columns, the cells at its sides reaching one more column each.
  hand.masked.clear();
  geometry.Build(hand.Mesh(), TargetOf(768, 256, 6, 2));
  ASSERT_EQ(geometry.TilesAcross(), 6);
  EXPECT_TRUE(geometry.TileCells(0, 0).empty());
  EXPECT_EQ(geometry.TileCells(1, 0), Cells({0}, {0, 1, 2}));
  EXPECT_EQ(geometry.TileCells(2, 0), Cells({0, 1, 2}, {0, 1, 2}));
  EXPECT_EQ(geometry.TileCells(3, 1), Cells({1, 2, 3}, {1, 2, 3}));
  EXPECT_EQ(geometry.TileCells(4, 1), Cells({3}, {1, 2, 3}));
  EXPECT_TRUE(geometry.TileCells(5, 1).empty());
  PTileGeometry::Placement place;
  EXPECT_FALSE(geometry.Place(hand.Mesh(), 0, 0, place));
}

// With the identity map a tile's pixels (widened by 2 for the pixel
// centres' reach) read their own pixels; the kernel reaches 3 more. Tile
// (0, 0) covers -2 to 130, the mesh starts at 0: source 0 to 133. Tile
// (1, 1) covers 126 to 258, the picture ends at 256: source 123 to 256.
// Textures step by 32 texels: 133 takes 160.
TEST(TileGeometry, ATextureHoldsWhatTheTilesPixelsRead) {
  HandMesh hand;
  PTileGeometry geometry;
  PTileGeometry::Target target = TargetOf(256, 256);
  target.sourceOrigin = {1000, 2000};
  geometry.Build(hand.Mesh(), target);

  PTileGeometry::Placement first;
  ASSERT_TRUE(geometry.Place(hand.Mesh(), 0, 0, first));
  EXPECT_EQ(first.sourceLeft, 0);
  EXPECT_EQ(first.sourceTop, 0);
  EXPECT_EQ(first.sourceWidth, 133);
  EXPECT_EQ(first.sourceHeight, 133);
  EXPECT_EQ(first.padLeft, 0);
  EXPECT_EQ(first.padTop, 0);
  EXPECT_EQ(first.textureWidth, 160);
  EXPECT_EQ(first.textureHeight, 160);
  EXPECT_EQ(first.firstI, 0);
  EXPECT_EQ(first.lastI, 3);
  EXPECT_EQ(first.source, (Tarsa::CRect{1000, 2000, 1133, 2133}));

  PTileGeometry::Placement last;
  ASSERT_TRUE(geometry.Place(hand.Mesh(), 1, 1, last));
  EXPECT_EQ(last.sourceLeft, 123);
  EXPECT_EQ(last.sourceWidth, 133);
  EXPECT_EQ(last.padLeft, 0);
  EXPECT_EQ(last.textureWidth, 160);
  EXPECT_EQ(last.firstI, 1);
  EXPECT_EQ(last.lastI, 4);
  EXPECT_EQ(last.firstJ, 1);
  EXPECT_EQ(last.lastJ, 4);
  EXPECT_EQ(last.source, (Tarsa::CRect{1123, 2123, 1256, 2256}));

  // Where textures must be powers of two, 160 becomes 256 and the source
  // moves to the far side.
  target.anyTextureSize = false;
  geometry.Build(hand.Mesh(), target);
  PTileGeometry::Placement square;
  ASSERT_TRUE(geometry.Place(hand.Mesh(), 1, 1, square));
  EXPECT_EQ(square.textureWidth, 256);
  EXPECT_EQ(square.padLeft, 96);
  EXPECT_EQ(square.sourceLeft, 123);
  EXPECT_EQ(square.sourceWidth, 133);
}

// Shifted 32 pixels, the picture starts at result x 32: tile (0, 0)'s
// pixels read source -35 to 101. The cells' texture reaches 0.125 past the
// picture's left edge, so the texture gets a border of zeros 33 texels wide
// (and, both axes taking it, one texel at the top); narrowed, the texture
// keeps 33 of zeros, 101 of picture: 134, stepped to 160. Cell 2's texture
// now straddles the source tiles' edge.
TEST(TileGeometry, CellsPastThePictureReadABorderOfZeros) {
  HandMesh hand(-0.125f);
  PTileGeometry geometry;
  geometry.Build(hand.Mesh(), TargetOf(256, 256));
  EXPECT_EQ(geometry.CellSources(0, 0), (CellSet{{0, 0}}));
  EXPECT_EQ(geometry.CellSources(2, 0), (CellSet{{0, 0}, {1, 0}}));
  EXPECT_EQ(geometry.CellSources(3, 0), (CellSet{{1, 0}}));

  PTileGeometry::Placement place;
  ASSERT_TRUE(geometry.Place(hand.Mesh(), 0, 0, place));
  EXPECT_EQ(place.sourceLeft, 0);
  EXPECT_EQ(place.sourceWidth, 101);
  EXPECT_EQ(place.padLeft, 33);
  EXPECT_EQ(place.textureWidth, 160);
  EXPECT_EQ(place.sourceTop, 0);
  EXPECT_EQ(place.sourceHeight, 133);
  EXPECT_EQ(place.padTop, 1);
  EXPECT_EQ(place.textureHeight, 160);
}

// Tile (0, 0) draws vertices 0 to 3 a side, 4 a row: cell (i, j) starts at
// vertex 4 j + i. Texture coordinates are the source pixel's share of the
// 160-texel texture; a vertex outside the warp is left at zero.
TEST(TileGeometry, ATilesMeshIsItsCellsSplitAsTraced) {
  HandMesh hand;
  hand.outside = {{3, 3}};
  PTileGeometry geometry;
  geometry.Build(hand.Mesh(), TargetOf(256, 256));
  PTileGeometry::Placement place;
  ASSERT_TRUE(geometry.Place(hand.Mesh(), 0, 0, place));
  PTileGeometry::Drawing drawing;
  geometry.Draw(hand.Mesh(), 0, 0, place, true, drawing);

  ASSERT_EQ(drawing.vertices.size(), 32u);
  ASSERT_EQ(drawing.texCoords.size(), 32u);
  const std::size_t v12 = (2 * 4 + 1) * 2;  // vertex (1, 2)
  EXPECT_FLOAT_EQ(drawing.vertices[v12], -0.5f);
  EXPECT_FLOAT_EQ(drawing.vertices[v12 + 1], 0.0f);
  EXPECT_FLOAT_EQ(drawing.texCoords[v12], 64.0f / 160.0f);
  EXPECT_FLOAT_EQ(drawing.texCoords[v12 + 1], 128.0f / 160.0f);
  const std::size_t v33 = (3 * 4 + 3) * 2;
  EXPECT_EQ(drawing.vertices[v33], 0.0f);
  EXPECT_EQ(drawing.texCoords[v33 + 1], 0.0f);

  // Nine cells in (i, j) order; (0, 0) along its main diagonal, (0, 1)
  // along the other.
  ASSERT_EQ(drawing.triangles.size(), 9u * 6);
  EXPECT_EQ(std::vector<std::uint32_t>(drawing.triangles.begin(), drawing.triangles.begin() + 12),
            (std::vector<std::uint32_t>{0, 4, 5, 0, 1, 5, 4, 8, 5, 8, 9, 5}));
  EXPECT_TRUE(drawing.quads.empty());

  geometry.Draw(hand.Mesh(), 0, 0, place, false, drawing);
  EXPECT_TRUE(drawing.triangles.empty());
  ASSERT_EQ(drawing.quads.size(), 9u * 4);
  EXPECT_EQ(std::vector<std::uint32_t>(drawing.quads.end() - 4, drawing.quads.end()),
            (std::vector<std::uint32_t>{10, 14, 15, 11}));  // cell (2, 2)
}

}  // namespace
}  // namespace Project::testing
