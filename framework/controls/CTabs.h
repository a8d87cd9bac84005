#pragma once

#include <string>
#include <vector>

#include "framework/controls/CControl.h"

namespace Tarsa {

// A row of tabs over a pane area: each tab owns a pane (a child view that
// fills the area beneath the row), and only the chosen tab's pane is shown.
// A click on a tab chooses it; Ctrl+Tab and Ctrl+Shift+Tab choose the next
// and the previous one from anywhere inside, Left and Right while the tabs
// have the focus. A new choice sends its index. The panes follow the tabs'
// size.
class CTabs : public CControl {
 public:
  static constexpr std::int32_t kRowHeight = 26;

  CTabs(CObjID id, CView* parent, const CRect& frame, std::uint32_t options = kView_TabStop,
        std::uint32_t binding = kBind_Fixed);

  // Adds a tab and returns its pane, for the caller to fill.
  CView* AddTab(const std::string& label, CObjID paneId = CObjID());
  int Count() const { return int(panes_.size()); }
  int Chosen() const { return chosen_; }
  CView* Pane(int index) const { return panes_.at(std::size_t(index)); }
  // Chooses without telling anyone.
  void SetChosen(int index);
  // A tab's rectangle, in the view's space.
  CRect TabRect(int index) const;

  void Click(CMouseMessage& message) override;
  void HandleMessage(CMessage& message) override;
  void Draw(CPort& port) override;

 private:
  void Choose(int index);

  std::vector<std::string> labels_;
  std::vector<CView*> panes_;
  std::vector<std::int32_t> widths_;
  int chosen_ = -1;
};

}  // namespace Tarsa
