#pragma once

#include <string>

#include "framework/controls/CControl.h"

namespace Tarsa {

// A field for a number within a range, shown with a fixed count of decimals
// and an optional unit. Only what can make a number is typed in: digits, one
// decimal point, a leading minus where the range allows negatives; anything
// else is refused as it is typed. The text is read when the user commits it
// (Return, Tab, leaving the field): an empty text brings the last value
// back; a number beyond the range is replaced by the range's nearest end,
// and an alert says so. Up and Down arrows and the mouse wheel step by the
// minor step (Shift: the major one). A committed change sends the value.
class CEditNumber : public CControl {
 public:
  CEditNumber(CObjID id, CView* parent, const CRect& frame, double value, double minimum,
              double maximum, int digits, std::uint32_t options = kView_TabStop,
              std::uint32_t binding = kBind_Fixed);

  double Value() const { return value_; }
  double Minimum() const { return minimum_; }
  double Maximum() const { return maximum_; }
  // Sets the value (kept in the range) and the text, without telling anyone.
  void SetValue(double value);
  void SetRange(double minimum, double maximum);
  void SetDigits(int digits);
  void SetUnit(const std::string& unit);
  void SetSteps(double minor, double major);
  // The text as the field shows it now, edits included.
  const std::string& Text() const { return text_; }

  // Reads the text; false when it had to be corrected (out of the range).
  // The alert that says so is shown at once, or, when the field is losing
  // the focus, just after the focus has moved.
  bool Commit(bool alertNow = true);

  void Click(CMouseMessage& message) override;
  void MouseWheel(CMouseMessage& message) override;
  void HandleMessage(CMessage& message) override;
  void Draw(CPort& port) override;

  // The text of the alert for a number beyond the range.
  static std::string RangeAlertText(double minimum, double maximum, int digits);

 protected:
  void OnBecameTarget() override;
  void OnLostTarget() override;

 private:
  std::string Format(double value) const;
  void Step(double by);
  // Sets the value, shows it, and sends it when it changed.
  void Change(double value);
  bool Accepts(std::uint32_t c) const;

  double value_;
  double minimum_;
  double maximum_;
  int digits_;
  double minorStep_ = 1.0;
  double majorStep_ = 10.0;
  std::string unit_;
  std::string text_;
  std::size_t caret_ = 0;
  bool selectAll_ = false;
  bool committing_ = false;
};

}  // namespace Tarsa
