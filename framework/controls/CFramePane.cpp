#include "framework/controls/CFramePane.h"

#include "framework/controls/CControl.h"

namespace Tarsa {

CFramePane::CFramePane(CObjID id, CView* parent, const CRect& frame, std::uint32_t fill,
                       std::uint32_t binding)
    : CView(id, parent, frame, kView_NoOptions, binding), fill_(fill) {}

void CFramePane::SetFill(std::uint32_t fill) {
  fill_ = fill;
  Invalidate();
}

void CFramePane::Draw(CPort& port) {
  const CRect image = Image();
  if ((fill_ >> 24) != 0) port.FillRect(image, fill_);
  port.FrameRect(image, IsEnabled() ? Skin::kEdge : Skin::kEdgeDisabled);
}

}  // namespace Tarsa
