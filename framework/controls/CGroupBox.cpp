#include "framework/controls/CGroupBox.h"

#include "framework/controls/CControl.h"

namespace Tarsa {

namespace {
// The title's line height; the frame's top runs through its middle.
constexpr std::int32_t kTitleHeight = 18;
}  // namespace

CGroupBox::CGroupBox(CObjID id, CView* parent, const CRect& frame, const std::string& title,
                     std::uint32_t binding)
    : CPane(id, parent, frame, kView_NoOptions, binding), title_(ShownText(title)) {}

void CGroupBox::SetTitle(const std::string& title) {
  title_ = ShownText(title);
  Invalidate();
}

CRect CGroupBox::Interior() const {
  const CRect image = Image();
  return CRect{image.left + 10, image.top + kTitleHeight + 4, image.right - 10, image.bottom - 8};
}

void CGroupBox::Draw(CPort& port) {
  const CRect image = Image();
  const std::int32_t top = image.top + (title_.empty() ? 0 : kTitleHeight / 2);
  const CRect box{image.left, top, image.right, image.bottom};
  const std::uint32_t line = IsEnabled() ? 0xFFB4B4B4 : Skin::kEdgeDisabled;
  if (title_.empty()) {
    port.FrameRoundRect(box, 4.0, line);
    return;
  }
  // The title interrupts the top line; it is left out under the title
  // rather than painted over, so whatever lies behind the box shows there.
  const CSize size = port.MeasureText(title_, EFont::kUIBold);
  const CRect text{image.left + 10, image.top, image.left + 10 + size.width + 8,
                   image.top + kTitleHeight};
  port.Save();
  port.Clip(CRect{image.left, top + 1, image.right, image.bottom});
  port.FrameRoundRect(box, 4.0, line);
  port.Restore();
  const double y = top + 0.5;
  port.Line({box.left + 4.0, y}, {double(text.left), y}, line);
  port.Line({double(text.right), y}, {box.right - 4.0, y}, line);
  port.Save();
  port.Clip(CRect{image.left, top, image.left + 4, top + 4});
  port.FrameRoundRect(box, 4.0, line);
  port.Restore();
  port.Save();
  port.Clip(CRect{image.right - 4, top, image.right, top + 4});
  port.FrameRoundRect(box, 4.0, line);
  port.Restore();
  port.DrawText(title_, CRect{text.left + 4, text.top, text.right, text.bottom}, EFont::kUIBold,
                IsEnabled() ? Skin::kText : Skin::kTextDisabled);
}

}  // namespace Tarsa
