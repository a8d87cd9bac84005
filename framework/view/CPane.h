#pragma once

#include <cstdint>

#include "framework/view/CView.h"

namespace Tarsa {

// A view that draws on the window as a surface of its own: the base of the
// framework's controls and panes. Beyond the view it keeps a fill and a
// frame style (none, a one-pixel rectangle, a bevel), which its Draw paints
// under whatever a subclass draws. Made like any view, owned by its parent.
class CPane : public CView {
 public:
  enum class EFrame { kNone, kRectangle, kBevel };

  using CView::CView;

  EFrame FrameStyle() const { return frame_; }
  void SetFrameStyle(EFrame frame);
  // 0xAARRGGBB; a zero alpha lets the face under the pane show.
  std::uint32_t Fill() const { return fill_; }
  void SetFill(std::uint32_t fill);

  // The fill, then the frame.
  void Draw(CPort& port) override;

 private:
  EFrame frame_ = EFrame::kNone;
  std::uint32_t fill_ = 0;
};

}  // namespace Tarsa
