#pragma once

#include <cstdint>

#include "framework/view/CPane.h"

namespace Tarsa {

class CScrollBar;
class CZoomPane;

// A frame around one scrolling view (a CZoomPane, or any view that
// scrolls): it places the view, a horizontal bar along the bottom and a
// vertical one along the right, as its attributes ask, and a gap at the
// left of the horizontal bar where a view of the caller's (the zoom combo)
// stands. Everything is placed again on each resize; the bars redraw on
// every zoom and scroll change the view announces, and a zoom combo in the
// gap is told of zoom changes. The scroller owns its bars; the scrolled
// view and the gap view are children made by whoever builds the scroller.
class CScroller : public CPane {
 public:
  CScroller(CObjID id, CView* parent, const CRect& frame,
            std::uint32_t attributes = kScroller_XBar | kScroller_YBar | kScroller_WellFrame,
            std::uint32_t binding = kBind_Fixed);

  // kScroller_ bits; the size box and auto-hiding are not supported.
  std::uint32_t Attributes() const { return attributes_; }
  void SetAttributes(std::uint32_t attributes);
  // The width of the gap at the left of the horizontal bar.
  std::int32_t GapLeft() const { return gapLeft_; }
  void SetGapLeft(std::int32_t width);
  // The view that stands in the gap; one of the scroller's children.
  void SetGapView(CView* view);
  CView* GapView() const { return gapView_; }

  // The scrolled view: the first child that scrolls and is neither a bar
  // nor the gap view; null while there is none.
  CView* Scrolled() const;
  CZoomPane* ZoomPane() const;
  // The bars, null where the attributes have none.
  CScrollBar* XBar() const;
  CScrollBar* YBar() const;

  // Places the scrolled view, the bars and the gap view in the frame.
  void Arrange();

  void OnStart() override { Arrange(); }
  void SizeChanged(std::int32_t dx, std::int32_t dy) override;
  void HandleMessage(CMessage& message) override;

 private:
  // The area inside the well frame.
  CRect Inner() const;
  // The height of the row that holds the horizontal bar and the gap view.
  std::int32_t BottomRow() const;

  std::uint32_t attributes_;
  std::int32_t gapLeft_ = 0;
  CView* gapView_ = nullptr;
  CScrollBar* xBar_;  // children, owned as views are
  CScrollBar* yBar_;
};

}  // namespace Tarsa
