#include "filter/PImageHub.h"

#include <utility>

#include "framework/core/CException.h"
#include "gpu/POpenGLManager.h"

namespace Project {

PImageHub::PImageHub(const Tarsa::CRect& imageRect, const Tarsa::CRect& sourceRect,
                     std::uint32_t depth, std::string logDirectory)
    : imageRect_(imageRect),
      sourceRect_(sourceRect),
      textureFormat_(depth == 16 ? kGLRGBA16F : kGLRGBA),
      pixelFormat_(kGLRGBA),
      pixelType_(depth == 16 ? kGLUnsignedShort : kGLUnsignedByte),
      glManager_(std::make_unique<POpenGLManager>(textureFormat_, std::move(logDirectory))) {
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

PImageHub::~PImageHub() { glManager_->Shutdown(); }

bool PImageHub::RenderFinalSilent() {
  throw Tarsa::CError(
      "$$$/Archway/Error/RenderMissing=This build of Archway cannot render corrections yet.");
}

}  // namespace Project
