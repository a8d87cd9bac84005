#pragma once

#include <cstdint>
#include <memory>
#include <string>
#include <vector>

#include "framework/core/CRect.h"
#include "framework/layout/CZilVariablePropertyList.h"

namespace Tarsa {

// The placement words of a layout file, with the values other code uses.
inline constexpr std::int32_t kPlace_Column = 0;
inline constexpr std::int32_t kPlace_Row = 1;
inline constexpr std::int32_t kPlace_Offscreen = 2;
inline constexpr std::int32_t kAlign_NotGiven = 0;
inline constexpr std::int32_t kAlignFill = 1;
inline constexpr std::int32_t kAlignCenter = 2;
inline constexpr std::int32_t kAlignProportional = 3;
inline constexpr std::int32_t kAlignLeft = 4;   // and top
inline constexpr std::int32_t kAlignRight = 5;  // and bottom

// A view of a layout file as the parser holds it for the layout pass: its
// class and properties, the layout words it was given, its children, and
// what measuring and placing make of them. A plain node: the parser fills
// the fields, Measure and Place compute the rest. Owns its children.
//
// Measuring runs children first and gives each node the size it needs;
// placing runs from the root down and gives each its frame in its
// parent's space. Right-to-left layout is not done: a row runs left to
// right whatever alwaysL2R says.
class CViewProxy {
 public:
  explicit CViewProxy(std::string className) : className_(std::move(className)) {}

  const std::string& ClassName() const { return className_; }

  // What the file gave.
  CZilVariablePropertyList properties;
  std::int32_t width = 0, height = 0, maxHeight = 0;  // least size; most height
  std::int32_t inset = 0, topInset = 0;
  std::int32_t outsetLeft = 0, outsetTop = 0, outsetRight = 0, outsetBottom = 0;
  std::int32_t labelWidth = 0;
  bool hasLabelWidth = false;
  std::int32_t horizontal = kAlign_NotGiven, vertical = kAlign_NotGiven;
  bool alwaysL2R = false;
  std::int32_t marginLeft = 0, marginTop = 0, marginRight = 0, marginBottom = 0;
  std::int32_t spacing = 0;
  std::int32_t placement = kPlace_Column;
  std::int32_t childHorizontal = kAlign_NotGiven, childVertical = kAlign_NotGiven;
  bool reverse = false;
  std::int32_t leftOffset = 0, topOffset = 0;
  std::int32_t cushionLeft = 0, cushionTop = 0, cushionRight = 0, cushionBottom = 0;
  // The size the class needs for its own content, from its builder.
  std::int32_t naturalWidth = 0, naturalHeight = 0;
  std::vector<std::unique_ptr<CViewProxy>> children;

  // What measuring makes.
  std::int32_t measuredWidth = 0, measuredHeight = 0;
  std::int32_t labelEdge = 0;  // a column's: the widest label among its children
  std::int32_t insetLine = 0;  // a row's: the inset line's distance from the inner top
  bool labelFromFirstChild = false;
  // What placing makes: the frame in the parent's space (outsets included,
  // cushion excluded) and the label width the view is to draw.
  CRect frame;
  std::int32_t finalLabelWidth = 0;

  void Measure();
  // Places the node in `slot` (its size without its outsets) and its
  // children inside it.
  void Place(const CRect& slot);

  // The size the node takes in its parent's sums: measured less outsets.
  std::int32_t SumWidth() const { return measuredWidth - outsetLeft - outsetRight; }
  std::int32_t SumHeight() const { return measuredHeight - outsetTop - outsetBottom; }
  // The frame the view is made with: the frame less its cushion.
  CRect ViewFrame() const;

 private:
  std::int32_t HAlignOf(const CViewProxy& child) const;
  std::int32_t VAlignOf(const CViewProxy& child) const;
  void PlaceColumn(std::int32_t innerWidth, std::int32_t innerHeight);
  void PlaceRow(std::int32_t innerWidth, std::int32_t innerHeight);
  void PlaceOffscreen(std::int32_t innerWidth, std::int32_t innerHeight);

  std::string className_;
};

}  // namespace Tarsa
