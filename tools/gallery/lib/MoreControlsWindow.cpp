#include "tools/gallery/lib/MoreControlsWindow.h"

#include <chrono>
#include <cstdio>
#include <thread>
#include <vector>

#include "framework/controls/CComboBox.h"
#include "framework/controls/CEditSlider.h"
#include "framework/controls/CFramePane.h"
#include "framework/controls/CGroupBox.h"
#include "framework/controls/CListBox.h"
#include "framework/controls/CProgressBar.h"
#include "framework/controls/CProgressDialog.h"
#include "framework/controls/CPushButton.h"
#include "framework/controls/CRadioGroup.h"
#include "framework/controls/CRadioPopup.h"
#include "framework/controls/CScrollBar.h"
#include "framework/controls/CStaticImage.h"
#include "framework/controls/CStaticText.h"
#include "framework/controls/CTabs.h"
#include "framework/strings/CString.h"
#include "tools/gallery/lib/GalleryWindow.h"

namespace Gallery {

using namespace Tarsa;

namespace {

CObjID Id(const char* text) { return CObjID::Intern(text); }

void Label(CView* parent, std::int32_t x, std::int32_t y, const char* text) {
  auto* label = new CStaticText(CObjID(), parent, CRect{x, y, x + 100, y + 24}, text);
  label->SetAlignment(EAlign::kEnd);
}

// A large drawing to scroll: a grid with its coordinates written in.
class Canvas : public CView {
 public:
  Canvas(CView* parent, const CRect& frame)
      : CView(Id(MoreControlsWindow::kCanvas), parent, frame, kView_NoOptions,
              kBind_Scrollable | kBind_LimitTopLeft, 600, 800) {}

