#pragma once

#include <cstdint>
#include <memory>
#include <set>
#include <utility>
#include <vector>

#include "framework/core/CRect.h"
#include "framework/pixels/CPixProcess.h"
#include "framework/pixels/CVirtualPixmap.h"

namespace Tarsa {
class CPixmap;
class CMemoryPixmap;
}  // namespace Tarsa

namespace Project {

class PFilter;
class PImageHub;
class Solver;

// The corrected image: each 128 x 128 tile of the result is drawn from the
// solver's mesh on the GPU, from a texture of just the source pixels that
// the tile needs, read back and stored. Built for a rectangle of the result
// plane; the whole image when the rectangle is the source's.
class PResult : public Tarsa::CPixProcess {
 public:
  // Mesh cells and source tiles, as (column, row).
  using CellSet = std::set<std::pair<std::int32_t, std::int32_t>>;

  PResult(PImageHub& hub, PFilter& filter);

  // Takes the solved mesh and indexes it for rect; the only operation that
  // needs the mesh, so it runs again whenever the solver's geometry changes.
  // An empty rectangle clears the stage.
  void SetRect(const Tarsa::CRect& rect);
  // Stale tiles are drawn again.
  void Invalidate(const Tarsa::CRect& area) override;
  // A new mesh: the index is built again and every tile is stale.
  void InvalidateAll();

  const Tarsa::CRect& Rect() const { return rect_; }
  std::uint32_t Planes() const { return planes_; }
  std::uint32_t PixelDepth() const { return depth_; }
  // Null until a rectangle is set.
  Tarsa::CVirtualPixmap* Pixels() { return pixels_.get(); }
  const CellSet& TileCells(std::int32_t col, std::int32_t row) const;

  int Advance(std::int32_t col, std::int32_t row, std::uint32_t& stepCount, bool wait,
              std::intptr_t arg1, std::intptr_t arg2) override;

  // Geometry and texture placement of tile (col, row); false for a tile with
  // no cells. out: the source rectangle the texture holds, in the source's
  // coordinates.
  bool PrepareTile(std::int32_t col, std::int32_t row, Tarsa::CRect& out);
  // Draws tile (col, row) into dest from the prepared geometry and the
  // source's pixels over sourceRect.
  void RenderTile(Tarsa::CMemoryPixmap& dest, const Tarsa::CPixmap& source,
                  const Tarsa::CRect& sourceRect, std::int32_t col, std::int32_t row);

 private:
  void BuildTileIndex();
  void Unpack(const std::vector<std::uint8_t>& readback, Tarsa::CMemoryPixmap& dest,
              const Tarsa::CRect& tile, std::uint32_t pass) const;
  void Pack(const Tarsa::CPixmap& source, const Tarsa::CRect& sourceRect, std::uint32_t pass,
            std::vector<std::uint8_t>& texels) const;

  PImageHub& hub_;
  PFilter& filter_;
  std::unique_ptr<Tarsa::CVirtualPixmap> pixels_;
  Tarsa::CRect rect_;
  std::int32_t resultWidth_ = 0;
  std::int32_t resultHeight_ = 0;
  std::int32_t imageMode_;
  std::uint32_t colorPlanes_;
  std::uint32_t depth_;
  std::uint32_t pixelLayout_;
  std::uint32_t planes_;
  bool fromScaled_ = false;

  std::int32_t currentCol_ = -1;
  std::int32_t currentRow_ = -1;
  Tarsa::CRect currentSourceRect_;
  bool currentHasCells_ = false;

  float meshOriginX_ = 0;
  float meshOriginY_ = 0;
  float meshScaleX_ = 1;
  float meshScaleY_ = 1;
  std::int32_t tilesAcross_ = 0;
  std::int32_t tilesDown_ = 0;
  std::vector<CellSet> tileCells_;
  std::vector<CellSet> cellTiles_;

  // The prepared tile.
  std::vector<float> vertexArray_;
  std::vector<float> texCoordArray_;
  std::vector<std::uint32_t> triangles_;
  std::vector<std::uint32_t> quads_;
  std::int32_t sourceWidth_ = 0;
  std::int32_t sourceHeight_ = 0;
  std::int32_t sourceLeft_ = 0;
  std::int32_t sourceTop_ = 0;
  std::int32_t textureWidth_ = 0;
  std::int32_t textureHeight_ = 0;
  std::int32_t padLeft_ = 0;
  std::int32_t padTop_ = 0;
};

}  // namespace Project
