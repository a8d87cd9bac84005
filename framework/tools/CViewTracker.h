#pragma once

#include "framework/core/CRect.h"
#include "framework/tools/CTracker.h"
#include "framework/view/CPort.h"

namespace Tarsa {

// The tracker a view uses to follow its own drag without a class of its
// own: its steps are forwarded to the view's tracking operations, with a
// client word that tells the view which of its drags this is.
class CViewTracker : public CTracker {
 public:
  CViewTracker(CView* view, std::uint32_t trackFlags, std::int32_t client)
      : CTracker(view, trackFlags), client_(client) {}
  std::int32_t Client() const { return client_; }

 protected:
  bool Track(bool moved, bool modifiersChanged) override;
  bool KeyEvent(const CNativeEvent& event) override;
  void KeyUpEvent(const CNativeEvent& event) override;
  void Idle(const CMouseEvent& event) override;

 private:
  std::int32_t client_;
};

// Scrolls a view with the hand: the picture follows the pointer from the
// press, on the axes allowed (1 x, 2 y). With both allowed and Shift held
// it moves on one axis only: Alt keeps x, Ctrl keeps y, and with neither
// the axis of the larger movement (y on a tie).
class CPanner : public CTracker {
 public:
  static constexpr std::uint32_t kAxisX = 1;
  static constexpr std::uint32_t kAxisY = 2;

  // options: the axes, and bits 4, 8, 16 as the tracker's keys and options.
  CPanner(CView* view, std::uint32_t options);

  void RunPan(const CMouseEvent& event);
  bool OnMouse(const CNativeEvent& event) override;

 private:
  std::uint32_t axes_;
  CPoint startScroll_;
  CPoint lastScroll_;
  CPoint startWindow_;
};

// The zoom tool's rectangle: from the press to the pointer, its dashes
// running while the button is held (a phase of 8 that steps every 0.05 s).
// The view draws it through DrawFeedback as part of its window's paint.
class CZoomTracker : public CTracker {
 public:
  static constexpr std::uint32_t kZoomFlags = 51;  // scroll both axes, idle, clamp

  explicit CZoomTracker(CView* view) : CTracker(view, kZoomFlags) {}

  // The rectangle in view coordinates, cut to the view's frame grown by 2.
  CRect GetRectangle() const;
  std::int32_t Phase() const { return phase_; }
  // The first row of the 8 x 8 pattern of a phase, and the row r below it.
  static std::uint8_t PatternRow(std::int32_t phase, std::int32_t row);
  // Draws the frame in the view's coordinates.
  void DrawFeedback(CPort& port) const override;

 protected:
  bool Begin() override;
  bool Track(bool moved, bool modifiersChanged) override;
  void Idle(const CMouseEvent& event) override;
  void End(bool aborted) override;

 private:
  CRect rect_;
  double lastPhaseTime_ = 0.0;
  std::int32_t phase_ = 0;
};

}  // namespace Tarsa
