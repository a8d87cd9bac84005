#pragma once

#include <string>
#include <vector>

#include "framework/controls/CControl.h"

namespace Tarsa {

class CScrollBar;

// A list of text rows with one selected row. A click selects, a double
// click selects and sends the distinct "activate" change (kChange_Activate)
// as well; Up, Down, Home, End, Page Up and Page Down move the selection,
// and the wheel scrolls. The rows lie in a scrolling view inside the list's
// frame, with a vertical scroll bar beside them when they do not all fit.
// A new selection sends its index (-1 for none).
class CListBox : public CControl {
 public:
  static constexpr std::int32_t kChange_Activate = 9;
  static constexpr std::int32_t kRowHeight = 20;

  CListBox(CObjID id, CView* parent, const CRect& frame, const std::vector<std::string>& rows,
           int selected = -1, std::uint32_t options = kView_TabStop,
           std::uint32_t binding = kBind_Fixed);

  int Selected() const { return selected_; }
  int Count() const { return int(rows_.size()); }
  const std::vector<std::string>& Rows() const { return rows_; }
  void SetRows(const std::vector<std::string>& rows);
  // Selects without telling anyone, scrolling the row into sight.
  void SetSelected(int index);
  // The first row in sight (at the top of the rows' view).
  int FirstVisible() const;
  int VisibleRows() const;
  CView* RowsView() const { return rows_view_; }
  CScrollBar* ScrollBar() const { return bar_; }

  void HandleMessage(CMessage& message) override;
  void Draw(CPort& port) override;

 private:
  class RowArea;
  friend class RowArea;
  void Select(int index, std::int32_t change);
  void Layout();
  void RowClicked(int index, std::int32_t clicks);
  void DrawRows(CPort& port, const CRect& shown);

  std::vector<std::string> rows_;
  int selected_ = -1;
  CView* rows_view_ = nullptr;
  CScrollBar* bar_ = nullptr;
};

}  // namespace Tarsa
