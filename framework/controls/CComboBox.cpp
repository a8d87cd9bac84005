#include "framework/controls/CComboBox.h"

#include <algorithm>
#include <cmath>

#include "framework/controls/CEditNumber.h"
#include "framework/controls/CPopupList.h"
#include "framework/process/CKeyCodes.h"
#include "framework/strings/CString.h"
#include "framework/view/CNativeWindow.h"
#include "framework/view/CWindow.h"

namespace Tarsa {

namespace {

CObjID FieldId() {
  static const CObjID id = CObjID::Intern("Tarsa/ComboBox/Field");
  return id;
}

}  // namespace

CComboBox::CComboBox(CObjID id, CView* parent, const CRect& frame, double value, double minimum,
                     double maximum, int digits, const std::vector<double>& choices,
                     const std::string& unit, std::uint32_t binding)
    : CControl(id, parent, frame, kView_NoOptions, binding),
      choices_(choices),
      unit_(ShownText(unit)),
      digits_(digits) {
  const CSize size = Size();
  // The unit stands after the arrow, so that the arrow meets the field.
  if (!unit_.empty()) {
    unitWidth_ = CreateMeasuringPort()->MeasureText(unit_, EFont::kUIMedium).width + 4;
  }
  field_ = new CEditNumber(FieldId(), this,
                           CRect{0, 0, size.width - unitWidth_ - kArrowWidth + 1, size.height},
                           value, minimum, maximum, digits, kView_TabStop, kBind_XSizeable);
}

CComboBox::~CComboBox() {
  if (CWindow* window = Window()) {
    if (CPopupList* list = CPopupList::OpenIn(*window)) list->Forget(field_);
  }
}

double CComboBox::Value() const { return field_->Value(); }

void CComboBox::SetValue(double value) { field_->SetValue(value); }

CRect CComboBox::ArrowRect() const {
  const CRect image = Image();
  return CRect{image.right - unitWidth_ - kArrowWidth, image.top, image.right - unitWidth_,
               image.bottom};
}

std::string CComboBox::ChoiceText(double value) const {
  std::string text = NumberToText(value, digits_, false).Str();
  if (!unit_.empty()) text += " " + unit_;
  return text;
}

void CComboBox::OpenList() {
  CWindow* window = Window();
  if (window == nullptr || !IsLive() || choices_.empty()) return;
  std::vector<std::string> items;
  int marked = 0;
  for (std::size_t i = 0; i < choices_.size(); ++i) {
    items.push_back(ChoiceText(choices_[i]));
    if (std::abs(choices_[i] - Value()) < std::abs(choices_[std::size_t(marked)] - Value())) {
      marked = int(i);
    }
  }
  field_->Commit();
  // The field holds the focus while the list is open and gets it back.
  CPopupList::For(*window).Open(field_, LocalToWindow(Image()), items, marked, [this](int index) {
    if (index < 0) return;
    const double before = Value();
    field_->SetValue(choices_[std::size_t(index)]);
    if (Value() != before) Notify(CNumber{Value()});
  });
}

void CComboBox::Click(CMouseMessage& message) {
  const CRect arrow = ArrowRect();
  if (message.button == kButton_Left && message.where.x >= arrow.left) OpenList();
}

void CComboBox::HandleMessage(CMessage& message) {
  if (const auto* number = dynamic_cast<const CValMsg<CNumber>*>(&message);
      number != nullptr && message.name == FieldId()) {
    message.SetHandled();
    Notify(number->value, number->change);
    return;
  }
  CControl::HandleMessage(message);
}

void CComboBox::Draw(CPort& port) {
  const CRect arrow = ArrowRect();
  const bool on = IsEnabled();
  port.FillRect(arrow, Hovered() ? Skin::kFaceHover : Skin::kFace);
  port.FrameRect(arrow, on ? Skin::kEdge : Skin::kEdgeDisabled);
  const double x = arrow.left + arrow.Width() / 2.0;
  const double y = arrow.top + arrow.Height() / 2.0;
  const CPointF down[] = {{x - 4, y - 2}, {x + 4, y - 2}, {x, y + 3}};
  port.FillPolygon(down, on ? Skin::kText : Skin::kTextDisabled);
  if (!unit_.empty()) {
    const CRect image = Image();
    port.DrawText(unit_, CRect{arrow.right + 4, image.top, image.right, image.bottom},
                  EFont::kUIMedium, TextColor());
  }
}

}  // namespace Tarsa
