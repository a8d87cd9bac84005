#pragma once

#include <string>

#include "framework/view/CPane.h"

namespace Tarsa {

// A line (or, wrapping, a paragraph) of text that the user reads but does
// not change. A line too long for the view is trimmed at its end, or in its
// middle for a view that asks so (a camera name keeps its model number).
class CStaticText : public CPane {
 public:
  enum class ETrim { kEnd, kMiddle };

  CStaticText(CObjID id, CView* parent, const CRect& frame, const std::string& text,
              std::uint32_t binding = kBind_Fixed);

  const std::string& Text() const { return text_; }
  void SetText(const std::string& text);
  void SetFont(EFont font) { font_ = font; }
  void SetAlignment(EAlign align) { align_ = align; }
  void SetTrim(ETrim trim) { trim_ = trim; }
  void SetWrap(bool wrap) { wrap_ = wrap; }

  void Draw(CPort& port) override;

 private:
  std::string text_;
  EFont font_ = EFont::kUIMedium;
  EAlign align_ = EAlign::kStart;
  ETrim trim_ = ETrim::kEnd;
  bool wrap_ = false;
};

}  // namespace Tarsa
