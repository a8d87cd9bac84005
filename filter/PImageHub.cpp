#include "filter/PImageHub.h"

#include <algorithm>
#include <chrono>
#include <utility>

#include "filter/PFinal.h"
#include "filter/PPreview.h"
#include "filter/PPreviewTarget.h"
#include "filter/PRenderContext.h"
#include "filter/PResult.h"
#include "filter/PResultScaled.h"
#include "filter/PSource.h"
#include "filter/PSourceScaled.h"
#include "framework/controls/CProgressDialog.h"
#include "framework/plugin/CQuillmarkFilter.h"
#include "gpu/POpenGLManager.h"

namespace Project {

namespace {

// The loops hand control back this often, tile boundaries permitting, so a
// cancel is seen soon.
constexpr std::chrono::milliseconds kSliceTime{200};
// The idle work's share of a pass: the dialog stays responsive.
constexpr double kIdleBudget = 0.25;

std::int32_t ProgressValue(std::uint64_t value) {
  return std::int32_t(std::min<std::uint64_t>(value, INT32_MAX));
}

}  // namespace

PImageHub::PImageHub(PRenderContext& run, const Tarsa::CRect& imageRect,
                     const Tarsa::CRect& sourceRect, std::uint32_t depth, std::string logDirectory,
                     std::string shaderFile)
    : run_(run),
      imageRect_(imageRect),
      sourceRect_(sourceRect),
      textureFormat_(depth == 16 ? kGLRGBA16F : kGLRGBA),
      pixelFormat_(kGLRGBA),
      pixelType_(depth == 16 ? kGLUnsignedShort : kGLUnsignedByte),
      glManager_(std::make_unique<POpenGLManager>(textureFormat_, std::move(logDirectory))) {
  if (!shaderFile.empty()) glManager_->SetShaderPath(std::move(shaderFile));
  if (!glManager_->Initialize()) {
    glStatus_ = kGLMissing;
  } else if (glManager_->FramebufferPath()) {
    glStatus_ = kGLFine;
  } else {
    // Without a framebuffer the target is an 8-bit image: 16-bit results
    // would lose their precision.
    glStatus_ = depth == 16 ? kGLNo16BitPath : kGLFine;
  }
  glUsable_ = glStatus_ == kGLFine;
  npotTextures_ = glManager_->HasVersion21();
}

PImageHub::~PImageHub() {
  Stop();
  glManager_->Shutdown();
  // Stages above first: they know the ones below by address.
  preview_.reset();
  resultScaled_.reset();
  resultDirect_.reset();
  resultFull_.reset();
  sourceScaled_.reset();
  sourceFull_.reset();
}

PSource& PImageHub::Source() {
  if (sourceFull_ == nullptr) {
    sourceFull_ = std::make_unique<PSource>(*this, run_.RenderHost());
    sourceFull_->SetRect(sourceRect_);
  }
  return *sourceFull_;
}

PResult& PImageHub::ResultFull() {
  if (resultFull_ == nullptr) {
    PSource& source = Source();
    resultFull_ = std::make_unique<PResult>(
        *this, run_, source, [this] { return sourceFull_->Pixels(); }, source.HasAlpha());
    resultFull_->AddInput(source);
    resultFull_->SetRect(sourceRect_);
  }
  return *resultFull_;
}

PSourceScaled& PImageHub::SourceScaled() {
  if (sourceScaled_ == nullptr) {
    sourceScaled_ = std::make_unique<PSourceScaled>(Source());
    sourceScaled_->SetRects(displayRect_, sourceRect_);
  }
  return *sourceScaled_;
}

PResultScaled& PImageHub::ResultScaled() {
  if (resultScaled_ == nullptr) {
    resultScaled_ = std::make_unique<PResultScaled>(ResultFull());
    resultScaled_->SetRects(displayRect_, sourceRect_);
  }
  return *resultScaled_;
}

PResult& PImageHub::ResultDirect() {
  if (resultDirect_ == nullptr) {
    PSourceScaled& source = SourceScaled();
    resultDirect_ = std::make_unique<PResult>(
        *this, run_, source, [this] { return sourceScaled_->Pixels(); }, Source().HasAlpha());
    resultDirect_->AddInput(source);
    resultDirect_->SetRect(displayRect_);
  }
  return *resultDirect_;
}

PPreview& PImageHub::Preview() {
  if (preview_ == nullptr) {
    preview_ = std::make_unique<PPreview>(*this, run_);
    preview_->SetRects(displayRect_, sourceRect_);
    RequestRecount();
  }
  return *preview_;
}

void PImageHub::ConnectPane(PPreviewTarget* pane) {
  pane_ = pane;
  if (pane == nullptr) {
    if (preview_ != nullptr) preview_->SetTarget(nullptr);
    SetDisplayRect({});
    return;
  }
  Preview().SetTarget(pane);
}

void PImageHub::SetDisplayRect(const Tarsa::CRect& rect) {
  if (rect == displayRect_) return;
  displayRect_ = rect;
  // The direct result is drawn at the display's size only when that differs
  // from the image's; at the image's size the preview reads the full result.
  const bool scaled = rect.Width() != sourceRect_.Width() || rect.Height() != sourceRect_.Height();
  if (sourceScaled_ != nullptr)
    sourceScaled_->SetRects(scaled ? rect : Tarsa::CRect{}, sourceRect_);
  if (resultScaled_ != nullptr)
    resultScaled_->SetRects(scaled ? rect : Tarsa::CRect{}, sourceRect_);
  if (resultDirect_ != nullptr) resultDirect_->SetRect(scaled ? rect : Tarsa::CRect{});
  if (preview_ != nullptr) preview_->SetRects(rect, sourceRect_);
  RequestRecount();
}

void PImageHub::SetVisibleRect(const Tarsa::CRect& rect) {
  if (rect == visibleRect_) return;
  visibleRect_ = rect;
  RequestRecount();
}

void PImageHub::RequestRecount() {
  needsRecount_ = true;
  if (suspendCount_ == 0) Start();
}

void PImageHub::RebuildResults() {
  if (resultFull_ != nullptr) {
    resultFull_->InvalidateAll();
    if (resultScaled_ != nullptr) resultScaled_->InputChanged(sourceRect_);
  }
  if (resultDirect_ != nullptr) resultDirect_->InvalidateAll();
  if (preview_ != nullptr) preview_->InvalidateAll();
  RequestRecount();
}

void PImageHub::SourceChanged(const Tarsa::CRect& area) {
  if (sourceScaled_ != nullptr) sourceScaled_->InputChanged(area);
  if (resultFull_ != nullptr) resultFull_->Invalidate(area);
}

void PImageHub::ResultChanged(const PResult& result, const Tarsa::CRect& area) {
  if (&result == resultFull_.get()) {
    if (resultScaled_ != nullptr) resultScaled_->InputChanged(area);
    if (preview_ != nullptr && !preview_->Scaled()) {
      const Tarsa::CRect view = preview_->ViewRect();
      preview_->Invalidate(area.Offset(view.left - sourceRect_.left, view.top - sourceRect_.top));
    }
  } else if (preview_ != nullptr && preview_->Scaled()) {
    preview_->Invalidate(area);
  }
}

void PImageHub::Suspend() {
  ++suspendCount_;
  Stop();
}

void PImageHub::Resume() {
  if (suspendCount_ > 0) --suspendCount_;
  if (suspendCount_ == 0) RequestRecount();
}

void PImageHub::Recount() {
  needsRecount_ = false;
  displayDone_ = displayTotal_ = 0;
  if (preview_ == nullptr || pane_ == nullptr) return;
  const Tarsa::CRect visible = visibleRect_.Intersect(displayRect_);
  std::int32_t col = 0, row = 0;
  std::uint32_t columns = 0, rows = 0;
  if (visible.IsEmpty() || !preview_->CellSpan(visible, col, row, columns, rows)) return;
  for (std::uint32_t r = 0; r < rows; ++r) {
    for (std::uint32_t c = 0; c < columns; ++c) {
      const std::int32_t i = col + std::int32_t(c), j = row + std::int32_t(r);
      ++displayTotal_;
      if (preview_->Counter(i, j) >= preview_->StepsOf(i, j)) ++displayDone_;
    }
  }
}

std::uint32_t PImageHub::StepOnce() {
  if (preview_ != nullptr && pane_ != nullptr && !pane_->PreviewFrozen()) {
    const Tarsa::CRect visible = visibleRect_.Intersect(displayRect_);
    std::int32_t col = 0, row = 0;
    std::uint32_t columns = 0, rows = 0;
    if (!visible.IsEmpty() && preview_->CellSpan(visible, col, row, columns, rows)) {
      const std::uint32_t steps = preview_->NextStepInRange(col, row, columns, rows);
      if (steps != 0) return steps;
    }
  }
  // With the display complete the source is read ahead, for the final
  // rendering and for a display that will want more of it.
  if (sourceFull_ == nullptr) return 0;
  return sourceFull_->NextStepInRange(0, 0, sourceFull_->Columns(), sourceFull_->Rows());
}

bool PImageHub::RunSteps(double budget) {
  const auto start = std::chrono::steady_clock::now();
  const auto limit = std::chrono::duration<double>(budget);
  if (needsRecount_) Recount();
  const std::uint64_t doneBefore = displayDone_;
  while (std::chrono::steady_clock::now() - start < limit) {
    if (StepOnce() == 0) break;
    Recount();
    if (displayDone_ >= displayTotal_ &&
        (sourceFull_ == nullptr || sourceFull_->DoneSteps() >= sourceFull_->TotalSteps()))
      break;
  }
  Recount();
  if (pane_ != nullptr && (displayDone_ != doneBefore || displayDone_ >= displayTotal_))
    pane_->PreviewProgress(displayDone_, displayTotal_);
  return displayDone_ >= displayTotal_;
}

bool PImageHub::Idle() {
  if (suspendCount_ != 0) return false;
  RunSteps(kIdleBudget);
  const bool sourceLeft =
      sourceFull_ != nullptr && sourceFull_->DoneSteps() < sourceFull_->TotalSteps();
  const bool displayLeft =
      pane_ != nullptr && !pane_->PreviewFrozen() && displayDone_ < displayTotal_;
  return sourceLeft || displayLeft;
}

bool PImageHub::RenderFinal(const std::function<bool(std::uint64_t, std::uint64_t)>& report) {
  Tarsa::CQuillmarkFilter& host = run_.RenderHost();
  PFinal final(ResultFull(), host);
  Suspend();
  bool complete = false;
  try {
    final.SetRect(host.LayerRect());
    const std::uint64_t total = final.TotalSteps();
    std::uint64_t done = final.DoneSteps();
    bool go = report(done, total);
    while (go && done < total) {
      const auto start = std::chrono::steady_clock::now();
      do {
        const std::uint32_t steps = final.NextStepInRange(0, 0, final.Columns(), final.Rows());
        // Nothing left to run: whatever the counts say, the image is out.
        done = steps == 0 ? total : std::min(total, done + steps);
      } while (done < total && std::chrono::steady_clock::now() - start < kSliceTime);
      go = report(done, total);
    }
    complete = done >= total;
  } catch (...) {
    Resume();
    throw;
  }
  Resume();
  return complete;
}

bool PImageHub::RenderFinalSilent() {
  const Tarsa::HostFilterRecord* record = run_.RenderHost().FilterRecord();
  const Tarsa::HostProgressProc progress = record != nullptr ? record->progressCallback : nullptr;
  const Tarsa::HostAbortProc abort = record != nullptr ? record->abortCallback : nullptr;
  return RenderFinal([&](std::uint64_t done, std::uint64_t total) {
    if (progress != nullptr) progress(ProgressValue(done), ProgressValue(total));
    return done >= total || abort == nullptr || abort() == 0;
  });
}

bool PImageHub::RenderFinalWithDialog(double delay, const std::string& title,
                                      const std::string& message) {
  std::unique_ptr<Tarsa::CProgressDialog> dialog;
  const auto start = std::chrono::steady_clock::now();
  return RenderFinal([&](std::uint64_t done, std::uint64_t total) {
    if (done >= total) return true;
    // A short rendering shows no window at all.
    if (dialog == nullptr &&
        std::chrono::steady_clock::now() - start >= std::chrono::duration<double>(delay))
      dialog = std::make_unique<Tarsa::CProgressDialog>(title, message);
    if (dialog == nullptr) return true;
    dialog->Update(total == 0 ? 1.0 : double(done) / double(total));
    return !dialog->Cancelled();
  });
}

}  // namespace Project
