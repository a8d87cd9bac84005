#include "framework/view/CPane.h"

namespace Tarsa {

void CPane::SetFrameStyle(EFrame frame) {
  frame_ = frame;
  Invalidate();
}

void CPane::SetFill(std::uint32_t fill) {
  fill_ = fill;
  Invalidate();
}

void CPane::Draw(CPort& port) {
  const CRect image = Image();
  if ((fill_ >> 24) != 0) port.FillRect(image, fill_);
  const std::uint32_t edge = IsEnabled() ? 0xFF9A9A9A : 0xFFC8C8C8;
  switch (frame_) {
    case EFrame::kRectangle:
      port.FrameRect(image, edge);
      break;
    case EFrame::kBevel:
      // Light above and to the left, dark below and to the right.
      port.Line({image.left + 0.5, image.bottom - 0.5}, {image.left + 0.5, image.top + 0.5},
                0xFFFFFFFF);
      port.Line({image.left + 0.5, image.top + 0.5}, {image.right - 0.5, image.top + 0.5},
                0xFFFFFFFF);
      port.Line({image.right - 0.5, image.top + 0.5}, {image.right - 0.5, image.bottom - 0.5},
                edge);
      port.Line({image.right - 0.5, image.bottom - 0.5}, {image.left + 0.5, image.bottom - 0.5},
                edge);
      break;
    case EFrame::kNone:
      break;
  }
}

}  // namespace Tarsa
