#pragma once

#include <string>
#include <vector>

#include "framework/controls/CControl.h"

namespace Tarsa {

// A popup menu button: shows the chosen item of a list and, pressed, opens
// the list over the window (CPopupList) to choose another. A click, Space,
// Return or Down opens it; Up and Down move the mark, Return chooses,
// Escape or a click outside closes it and nothing changes. With the list
// closed, the wheel steps the choice. A new choice sends its index.
class CRadioPopup : public CControl {
 public:
  CRadioPopup(CObjID id, CView* parent, const CRect& frame, const std::vector<std::string>& items,
              int chosen = 0, std::uint32_t options = kView_TabStop,
              std::uint32_t binding = kBind_Fixed);
  ~CRadioPopup() override;

  int Chosen() const { return chosen_; }
  const std::vector<std::string>& Items() const { return items_; }
  // Sets the choice without telling anyone.
  void SetChosen(int index);
  void OpenList();

  void Click(CMouseMessage& message) override;
  void MouseWheel(CMouseMessage& message) override;
  void HandleMessage(CMessage& message) override;
  void Draw(CPort& port) override;

 private:
  void Choose(int index);

  std::vector<std::string> items_;
  int chosen_ = 0;
};

}  // namespace Tarsa
