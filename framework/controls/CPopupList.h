#pragma once

#include <functional>
#include <string>
#include <vector>

#include "framework/view/CView.h"

namespace Tarsa {

class CWindow;

// The open list of a popup button or a combo box: a view laid over the
// window's other views, one per window, made on first use and kept hidden
// between uses. While it is open it covers the whole window, so that a
// click anywhere reaches it: a click on an item chooses it, a click outside
// the list closes it without a change. It takes the keyboard meanwhile: Up,
// Down, Home and End move the mark, Return and Space choose, Escape and Tab
// close it without a change. The list shows at most as many rows as fit in
// the window and scrolls to keep the mark in sight (the wheel scrolls too).
class CPopupList : public CView {
 public:
  // The answer: the index chosen, or -1 when the list closed without one.
  using Chosen = std::function<void(int index)>;

  static constexpr std::int32_t kRowHeight = 22;

  // The window's list, made when it has none.
  static CPopupList& For(CWindow& window);
  // The window's list when one is open, else null.
  static CPopupList* OpenIn(CWindow& window);

  // Opens under anchor (a rectangle in the window's space; above it when
  // there is no room below) with the item marked; owner gets the focus back
  // when the list closes, then chosen is called.
  void Open(CView* owner, const CRect& anchor, const std::vector<std::string>& items, int marked,
            Chosen chosen);
  // Closes with the answer.
  void Close(int index);
  // An owner going away closes its list without calling it.
  void Forget(const CView* owner);
  bool IsOpen() const { return owner_ != nullptr; }
  int Marked() const { return marked_; }
  // The list's box, in the window's space.
  const CRect& Box() const { return box_; }
  // The row of an item, in the window's space (its part in sight or not).
  CRect RowRect(int index) const;

  bool HitTest(CPoint where) const override;
  void MouseDown(CMouseMessage& message) override;
  void MouseMoved(CMouseMessage& message) override;
  void MouseWheel(CMouseMessage& message) override;
  void HandleMessage(CMessage& message) override;
  void Draw(CPort& port) override;

 private:
  explicit CPopupList(CWindow& window);
  int ItemAt(CPoint where) const;
  void Mark(int index);
  int VisibleRows() const;

  CView* owner_ = nullptr;
  Chosen chosen_;
  std::vector<std::string> items_;
  int marked_ = -1;
  int current_ = -1;  // the owner's item when the list opened
  int first_ = 0;     // the first row in sight
  CRect box_;
};

}  // namespace Tarsa
