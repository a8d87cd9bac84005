#include "filter/PResult.h"

#include <algorithm>
#include <array>
#include <cstring>

#include "filter/PImageHub.h"
#include "filter/PRenderContext.h"
#include "filter/PSource.h"
#include "framework/pixels/CMemoryPixmap.h"
#include "framework/pixels/CTexelPacker.h"
#include "framework/plugin/CQuillmarkFilter.h"
#include "gpu/POpenGLManager.h"
#include "gpu/POpenGLTile.h"
#include "lens/sphere/PhotoToSphere.h"
#include "params/PSettings.h"
#include "solver/frame/Solver.h"

namespace Project {

namespace {

constexpr std::int32_t kTile = PTileGeometry::kTile;
// Texels go to the GL in bands of some 64 KiB, still in the cache from
// their making.
constexpr std::size_t kBandBytes = 64 * 1024;

}  // namespace

PResult::PResult(PImageHub& hub, PRenderContext& run, Tarsa::CPixProcess& source,
                 std::function<Tarsa::CVirtualPixmap*()> sourcePixels, bool sourceHasAlpha)
    : hub_(hub),
      run_(run),
      source_(source),
      sourcePixels_(std::move(sourcePixels)),
      sourceHasAlpha_(sourceHasAlpha),
      depth_(run.RenderHost().Depth()),
      planes_(run.RenderHost().ColorPlanes() + 1),
      blocks_(planes_, depth_) {}

PResult::~PResult() { DeleteTextures(); }

const PResult::CellSet& PResult::TileCells(std::int32_t col, std::int32_t row) const {
  return geometry_.TileCells(col, row);
}

PTileGeometry::Mesh PResult::Mesh() const {
  const Solver& solver = run_.RenderSolver();
  PTileGeometry::Mesh mesh;
  mesh.gridSize = solver.GridSize();
  mesh.cells = solver.CellCount();
  mesh.positions = solver.Positions();
  mesh.texCoords = solver.TexCoords();
  const Solver* from = &solver;
  mesh.cellInMask = [from](std::int32_t i, std::int32_t j) { return from->IsCellInMask(i, j); };
  mesh.vertexInside = [from](std::int32_t i, std::int32_t j) {
    return from->GetWarp()->IsVertexInside(i, j);
  };
  mesh.splitsMainDiagonal = [from](std::int32_t i, std::int32_t j) {
    return from->GetOctaMap()->SplitsAlongMainDiagonal(i, j);
  };
  return mesh;
}

bool PResult::NextTile(std::int32_t col, std::int32_t row, std::int32_t& nextCol,
                       std::int32_t& nextRow) const {
  nextCol = col + 1, nextRow = row;
  if (nextCol >= geometry_.TilesAcross()) nextCol = 0, ++nextRow;
  return nextRow < geometry_.TilesDown();
}

void PResult::SetRect(const Tarsa::CRect& rect) {
  currentCol_ = currentRow_ = -1;
  ahead_.valid = false;
  inflight_.valid = false;
  blocks_.Drop();
  if (rect.IsEmpty()) {
    pixels_.reset();
    rect_ = {};
    geometry_.Clear();
    Clear();
    return;
  }
  PlaceStagePixels(pixels_, rect, depth_, planes_);
  rect_ = rect;
  resultWidth_ = std::int32_t(rect.Width());
  resultHeight_ = std::int32_t(rect.Height());
  Layout(rect, TileRect({rect.left, rect.top}, 0, 0));
  SetStepsPerCell(1);
  // The source stage covers the same rectangle as the result: the whole
  // image at full size, or the display area from the reduced source.
  geometry_.Build(Mesh(), {resultWidth_,
                           resultHeight_,
                           run_.RenderSolver().FitBox(0),
                           {rect.left, rect.top},
                           hub_.NpotTextures()});
}

void PResult::Invalidate(const Tarsa::CRect& area) {
  const Tarsa::CRect stale = area.Intersect(rect_);
  if (stale.IsEmpty()) return;
  ClearCounts(stale);
  currentCol_ = currentRow_ = -1;
  // The source may have changed under it.
  ahead_.valid = false;
  inflight_.valid = false;
  blocks_.Drop();
  hub_.ResultChanged(*this, stale);
}

void PResult::InvalidateAll() {
  if (rect_.IsEmpty()) return;
  const Tarsa::CRect rect = rect_;
  rect_ = {};  // SetRect takes the same rectangle as new
  SetRect(rect);
}

bool PResult::PrepareTile(std::int32_t col, std::int32_t row, Tarsa::CRect& out) {
  const PTileGeometry::Mesh mesh = Mesh();
  if (!geometry_.Place(mesh, col, row, placement_)) {
    drawing_.vertices.clear();
    drawing_.texCoords.clear();
    drawing_.triangles.clear();
    drawing_.quads.clear();
    return false;
  }
  geometry_.Draw(mesh, col, row, placement_, run_.RenderSettings().meshUseTriangle != 0, drawing_);
  out = placement_.source;
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
  Tarsa::CPixProcess& source = source_;
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
    dest.CopyFrom(*sourcePixels_(), tile);
  } else if (currentHasCells_) {
    if (!currentSourceRect_.IsEmpty() &&
        !BringUpToDate(source, currentSourceRect_, wait, stepCount))
      return 1;
    const Tarsa::CPixmap* from = sourcePixels_();
    std::unique_ptr<Tarsa::CMemoryPixmap> cut;
    if (run_.RenderSettings().projectionModel == PSettings::kModelFullSpherical) {
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

void PResult::Fill(const Tarsa::CPixmap& source, const Placement& place, std::uint32_t pass,
                   std::uint32_t texture) {
  const POpenGLTilePass format = TexelFormat(place.textureWidth, place.textureHeight);
  const std::size_t lineBytes = std::size_t(place.textureWidth) * (depth_ == 16 ? 8 : 4);
  const auto band = std::int32_t(std::max<std::size_t>(1, kBandBytes / lineBytes));
  const Tarsa::CTexelPacker packer(planes_, pass, depth_, halfTexels_);
  for (std::int32_t y = 0; y < place.textureHeight; y += band) {
    const std::int32_t end = std::min(place.textureHeight, y + band);
    packer.Pack(source, place.source, {place.padLeft, place.padTop}, 0, y, place.textureWidth, end,
                texels_, sourceRows_);
    FillTileTexture(texture, format, 0, y, place.textureWidth, end - y, texels_.data(),
                    place.textureWidth);
  }
}

void PResult::FillMargins(const Placement& place, std::uint32_t texture) {
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

void PResult::FillPicture(const Tarsa::CPixmap& source, const Placement& place,
                          std::uint32_t texture, const std::vector<Tarsa::CRect>& parts,
                          std::vector<Tarsa::CRect>* late) {
  const POpenGLTilePass format = TexelFormat(place.textureWidth, place.textureHeight);
  const std::size_t texelBytes = depth_ == 16 ? 8 : 4;
  Tarsa::CPixProcess& stage = source_;
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
        const PTexelBlocks::Block& block =
            blocks_.Get(source, halfTexels_, stage.Columns(), stage.Rows(), col, row, cell);
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

void PResult::FillAhead(const Tarsa::CPixmap& source, std::int32_t col, std::int32_t row,
                        std::uint32_t drawing, std::uint32_t* stepCount) {
  ahead_.valid = false;
  std::int32_t nextCol = 0, nextRow = 0;
  if (!NextTile(col, row, nextCol, nextRow) ||
      Counter(nextCol, nextRow) >= StepsOf(nextCol, nextRow))
    return;
  Placement& next = ahead_.placement;
  if (!geometry_.Place(Mesh(), nextCol, nextRow, next) || next.source.IsEmpty() ||
      !source.Bounds().Contains(next.source))
    return;
  ahead_.col = nextCol;
  ahead_.row = nextRow;
  ahead_.texture = TextureOfSize(next.textureWidth, next.textureHeight, drawing);
  ahead_.late.clear();
  if (stepCount != nullptr && !BringUpToDate(source_, next.source, true, *stepCount)) return;
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

POpenGLTilePass PResult::TilePass(const Tarsa::CPixmap& source, const Tarsa::CRect& sourceRect,
                                  std::int32_t col, std::int32_t row) {
  const Placement& place = placement_;
  const float scaleX = geometry_.ScaleX(), scaleY = geometry_.ScaleY();
  const double s = std::max(scaleX, scaleY);
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
  pass.shiftX = float(-col * scaleX * fx - geometry_.OriginX());
  pass.shiftY = float(row * scaleY * fy - geometry_.OriginY());
  pass.drawGeometry = currentHasCells_ && source.Bounds().Contains(sourceRect);
  pass.textured = run_.RenderSettings().textureRendering != 0;
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
  pass.vertices = drawing_.vertices.data();
  pass.texCoords = drawing_.texCoords.data();
  pass.triangles = drawing_.triangles.data();
  pass.triangleIndices = drawing_.triangles.size();
  pass.quads = drawing_.quads.data();
  pass.quadIndices = drawing_.quads.size();
  const std::size_t sampleBytes = depth_ == 16 ? 2 : 1;
  readback_.resize(std::size_t(POpenGLManager::kSurfaceSize) * POpenGLManager::kSurfaceSize * 4 *
                   sampleBytes);
  pass.readback = readback_.data();
  return pass;
}

void PResult::SetCover(POpenGLTilePass& pass, std::uint32_t passIndex) const {
  const Placement& place = placement_;
  const std::shared_ptr<PhotoToSphere>& model = run_.RenderSolver().GetImageModel();
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
  const bool fadeAll = !sourceHasAlpha_;
  const bool lastPass = passIndex + 1 == (planes_ < 5 ? 1u : 2u);
  for (int c = 0; c < 4; ++c) pass.coverScale[c] = fadeAll || (lastPass && c == 3) ? 1.0f : 0.0f;
}

void PResult::RenderTile(Tarsa::CMemoryPixmap& dest, const Tarsa::CPixmap& source,
                         const Tarsa::CRect& sourceRect, std::int32_t col, std::int32_t row) {
  POpenGLManager& gl = hub_.GLManager();
  placement_.source = sourceRect;
  const Placement& place = placement_;
  POpenGLTilePass pass = TilePass(source, sourceRect, col, row);
  const Tarsa::CRect tile = TileRect({rect_.left, rect_.top}, col, row);

  const std::uint32_t passes = planes_ < 5 ? 1 : 2;
  const bool textured = pass.drawGeometry && pass.textured;
  // With one pass and the stage's own source, textures come from the kept
  // source tiles, and the next tile's is filled while this one draws.
  // The kept source tiles follow the full source's tiles, read once each;
  // a reduced source is drawn from as it stands.
  const bool fromBlocks = textured && passes == 1 && &source == sourcePixels_() &&
                          &source_ == static_cast<Tarsa::CPixProcess*>(&hub_.Source());
  const bool drawn = inflight_.valid && inflight_.col == col && inflight_.row == row &&
                     inflight_.placement == place && inflight_.draw == gl.DrawCount() && fromBlocks;
  inflight_.valid = false;
  gl.MakeCurrent();
  try {
    halfTexels_ = depth_ == 16 && pass.textureFormat == PImageHub::kGLRGBA16F &&
                  pass.pixelType == PImageHub::kGLUnsignedShort &&
                  Tarsa::CTexelPacker::CanMakeHalves() && TakesHalfFloatTexels();
    pass.halfTexels = halfTexels_;
    const bool ready = fromBlocks && ahead_.valid && ahead_.col == col && ahead_.row == row &&
                       ahead_.placement == place && blocks_.Holds(&source, halfTexels_);
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
      // Target row 0 is the tile's top row: the view puts the plane's top
      // there.
      Tarsa::CTexelPacker(planes_, p, depth_, false)
          .Unpack(readback_.data(), POpenGLManager::kSurfaceSize, {tile.left, tile.top}, dest);
    }
    // After the last tile the kept source tiles have served their turn.
    if (col + 1 >= geometry_.TilesAcross() && row + 1 >= geometry_.TilesDown()) blocks_.Drop();
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
      run_.RenderSettings().projectionModel == PSettings::kModelFullSpherical)
    return;
  // Only the tile that comes next, and only from the texture ahead.
  std::int32_t nextCol = 0, nextRow = 0;
  if (!NextTile(col, row, nextCol, nextRow) || ahead_.col != nextCol || ahead_.row != nextRow)
    return;
  Tarsa::CPixProcess& source = source_;
  const Tarsa::CPixmap* pixels = sourcePixels_();
  if (pixels == nullptr || !blocks_.Holds(pixels, halfTexels_)) return;
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
