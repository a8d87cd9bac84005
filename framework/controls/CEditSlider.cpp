#include "framework/controls/CEditSlider.h"

#include <cmath>

#include "framework/controls/CEditNumber.h"
#include "framework/controls/CSlider.h"
#include "framework/controls/CStaticText.h"

namespace Tarsa {

namespace {

CObjID SliderId() {
  static const CObjID id = CObjID::Intern("Tarsa/EditSlider/Slider");
  return id;
}

CObjID FieldId() {
  static const CObjID id = CObjID::Intern("Tarsa/EditSlider/Field");
  return id;
}

}  // namespace

CEditSlider::CEditSlider(CObjID id, CView* parent, const CRect& frame, const std::string& label,
                         double value, double minimum, double maximum, int digits,
                         const std::string& unit, std::uint32_t binding, std::int32_t labelWidth,
                         std::int32_t fieldWidth)
    : CControl(id, parent, frame, kView_NoOptions, binding) {
  const CSize size = Size();
  label_ = new CStaticText(CObjID(), this, CRect{0, 0, labelWidth - 8, size.height}, label);
  label_->SetAlignment(EAlign::kEnd);
  // The slider snaps to the field's last digit, so that what it shows is
  // what the field holds.
  const double step = std::pow(10.0, -digits);
  const double positions = std::min(100001.0, std::round((maximum - minimum) / step) + 1);
  slider_ =
      new CSlider(SliderId(), this, CRect{labelWidth, 0, size.width - fieldWidth - 8, size.height},
                  value, minimum, maximum, std::int32_t(positions), kView_TabStop, kBind_SizeLeft);
  field_ =
      new CEditNumber(FieldId(), this, CRect{size.width - fieldWidth, 0, size.width, size.height},
                      value, minimum, maximum, digits, kView_TabStop, kBind_FixedRight);
  if (!unit.empty()) field_->SetUnit(unit);
  field_->SetValue(slider_->Value());
}

double CEditSlider::Value() const { return field_->Value(); }

void CEditSlider::SetValue(double value) {
  slider_->SetValue(value);
  field_->SetValue(value);
}

void CEditSlider::HandleMessage(CMessage& message) {
  const auto* number = dynamic_cast<const CValMsg<CNumber>*>(&message);
  if (number != nullptr && (message.name == SliderId() || message.name == FieldId())) {
    message.SetHandled();
    // The slider's positions are the field's last digit, so a typed number
    // is rounded to what the field shows.
    slider_->SetValue(number->value.value);
    field_->SetValue(slider_->Value());
    Notify(CNumber{field_->Value()}, number->change);
    return;
  }
  CControl::HandleMessage(message);
}

}  // namespace Tarsa
