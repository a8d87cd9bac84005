#pragma once

#include "solver/geodesic/LineRecords.h"

namespace Project {

// How the preview's window shows the view: a view point goes to
// point * zoom + origin - scroll, per axis, in single precision.
struct ScreenTransform {
  float zoom = 1.0f;
  float originX = 0.0f;
  float originY = 0.0f;
  float scrollX = 0.0f;
  float scrollY = 0.0f;

  Point2f Apply(Point2f p) const {
    return {originX + p.x * zoom - scrollX, originY + p.y * zoom - scrollY};
  }
};

// How a constraint is marked when it is drawn.
struct Highlight {
  bool selected = false;
  bool hovered = false;
  // Degrees; the angle shown while a line is being rotated, or below 0.
  float liveRotation = -1.0f;
  // The focal handle being dragged, (-1, -1) when none; moved: it is a
  // photograph point to be mapped into the result view.
  Point2f liveFocalHandle{-1.0f, -1.0f};
  bool liveFocalMoved = false;
};

// A box of the window, what a drawing touched, for damage. Empty until the
// first point widens it; a single point makes a box of no size that is not
// empty.
struct ScreenBounds {
  float left = 0.0f;
  float top = 0.0f;
  float right = 0.0f;
  float bottom = 0.0f;
  bool empty = true;

  bool IsEmpty() const { return empty; }
  void Widen(Point2f p);
  // The union, an empty box giving way to the other one.
  void Merge(const ScreenBounds& other);
};

}  // namespace Project
