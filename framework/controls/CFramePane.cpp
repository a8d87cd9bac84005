#include "framework/controls/CFramePane.h"

#include "framework/controls/CControl.h"

namespace Tarsa {

CFramePane::CFramePane(CObjID id, CView* parent, const CRect& frame, std::uint32_t fill,
                       std::uint32_t binding)
    : CPane(id, parent, frame, kView_NoOptions, binding) {
  SetFill(fill);
  SetFrameStyle(EFrame::kRectangle);
}

}  // namespace Tarsa
