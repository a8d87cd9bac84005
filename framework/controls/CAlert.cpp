#include "framework/controls/CAlert.h"

#include <algorithm>
#include <numbers>

#include "framework/controls/CCheckButton.h"
#include "framework/controls/CControl.h"
#include "framework/controls/CPushButton.h"
#include "framework/controls/CStaticText.h"

namespace Tarsa {

namespace {

constexpr std::int32_t kWidth = 440;
constexpr std::int32_t kMargin = 20;
constexpr std::int32_t kSign = 32;
constexpr std::int32_t kTextLeft = kMargin + kSign + 16;
constexpr std::int32_t kButtonHeight = 26;
constexpr std::int32_t kButtonGap = 8;

std::string TitleOf(CAlert::EKind kind) {
  switch (kind) {
    case CAlert::EKind::kStop:
      return ShownText("$$$/Tarsa/Alert/Title/Error=Error");
    case CAlert::EKind::kCaution:
      return ShownText("$$$/Tarsa/Alert/Title/Warning=Warning");
    case CAlert::EKind::kNote:
      break;
  }
  return ShownText("$$$/Tarsa/Alert/Title/Note=Information");
}

}  // namespace

CObjID CAlert::ButtonId(int index) {
  return CObjID::Intern("Tarsa/Alert/Button" + std::to_string(index));
}

CAlert::CAlert(EKind kind, const std::string& message, const std::string& detail,
               const std::vector<std::string>& buttons, int defaultButton, int cancelButton,
               const CWindow* parent, const std::string& checkBox)
    : CWindow(CObjID::Intern("Tarsa/Alert"), EWindowKind::kModal, TitleOf(kind), CSize{kWidth, 120},
              parent),
      kind_(kind),
      buttonCount_(int(buttons.size())),
      cancelButton_(cancelButton) {
  const std::unique_ptr<CPort> measure = CreateMeasuringPort();
  const std::int32_t textWidth = kWidth - kTextLeft - kMargin;
  const std::string shownMessage = ShownText(message);
  const std::string shownDetail = ShownText(detail);
  std::int32_t y = kMargin;
  const std::int32_t messageHeight =
      measure->WrappedTextHeight(shownMessage, textWidth, EFont::kUIBold);
  auto* main = new CStaticText(
      CObjID(), this, CRect{kTextLeft, y, kTextLeft + textWidth, y + messageHeight}, shownMessage);
  main->SetFont(EFont::kUIBold);
  main->SetWrap(true);
  y += messageHeight;
  if (!shownDetail.empty()) {
    y += 8;
    const std::int32_t detailHeight =
        measure->WrappedTextHeight(shownDetail, textWidth, EFont::kUIMedium);
    auto* more = new CStaticText(
        CObjID(), this, CRect{kTextLeft, y, kTextLeft + textWidth, y + detailHeight}, shownDetail);
    more->SetWrap(true);
    y += detailHeight;
  }
  if (!checkBox.empty()) {
    y += 10;
    checkBox_ = new CCheckButton(CObjID::Intern("Tarsa/Alert/CheckBox"), this,
                                 CRect{kTextLeft, y, kTextLeft + textWidth, y + 20}, checkBox);
    y += 20;
  }
  y = std::max(y, kMargin + kSign) + 20;

  // Buttons from the right: the first given is the rightmost.
  std::int32_t right = kWidth - kMargin;
  for (int i = 0; i < buttonCount_; ++i) {
    const std::string label = ShownText(buttons[std::size_t(i)]);
    const std::int32_t width =
        std::max(84, measure->MeasureText(label, EFont::kUIMedium).width + 28);
    auto* button = new CPushButton(ButtonId(i), this,
                                   CRect{right - width, y, right, y + kButtonHeight}, label);
    button->SetEndsModal(true);
    right -= width + kButtonGap;
  }
  if (defaultButton >= 0 && defaultButton < buttonCount_) SetDefaultView(ButtonId(defaultButton));
  if (cancelButton >= 0 && cancelButton < buttonCount_) SetCancelView(ButtonId(cancelButton));
  SetClientSize(CSize{kWidth, y + kButtonHeight + kMargin});
}

CAlert::~CAlert() = default;

bool CAlert::CheckBoxChecked() const { return checkBox_ != nullptr && checkBox_->IsChecked(); }

int CAlert::Run() {
  const CObjID pressed = RunModal();
  for (int i = 0; i < buttonCount_; ++i) {
    if (pressed == ButtonId(i)) return i;
  }
  return cancelButton_;
}

int CAlert::Ask(EKind kind, const std::string& message, const std::string& detail,
                const std::vector<std::string>& buttons, int defaultButton, int cancelButton,
                const CWindow* parent) {
  CAlert alert(kind, message, detail, buttons, defaultButton, cancelButton, parent);
  return alert.Run();
}

void CAlert::Draw(CPort& port) {
  const CRect sign{kMargin, kMargin, kMargin + kSign, kMargin + kSign};
  const std::uint32_t color = kind_ == EKind::kStop      ? 0xFFD03A2F
                              : kind_ == EKind::kCaution ? 0xFFE8A317
                                                         : Skin::kAccent;
  if (kind_ == EKind::kCaution) {
    const CPointF triangle[] = {{kMargin + kSign / 2.0, double(kMargin)},
                                {double(kMargin + kSign), double(kMargin + kSign)},
                                {double(kMargin), double(kMargin + kSign)}};
    port.FillPolygon(triangle, color);
  } else {
    port.FillEllipse(sign, color);
  }
  port.DrawText(kind_ == EKind::kNote ? "i" : "!",
                CRect{sign.left, sign.top + 3, sign.right, sign.bottom}, EFont::kUILarge,
                0xFFFFFFFF, EAlign::kCenter, EAlign::kCenter);
}

}  // namespace Tarsa
