#include "gpu/POpenGLTile.h"

#include <cstdlib>
#include <cstring>
#include <limits>

#define EGL_NO_X11
#include <GL/gl.h>

#include "framework/core/CException.h"
#include "framework/strings/CString.h"
#include "gpu/POpenGLManager.h"

namespace Project {

namespace {

constexpr const char* kTextureTooLargeText =
    "$$$/Archway/Error/TextureTooLarge=This correction needs a texture of ^0 x ^1 texels, more "
    "than the graphics processor takes (^2 on a side).";

constexpr const char* kBadDrawText =
    "$$$/Archway/Error/BadDraw=A tile of this correction cannot be drawn: its mesh part or "
    "texture region is beyond what the graphics processor takes.";

[[noreturn]] void RefuseDraw() { throw Tarsa::CError(Tarsa::ResolveText(kBadDrawText).Str()); }

GLenum TexelType(const POpenGLTilePass& pass) {
  return pass.halfTexels ? GL_HALF_FLOAT : pass.pixelType;
}

// Sampling state lives in the texture object: set once when it is defined.
void SetSampling(POpenGLManager& manager) {
  glTexParameteri(GL_TEXTURE_2D, GL_TEXTURE_WRAP_S, GL_CLAMP);
  glTexParameteri(GL_TEXTURE_2D, GL_TEXTURE_WRAP_T, GL_CLAMP);
  const GLint filter = manager.ShaderReady() ? GL_NEAREST : GL_LINEAR;
  glTexParameteri(GL_TEXTURE_2D, GL_TEXTURE_MIN_FILTER, filter);
  glTexParameteri(GL_TEXTURE_2D, GL_TEXTURE_MAG_FILTER, filter);
}

}  // namespace

void RenderTilePass(POpenGLManager& manager, const POpenGLTilePass& pass) {
  ReadTilePass(pass, DrawTilePass(manager, pass));
}

std::uint32_t DrawTilePass(POpenGLManager& manager, const POpenGLTilePass& pass) {
  constexpr int kSize = POpenGLManager::kSurfaceSize;
  // Index counts travel as GLsizei.
  constexpr std::size_t kMostIndices = std::numeric_limits<GLsizei>::max();
  if (pass.drawGeometry &&
      (pass.triangleIndices > kMostIndices || pass.quadIndices > kMostIndices)) {
    RefuseDraw();
  }
  manager.CountDraw();
  glViewport(0, 0, kSize, kSize);
  glMatrixMode(GL_PROJECTION);
  glLoadIdentity();
  glOrtho(pass.left, pass.right, pass.bottom, pass.top, -1.0, 1.0);
  glShadeModel(GL_SMOOTH);
  glClearColor(0, 0, 0, 0);
  glDisable(GL_DEPTH_TEST);
  manager.UseShader();
  glClear(GL_COLOR_BUFFER_BIT | GL_DEPTH_BUFFER_BIT);

  GLuint made = 0;
  if (pass.drawGeometry) {
    glMatrixMode(GL_MODELVIEW);
    glLoadIdentity();
    glScalef(pass.zoom, pass.zoom, 1.0f);
    glTranslatef(pass.shiftX, pass.shiftY, 0.0f);

    if (pass.textured) {
      glEnable(GL_TEXTURE_2D);
      if (pass.texture != 0) {
        glBindTexture(GL_TEXTURE_2D, pass.texture);
      } else {
        CheckTextureSize(manager, pass);
        glGenTextures(1, &made);
        glBindTexture(GL_TEXTURE_2D, made);
        SetSampling(manager);
        glPixelStorei(GL_UNPACK_ALIGNMENT, 1);
        glPixelStorei(GL_UNPACK_ROW_LENGTH, 0);
        glTexImage2D(GL_TEXTURE_2D, 0, GLint(pass.textureFormat), pass.textureWidth,
                     pass.textureHeight, 0, pass.pixelFormat, TexelType(pass), pass.texels);
      }
      glTexEnvi(GL_TEXTURE_ENV, GL_TEXTURE_ENV_MODE, GL_REPLACE);
      manager.SetShaderSizes(1.0f / float(pass.textureWidth), 1.0f / float(pass.textureHeight),
                             float(pass.textureWidth), float(pass.textureHeight),
                             pass.pictureTexels);
      manager.SetShaderCover(pass.coverCircle, pass.coverScale);
    } else {
      glDisable(GL_TEXTURE_2D);
      glColor4f(1, 0, 0, 1);
    }
    glEnableClientState(GL_VERTEX_ARRAY);
    glVertexPointer(2, GL_FLOAT, 0, pass.vertices);
    glEnableClientState(GL_TEXTURE_COORD_ARRAY);
    glTexCoordPointer(2, GL_FLOAT, 0, pass.texCoords);
    if (pass.textured) {
      if (pass.triangleIndices > 0)
        glDrawElements(GL_TRIANGLES, GLsizei(pass.triangleIndices), GL_UNSIGNED_INT,
                       pass.triangles);
      if (pass.quadIndices > 0)
        glDrawElements(GL_QUADS, GLsizei(pass.quadIndices), GL_UNSIGNED_INT, pass.quads);
    } else {
      for (std::size_t i = 0; i + 3 <= pass.triangleIndices; i += 3)
        glDrawElements(GL_LINE_LOOP, 3, GL_UNSIGNED_INT, pass.triangles + i);
      for (std::size_t i = 0; i + 4 <= pass.quadIndices; i += 4)
        glDrawElements(GL_LINE_LOOP, 4, GL_UNSIGNED_INT, pass.quads + i);
    }
    glDisableClientState(GL_TEXTURE_COORD_ARRAY);
    glDisableClientState(GL_VERTEX_ARRAY);
  }
  glFlush();
  return made;
}

void ReadTilePass(const POpenGLTilePass& pass, std::uint32_t madeTexture) {
  constexpr int kSize = POpenGLManager::kSurfaceSize;
  glPixelStorei(GL_PACK_ALIGNMENT, 1);
  glReadPixels(0, 0, kSize, kSize, pass.pixelFormat, pass.pixelType, pass.readback);
  glBindTexture(GL_TEXTURE_2D, 0);
  if (madeTexture != 0) {
    const GLuint texture = madeTexture;
    glDeleteTextures(1, &texture);
  }
  glDisable(GL_TEXTURE_2D);
}

void CheckTextureSize(POpenGLManager& manager, const POpenGLTilePass& pass) {
  const int most = manager.MaxTextureSize();
  if (pass.textureWidth > 0 && pass.textureHeight > 0 && pass.textureWidth <= most &&
      pass.textureHeight <= most) {
    return;
  }
  const Tarsa::CString text = Tarsa::ResolveText(kTextureTooLargeText)
                                  .Replace(0, Tarsa::NumberToText(pass.textureWidth, 0, false))
                                  .Replace(1, Tarsa::NumberToText(pass.textureHeight, 0, false))
                                  .Replace(2, Tarsa::NumberToText(most, 0, false));
  throw Tarsa::CError(text.Str());
}

void DefineTileTexture(POpenGLManager& manager, std::uint32_t& texture,
                       const POpenGLTilePass& pass) {
  CheckTextureSize(manager, pass);
  if (texture == 0) {
    GLuint name = 0;
    glGenTextures(1, &name);
    glBindTexture(GL_TEXTURE_2D, name);
    SetSampling(manager);
    texture = name;
  } else {
    glBindTexture(GL_TEXTURE_2D, texture);
  }
  glTexImage2D(GL_TEXTURE_2D, 0, GLint(pass.textureFormat), pass.textureWidth, pass.textureHeight,
               0, pass.pixelFormat, TexelType(pass), nullptr);
  glBindTexture(GL_TEXTURE_2D, 0);
}

void FillTileTexture(std::uint32_t texture, const POpenGLTilePass& pass, int x, int y, int width,
                     int height, const void* texels, int rowLength) {
  // The region lies in the texture, and its rows in the caller's texels.
  if (x < 0 || y < 0 || width < 0 || height < 0 || x > pass.textureWidth - width ||
      y > pass.textureHeight - height || (rowLength != 0 && rowLength < width)) {
    RefuseDraw();
  }
  glBindTexture(GL_TEXTURE_2D, texture);
  glPixelStorei(GL_UNPACK_ALIGNMENT, 1);
  glPixelStorei(GL_UNPACK_ROW_LENGTH, rowLength);
  glTexSubImage2D(GL_TEXTURE_2D, 0, x, y, width, height, pass.pixelFormat, TexelType(pass), texels);
  glPixelStorei(GL_UNPACK_ROW_LENGTH, 0);
  glBindTexture(GL_TEXTURE_2D, 0);
}

void DeleteTileTexture(std::uint32_t& texture) {
  if (texture == 0) return;
  const GLuint name = texture;
  glDeleteTextures(1, &name);
  texture = 0;
}

bool TakesHalfFloatTexels() {
  // A core type from 3.0, an extension before.
  const auto* version = reinterpret_cast<const char*>(glGetString(GL_VERSION));
  if (version != nullptr && std::atoi(version) >= 3) return true;
  const auto* extensions = reinterpret_cast<const char*>(glGetString(GL_EXTENSIONS));
  return extensions != nullptr && std::strstr(extensions, "GL_ARB_half_float_pixel") != nullptr;
}

}  // namespace Project
