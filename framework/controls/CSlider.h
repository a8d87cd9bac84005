#pragma once

#include "framework/controls/CControl.h"

namespace Tarsa {

// A horizontal slider over a range, with a count of positions the value
// snaps to (two or more; the ends are positions). Dragging the thumb, or
// pressing on the track (the thumb jumps there and follows the drag), sends
// the value as it goes (tracking) and once more at the release (end of a
// drag). Left and Right step one position, Page Up and Page Down a tenth of
// the range, Home and End go to the ends; the wheel steps one position.
class CSlider : public CControl {
 public:
  CSlider(CObjID id, CView* parent, const CRect& frame, double value, double minimum,
          double maximum, std::int32_t positions = 101, std::uint32_t options = kView_TabStop,
          std::uint32_t binding = kBind_Fixed);

  double Value() const { return value_; }
  double Minimum() const { return minimum_; }
  double Maximum() const { return maximum_; }
  // Sets the value, snapped and kept in the range, without telling anyone.
  void SetValue(double value);
  void SetRange(double minimum, double maximum);

  // The track's span in the view, the thumb's centre's travel.
  std::int32_t TrackLeft() const;
  std::int32_t TrackRight() const;
  // The value at an x of the view, snapped.
  double ValueAt(std::int32_t x) const;
  std::int32_t ThumbCenter() const;

  void Click(CMouseMessage& message) override;
  void MouseWheel(CMouseMessage& message) override;
  void HandleMessage(CMessage& message) override;
  void Draw(CPort& port) override;

  static constexpr std::int32_t kThumbRadius = 7;

 private:
  double Snap(double value) const;
  double PositionStep() const;
  void Change(double value, std::int32_t change);

  double value_;
  double minimum_;
  double maximum_;
  std::int32_t positions_;
  bool dragging_ = false;
};

}  // namespace Tarsa
