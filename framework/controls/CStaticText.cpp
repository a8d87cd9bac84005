#include "framework/controls/CStaticText.h"

#include "framework/controls/CControl.h"

namespace Tarsa {

CStaticText::CStaticText(CObjID id, CView* parent, const CRect& frame, const std::string& text,
                         std::uint32_t binding)
    : CPane(id, parent, frame, kView_NoOptions, binding), text_(text) {}

void CStaticText::SetText(const std::string& text) {
  if (text == text_) return;
  text_ = text;
  Invalidate();
}

void CStaticText::Draw(CPort& port) {
  const CRect box = Image();
  const std::uint32_t color = IsEnabled() ? Skin::kText : Skin::kTextDisabled;
  if (wrap_) {
    port.DrawWrappedText(text_, box, font_, color);
    return;
  }
  std::string shown = text_;
  if (trim_ == ETrim::kMiddle && port.MeasureText(shown, font_).width > box.Width()) {
    // Drop characters from the middle until the text with an ellipsis fits;
    // whole UTF-8 sequences only.
    std::string head = text_.substr(0, text_.size() / 2);
    std::string tail = text_.substr(text_.size() / 2);
    const auto dropLast = [](std::string& s) {
      while (!s.empty() && (static_cast<unsigned char>(s.back()) & 0xC0) == 0x80) s.pop_back();
      if (!s.empty()) s.pop_back();
    };
    const auto dropFirst = [](std::string& s) {
      if (!s.empty()) s.erase(0, 1);
      while (!s.empty() && (static_cast<unsigned char>(s.front()) & 0xC0) == 0x80) s.erase(0, 1);
    };
    while (!head.empty() || !tail.empty()) {
      shown = head + "\u2026" + tail;
      if (port.MeasureText(shown, font_).width <= box.Width()) break;
      if (head.size() >= tail.size()) {
        dropLast(head);
      } else {
        dropFirst(tail);
      }
    }
  }
  port.DrawText(shown, box, font_, color, align_, EAlign::kCenter);
}

}  // namespace Tarsa
