#pragma once

#include <cstddef>
#include <cstdint>

namespace Project {

class POpenGLManager;

// One pass of a result tile on the manager's 128 x 128 target, described
// without OpenGL types so that the stages above need no GL headers: the view,
// the texture of the source pixels the tile needs, the mesh part that covers
// the tile, and where the target's pixels go. The context must be current.
struct POpenGLTilePass {
  // Orthographic view: x from left to right across the target; y at bottom
  // lies on the target's first row (the first row read back).
  double left = 0;
  double right = 1;
  double bottom = 0;
  double top = 1;
  // Model-view: vertices are shifted, then scaled uniformly.
  float zoom = 1;
  float shiftX = 0;
  float shiftY = 0;

  // false: the pass only clears the target.
  bool drawGeometry = false;
  // false: cells are drawn as red outlines, untextured.
  bool textured = true;

  // Four samples per texel, rows from t = 0, of pixelType.
  const void* texels = nullptr;
  // A texture filled already (DefineTileTexture, FillTileTexture): the pass
  // draws from it and texels is not read. 0: a texture is made from texels
  // for the pass.
  std::uint32_t texture = 0;
  int textureWidth = 0;
  int textureHeight = 0;
  // The texels that hold the picture's pixels, first and last, x then y:
  // the rest is margin, where the result is transparent.
  float pictureTexels[4] = {0, 0, 0, 0};
  // The edge of the camera model's cover as a circle in texels, centre x, y
  // and radius (0: none), and the channels the covered share of an edge
  // pixel scales; see the fragment shader.
  float coverCircle[4] = {0, 0, 0, 0};
  float coverScale[4] = {1, 1, 1, 1};
  std::uint32_t textureFormat = 0;
  std::uint32_t pixelFormat = 0;
  std::uint32_t pixelType = 0;
  // The texels are half floats, not pixelType: for a half-float texture,
  // whose texels then go in unconverted. The read back stays pixelType.
  bool halfTexels = false;

  // Two floats per vertex each.
  const float* vertices = nullptr;
  const float* texCoords = nullptr;
  // Vertex indices, three per triangle and four per quad.
  const std::uint32_t* triangles = nullptr;
  std::size_t triangleIndices = 0;
  const std::uint32_t* quads = nullptr;
  std::size_t quadIndices = 0;

  // 128 x 128 x 4 samples of pixelType: the target after the pass.
  void* readback = nullptr;
};

// Clears, draws and reads back one pass. With the manager's shader the
// texture is sampled texel by texel and the shader interpolates; without it,
// bilinear filtering does.
void RenderTilePass(POpenGLManager& manager, const POpenGLTilePass& pass);

// RenderTilePass in two halves, so that the CPU can work while the GL draws:
// DrawTilePass clears, draws and sends the drawing off; ReadTilePass waits
// for it and reads the target back. DrawTilePass answers the texture it made
// from pass.texels (0 for none), which ReadTilePass deletes.
std::uint32_t DrawTilePass(POpenGLManager& manager, const POpenGLTilePass& pass);
void ReadTilePass(const POpenGLTilePass& pass, std::uint32_t madeTexture);

// A texture kept by the caller across passes, in the manager's context:
// DefineTileTexture makes it when texture is 0 and gives it the pass's size,
// formats and sampling, its texels undefined until filled. FillTileTexture
// writes width x height texels at (x, y) from texels, whose rows lie
// rowLength texels apart, of the pass's type.
// Throws the framework's error when the pass's texture is empty or larger on
// a side than the context takes: no mesh, however it came out, hands the GL
// a size beyond its limits. DrawTilePass and DefineTileTexture check, and
// DrawTilePass refuses index counts beyond GLsizei and FillTileTexture a
// region outside the pass's texture size, both with the framework's error.
void CheckTextureSize(POpenGLManager& manager, const POpenGLTilePass& pass);
void DefineTileTexture(POpenGLManager& manager, std::uint32_t& texture,
                       const POpenGLTilePass& pass);
void FillTileTexture(std::uint32_t texture, const POpenGLTilePass& pass, int x, int y, int width,
                     int height, const void* texels, int rowLength);
// Deletes texture, when not 0, and sets it to 0.
void DeleteTileTexture(std::uint32_t& texture);

// Whether the current context takes half floats as texels.
bool TakesHalfFloatTexels();

}  // namespace Project
