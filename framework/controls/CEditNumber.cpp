#include "framework/controls/CEditNumber.h"

#include <algorithm>
#include <charconv>
#include <cmath>

#include "framework/controls/CAlert.h"
#include "framework/process/CKeyCodes.h"
#include "framework/process/CMessageNames.h"
#include "framework/process/CProcess.h"
#include "framework/strings/CString.h"
#include "framework/view/CWindow.h"

namespace Tarsa {

namespace {

constexpr std::int32_t kUnitGap = 4;

}  // namespace

CEditNumber::CEditNumber(CObjID id, CView* parent, const CRect& frame, double value, double minimum,
                         double maximum, int digits, std::uint32_t options, std::uint32_t binding)
    : CControl(id, parent, frame, options, binding),
      value_(value),
      minimum_(std::min(minimum, maximum)),
      maximum_(std::max(minimum, maximum)),
      digits_(std::clamp(digits, 0, 10)) {
  SetValue(value);
}

std::string CEditNumber::Format(double value) const {
  return NumberToText(value, digits_, true).Str();
}

void CEditNumber::SetValue(double value) {
  if (!std::isfinite(value)) value = minimum_;
  value_ = std::clamp(value, minimum_, maximum_);
  text_ = Format(value_);
  caret_ = text_.size();
  Invalidate();
}

void CEditNumber::SetRange(double minimum, double maximum) {
  minimum_ = std::min(minimum, maximum);
  maximum_ = std::max(minimum, maximum);
  SetValue(value_);
}

void CEditNumber::SetDigits(int digits) {
  digits_ = std::clamp(digits, 0, 10);
  SetValue(value_);
}

void CEditNumber::SetUnit(const std::string& unit) {
  unit_ = ShownText(unit);
  Invalidate();
}

void CEditNumber::SetSteps(double minor, double major) {
  minorStep_ = minor;
  majorStep_ = major;
}

void CEditNumber::Change(double value) {
  const double before = value_;
  SetValue(value);
  if (value_ != before) Notify(CNumber{value_});
}

std::string CEditNumber::RangeAlertText(double minimum, double maximum, int digits) {
  CString text = ResolveText(
      "$$$/Tarsa/EditNumber/OutOfRange=A number between ^0 and ^1 is required. The closest "
      "value was inserted.");
  text = text.Replace(0, NumberToText(minimum, digits, false));
  text = text.Replace(1, NumberToText(maximum, digits, false));
  return text.Str();
}

bool CEditNumber::Commit(bool alertNow) {
  if (committing_) return true;
  double read = 0.0;
  const char* begin = text_.data();
  const char* end = begin + text_.size();
  const auto result = std::from_chars(begin, end, read);
  if (text_.empty() || result.ec != std::errc() || result.ptr != end || !std::isfinite(read)) {
    // Nothing that reads as a number: the last value stands.
    SetValue(value_);
    return true;
  }
  if (read >= minimum_ && read <= maximum_) {
    Change(read);
    return true;
  }
  Change(std::clamp(read, minimum_, maximum_));
  const std::string text = RangeAlertText(minimum_, maximum_, digits_);
  const CWindow* window = Window();
  const auto alert = [text, window] {
    CAlert::Ask(CAlert::EKind::kCaution, text, "", {"$$$/Tarsa/Alert/OK=OK"}, 0, 0, window);
  };
  CProcess* process = CProcess::Current();
  if (alertNow || process == nullptr) {
    committing_ = true;
    alert();
    committing_ = false;
    selectAll_ = true;
  } else {
    process->PostAction(alert);
  }
  return false;
}

bool CEditNumber::Accepts(std::uint32_t c) const {
  if (c >= '0' && c <= '9') return true;
  const std::string& current = selectAll_ ? std::string() : text_;
  if (c == '.' && digits_ > 0) return current.find('.') == std::string::npos;
  if (c == '-' && minimum_ < 0) return caret_ == 0 || selectAll_;
  return false;
}

void CEditNumber::Step(double by) {
  Commit();
  Change(value_ + by);
}

void CEditNumber::Click(CMouseMessage& /*message*/) {
  if (!IsLive()) return;
  selectAll_ = false;
  caret_ = text_.size();
  Invalidate();
}

void CEditNumber::MouseWheel(CMouseMessage& message) {
  if (!IsLive()) return;
  Step(message.wheel * ((message.modifiers & kModifier_Shift) != 0 ? majorStep_ : minorStep_));
  message.SetHandled();
}

void CEditNumber::OnBecameTarget() {
  selectAll_ = true;
  caret_ = text_.size();
  CControl::OnBecameTarget();
}

void CEditNumber::OnLostTarget() {
  selectAll_ = false;
  Commit(false);
  CControl::OnLostTarget();
}

void CEditNumber::HandleMessage(CMessage& message) {
  const CMessageNames& names = CMessageNames::Get();
  if (message.name == names.keyChar) {
    const auto* typed = dynamic_cast<const CValMsg<std::uint32_t>*>(&message);
    if (typed != nullptr) {
      message.SetHandled();
      if (!Accepts(typed->value)) return;
      if (selectAll_) {
        text_.clear();
        caret_ = 0;
        selectAll_ = false;
      }
      text_.insert(caret_, 1, static_cast<char>(typed->value));
      ++caret_;
      Invalidate();
      return;
    }
  }
  const std::uint32_t key = KeyDownCode(message);
  const bool shift = (message.modifiers & kModifier_Shift) != 0;
  switch (key) {
    case kKey_Backspace:
    case kKey_Delete:
      if (selectAll_) {
        text_.clear();
        caret_ = 0;
        selectAll_ = false;
      } else if (key == kKey_Backspace && caret_ > 0) {
        text_.erase(--caret_, 1);
      } else if (key == kKey_Delete && caret_ < text_.size()) {
        text_.erase(caret_, 1);
      }
      Invalidate();
      message.SetHandled();
      return;
    case kKey_Left:
    case kKey_Right:
    case kKey_Home:
    case kKey_End:
      selectAll_ = false;
      if (key == kKey_Left && caret_ > 0) --caret_;
      if (key == kKey_Right && caret_ < text_.size()) ++caret_;
      if (key == kKey_Home) caret_ = 0;
      if (key == kKey_End) caret_ = text_.size();
      Invalidate();
      message.SetHandled();
      return;
    case kKey_Up:
    case kKey_Down:
      Step((key == kKey_Up ? 1 : -1) * (shift ? majorStep_ : minorStep_));
      message.SetHandled();
      return;
    case kKey_Return:
      // A corrected number keeps the dialog open; an accepted one lets
      // Return go on to the default button.
      if (!Commit()) {
        message.SetHandled();
        return;
      }
      break;
    case kKey_Escape:
      SetValue(value_);
      break;
    default:
      break;
  }
  CControl::HandleMessage(message);
}

void CEditNumber::Draw(CPort& port) {
  const CRect image = Image();
  const std::int32_t unitWidth =
      unit_.empty() ? 0 : port.MeasureText(unit_, EFont::kUIMedium).width + kUnitGap;
  const CRect field{image.left, image.top, image.right - unitWidth, image.bottom};
  const bool on = IsEnabled();
  port.FillRect(field, on ? Skin::kField : Skin::kFace);
  port.FrameRect(field,
                 IsTarget() ? Skin::kFocus
                 : on       ? Skin::kEdge
                            : Skin::kEdgeDisabled,
                 IsTarget() ? 2.0 : 1.0);
  const CRect text{field.left + 5, field.top, field.right - 5, field.bottom};
  if (IsTarget() && selectAll_ && !text_.empty()) {
    const CSize size = port.MeasureText(text_, EFont::kUIMedium);
    const std::int32_t top = text.top + (std::int32_t(text.Height()) - size.height) / 2;
    port.FillRect(CRect{text.left - 1, top, text.left + size.width + 1, top + size.height},
                  Skin::kAccentLight);
  }
  port.DrawText(text_, text, EFont::kUIMedium, TextColor());
  if (IsTarget() && !selectAll_) {
    const std::int32_t x =
        text.left + port.MeasureText(text_.substr(0, caret_), EFont::kUIMedium).width;
    port.Line({x + 0.5, field.top + 4.0}, {x + 0.5, field.bottom - 4.0}, Skin::kText, 1.0);
  }
  if (!unit_.empty()) {
    port.DrawText(unit_, CRect{field.right + kUnitGap, image.top, image.right, image.bottom},
                  EFont::kUIMedium, TextColor());
  }
}

}  // namespace Tarsa
