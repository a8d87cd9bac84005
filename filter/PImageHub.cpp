#include "filter/PImageHub.h"

#include <algorithm>
#include <chrono>
#include <utility>

#include "filter/PFinal.h"
#include "filter/PRenderContext.h"
#include "filter/PResult.h"
#include "filter/PResultScaled.h"
#include "filter/PSource.h"
#include "filter/PSourceScaled.h"
#include "framework/plugin/CQuillmarkFilter.h"
#include "gpu/POpenGLManager.h"

namespace Project {

namespace {

// The loops hand control back this often, tile boundaries permitting, so a
// cancel is seen soon.
constexpr std::chrono::milliseconds kSliceTime{200};

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
  resultScaled_.reset();
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
    resultFull_ = std::make_unique<PResult>(*this, run_);
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

void PImageHub::SetDisplayRect(const Tarsa::CRect& rect) {
  if (rect == displayRect_) return;
  displayRect_ = rect;
  if (sourceScaled_ != nullptr) sourceScaled_->SetRects(displayRect_, sourceRect_);
  if (resultScaled_ != nullptr) resultScaled_->SetRects(displayRect_, sourceRect_);
}

void PImageHub::RebuildResults() {
  if (resultFull_ == nullptr) return;
  resultFull_->InvalidateAll();
  ResultChanged(sourceRect_);
}

void PImageHub::SourceChanged(const Tarsa::CRect& area) {
  if (sourceScaled_ != nullptr) sourceScaled_->InputChanged(area);
  if (resultFull_ != nullptr) resultFull_->Invalidate(area);
}

void PImageHub::ResultChanged(const Tarsa::CRect& area) {
  if (resultScaled_ != nullptr) resultScaled_->InputChanged(area);
}

void PImageHub::Suspend() {
  ++suspendCount_;
  Stop();
}

void PImageHub::Resume() {
  if (suspendCount_ > 0) --suspendCount_;
  if (suspendCount_ == 0 && sourceFull_ != nullptr &&
      sourceFull_->DoneSteps() < sourceFull_->TotalSteps())
    Start();
}

bool PImageHub::Idle() {
  if (suspendCount_ != 0 || sourceFull_ == nullptr) return false;
  PSource& source = *sourceFull_;
  source.NextStepInRange(0, 0, source.Columns(), source.Rows());
  return source.DoneSteps() < source.TotalSteps();
}

bool PImageHub::RenderFinalSilent() {
  Tarsa::CQuillmarkFilter& host = run_.RenderHost();
  const Tarsa::HostFilterRecord* record = host.FilterRecord();
  const Tarsa::HostProgressProc progress = record != nullptr ? record->progressCallback : nullptr;
  const Tarsa::HostAbortProc abort = record != nullptr ? record->abortCallback : nullptr;

  PFinal final(ResultFull(), host);
  Suspend();
  bool complete = false;
  try {
    final.SetRect(host.LayerRect());
    const std::uint64_t total = final.TotalSteps();
    std::uint64_t done = final.DoneSteps();
    if (progress != nullptr) progress(ProgressValue(done), ProgressValue(total));
    while (done < total) {
      if (abort != nullptr && abort() != 0) break;
      const auto start = std::chrono::steady_clock::now();
      do {
        const std::uint32_t steps = final.NextStepInRange(0, 0, final.Columns(), final.Rows());
        // Nothing left to run: whatever the counts say, the image is out.
        done = steps == 0 ? total : std::min(total, done + steps);
      } while (done < total && std::chrono::steady_clock::now() - start < kSliceTime);
      if (progress != nullptr) progress(ProgressValue(done), ProgressValue(total));
    }
    complete = done >= total;
  } catch (...) {
    Resume();
    throw;
  }
  Resume();
  return complete;
}

}  // namespace Project
