#pragma once

#include <array>
#include <cstddef>
#include <cstdint>
#include <functional>
#include <memory>
#include <vector>

#include "filter/PTexelBlocks.h"
#include "filter/PTileGeometry.h"
#include "framework/core/CRect.h"
#include "framework/pixels/CPixProcess.h"
#include "framework/pixels/CVirtualPixmap.h"

namespace Tarsa {
class CPixmap;
class CMemoryPixmap;
}  // namespace Tarsa

namespace Project {

struct POpenGLTilePass;
class PImageHub;
class PRenderContext;

// The corrected image: each 128 x 128 tile of the result is drawn from the
// solver's mesh on the GPU, from a texture of just the source pixels that
// the tile needs, read back and stored. Built for a rectangle of the result
// plane; the whole image when the rectangle is the source's. Which cells and
// texels a tile needs is the tile geometry's (PTileGeometry), the source
// tiles kept as texels are PTexelBlocks', and how samples become texels and
// back is the texel packer's; this stage runs the GL side: it fills the
// textures, draws and reads back, drawing one tile while the next one's
// texture fills. It owns the result's pixels, the geometry, the kept
// texels and the GL textures (kept from tile to tile); the hub owns the
// stage, the GL manager and the source stage it reads.
class PResult : public Tarsa::CPixProcess {
 public:
  using CellSet = PTileGeometry::CellSet;

  // source: the stage the pixels come from, the full source or the source
  // reduced to the display, covering the rectangle the result will be given;
  // sourcePixels answers its pixmap as it stands. The hub owns both.
  PResult(PImageHub& hub, PRenderContext& run, Tarsa::CPixProcess& source,
          std::function<Tarsa::CVirtualPixmap*()> sourcePixels, bool sourceHasAlpha);
  ~PResult() override;

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
  using Placement = PTileGeometry::Placement;

  // A texture filled for the tile expected next while the GL draws the
  // current one. Source tiles that were not read yet were left out: their
  // parts (late) are filled when the tile comes.
  struct TextureAhead {
    bool valid = false;
    std::int32_t col = 0;
    std::int32_t row = 0;
    Placement placement;
    std::uint32_t texture = 0;
    std::vector<Tarsa::CRect> late;
  };

  // The tile the GL was given to draw before it was asked for: drawn while
  // the tile before it went on to the host, read back when it is asked for.
  struct TileInFlight {
    bool valid = false;
    std::int32_t col = 0;
    std::int32_t row = 0;
    Placement placement;
    std::uint64_t draw = 0;  // the manager's draw count after it
  };

  // A texture kept from tile to tile: the GL makes a texture's storage at
  // some cost, and most tiles share a few sizes.
  struct KeptTexture {
    std::uint32_t name = 0;
    std::int32_t width = 0;
    std::int32_t height = 0;
    std::uint64_t lastUse = 0;
  };

  // The solver's mesh as it stands, for the geometry.
  PTileGeometry::Mesh Mesh() const;
  // The next tile in the order tiles go, row by row; false after the last.
  bool NextTile(std::int32_t col, std::int32_t row, std::int32_t& nextCol,
                std::int32_t& nextRow) const;
  // Packs the whole texture and writes it into texture, a band of rows at a
  // time so that the texels are still in the cache when the GL copies them.
  void Fill(const Tarsa::CPixmap& source, const Placement& place, std::uint32_t pass,
            std::uint32_t texture);
  // Writes the zeros around the picture into texture.
  void FillMargins(const Placement& place, std::uint32_t texture);
  // Writes the source's pixels over the parts of the picture into texture
  // from the kept source tiles. Source tiles not read yet are left out and
  // their parts added to late; without late they must have been read.
  void FillPicture(const Tarsa::CPixmap& source, const Placement& place, std::uint32_t texture,
                   const std::vector<Tarsa::CRect>& parts, std::vector<Tarsa::CRect>* late);
  // Fills a texture for the tile expected after (col, row) while the GL
  // draws from drawing; the context is current. With a step count the
  // source under that tile is read first, counted there; without, from the
  // source tiles read so far.
  void FillAhead(const Tarsa::CPixmap& source, std::int32_t col, std::int32_t row,
                 std::uint32_t drawing, std::uint32_t* stepCount = nullptr);
  // Gives the GL the tile expected after (col, row) to draw, from the
  // texture filled ahead, its source read now where it was not: the GL
  // draws while the caller passes (col, row) on. Nothing when the next tile
  // is not that simple (two passes, a cut source, no texture ahead).
  void DrawAhead(std::int32_t col, std::int32_t row, std::uint32_t& stepCount);
  // The pass that draws the prepared tile (col, row) from source over
  // sourceRect, up to its texture.
  POpenGLTilePass TilePass(const Tarsa::CPixmap& source, const Tarsa::CRect& sourceRect,
                           std::int32_t col, std::int32_t row);
  // The camera model's cover circle in the placed texture, and the
  // channels an edge pixel's covered share scales in that pass.
  void SetCover(POpenGLTilePass& pass, std::uint32_t passIndex) const;
  // The texel format of the textures, for transfers.
  POpenGLTilePass TexelFormat(std::int32_t width, std::int32_t height) const;
  // A kept texture of the size, other than busy; given that size when none
  // has it, in place of the one used least recently.
  std::uint32_t TextureOfSize(std::int32_t width, std::int32_t height, std::uint32_t busy);
  void DeleteTextures();

  PImageHub& hub_;
  PRenderContext& run_;
  Tarsa::CPixProcess& source_;
  std::function<Tarsa::CVirtualPixmap*()> sourcePixels_;
  bool sourceHasAlpha_;
  std::unique_ptr<Tarsa::CVirtualPixmap> pixels_;
  Tarsa::CRect rect_;
  std::int32_t resultWidth_ = 0;
  std::int32_t resultHeight_ = 0;
  std::uint32_t depth_;
  std::uint32_t planes_;

  std::int32_t currentCol_ = -1;
  std::int32_t currentRow_ = -1;
  Tarsa::CRect currentSourceRect_;
  bool currentHasCells_ = false;

  PTileGeometry geometry_;
  // The prepared tile.
  PTileGeometry::Drawing drawing_;
  Placement placement_;

  // Kept from tile to tile, so that a tile costs no fresh buffers.
  std::vector<std::uint8_t> texels_;
  std::vector<std::uint8_t> readback_;
  std::vector<std::uint8_t> sourceRows_;
  std::vector<std::uint8_t> zeros_;
  std::array<KeptTexture, 4> textures_{};
  std::uint64_t textureUses_ = 0;
  TextureAhead ahead_;
  TileInFlight inflight_;
  PTexelBlocks blocks_;
  // At 16 bits the texture's half floats are made here rather than by the
  // GL from 16-bit integers: the same values, at a fraction of the cost.
  bool halfTexels_ = false;
};

}  // namespace Project
