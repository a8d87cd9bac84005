#pragma once

#include <cstdint>
#include <memory>
#include <string>

#include "framework/core/CRect.h"
#include "framework/process/CIdler.h"

namespace Project {

class POpenGLManager;

// The owner of every image stage of a run and of the OpenGL manager, and the
// idler that advances the stages between events. Made by the filter's first
// ImageHub(), which is the run's check of the OpenGL environment: the
// constructor picks the texture formats by depth, builds the manager and
// says in GLStatus() whether the run can go on. The stages, their idle work
// and the rendering are added on top of this; until then Idle() has nothing
// to do.
class PImageHub : public Tarsa::CIdler {
 public:
  // GLStatus values.
  static constexpr std::int32_t kGLFine = 0;
  static constexpr std::int32_t kGLMissing = 1;
  static constexpr std::int32_t kGLNo16BitPath = 2;

  // GL enumerants of the textures and pixel transfers.
  static constexpr std::uint32_t kGLRGBA = 6408;
  static constexpr std::uint32_t kGLRGBA16F = 34842;
  static constexpr std::uint32_t kGLUnsignedByte = 5121;
  static constexpr std::uint32_t kGLUnsignedShort = 5123;

  // imageRect and sourceRect: the filter's ImageRect() and LayerRect();
  // depth: the image's bits per sample; logDirectory: where the shader log
  // goes (empty: none).
  PImageHub(const Tarsa::CRect& imageRect, const Tarsa::CRect& sourceRect, std::uint32_t depth,
            std::string logDirectory);
  ~PImageHub() override;
  PImageHub(const PImageHub&) = delete;
  PImageHub& operator=(const PImageHub&) = delete;

  const Tarsa::CRect& ImageRect() const { return imageRect_; }
  const Tarsa::CRect& SourceRect() const { return sourceRect_; }
  std::int32_t GLStatus() const { return glStatus_; }
  bool GLUsable() const { return glUsable_; }
  bool NpotTextures() const { return npotTextures_; }
  std::uint32_t TextureFormat() const { return textureFormat_; }
  std::uint32_t PixelFormat() const { return pixelFormat_; }
  std::uint32_t PixelType() const { return pixelType_; }
  POpenGLManager& GLManager() { return *glManager_; }

  bool Idle() override { return false; }

  // The scripted run's final image into the host; true when it went back.
  // The final rendering is not part of this build: it throws a CError that
  // says so.
  bool RenderFinalSilent();

 private:
  Tarsa::CRect imageRect_;
  Tarsa::CRect sourceRect_;
  std::uint32_t textureFormat_;
  std::uint32_t pixelFormat_;
  std::uint32_t pixelType_;
  std::unique_ptr<POpenGLManager> glManager_;
  std::int32_t glStatus_ = kGLMissing;
  bool glUsable_ = false;
  bool npotTextures_ = false;
};

}  // namespace Project
