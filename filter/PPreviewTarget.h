#pragma once

#include <cstdint>

#include "framework/core/CRect.h"

namespace Project {

// The preview pane as the image hub and the preview stage see it: told
// which part of the display picture changed and how far the display's work
// has come, and asked whether it is being dragged (the hub then holds off).
// The pane connects itself to the hub and disconnects before it goes.
class PPreviewTarget {
 public:
  virtual ~PPreviewTarget() = default;

  // area: display coordinates (the picture at the display's scale).
  virtual void PreviewChanged(const Tarsa::CRect& area) = 0;
  virtual void PreviewProgress(std::uint64_t done, std::uint64_t total) = 0;
  virtual bool PreviewFrozen() const { return false; }
};

}  // namespace Project
