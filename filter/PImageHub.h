#pragma once

#include <cstdint>
#include <memory>
#include <string>

#include "framework/core/CRect.h"
#include "framework/process/CIdler.h"

namespace Project {

class POpenGLManager;
class PRenderContext;
class PResult;
class PResultScaled;
class PSource;
class PSourceScaled;

// The owner of every image stage of a run and of the OpenGL manager, and the
// idler that advances the stages between events. Made by the filter's first
// ImageHub(), which is the run's check of the OpenGL environment: the
// constructor picks the texture formats by depth, builds the manager and
// says in GLStatus() whether the run can go on. Stages are made on first
// demand; nothing is read from the host before a stage asks for it.
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

  // run: what the stages see of the run, which outlives the hub. The
  // rectangles and the depth are the host's ImageRect(), LayerRect() and
  // Depth().
  // logDirectory: where the shader log goes (empty: none); shaderFile: the
  // fragment shader (empty: beside the host executable).
  PImageHub(PRenderContext& run, const Tarsa::CRect& imageRect, const Tarsa::CRect& sourceRect,
            std::uint32_t depth, std::string logDirectory, std::string shaderFile = {});
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

  // The stages, made with their rectangles on first demand.
  PSource& Source();
  PResult& ResultFull();
  bool HasResultFull() const { return resultFull_ != nullptr; }
  // The source and the full result reduced to the display area; the
  // display rectangle must have been set.
  PSourceScaled& SourceScaled();
  PResultScaled& ResultScaled();

  // The area on screen; empty until a preview shows. The scaled stages map
  // it onto the source's rectangle.
  void SetDisplayRect(const Tarsa::CRect& rect);
  const Tarsa::CRect& DisplayRect() const { return displayRect_; }

  // The solver's geometry changed: every result is stale.
  void RebuildResults();
  // The source changed over area: the stages built on it are stale there.
  void SourceChanged(const Tarsa::CRect& area);
  // The full result changed over area: its reduction is stale there.
  void ResultChanged(const Tarsa::CRect& area);

  // Idle work runs only while no one holds the hub suspended.
  void Suspend();
  void Resume();
  bool Suspended() const { return suspendCount_ != 0; }

  // Reads ahead the source, a tile per call, while nothing else is due.
  bool Idle() override;

  // The final image into the host, with the host's progress and abort
  // callbacks; true when every tile went back, false on the host's abort.
  bool RenderFinalSilent();

 private:
  PRenderContext& run_;
  Tarsa::CRect imageRect_;
  Tarsa::CRect sourceRect_;
  std::uint32_t textureFormat_;
  std::uint32_t pixelFormat_;
  std::uint32_t pixelType_;
  std::unique_ptr<POpenGLManager> glManager_;
  std::int32_t glStatus_ = kGLMissing;
  bool glUsable_ = false;
  bool npotTextures_ = false;
  std::uint32_t suspendCount_ = 0;
  Tarsa::CRect displayRect_;
  std::unique_ptr<PSource> sourceFull_;
  std::unique_ptr<PSourceScaled> sourceScaled_;
  std::unique_ptr<PResult> resultFull_;
  std::unique_ptr<PResultScaled> resultScaled_;
};

}  // namespace Project
