#include "framework/layout/CPlaceholderPane.h"

namespace Tarsa {

CPlaceholderPane::CPlaceholderPane(CObjID id, CView* parent, const CRect& frame,
                                   std::string className, std::uint32_t binding)
    : CPane(id, parent, frame, kView_NoOptions, binding), className_(std::move(className)) {}

void CPlaceholderPane::Draw(CPort& port) {
  const CRect box = Image();
  port.FrameRect(box, 0xFFB8B8C8);
  // Only a pane with room of its own names itself; a container's children
  // cover its face.
  if (Children().empty() && box.Height() >= 14 && box.Width() >= 30) {
    port.DrawText(className_, {box.left + 3, box.top + 1, box.right - 3, box.bottom - 1},
                  EFont::kUISmall, 0xFF8080A0, EAlign::kCenter, EAlign::kCenter);
  }
}

}  // namespace Tarsa
