#include <gtest/gtest.h>

#include <sys/wait.h>

#include <algorithm>
#include <chrono>
#include <cmath>
#include <string>
#include <thread>
#include <vector>

#include "framework/controls/CComboBox.h"
#include "framework/controls/CEditNumber.h"
#include "framework/controls/CEditSlider.h"
#include "framework/controls/CListBox.h"
#include "framework/controls/CPopupList.h"
#include "framework/controls/CProgressDialog.h"
#include "framework/controls/CRadioGroup.h"
#include "framework/controls/CRadioPopup.h"
#include "framework/controls/CScrollBar.h"
#include "framework/controls/CSlider.h"
#include "framework/controls/CTabs.h"
#include "framework/core/CException.h"
#include "framework/native/NativeDisplay.h"
#include "tests/framework/controls/Desktop.h"
#include "tests/framework/controls/GalleryFixture.h"
#include "tools/gallery/lib/MoreControlsWindow.h"

namespace Tarsa::testing {
namespace {

using Gallery::MoreControlsWindow;

// The gallery's second window on the display, driven with real X input.
class MoreControls : public GalleryFixture<MoreControlsWindow> {
 protected:
  template <class T>
  T* Find(const char* id) {
    return dynamic_cast<T*>(window_->Find(id));
  }
  // The window point at the middle of a rectangle of a view's space.
  static CPoint Middle(const CView* view, const CRect& local) {
    return view->LocalToWindow(CPoint{local.left + std::int32_t(local.Width()) / 2,
                                      local.top + std::int32_t(local.Height()) / 2});
  }
  // Real input: the pointer moved to a window point, then the rest.
  using GalleryFixture<MoreControlsWindow>::At;
  int At(CPoint p, std::vector<std::string> then) { return At(p.x, p.y, std::move(then)); }
  const CView* Focused() const { return dynamic_cast<const CView*>(CMessenger::Target()); }
  void ShowPage(int page) {
    auto* tabs = Find<CTabs>(MoreControlsWindow::kTabs);
    ASSERT_NE(tabs, nullptr);
    ASSERT_EQ(At(Middle(tabs, tabs->TabRect(page)), {"click", "1"}), 0);
    ASSERT_EQ(tabs->Chosen(), page);
  }
};

TEST_F(MoreControls, ARadioPopupChoosesByMouseAndByKeyboardAndEscapeChangesNothing) {
  Screenshot("gallery2-choices.png");
  auto* lens = Find<CRadioPopup>(MoreControlsWindow::kLens);
  ASSERT_NE(lens, nullptr);
  const CPoint button = Middle(lens, lens->Image());
  // A click opens the list over the window; a click on an item chooses it.
  ASSERT_EQ(At(button, {"click", "1"}), 0);
  CPopupList* list = CPopupList::OpenIn(*window_);
  ASSERT_NE(list, nullptr);
  Screenshot("gallery2-popup-open.png");
  ASSERT_EQ(At(Middle(list, list->RowRect(2)), {"click", "1"}), 0);
  EXPECT_EQ(CPopupList::OpenIn(*window_), nullptr);
  EXPECT_EQ(lens->Chosen(), 2);
  EXPECT_TRUE(Logged("Gallery2/Lens 2 2"));
  EXPECT_EQ(Focused(), lens) << "the button has the focus back";
  // Space opens it, arrows move the mark, Return chooses.
  ASSERT_EQ(Keys({"space", "Down", "Down", "Return"}), 0);
  EXPECT_EQ(lens->Chosen(), 4);
  EXPECT_TRUE(Logged("Gallery2/Lens 4 2"));
  EXPECT_FALSE(window_->ModalEnded()) << "Return chose; it pressed no default button";
  // Escape closes the list and changes nothing; the dialog stays open.
  ASSERT_EQ(Keys({"Down", "Up", "Up", "Escape"}), 0);
  EXPECT_EQ(CPopupList::OpenIn(*window_), nullptr);
  EXPECT_EQ(lens->Chosen(), 4);
  EXPECT_FALSE(window_->ModalEnded());
  // So does a click outside the list, which reaches nothing beneath it.
  ASSERT_EQ(At(button, {"click", "1"}), 0);
  ASSERT_NE(CPopupList::OpenIn(*window_), nullptr);
  ASSERT_EQ(At(CPoint{480, 393}, {"click", "1"}), 0);
  EXPECT_EQ(CPopupList::OpenIn(*window_), nullptr);
  EXPECT_EQ(lens->Chosen(), 4);
  EXPECT_FALSE(window_->ModalEnded()) << "the click outside did not press OK";
  EXPECT_EQ(std::count_if(log_.begin(), log_.end(),
                          [](const std::string& l) { return l.starts_with("Gallery2/Lens"); }),
            2);
}

TEST_F(MoreControls, ARadioGroupIsOneTabStopWhoseArrowsMoveTheChoice) {
  auto* group = Find<CRadioGroup>(MoreControlsWindow::kProjection);
  ASSERT_NE(group, nullptr);
  // A click on a label chooses its button.
  const CRect row = group->RowRect(1);
  ASSERT_EQ(At(group->LocalToWindow(CPoint{row.left + 40, row.top + 11}), {"click", "1"}), 0);
  EXPECT_EQ(group->Chosen(), 1);
  EXPECT_TRUE(Logged("Gallery2/Projection 1 2"));
  EXPECT_EQ(Focused(), group);
  ASSERT_EQ(Keys({"Down", "Down"}), 0);
  EXPECT_EQ(group->Chosen(), 3);
  Screenshot("gallery2-radio-focused.png");
  ASSERT_EQ(Keys({"Down", "Up", "Up", "Up", "Up", "Up"}), 0);
  EXPECT_EQ(group->Chosen(), 0) << "the choice stops at the ends";
  // Tab leaves the group for the next control, Shift+Tab comes back to it.
  ASSERT_EQ(Keys({"Tab"}), 0);
  EXPECT_EQ(Focused(), Find<CView>(MoreControlsWindow::kLens));
  ASSERT_EQ(Keys({"shift+Tab"}), 0);
  EXPECT_EQ(Focused(), group);
}

TEST_F(MoreControls, AComboBoxTakesAChoiceFromItsListOrATypedNumber) {
  auto* zoom = Find<CComboBox>(MoreControlsWindow::kZoom);
  ASSERT_NE(zoom, nullptr);
  ASSERT_EQ(At(Middle(zoom, zoom->ArrowRect()), {"click", "1"}), 0);
  CPopupList* list = CPopupList::OpenIn(*window_);
  ASSERT_NE(list, nullptr);
  EXPECT_EQ(list->Marked(), 3) << "the list opens at the value shown, 100 %";
  ASSERT_EQ(At(Middle(list, list->RowRect(4)), {"click", "1"}), 0);
  EXPECT_EQ(zoom->Value(), 200);
  EXPECT_TRUE(Logged("Gallery2/Zoom 200 2"));
  // The field keeps the focus; a typed number is committed by Return.
  ASSERT_EQ(desktop_->Xdo({"type", "--delay", "40", "150"}), 0);
  ASSERT_EQ(Keys({"Return"}), 0);
  EXPECT_EQ(zoom->Value(), 150);
  EXPECT_TRUE(Logged("Gallery2/Zoom 150 2"));
}

TEST_F(MoreControls, AListSelectsByClickArrowsAndPageKeysAndScrollsByWheelAndBar) {
  auto* files = Find<CListBox>(MoreControlsWindow::kFiles);
  ASSERT_NE(files, nullptr);
  ASSERT_TRUE(files->ScrollBar()->IsShown()) << "20 rows do not fit: a bar is shown";
  const CView* rows = files->RowsView();
  const auto rowMiddle = [&](int index) {
    return rows->LocalToWindow(CPoint{40, index * CListBox::kRowHeight + CListBox::kRowHeight / 2});
  };
  ASSERT_EQ(At(rowMiddle(2), {"click", "1"}), 0);
  EXPECT_EQ(files->Selected(), 2);
  EXPECT_TRUE(Logged("Gallery2/Files 2 2"));
  ASSERT_EQ(Keys({"Down", "Down", "Down"}), 0);
  EXPECT_EQ(files->Selected(), 5);
  // Page Down moves by a page less one row, and the list follows.
  const int page = files->VisibleRows() - 1;
  ASSERT_EQ(Keys({"Next"}), 0);
  EXPECT_EQ(files->Selected(), 5 + page);
  ASSERT_EQ(Keys({"End"}), 0);
  EXPECT_EQ(files->Selected(), 19);
  EXPECT_EQ(rows->Image().bottom, 20 * CListBox::kRowHeight) << "the last row is in sight";
  EXPECT_EQ(files->ScrollBar()->Position(), rows->Image().top);
  ASSERT_EQ(Keys({"Home"}), 0);
  EXPECT_EQ(files->Selected(), 0);
  EXPECT_EQ(rows->Image().top, 0);
  // The wheel scrolls without changing the selection; the bar agrees.
  ASSERT_EQ(At(rowMiddle(3), {"click", "5", "click", "5"}), 0);
  EXPECT_GT(rows->Image().top, 0);
  EXPECT_EQ(files->Selected(), 0);
  EXPECT_EQ(files->ScrollBar()->Position(), rows->Image().top);
  Screenshot("gallery2-list-scrolled.png");
  // A double click selects and sends the distinct activate change once.
  const int under = files->FirstVisible() + 2;
  ASSERT_EQ(At(rowMiddle(under), {"click", "--repeat", "2", "--delay", "80", "1"}), 0);
  EXPECT_EQ(files->Selected(), under);
  const std::string activate =
      "Gallery2/Files " + std::to_string(under) + " " + std::to_string(CListBox::kChange_Activate);
  EXPECT_EQ(std::count(log_.begin(), log_.end(), activate), 1);
}

TEST_F(MoreControls, TabsSwitchPagesByClickAndByControlTab) {
  auto* tabs = Find<CTabs>(MoreControlsWindow::kTabs);
  ASSERT_NE(tabs, nullptr);
  EXPECT_TRUE(tabs->Pane(0)->IsVisible());
  EXPECT_FALSE(tabs->Pane(1)->IsVisible());
  ShowPage(1);
  EXPECT_FALSE(tabs->Pane(0)->IsVisible());
  EXPECT_TRUE(tabs->Pane(1)->IsVisible());
  EXPECT_TRUE(Logged("Gallery2/Tabs 1 2"));
  Screenshot("gallery2-display.png");
  // A click on the hidden page's place reaches nothing there.
  auto* lens = Find<CRadioPopup>(MoreControlsWindow::kLens);
  ASSERT_EQ(At(Middle(lens, lens->Image()), {"click", "1"}), 0);
  EXPECT_EQ(CPopupList::OpenIn(*window_), nullptr);
  // Ctrl+Tab goes on to the next page (round to the first), from the tabs
  // or from a control in the page; Tab alone moves the focus.
  ASSERT_EQ(Keys({"ctrl+Tab"}), 0);
  EXPECT_EQ(tabs->Chosen(), 0);
  auto* group = Find<CRadioGroup>(MoreControlsWindow::kProjection);
  ASSERT_TRUE(group->BecomeTarget(false));
  ASSERT_EQ(Keys({"ctrl+Tab"}), 0);
  EXPECT_EQ(tabs->Chosen(), 1);
  EXPECT_EQ(Focused(), tabs) << "the focus left the hidden page for the tabs";
  ASSERT_EQ(Keys({"Left"}), 0);
  EXPECT_EQ(tabs->Chosen(), 0);
  ASSERT_EQ(Keys({"ctrl+shift+Tab"}), 0);
  EXPECT_EQ(tabs->Chosen(), 1);
}

TEST_F(MoreControls, AScrollBarDraggedByNPixelsScrollsTheViewByTheShareOfItsTravel) {
  ShowPage(1);
  auto* bar = Find<CScrollBar>(MoreControlsWindow::kVBar);
  auto* hbar = Find<CScrollBar>(MoreControlsWindow::kHBar);
  CView* canvas = window_->Find(MoreControlsWindow::kCanvas);
  ASSERT_NE(bar, nullptr);
  ASSERT_NE(canvas, nullptr);
  ASSERT_EQ(bar->Maximum(), 800 - canvas->Size().height);
  const std::int32_t travel = bar->TrackEnd() - bar->TrackStart() - bar->ThumbLength();
  ASSERT_GT(travel, 40);
  const CPoint thumb = bar->LocalToWindow(
      CPoint{CScrollBar::kThickness / 2, bar->ThumbStart() + bar->ThumbLength() / 2});
  const std::int32_t n = 37;
  ASSERT_EQ(At(thumb, {"mousedown", "1", "mousemove", "--window", xid_, std::to_string(thumb.x),
                       std::to_string(thumb.y + 20), "mousemove", "--window", xid_,
                       std::to_string(thumb.x + 30), std::to_string(thumb.y + n), "mouseup", "1"}),
            0);
  const auto expected = std::int32_t(std::lround(double(n) * bar->Maximum() / travel));
  EXPECT_EQ(canvas->Image().top, expected);
  EXPECT_EQ(bar->Position(), expected);
  EXPECT_EQ(canvas->Image().left, 0) << "the vertical bar moved only its own axis";
  EXPECT_TRUE(Logged("Gallery2/VerticalBar " + std::to_string(expected) + " 2"));
  // The wheel over the view scrolls it, and the bar shows where it is.
  ASSERT_EQ(At(Middle(canvas, canvas->Image()), {"click", "5"}), 0);
  EXPECT_EQ(canvas->Image().top, expected + 36);
  EXPECT_EQ(bar->Position(), expected + 36);
  // A press on the track beyond the thumb pages; an arrow steps a line.
  const std::int32_t before = canvas->Image().top;
  ASSERT_EQ(At(bar->LocalToWindow(CPoint{7, bar->TrackEnd() - 2}), {"click", "1"}), 0);
  EXPECT_EQ(canvas->Image().top, before + bar->Page());
  ASSERT_EQ(At(hbar->LocalToWindow(CPoint{hbar->TrackEnd() + 7, 7}), {"click", "1"}), 0);
  EXPECT_EQ(canvas->Image().left, 12);
  // An arrow held down goes on stepping.
  const std::int32_t held = canvas->Image().top;
  ASSERT_EQ(At(bar->LocalToWindow(CPoint{7, bar->TrackStart() - 7}),
               {"mousedown", "1", "sleep", "1", "mouseup", "1"}),
            0);
  EXPECT_LE(canvas->Image().top, held - 5 * 12);
  Screenshot("gallery2-scrolled.png");
}

TEST_F(MoreControls, ASliderRowKeepsItsSliderAndFieldInStep) {
  auto* focal = Find<CEditSlider>(MoreControlsWindow::kFocal);
  ASSERT_NE(focal, nullptr);
  CSlider& slider = focal->Slider();
  const CPoint thumb = slider.LocalToWindow(CPoint{slider.ThumbCenter(), 12});
  ASSERT_EQ(
      At(thumb, {"mousedown", "1", "mousemove", "--window", xid_, std::to_string(thumb.x + 20),
                 std::to_string(thumb.y), "mousemove", "--window", xid_,
                 std::to_string(thumb.x + 60), std::to_string(thumb.y), "mouseup", "1"}),
      0);
  EXPECT_GT(slider.Value(), 10.5);
  EXPECT_DOUBLE_EQ(focal->Field().Value(), slider.Value()) << "the field followed the drag";
  char line[64];
  std::snprintf(line, sizeof line, "Gallery2/FocalLength %.6g 8", slider.Value());
  EXPECT_TRUE(Logged(line));
  // A number typed in the field moves the slider when it is committed.
  CEditNumber& field = focal->Field();
  ASSERT_EQ(
      At(Middle(&field, field.Image()), {"click", "1", "key", "BackSpace", "BackSpace", "BackSpace",
                                         "BackSpace", "BackSpace", "type", "24.5"}),
      0);
  ASSERT_EQ(Keys({"Tab"}), 0);
  EXPECT_DOUBLE_EQ(field.Value(), 24.5);
  EXPECT_DOUBLE_EQ(slider.Value(), 24.5);
  EXPECT_TRUE(Logged("Gallery2/FocalLength 24.5 2"));
}

TEST_F(MoreControls, ResizingKeepsRowsAndPagesToTheirBindings) {
  ASSERT_EQ(desktop_->Xdo({"windowsize", "--sync", xid_, "700", "500"}), 0);
  desktop_->Pump(0.3);
  ASSERT_EQ(window_->Size().width, 700);
  // The tabs take the window's growth, and so do their pages; in a slider
  // row the slider widens and the field keeps to the right end.
  auto* tabs = Find<CTabs>(MoreControlsWindow::kTabs);
  EXPECT_EQ(tabs->Frame(), (CRect{10, 10, 690, 444}));
  EXPECT_EQ(tabs->Pane(0)->Frame(), (CRect{1, 27, 679, 433}));
  EXPECT_EQ(tabs->Pane(1)->Frame(), (CRect{1, 27, 679, 433}));
  auto* focal = Find<CEditSlider>(MoreControlsWindow::kFocal);
  EXPECT_EQ(focal->Frame(), (CRect{10, 200, 660, 224}));
  EXPECT_EQ(focal->Slider().Frame(), (CRect{110, 0, 552, 24}));
  EXPECT_EQ(focal->Field().Frame(), (CRect{560, 0, 650, 24}));
  EXPECT_EQ(window_->Find(MoreControlsWindow::kOk)->Frame(), (CRect{580, 460, 680, 486}));
  // An open list follows the window too, and still closes on a click
  // anywhere outside it.
  auto* lens = Find<CRadioPopup>(MoreControlsWindow::kLens);
  ASSERT_EQ(At(Middle(lens, lens->Image()), {"click", "1"}), 0);
  ASSERT_NE(CPopupList::OpenIn(*window_), nullptr);
  ASSERT_EQ(At(CPoint{680, 480}, {"click", "1"}), 0);
  EXPECT_EQ(CPopupList::OpenIn(*window_), nullptr);
  EXPECT_FALSE(window_->ModalEnded());
  Screenshot("gallery2-resized.png");
}

TEST_F(MoreControls, TheProgressDialogsCancelStopsTheWorkItShows) {
  CProgressDialog dialog("Correcting", "Rendering the corrected image\u2026", window_.get());
  dialog.Update(0.0);
  desktop_->Pump(0.3);
  const std::string dialogXid = std::to_string(dialog.Native().SystemHandle());
  CView* cancel = dialog.FindView(CObjID::Intern(CProgressDialog::kCancelId));
  ASSERT_NE(cancel, nullptr);
  const CPoint at = Middle(cancel, cancel->Image());
  // The user clicks Cancel a second into work of 200 steps of 20 ms.
  const int pid = desktop_->XdoStart({"sleep", "1", "mousemove", "--window", dialogXid,
                                      std::to_string(at.x), std::to_string(at.y), "click", "1"});
  ASSERT_GT(pid, 0);
  int done = 0;
  for (; done < 200 && !dialog.Cancelled(); ++done) {
    dialog.Update(done / 200.0);
    std::this_thread::sleep_for(std::chrono::milliseconds(20));
    if (done == 25) {
      dialog.PaintNow();
      EXPECT_TRUE(dialog.SaveImage(Desktop::Artefact("progress-dialog.png")));
    }
  }
  EXPECT_EQ(desktop_->XdoWait(pid), 0);
  EXPECT_TRUE(dialog.Cancelled());
  EXPECT_LT(done, 150) << "the work stopped soon after the click, well before its end";
  EXPECT_GT(done, 10);
  EXPECT_THROW(dialog.ThrowIfCancelled(), CAbort);
  EXPECT_TRUE(log_.empty()) << "the click reached the dialog, not the window beneath";
}

TEST_F(MoreControls, EscapeInTheProgressDialogCancelsToo) {
  CProgressDialog dialog("Correcting", "Rendering\u2026", window_.get());
  dialog.Update(-1.0);
  desktop_->Pump(0.3);
  const int pid = desktop_->XdoStart({"sleep", "0.5", "key", "Escape"});
  ASSERT_GT(pid, 0);
  int done = 0;
  for (; done < 200 && !dialog.Cancelled(); ++done) {
    dialog.Update(-1.0);
    std::this_thread::sleep_for(std::chrono::milliseconds(20));
  }
  EXPECT_EQ(desktop_->XdoWait(pid), 0);
  EXPECT_LT(done, 150);
  EXPECT_FALSE(window_->ModalEnded()) << "Escape went to the dialog, not the window beneath";
}

}  // namespace
}  // namespace Tarsa::testing
