#include "framework/layout/CViewProxy.h"

#include <algorithm>

namespace Tarsa {

std::int32_t CViewProxy::HAlignOf(const CViewProxy& child) const {
  if (child.horizontal != kAlign_NotGiven) return child.horizontal;
  return childHorizontal;
}

std::int32_t CViewProxy::VAlignOf(const CViewProxy& child) const {
  if (child.vertical != kAlign_NotGiven) return child.vertical;
  return childVertical;
}

void CViewProxy::Measure() {
  for (auto& child : children) child->Measure();
  std::int32_t innerWidth = 0;
  std::int32_t innerHeight = 0;
  const auto count = static_cast<std::int32_t>(children.size());
  const std::int32_t gaps = count > 1 ? spacing * (count - 1) : 0;
  labelEdge = 0;
  insetLine = 0;
  if (placement == kPlace_Row) {
    std::int32_t below = 0;
    for (auto& child : children) {
      innerWidth += child->SumWidth() + child->leftOffset;
      insetLine = std::max(insetLine, child->topInset);
      below = std::max(below, child->SumHeight() - child->topInset);
    }
    innerWidth += gaps;
    innerHeight = insetLine + below;
    // A row that starts with a labelled view is labelled itself, so that a
    // column lines it up with its other labels.
    if (!children.empty() && !hasLabelWidth) {
      const CViewProxy& first = *children.front();
      if (first.hasLabelWidth && HAlignOf(first) != kAlignCenter) {
        labelWidth = marginLeft + first.labelWidth + first.leftOffset;
        hasLabelWidth = true;
        labelFromFirstChild = true;
      }
    }
    if (topInset == 0 && insetLine > 0) topInset = marginTop + insetLine;
  } else if (placement == kPlace_Offscreen) {
    childHorizontal = kAlignFill;
    for (auto& child : children) {
      innerWidth = std::max(innerWidth, child->SumWidth());
      innerHeight = std::max(innerHeight, child->SumHeight());
    }
  } else {
    std::int32_t rest = 0;
    for (auto& child : children) {
      const std::int32_t h = HAlignOf(*child);
      const bool labelled =
          child->hasLabelWidth && (h == kAlignFill || h == kAlignLeft || h == kAlign_NotGiven);
      if (labelled) {
        labelEdge = std::max(labelEdge, child->labelWidth);
        rest = std::max(rest, child->SumWidth() - child->labelWidth);
      } else {
        innerWidth = std::max(innerWidth, child->SumWidth() + child->leftOffset);
      }
      innerHeight += child->SumHeight();
    }
    innerWidth = std::max(innerWidth, labelEdge + rest);
    innerHeight += gaps;
  }
  std::int32_t w = naturalWidth;
  std::int32_t h = naturalHeight;
  if (!children.empty()) {
    w = std::max(w, innerWidth + marginLeft + marginRight);
    h = std::max(h, innerHeight + marginTop + marginBottom);
  }
  w = std::max(w, width);
  if (hasLabelWidth) w = std::max(w, labelWidth);
  h = std::max(h, height);
  measuredWidth = w + cushionLeft + cushionRight;
  measuredHeight = h + cushionTop + cushionBottom;
  if (maxHeight > 0) measuredHeight = std::min(measuredHeight, maxHeight);
  finalLabelWidth = labelWidth;
}

CRect CViewProxy::ViewFrame() const {
  return {frame.left + cushionLeft, frame.top + cushionTop, frame.right - cushionRight,
          frame.bottom - cushionBottom};
}

void CViewProxy::Place(const CRect& slot) {
  frame = {slot.left - outsetLeft, slot.top - outsetTop, slot.right + outsetRight,
           slot.bottom + outsetBottom};
  // Children lie in this view's own space, which starts at its frame.
  const auto w = static_cast<std::int32_t>(frame.Width()) - cushionLeft - cushionRight;
  const auto h = static_cast<std::int32_t>(frame.Height()) - cushionTop - cushionBottom;
  const std::int32_t innerWidth = w - marginLeft - marginRight;
  const std::int32_t innerHeight = h - marginTop - marginBottom;
  if (placement == kPlace_Row) {
    PlaceRow(innerWidth, innerHeight);
  } else if (placement == kPlace_Offscreen) {
    PlaceOffscreen(innerWidth, innerHeight);
  } else {
    PlaceColumn(innerWidth, innerHeight);
  }
}

void CViewProxy::PlaceColumn(std::int32_t innerWidth, std::int32_t innerHeight) {
  const auto count = static_cast<std::int32_t>(children.size());
  std::int32_t sum = 0;
  std::int32_t stretchers = 0;
  for (auto& child : children) {
    sum += child->SumHeight();
    const std::int32_t v = VAlignOf(*child) == kAlign_NotGiven ? kAlignCenter : VAlignOf(*child);
    if (v == kAlignFill || v == kAlignCenter || v == kAlignProportional) ++stretchers;
  }
  const std::int32_t free = innerHeight - sum - (count > 1 ? spacing * (count - 1) : 0);
  const std::int32_t extra = (stretchers > 0 && free > 0) ? free / stretchers : 0;

  std::vector<std::int32_t> tops(children.size(), 0);
  std::vector<std::int32_t> heights(children.size(), 0);
  // Children aligned to the bottom at the end of the column stand on its
  // bottom margin.
  std::int32_t end = count;
  std::int32_t bottom = marginTop + innerHeight;
  while (end > 0 && VAlignOf(*children[end - 1]) == kAlignRight) {
    const CViewProxy& child = *children[end - 1];
    heights[end - 1] = child.SumHeight();
    bottom -= heights[end - 1];
    tops[end - 1] = bottom;
    bottom -= spacing;
    --end;
  }
  std::int32_t pos = marginTop;
  for (std::int32_t i = 0; i < end; ++i) {
    const CViewProxy& child = *children[i];
    std::int32_t v = VAlignOf(child);
    if (v == kAlign_NotGiven) v = kAlignCenter;
    std::int32_t ch = child.SumHeight();
    std::int32_t y = pos;
    if (v == kAlignFill) {
      ch += extra;
      if (child.maxHeight > 0) ch = std::min(ch, std::max(child.maxHeight, child.SumHeight()));
      pos += ch;
    } else if (v == kAlignCenter) {
      y = pos + extra / 2;
      pos += ch + extra;
    } else if (v == kAlignProportional) {
      // Shifted by the share of extra that the run so far bears to the
      // column's fixed run.
      const std::int32_t run = std::max(1, sum);
      y = pos + static_cast<std::int32_t>(std::int64_t(extra) * (pos - marginTop) / run);
      pos += ch + extra;
    } else {
      pos += ch;
    }
    tops[i] = y + child.topOffset;
    heights[i] = ch;
    pos += spacing;
  }
  for (std::size_t i = 0; i < children.size(); ++i) {
    CViewProxy& child = *children[i];
    const std::int32_t hAlign = HAlignOf(child);
    std::int32_t cw = child.SumWidth();
    std::int32_t x = marginLeft + child.leftOffset;
    const bool labelled = child.hasLabelWidth && (hAlign == kAlignFill || hAlign == kAlignLeft ||
                                                  hAlign == kAlign_NotGiven);
    if (labelled && labelEdge > child.labelWidth) {
      // The label grows to the column's label edge, and the rest follows.
      child.finalLabelWidth = labelEdge;
      cw += labelEdge - child.labelWidth;
    }
    if (hAlign == kAlignFill) {
      x = marginLeft;
      cw = innerWidth;
    } else if (hAlign == kAlignCenter || hAlign == kAlignProportional) {
      x = marginLeft + (innerWidth - cw) / 2;
    } else if (hAlign == kAlignRight) {
      x = marginLeft + innerWidth - cw;
    }
    child.Place({x, tops[i], x + cw, tops[i] + heights[i]});
  }
}

void CViewProxy::PlaceRow(std::int32_t innerWidth, std::int32_t innerHeight) {
  const auto count = static_cast<std::int32_t>(children.size());
  // A label edge wider than the first child's own widens that child.
  std::int32_t firstGrowth = 0;
  if (labelFromFirstChild && finalLabelWidth > labelWidth && !children.empty()) {
    firstGrowth = finalLabelWidth - labelWidth;
    children.front()->finalLabelWidth = children.front()->labelWidth + firstGrowth;
  }
  std::int32_t sum = firstGrowth;
  std::int32_t stretchers = 0;
  for (auto& child : children) {
    sum += child->SumWidth() + child->leftOffset;
    const std::int32_t h = HAlignOf(*child);
    if (h == kAlignFill || h == kAlignCenter || h == kAlignProportional) ++stretchers;
  }
  const std::int32_t free = innerWidth - sum - (count > 1 ? spacing * (count - 1) : 0);
  const std::int32_t extra = (stretchers > 0 && free > 0) ? free / stretchers : 0;

  std::vector<std::int32_t> lefts(children.size(), 0);
  std::vector<std::int32_t> widths(children.size(), 0);
  std::int32_t end = count;
  std::int32_t right = marginLeft + innerWidth;
  while (end > 0 && HAlignOf(*children[end - 1]) == kAlignRight) {
    const CViewProxy& child = *children[end - 1];
    widths[end - 1] = child.SumWidth() + (end == 1 ? firstGrowth : 0);
    right -= widths[end - 1];
    lefts[end - 1] = right;
    right -= spacing;
    --end;
  }
  std::int32_t pos = marginLeft;
  for (std::int32_t i = 0; i < end; ++i) {
    const CViewProxy& child = *children[i];
    const std::int32_t h = HAlignOf(child);
    std::int32_t cw = child.SumWidth() + (i == 0 ? firstGrowth : 0);
    pos += child.leftOffset;
    std::int32_t x = pos;
    if (h == kAlignFill) {
      cw += extra;
      pos += cw;
    } else if (h == kAlignCenter) {
      x = pos + extra / 2;
      pos += cw + extra;
    } else if (h == kAlignProportional) {
      const std::int32_t run = std::max(1, sum);
      x = pos + static_cast<std::int32_t>(std::int64_t(extra) * (pos - marginLeft) / run);
      pos += cw + extra;
    } else {
      pos += cw;
    }
    lefts[i] = x;
    widths[i] = cw;
    pos += spacing;
  }
  for (std::size_t i = 0; i < children.size(); ++i) {
    CViewProxy& child = *children[i];
    const std::int32_t v = VAlignOf(child);
    std::int32_t ch = child.SumHeight();
    // By default the children's inset lines meet the row's.
    std::int32_t y = marginTop + insetLine - child.topInset;
    if (v == kAlignFill) {
      y = marginTop;
      ch = innerHeight;
    } else if (v == kAlignCenter || v == kAlignProportional) {
      y = marginTop + (innerHeight - ch) / 2;
    } else if (v == kAlignRight) {
      y = marginTop + innerHeight - ch;
    } else if (v == kAlignLeft) {
      y = marginTop;
    }
    y += child.topOffset;
    child.Place({lefts[i], y, lefts[i] + widths[i], y + ch});
  }
}

void CViewProxy::PlaceOffscreen(std::int32_t innerWidth, std::int32_t innerHeight) {
  for (auto& child : children) {
    std::int32_t cw = child->SumWidth();
    std::int32_t ch = child->SumHeight();
    std::int32_t x = marginLeft;
    std::int32_t y = marginTop;
    const std::int32_t h = child->horizontal == kAlign_NotGiven ? kAlignFill : child->horizontal;
    const std::int32_t v = child->vertical == kAlign_NotGiven ? kAlignFill : child->vertical;
    if (h == kAlignFill) cw = innerWidth;
    if (h == kAlignCenter || h == kAlignProportional) x += (innerWidth - cw) / 2;
    if (h == kAlignRight) x += innerWidth - cw;
    if (v == kAlignFill) ch = innerHeight;
    if (v == kAlignCenter || v == kAlignProportional) y += (innerHeight - ch) / 2;
    if (v == kAlignRight) y += innerHeight - ch;
    child->Place({x, y, x + cw, y + ch});
  }
}

}  // namespace Tarsa
