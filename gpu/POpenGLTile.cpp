#include "gpu/POpenGLTile.h"

#define EGL_NO_X11
#include <GL/gl.h>

#include "gpu/POpenGLManager.h"

namespace Project {

void RenderTilePass(POpenGLManager& manager, const POpenGLTilePass& pass) {
  constexpr int kSize = POpenGLManager::kSurfaceSize;
  glViewport(0, 0, kSize, kSize);
  glMatrixMode(GL_PROJECTION);
  glLoadIdentity();
  glOrtho(pass.left, pass.right, pass.bottom, pass.top, -1.0, 1.0);
  glShadeModel(GL_SMOOTH);
  glClearColor(0, 0, 0, 0);
  glDisable(GL_DEPTH_TEST);
  manager.UseShader();
  glClear(GL_COLOR_BUFFER_BIT | GL_DEPTH_BUFFER_BIT);

  GLuint texture = 0;
  if (pass.drawGeometry) {
    glMatrixMode(GL_MODELVIEW);
    glLoadIdentity();
    glScalef(pass.zoom, pass.zoom, 1.0f);
    glTranslatef(pass.shiftX, pass.shiftY, 0.0f);

    if (pass.textured) {
      glEnable(GL_TEXTURE_2D);
      glPixelStorei(GL_UNPACK_ALIGNMENT, 1);
      glGenTextures(1, &texture);
      glBindTexture(GL_TEXTURE_2D, texture);
      glTexEnvi(GL_TEXTURE_ENV, GL_TEXTURE_ENV_MODE, GL_REPLACE);
      glTexParameteri(GL_TEXTURE_2D, GL_TEXTURE_WRAP_S, GL_CLAMP);
      glTexParameteri(GL_TEXTURE_2D, GL_TEXTURE_WRAP_T, GL_CLAMP);
      const GLint filter = manager.ShaderReady() ? GL_NEAREST : GL_LINEAR;
      glTexParameteri(GL_TEXTURE_2D, GL_TEXTURE_MIN_FILTER, filter);
      glTexParameteri(GL_TEXTURE_2D, GL_TEXTURE_MAG_FILTER, filter);
      manager.SetShaderSizes(1.0f / float(pass.textureWidth), 1.0f / float(pass.textureHeight),
                             float(pass.textureWidth), float(pass.textureHeight),
                             pass.pictureTexels);
      glTexImage2D(GL_TEXTURE_2D, 0, GLint(pass.textureFormat), pass.textureWidth,
                   pass.textureHeight, 0, pass.pixelFormat, pass.pixelType, pass.texels);
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

  glPixelStorei(GL_PACK_ALIGNMENT, 1);
  glReadPixels(0, 0, kSize, kSize, pass.pixelFormat, pass.pixelType, pass.readback);
  if (texture != 0) {
    glBindTexture(GL_TEXTURE_2D, 0);
    glDeleteTextures(1, &texture);
  }
  glDisable(GL_TEXTURE_2D);
}

}  // namespace Project
