#pragma once

#include <cstdint>
#include <functional>
#include <string>
#include <vector>

#include "framework/controls/CControl.h"

namespace Tarsa {

class CProgressBar;
class CZoomPane;

// The zoom field of a zoom pane, which doubles as a progress display. In
// the zoom mode it shows the pane's zoom as a percentage in a field the
// user may type into (Return sets the zoom, kept in the pane's limits;
// Escape brings the shown zoom back), an arrow that opens a list of zoom
// values, and two step buttons that zoom out and in, each enabled while
// the pane can go that way. In the progress mode a progress bar, a child
// of the combo, covers it until the work is done.
//
// The combo finds its pane through the CScroller it lies in, unless it is
// given one; the pane is not owned. A scroller tells the combo of each
// zoom change; a combo given a pane elsewhere is told by its owner, through
// UpdateZoomControls.
class CZoomProgressCombo : public CControl {
 public:
  // An entry of the zoom list: its text, and what choosing it does.
  struct Item {
    std::string label;
    std::function<void(CZoomPane& pane)> choose;
  };
  using ItemSource = std::function<std::vector<Item>(const CZoomPane& pane)>;

  static constexpr std::int32_t kButtonWidth = 16;
  static constexpr std::int32_t kArrowWidth = 14;

  CZoomProgressCombo(CObjID id, CView* parent, const CRect& frame,
                     std::uint32_t options = kView_TabStop, std::uint32_t binding = kBind_Fixed);
  ~CZoomProgressCombo() override;

  void SetZoomPane(CZoomPane* pane);
  CZoomPane* ZoomPane() const;

  // Shows the pane's zoom again, and enables the step buttons by its limits.
  void UpdateZoomControls();
  // The field's text as shown now, typing included.
  const std::string& Text() const { return text_; }
  bool CanStepIn() const { return canIn_; }
  bool CanStepOut() const { return canOut_; }

  // Replaces the list the arrow opens; the source is asked at each opening.
  // The default lists the ladder's steps within the limits, then "Fit on
  // Screen".
  void SetPopup(ItemSource source);
  std::vector<Item> PopupItems() const;
  // Opens the list under the combo.
  void OpenPopup();

  // The progress mode while done < total; the zoom mode again once done
  // reaches total.
  void SetProgress(double done, double total);
  bool InProgress() const;
  const CProgressBar& Progress() const { return *progress_; }

  // Reads the typed text and sets the zoom from it; false when it was not
  // a number (the zoom is shown again).
  bool Commit();

  // The parts, in the combo's space.
  CRect FieldRect() const;
  CRect ArrowRect() const;
  CRect OutRect() const;
  CRect InRect() const;

  // A zoom as the field shows it: a percentage with one decimal at most.
  static std::string FormatZoom(double zoom);

  void Click(CMouseMessage& message) override;
  void HandleMessage(CMessage& message) override;
  void Draw(CPort& port) override;
  // The pane may have come after the combo in the layout.
  void OnStart() override { UpdateZoomControls(); }

 protected:
  void OnBecameTarget() override;
  void OnLostTarget() override;

 private:
  static std::vector<Item> DefaultItems(const CZoomPane& pane);
  void DrawStep(CPort& port, const CRect& box, bool in, bool enabled) const;

  CZoomPane* pane_ = nullptr;
  ItemSource source_;
  std::string text_;
  bool selectAll_ = false;
  bool canIn_ = false;
  bool canOut_ = false;
  int pressedPart_ = 0;     // 1 the arrow, 2 out, 3 in
  CProgressBar* progress_;  // a child, owned as views are
};

}  // namespace Tarsa