  void Draw(CPort& port) override {
    const CRect image = Image();
    port.FillRect(image, 0xFFFFFFFF);
    for (std::int32_t y = 0; y < 800; y += 50) {
      for (std::int32_t x = 0; x < 600; x += 100) {
        const CRect cell{x, y, x + 100, y + 50};
        if (((x / 100) + (y / 50)) % 2 == 0) port.FillRect(cell, 0xFFE8EEF8);
        port.DrawText(std::to_string(x) + "," + std::to_string(y), cell.Offset(6, 0),
                      EFont::kUISmall, 0xFF505050);
      }
    }
  }
};

}  // namespace

MoreControlsWindow::MoreControlsWindow(Log log)
    : CWindow(Id("Gallery2/Window"), EWindowKind::kModal, "More controls", CSize{560, 420}),
      log_(std::move(log)) {
  auto* tabs = new CTabs(Id(kTabs), this, CRect{10, 10, 550, 364}, kView_TabStop, kBind_Sizeable);

  // Choosing among items.
  CView* choices = tabs->AddTab("Choices");
  Label(choices, 10, 12, "Projection:");
  new CRadioGroup(Id(kProjection), choices, CRect{120, 12, 300, 12 + 4 * CRadioGroup::kRowHeight},
                  {"Stereographic", "Mercator", "Panini", "Equirectangular"}, 0);
  Label(choices, 10, 116, "Lens:");
  new CRadioPopup(Id(kLens), choices, CRect{120, 116, 300, 140},
                  {"Rectilinear", "Fisheye, equisolid", "Fisheye, equidistant",
                   "Fisheye, stereographic", "Fisheye, orthographic"},
                  0);
  Label(choices, 10, 152, "Zoom:");
  new CComboBox(Id(kZoom), choices, CRect{120, 152, 230, 176}, 100, 1, 1600, 0,
                {12.5, 25, 50, 100, 200, 400, 800, 1600}, "%");
  std::vector<std::string> files;
  for (int i = 1; i <= 20; ++i) {
    char name[32];
    std::snprintf(name, sizeof name, "Hall %02d.tif", i);
    files.push_back(name);
  }
  new CListBox(Id(kFiles), choices, CRect{330, 12, 520, 16 + 8 * CListBox::kRowHeight}, files, 0);
  new CEditSlider(Id(kFocal), choices, CRect{10, 200, 520, 224}, "Focal length:", 10.5, 5, 50, 1,
                  "mm", kBind_SizeLeft, 110, 90);
  new CEditSlider(Id(kScale), choices, CRect{10, 236, 520, 260}, "Scale:", 100, 50, 150, 0, "%",
                  kBind_SizeLeft, 110, 90);

  // Showing things.
  CView* display = tabs->AddTab("Display");
  auto* preview = new CGroupBox(CObjID(), display, CRect{10, 6, 270, 222}, "Preview");
  auto* frame = new CFramePane(CObjID(), preview, CRect{12, 26, 228, 196}, 0xFFFFFFFF);
  auto* canvas = new Canvas(frame, CRect{1, 1, 201, 155});
  new CScrollBar(Id(kVBar), frame, CRect{201, 1, 215, 155}, CScrollBar::EOrientation::kVertical,
                 canvas);
  new CScrollBar(Id(kHBar), frame, CRect{1, 155, 201, 169}, CScrollBar::EOrientation::kHorizontal,
                 canvas);

  auto* images = new CGroupBox(CObjID(), display, CRect{290, 6, 528, 112}, "Images");
  const char* icons[] = {"CheckBox.On", "RadioButton.On", "Slider.Thumb", "ScrollBar.Arrow.Up"};
  for (int i = 0; i < 4; ++i) {
    auto* icon = new CStaticImage(CObjID(), images, CRect{14 + i * 36, 34, 46 + i * 36, 66});
    icon->SetIcon(icons[i]);
  }
  // An image made here: a colour ramp with a transparent corner.
  std::vector<std::uint8_t> ramp(48 * 32 * 4);
  for (int y = 0; y < 32; ++y) {
    for (int x = 0; x < 48; ++x) {
      std::uint8_t* p = &ramp[std::size_t(y * 48 + x) * 4];
      p[0] = std::uint8_t(x * 255 / 47);
      p[1] = std::uint8_t(y * 255 / 31);
      p[2] = 160;
      p[3] = x + y < 12 ? 0 : 255;
    }
  }
  auto* picture = new CStaticImage(CObjID(), images, CRect{166, 30, 222, 70});
  picture->SetPixels(ramp.data(), 48, 32, 48 * 4);

  auto* progress = new CGroupBox(CObjID(), display, CRect{290, 122, 528, 222}, "Progress");
  auto* bar = new CProgressBar(Id(kProgress), progress, CRect{12, 32, 226, 48});
  bar->SetValue(0.6);
  auto* busy = new CProgressBar(Id(kBusy), progress, CRect{12, 62, 226, 78});
  busy->SetIndeterminate(true);
  new CPushButton(Id(kRunWork), display, CRect{10, 236, 150, 262}, "Run work\u2026");

  auto* cancel = new CPushButton(Id(kCancel), this, CRect{330, 380, 430, 406}, "Cancel",
                                 kView_TabStop, kBind_FixedBottomRight);
  cancel->SetEndsModal(true);
  auto* ok = new CPushButton(Id(kOk), this, CRect{440, 380, 540, 406}, "OK", kView_TabStop,
                             kBind_FixedBottomRight);
  ok->SetEndsModal(true);
  SetDefaultView(Id(kOk));
  SetCancelView(Id(kCancel));
}

void MoreControlsWindow::RunWork() {
  CProgressDialog dialog("Work", "Working through 200 steps\u2026", this);
  int done = 0;
  for (; done < 200 && !dialog.Cancelled(); ++done) {
    dialog.Update(done / 200.0);
    std::this_thread::sleep_for(std::chrono::milliseconds(20));
  }
  log_("Gallery2/WorkSteps " + std::to_string(done) + (dialog.Cancelled() ? " cancelled" : ""));
}

void MoreControlsWindow::HandleMessage(CMessage& message) {
  const CObjID name = message.name;
  const std::string line = FindView(name) != nullptr ? ValueLine(message) : std::string();
  if (line.empty()) {
    CWindow::HandleMessage(message);
    return;
  }
  log_(line);
  message.SetHandled();
  if (name == Id(kRunWork)) RunWork();
}

}  // namespace Gallery
