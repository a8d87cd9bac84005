#pragma once

#include "framework/controls/CControl.h"

namespace Tarsa {

// A check box with its label to the right: a click released over it, or
// Space while it has the focus, turns it over and sends the new state.
class CCheckButton : public CControl {
 public:
  CCheckButton(CObjID id, CView* parent, const CRect& frame, const std::string& label,
               bool checked = false, std::uint32_t options = kView_TabStop,
               std::uint32_t binding = kBind_Fixed);

  bool IsChecked() const { return checked_; }
  // Sets the state without telling anyone: the dialog's own writes.
  void SetChecked(bool checked);

  void Click(CMouseMessage& message) override;
  void HandleMessage(CMessage& message) override;
  void Draw(CPort& port) override;

 private:
  void Toggle();

  bool checked_;
};

}  // namespace Tarsa
