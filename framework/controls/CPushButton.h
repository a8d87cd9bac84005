#pragma once

#include "framework/controls/CControl.h"

namespace Tarsa {

// A push button: a click released over it, Space while it has the focus,
// or Return and Escape when the window names it its default or cancel
// view, press it. A press sends EButtonValue::kOn under the button's id and,
// for a button that ends its modal window, ends it with the button's id.
class CPushButton : public CControl {
 public:
  CPushButton(CObjID id, CView* parent, const CRect& frame, const std::string& label,
              std::uint32_t options = kView_TabStop, std::uint32_t binding = kBind_Fixed);

  void SetEndsModal(bool ends) { endsModal_ = ends; }
  // Drawn with the accent: the button Return presses.
  bool IsDefault() const;

  void Press();
  void Click(CMouseMessage& message) override;
  void HandleMessage(CMessage& message) override;
  void Draw(CPort& port) override;

 private:
  bool endsModal_ = false;
};

}  // namespace Tarsa
