#pragma once

#include "framework/controls/CControl.h"

namespace Tarsa {

// A scroll bar, vertical or horizontal, for a scrolling view: it reads the
// view's limits and image whenever it draws, so the view's own scrolling
// (the wheel) and the bar always agree, and moves the view with ScrollTo.
// The arrows step a line, a press on the track pages towards the pointer
// (both repeat while the button is held), and the thumb drags (the view follows as it goes). The
// arrow keys step and Page Up and Page Down page while the bar has the focus. Each move sends the
// view's scroll position (the image's offset from the limits' start).
class CScrollBar : public CControl {
 public:
  enum class EOrientation { kVertical, kHorizontal };

  CScrollBar(CObjID id, CView* parent, const CRect& frame, EOrientation orientation,
             CView* scrolled = nullptr, std::uint32_t options = kView_NoOptions,
             std::uint32_t binding = kBind_Fixed);

  void SetScrolled(CView* scrolled);
  CView* Scrolled() const { return scrolled_; }
  void SetLineStep(std::int32_t pixels) { lineStep_ = pixels; }

  // The scroll position and its range, in the view's pixels.
  std::int32_t Position() const;
  std::int32_t Maximum() const;
  std::int32_t Page() const;
  void ScrollToPosition(std::int32_t position);

  // Along the bar's axis, in the bar's space: the track between the arrows,
  // and the thumb on it.
  std::int32_t TrackStart() const;
  std::int32_t TrackEnd() const;
  std::int32_t ThumbStart() const;
  std::int32_t ThumbLength() const;

  void Click(CMouseMessage& message) override;
  void MouseWheel(CMouseMessage& message) override;
  void HandleMessage(CMessage& message) override;
  void Draw(CPort& port) override;

  static constexpr std::int32_t kThickness = 14;
  static constexpr std::int32_t kMinThumb = 16;

 private:
  bool Vertical() const { return orientation_ == EOrientation::kVertical; }
  std::int32_t Along(CPoint p) const { return Vertical() ? p.y : p.x; }
  void DragThumb(std::int32_t grip);

  EOrientation orientation_;
  CView* scrolled_ = nullptr;
  std::int32_t lineStep_ = 12;
  int pressedPart_ = 0;  // 1 the arrow back, 2 the arrow on, 3 the thumb
};

}  // namespace Tarsa
