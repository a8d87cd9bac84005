#include <gtest/gtest.h>

#include <algorithm>
#include <cmath>
#include <cstdio>
#include <string>
#include <vector>

#include "framework/controls/CAlert.h"
#include "framework/controls/CEditNumber.h"
#include "framework/controls/CSlider.h"
#include "framework/native/NativeDisplay.h"
#include "framework/process/CKeyCodes.h"
#include "framework/view/CWindow.h"
#include "tests/framework/controls/Desktop.h"
#include "tests/framework/controls/GalleryFixture.h"
#include "tools/gallery/lib/GalleryWindow.h"

namespace Tarsa::testing {
namespace {

using Gallery::GalleryWindow;

// The gallery on the display, driven with real X input through xdotool.
class ControlsWindow : public GalleryFixture<GalleryWindow> {
 protected:
  std::string Focused() const {
    const auto* view = dynamic_cast<const CView*>(CMessenger::Target());
    return view != nullptr && !view->GetId().IsNull() ? view->GetId().Text() : "";
  }
};

TEST_F(ControlsWindow, ClicksReachTheirControlsAndTheProgramReadsThem) {
  Screenshot("gallery.png");
  // The check box, clicked on its label, turns on and says so.
  ASSERT_EQ(At(170, 61, {"click", "1"}), 0);
  EXPECT_TRUE(Logged("Gallery/ShowMesh 1 2"));
  // A disabled button takes no click.
  ASSERT_EQ(At(330, 213, {"click", "1"}), 0);
  EXPECT_FALSE(Logged("Gallery/Disabled 1 2"));
  // A press dragged off the button before the release is no press.
  ASSERT_EQ(
      At(480, 389, {"mousedown", "1", "mousemove", "--window", xid_, "480", "300", "mouseup", "1"}),
      0);
  EXPECT_FALSE(Logged("Gallery/OK 1 2"));
  EXPECT_FALSE(window_->ModalEnded());
  // OK clicked: its press reaches the program and ends the dialog.
  ASSERT_EQ(At(480, 389, {"click", "1"}), 0);
  EXPECT_TRUE(Logged("Gallery/OK 1 2"));
  EXPECT_TRUE(window_->ModalEnded());
  Screenshot("gallery-after-clicks.png");
}

// The same road without X: events put into the framework's own event
// source reach the controls as real input does.
TEST_F(ControlsWindow, EventsInjectedIntoTheEventSourceReachTheControls) {
  const CNativeWindowId id = window_->NativeId();
  const auto at = [id](ENativeKind kind, std::int32_t x, std::int32_t y, std::uint32_t code) {
    CNativeEvent event;
    event.kind = kind;
    event.window = id;
    event.where = {x, y};
    event.code = code;
    return event;
  };
  // A click on the check box: down and up, both over it.
  desktop_->Inject({at(ENativeKind::kMouseMove, 170, 61, 0),
                    at(ENativeKind::kMouseDown, 170, 61, kButton_Left),
                    at(ENativeKind::kMouseUp, 170, 61, kButton_Left)});
  EXPECT_TRUE(Logged("Gallery/ShowMesh 1 2"));
  // Into the line weight field: a click, then typed characters and Return.
  desktop_->Inject({at(ENativeKind::kMouseDown, 200, 134, kButton_Left),
                    at(ENativeKind::kMouseUp, 200, 134, kButton_Left)});
  EXPECT_EQ(Focused(), GalleryWindow::kWeight);
  std::vector<CNativeEvent> typing;
  for (int i = 0; i < 6; ++i) typing.push_back(at(ENativeKind::kKeyDown, 0, 0, kKey_Backspace));
  for (char c : std::string("12.5x")) typing.push_back(at(ENativeKind::kKeyChar, 0, 0, c));
  typing.push_back(at(ENativeKind::kKeyDown, 0, 0, kKey_Tab));
  desktop_->Inject(typing);
  auto* weight = dynamic_cast<CEditNumber*>(window_->Find(GalleryWindow::kWeight));
  ASSERT_NE(weight, nullptr);
  EXPECT_EQ(weight->Value(), 12.5) << "the x was refused, Tab committed the rest";
  EXPECT_TRUE(Logged("Gallery/LineWeight 12.5 2"));
}

TEST_F(ControlsWindow, ASliderDraggedByNPixelsHoldsTheValueThatCorresponds) {
  auto* slider = dynamic_cast<CSlider*>(window_->Find(GalleryWindow::kScale));
  ASSERT_NE(slider, nullptr);
  const CPoint thumb = slider->LocalToWindow(CPoint{slider->ThumbCenter(), 12});
  const std::int32_t span = slider->TrackRight() - slider->TrackLeft();
  const std::int32_t n = 71;
  ASSERT_EQ(At(thumb.x, thumb.y,
               {"mousedown", "1", "mousemove", "--window", xid_, std::to_string(thumb.x + 30),
                std::to_string(thumb.y), "mousemove", "--window", xid_, std::to_string(thumb.x + n),
                std::to_string(thumb.y + 40), "mouseup", "1"}),
            0);
  // 100 % of the range over the track's span, snapped to the 0.5 steps of
  // 201 positions over 50 to 150.
  const double expected = std::round((100.0 + 100.0 * n / span) * 2) / 2;
  EXPECT_DOUBLE_EQ(slider->Value(), expected);
  char line[64];
  std::snprintf(line, sizeof line, "Gallery/Scale %.6g 8", expected);
  EXPECT_TRUE(Logged(line)) << "the end of the drag is sent";
  // One notch of the wheel over it is one position.
  ASSERT_EQ(At(thumb.x + n, thumb.y, {"click", "4"}), 0);
  EXPECT_DOUBLE_EQ(slider->Value(), expected + 0.5);
  Screenshot("gallery-slider.png");
}

TEST_F(ControlsWindow, ANumberFieldRefusesLettersAndBringsANumberIntoItsRange) {
  auto* iterations = dynamic_cast<CEditNumber*>(window_->Find(GalleryWindow::kIterations));
  ASSERT_NE(iterations, nullptr);
  ASSERT_EQ(At(180, 100, {"click", "1"}), 0);
  EXPECT_EQ(Focused(), GalleryWindow::kIterations);
  ASSERT_EQ(desktop_->Xdo({"type", "--delay", "40", "abc"}), 0);
  EXPECT_EQ(iterations->Text(), "8");
  // 12 is beyond 1 to 10: Tab commits it, the field holds the nearest end,
  // and an alert says so; Return closes the alert.
  // (xdotool's type takes every word after it, so it ends each chain.)
  ASSERT_EQ(desktop_->Xdo({"key", "BackSpace", "type", "12"}), 0);
  EXPECT_EQ(iterations->Text(), "12");
  ASSERT_EQ(desktop_->Xdo({"key", "Tab", "sleep", "1", "key", "Return"}), 0);
  EXPECT_EQ(iterations->Value(), 10);
  EXPECT_EQ(iterations->Text(), "10");
  EXPECT_TRUE(Logged("Gallery/Iterations 10 2"));
  EXPECT_EQ(Focused(), GalleryWindow::kWeight) << "the focus moved on, and came back after";
  // Up steps by one, within the range.
  ASSERT_EQ(At(180, 100, {"click", "1", "key", "Down", "key", "Down"}), 0);
  EXPECT_EQ(iterations->Value(), 8);
  Screenshot("gallery-number.png");
}

TEST_F(ControlsWindow, TabMovesTheFocusInOrderAndReturnPressesTheDefault) {
  EXPECT_EQ(Focused(), GalleryWindow::kMesh) << "the first tab stop has the focus";
  const std::vector<std::string> order = {GalleryWindow::kIterations, GalleryWindow::kWeight,
                                          GalleryWindow::kScale,      GalleryWindow::kAlert,
                                          GalleryWindow::kCancel,     GalleryWindow::kOk,
                                          GalleryWindow::kMesh};
  ASSERT_EQ(At(300, 300, {}), 0);
  for (const std::string& next : order) {
    ASSERT_EQ(Keys({"Tab"}), 0);
    EXPECT_EQ(Focused(), next) << "the disabled button is no stop";
  }
  ASSERT_EQ(Keys({"shift+Tab"}), 0);
  EXPECT_EQ(Focused(), GalleryWindow::kOk);
  // Space presses the focused check box; Return the default button.
  ASSERT_EQ(Keys({"Tab", "space"}), 0);
  EXPECT_TRUE(Logged("Gallery/ShowMesh 1 2"));
  ASSERT_EQ(Keys({"Return"}), 0);
  EXPECT_TRUE(Logged("Gallery/OK 1 2"));
}

TEST_F(ControlsWindow, EscapeCancelsAnAlertAndClosingItIsCancel) {
  {
    // What an alert looks like, shown for a moment without its loop.
    CAlert alert(CAlert::EKind::kCaution, "Do you want to save the changes you made in the image?",
                 "Your changes will be lost if you don't save them.",
                 {"Save", "Don't Save", "Cancel"}, 0, 2, window_.get(), "Don't show again");
    alert.Show();
    desktop_->Pump(0.3);
    alert.PaintNow();
    EXPECT_TRUE(alert.SaveImage(Desktop::Artefact("alert.png")));
  }
  ASSERT_EQ(At(200, 213, {"click", "1", "sleep", "1", "key", "Escape"}), 0);
  EXPECT_TRUE(Logged("Gallery/AlertAnswer 2"));
  // Return takes the alert's default, the rightmost button.
  ASSERT_EQ(At(200, 213, {"click", "1", "sleep", "1", "key", "Return"}), 0);
  EXPECT_TRUE(Logged("Gallery/AlertAnswer 0"));
  // Escape in the gallery itself is its Cancel.
  ASSERT_EQ(At(300, 300, {"key", "Escape"}), 0);
  EXPECT_TRUE(Logged("Gallery/Cancel 1 2"));
  EXPECT_TRUE(window_->ModalEnded());
}

// A view that asks for the zoom-in cursor.
class Magnifying : public CView {
 public:
  using CView::CView;
  std::int32_t CursorId() const override { return 26008; }
};

TEST_F(ControlsWindow, ThePointerTakesTheCursorOfTheViewUnderIt) {
  new Magnifying(CObjID(), window_.get(), CRect{20, 250, 540, 360});
  ASSERT_EQ(At(200, 300, {}), 0);
  EXPECT_EQ(window_->CursorShown(), 26008);
  EXPECT_TRUE(window_->CursorShowsImage()) << "drawn from the icon resources, not the arrow";
  ASSERT_EQ(At(300, 30, {}), 0);
  EXPECT_EQ(window_->CursorShown(), 0);
}

TEST_F(ControlsWindow, ResizingTheWindowMovesItsViewsByTheirBindings) {
  ASSERT_EQ(desktop_->Xdo({"windowsize", "--sync", xid_, "700", "500"}), 0);
  desktop_->Pump(0.3);
  ASSERT_EQ(window_->Size().width, 700);
  ASSERT_EQ(window_->Size().height, 500);
  // OK and Cancel keep to the bottom right; the slider widens with the
  // window; the check box stays where it was.
  EXPECT_EQ(window_->Find(GalleryWindow::kOk)->Frame(), (CRect{580, 456, 680, 482}));
  EXPECT_EQ(window_->Find(GalleryWindow::kCancel)->Frame(), (CRect{470, 456, 570, 482}));
  EXPECT_EQ(window_->Find(GalleryWindow::kScale)->Frame(), (CRect{140, 156, 580, 180}));
  EXPECT_EQ(window_->Find(GalleryWindow::kMesh)->Frame(), (CRect{140, 50, 400, 72}));
  // And the OK button is where a click finds it.
  ASSERT_EQ(At(630, 469, {"click", "1"}), 0);
  EXPECT_TRUE(Logged("Gallery/OK 1 2"));
  Screenshot("gallery-resized.png");
}

}  // namespace
}  // namespace Tarsa::testing
