#pragma once

#include <cstdint>
#include <functional>
#include <memory>
#include <string>

#include "framework/core/CRect.h"
#include "framework/process/CIdler.h"

namespace Project {

class POpenGLManager;
class PPreview;
class PPreviewTarget;
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
  // The result drawn straight at the display's size from the reduced source.
  PResult& ResultDirect();
  // What the preview pane shows; made by ConnectPane.
  PPreview& Preview();
  bool HasPreview() const { return preview_ != nullptr; }

  // The pane that shows the preview, or null to let go of it (which clears
  // the display area). The pane outlives its connection.
  void ConnectPane(PPreviewTarget* pane);
  // The part of the display picture the pane shows: the idle work makes
  // those tiles first and the others not at all.
  void SetVisibleRect(const Tarsa::CRect& rect);
  // The counts are stale: the next idle pass counts again.
  void RequestRecount();
  // The display's steps, done and in all, as of the last count.
  std::uint64_t DisplayDone() const { return displayDone_; }
  std::uint64_t DisplayTotal() const { return displayTotal_; }
  // Runs idle steps until the visible preview is complete or the budget
  // (seconds) is spent; true when it is complete.
  bool RunSteps(double budget);

  // The display picture's rectangle; empty until a preview shows. The
  // scaled stages map it onto the source's rectangle.
  void SetDisplayRect(const Tarsa::CRect& rect);
  const Tarsa::CRect& DisplayRect() const { return displayRect_; }

  // The solver's geometry changed: every result is stale.
  void RebuildResults();
  // The source changed over area: the stages built on it are stale there.
  void SourceChanged(const Tarsa::CRect& area);
  // A result changed over area (in its coordinates): what shows it is stale
  // there.
  void ResultChanged(const PResult& result, const Tarsa::CRect& area);

  // Idle work runs only while no one holds the hub suspended.
  void Suspend();
  void Resume();
  bool Suspended() const { return suspendCount_ != 0; }

  // Makes the visible preview, then reads ahead the source, for at most a
  // quarter of a second a call.
  bool Idle() override;

  // The final image into the host, with the host's progress and abort
  // callbacks; true when every tile went back, false on the host's abort.
  bool RenderFinalSilent();
  // The same from the dialog's OK, with a progress window shown once the
  // work has taken delay seconds; false when the user cancelled.
  bool RenderFinalWithDialog(double delay, const std::string& title, const std::string& message);

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
  // One step of the display's work, or of the source's read-ahead; the
  // steps run.
  std::uint32_t StepOnce();
  // The final rendering's loop; report takes done and total after each
  // slice and answers whether to go on.
  bool RenderFinal(const std::function<bool(std::uint64_t, std::uint64_t)>& report);
  void Recount();

  Tarsa::CRect displayRect_;
  Tarsa::CRect visibleRect_;
  PPreviewTarget* pane_ = nullptr;
  bool needsRecount_ = true;
  std::uint64_t displayDone_ = 0;
  std::uint64_t displayTotal_ = 0;
  std::unique_ptr<PSource> sourceFull_;
  std::unique_ptr<PSourceScaled> sourceScaled_;
  std::unique_ptr<PResult> resultFull_;
  std::unique_ptr<PResult> resultDirect_;
  std::unique_ptr<PResultScaled> resultScaled_;
  std::unique_ptr<PPreview> preview_;
};

}  // namespace Project
