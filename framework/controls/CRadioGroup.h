#pragma once

#include <string>
#include <vector>

#include "framework/controls/CControl.h"

namespace Tarsa {

// A column of radio buttons with one value, the index of the chosen one. It
// is a single tab stop: Tab enters and leaves the group as a whole, and the
// arrow keys move the choice within it (Up and Left to the previous button,
// Down and Right to the next, each sending the new index). A click on a
// button, or its label, chooses it.
class CRadioGroup : public CControl {
 public:
  CRadioGroup(CObjID id, CView* parent, const CRect& frame, const std::vector<std::string>& labels,
              int chosen = 0, std::uint32_t options = kView_TabStop,
              std::uint32_t binding = kBind_Fixed);

  int Chosen() const { return chosen_; }
  int Count() const { return int(labels_.size()); }
  // Sets the choice without telling anyone.
  void SetChosen(int index);
  // A button's row, in the view's space.
  CRect RowRect(int index) const;

  void Click(CMouseMessage& message) override;
  void HandleMessage(CMessage& message) override;
  void Draw(CPort& port) override;

  static constexpr std::int32_t kRowHeight = 22;

 private:
  void Choose(int index);

  std::vector<std::string> labels_;
  int chosen_ = 0;
  int pressedRow_ = -1;
};

}  // namespace Tarsa
