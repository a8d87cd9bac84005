#include "tools/gallery/lib/GalleryWindow.h"

#include <cstdio>

#include "framework/controls/CAlert.h"
#include "framework/controls/CCheckButton.h"
#include "framework/controls/CEditNumber.h"
#include "framework/controls/CPushButton.h"
#include "framework/controls/CSlider.h"
#include "framework/controls/CStaticText.h"
#include "framework/strings/CString.h"

namespace Gallery {

using namespace Tarsa;

namespace {

CObjID Id(const char* text) { return CObjID::Intern(text); }

CStaticText* Label(CView* parent, std::int32_t y, const char* text) {
  auto* label = new CStaticText(CObjID(), parent, CRect{20, y, 130, y + 24}, text);
  label->SetAlignment(EAlign::kEnd);
  return label;
}

}  // namespace

GalleryWindow::GalleryWindow(Log log)
    : CWindow(Id("Gallery/Window"), EWindowKind::kModal, "Controls", CSize{560, 420}),
      log_(std::move(log)) {
  auto* title = new CStaticText(CObjID(), this, CRect{20, 14, 540, 38}, "Every control");
  title->SetFont(EFont::kUILarge);

  auto* mesh = new CCheckButton(Id(kMesh), this, CRect{140, 50, 400, 72}, "Show M&esh");
  mesh->AddTip("Show or hide the mesh");

  Label(this, 88, "Iterations:");
  auto* iterations = new CEditNumber(Id(kIterations), this, CRect{140, 88, 200, 112}, 8, 1, 10, 0);
  iterations->AddTip("Gauss-Newton iterations, 1 to 10");

  Label(this, 122, "Line weight:");
  auto* weight = new CEditNumber(Id(kWeight), this, CRect{140, 122, 240, 146}, 30, 0, 100, 3);
  weight->SetSteps(0.5, 10);

  Label(this, 158, "Scale:");
  scale_ = new CSlider(Id(kScale), this, CRect{140, 156, 440, 180}, 100, 50, 150, 201,
                       kView_TabStop, kBind_SizeLeft);
  scaleText_ =
      new CStaticText(CObjID(), this, CRect{450, 158, 540, 182}, "100 %", kBind_FixedRight);

  new CPushButton(Id(kAlert), this, CRect{140, 200, 260, 226}, "Alert\u2026");
  auto* disabled = new CPushButton(Id(kDisabled), this, CRect{270, 200, 390, 226}, "Disabled");
  disabled->SetEnabled(false);

  // Cancel before OK: Tab goes through them in reading order.
  auto* cancel = new CPushButton(Id(kCancel), this, CRect{330, 376, 430, 402}, "Cancel",
                                 kView_TabStop, kBind_FixedBottomRight);
  cancel->SetEndsModal(true);
  auto* ok = new CPushButton(Id(kOk), this, CRect{440, 376, 540, 402}, "OK", kView_TabStop,
                             kBind_FixedBottomRight);
  ok->SetEndsModal(true);
  SetDefaultView(Id(kOk));
  SetCancelView(Id(kCancel));
}

std::string ValueLine(const CMessage& message) {
  const auto* value = dynamic_cast<const CValueMessage*>(&message);
  if (value == nullptr) return {};
  char line[160];
  if (const auto* number = dynamic_cast<const CValMsg<CNumber>*>(&message)) {
    std::snprintf(line, sizeof line, "%s %.6g %d", message.name.Text().c_str(), number->value.value,
                  value->change);
  } else if (const auto* button = dynamic_cast<const CValMsg<EButtonValue>*>(&message)) {
    std::snprintf(line, sizeof line, "%s %d %d", message.name.Text().c_str(),
                  static_cast<int>(button->value), value->change);
  } else {
    return {};
  }
  return line;
}

void GalleryWindow::HandleMessage(CMessage& message) {
  const CObjID name = message.name;
  const std::string line = FindView(name) != nullptr ? ValueLine(message) : std::string();
  if (line.empty()) {
    CWindow::HandleMessage(message);
    return;
  }
  if (name == Id(kScale)) {
    const auto& number = static_cast<const CValMsg<CNumber>&>(message);
    scaleText_->SetText(NumberToText(number.value.value, 1, false).Str() + " %");
  }
  log_(line);
  message.SetHandled();
  if (name == Id(kAlert)) {
    const int pressed = CAlert::Ask(CAlert::EKind::kCaution,
                                    "Do you want to save the changes you made in the image?",
                                    "Your changes will be lost if you don't save them.",
                                    {"Save", "Don't Save", "Cancel"}, 0, 2, this);
    log_(std::string("Gallery/AlertAnswer ") + std::to_string(pressed));
  }
}

}  // namespace Gallery
