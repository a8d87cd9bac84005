#pragma once

#include <array>
#include <cstddef>
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
struct POpenGLTilePass;
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
  // Where a tile's texture takes the source's pixels from, and its size.
  struct TexturePlacement {
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

    bool operator==(const TexturePlacement&) const = default;
  };

  // A texture filled for the tile expected next while the GL draws the
  // current one. Source tiles that were not read yet were left out: their
  // parts (late) are filled when the tile comes.
  struct TextureAhead {
    bool valid = false;
    std::int32_t col = 0;
    std::int32_t row = 0;
    TexturePlacement placement;
    std::uint32_t texture = 0;
    std::vector<Tarsa::CRect> late;
  };

  // The tile the GL was given to draw before it was asked for: drawn while
  // the tile before it went on to the host, read back when it is asked for.
  struct TileInFlight {
    bool valid = false;
    std::int32_t col = 0;
    std::int32_t row = 0;
    TexturePlacement placement;
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

  // One source tile (a cell of the source stage) as texels. Neighbouring
  // tiles' textures overlap by most of their pixels: kept, a source tile is
  // read and interleaved once, and textures are filled straight from it.
  struct TexelBlock {
    std::int32_t col = -1;
    std::int32_t row = -1;
    Tarsa::CRect rect;
    std::uint64_t lastUse = 0;
    std::vector<std::uint8_t> texels;
  };

  void BuildTileIndex();
  // The texture placement of tile (col, row); false for a tile with no cells
  // or no texture.
  bool PlaceTexture(std::int32_t col, std::int32_t row, TexturePlacement& place) const;
  bool Place(std::int32_t col, std::int32_t row, TexturePlacement& place) const;
  // Narrows place to the source pixels the tile's own pixels read: the
  // parts of its cells' triangles inside the tile, mapped to the source,
  // with the kernel's reach around them. Most of a tile's cells reach well
  // beyond it; a texture of all of them holds several times the pixels the
  // tile shows.
  void NarrowTexture(std::int32_t col, std::int32_t row, TexturePlacement& place) const;
  // Texels [x0, x1) x [y0, y1) of a texture placed at place into texels_,
  // rows of x1 - x0 texels: the source's pixels where the picture lies,
  // zeros elsewhere.
  void Pack(const Tarsa::CPixmap& source, const TexturePlacement& place, std::uint32_t pass,
            std::int32_t x0, std::int32_t y0, std::int32_t x1, std::int32_t y1);
  // Packs the whole texture and writes it into texture, a band of rows at a
  // time so that the texels are still in the cache when the GL copies them.
  void Fill(const Tarsa::CPixmap& source, const TexturePlacement& place, std::uint32_t pass,
            std::uint32_t texture);
  // Writes the zeros around the picture into texture.
  void FillMargins(const TexturePlacement& place, std::uint32_t texture);
  // Writes the source's pixels over the parts of the picture into texture
  // from the kept source tiles. Source tiles not read yet are left out and
  // their parts added to late; without late they must have been read.
  void FillPicture(const Tarsa::CPixmap& source, const TexturePlacement& place,
                   std::uint32_t texture, const std::vector<Tarsa::CRect>& parts,
                   std::vector<Tarsa::CRect>* late);
  // The source stage's cell as texels, read when not kept.
  const TexelBlock& Block(const Tarsa::CPixmap& source, std::int32_t col, std::int32_t row,
                          const Tarsa::CRect& rect);
  void DropBlocks();
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
  // From readback_ into dest.
  void Unpack(Tarsa::CMemoryPixmap& dest, const Tarsa::CRect& tile, std::uint32_t pass) const;
  void DeleteTextures();

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
  TexturePlacement placement_;

  // Kept from tile to tile, so that a tile costs no fresh buffers.
  std::vector<std::uint8_t> texels_;
  std::vector<std::uint8_t> readback_;
  std::vector<std::uint8_t> sourceRows_;
  std::vector<std::uint8_t> zeros_;
  std::array<KeptTexture, 4> textures_{};
  std::uint64_t textureUses_ = 0;
  TextureAhead ahead_;
  TileInFlight inflight_;
  // The placement last made, for the tile it was made for.
  struct {
    bool valid = false;
    std::int32_t col = 0;
    std::int32_t row = 0;
    bool placed = false;
    TexturePlacement place;
  } mutable lastPlacement_;
  std::vector<TexelBlock> blocks_;
  // Per cell of the source stage, row by row: its index in blocks_, or -1.
  std::vector<std::int32_t> blockIndex_;
  std::int32_t blockColumns_ = 0;
  const Tarsa::CPixmap* blockSource_ = nullptr;
  bool blockHalves_ = false;
  std::uint64_t blockUses_ = 0;
  // At 16 bits the texture's half floats are made here rather than by the
  // GL from 16-bit integers: the same values, at a fraction of the cost.
  bool halfTexels_ = false;
};

}  // namespace Project
