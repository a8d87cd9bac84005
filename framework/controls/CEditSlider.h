#pragma once

#include <string>

#include "framework/controls/CControl.h"

namespace Tarsa {

class CEditNumber;
class CSlider;
class CStaticText;

// One row for a number that is both dragged and typed: a label, a slider, a
// number field and its unit, kept in step. Dragging the slider shows each
// value in the field as it goes; a number committed in the field moves the
// slider. The row sends the value under its own id, with the change the
// part that moved it gave (tracking, end of a drag, or set). The label and
// the field's width are fixed; the slider takes the rest of the row.
class CEditSlider : public CControl {
 public:
  CEditSlider(CObjID id, CView* parent, const CRect& frame, const std::string& label, double value,
              double minimum, double maximum, int digits, const std::string& unit = "",
              std::uint32_t binding = kBind_Fixed, std::int32_t labelWidth = 90,
              std::int32_t fieldWidth = 90);

  double Value() const;
  // Sets both parts without telling anyone.
  void SetValue(double value);
  CSlider& Slider() const { return *slider_; }
  CEditNumber& Field() const { return *field_; }

  void HandleMessage(CMessage& message) override;

 private:
  CStaticText* label_ = nullptr;
  CSlider* slider_ = nullptr;
  CEditNumber* field_ = nullptr;
};

}  // namespace Tarsa
