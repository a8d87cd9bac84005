// The scroller and the zoom combo as a tree of views, without a window.
#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "framework/controls/CProgressBar.h"
#include "framework/controls/CScrollBar.h"
#include "framework/controls/CScroller.h"
#include "framework/controls/CZoomProgressCombo.h"
#include "framework/process/CKeyCodes.h"
#include "framework/process/CMessageNames.h"
#include "framework/view/CZoomPane.h"

namespace Tarsa {
namespace {

// A 300 x 200 scroller with its well frame, both bars and a 110 gap, over
// a 1000 x 800 picture at 100%.
class ZoomControls : public ::testing::Test {
 protected:
  ZoomControls() {
    scroller_.SetGapLeft(kZoomCombo_DefaultWidth);
    pane_ = new CZoomPane(CObjID(), &scroller_, CRect{0, 0, 100, 100});
    combo_ = new CZoomProgressCombo(CObjID(), &scroller_, CRect{0, 0, 110, 18});
    scroller_.SetGapView(combo_);
    pane_->SetDocumentSize({1000, 800});
  }

  void Type(const std::string& text) {
    const CMessageNames& names = CMessageNames::Get();
    for (char c : text) {
      CValMsg<std::uint32_t> typed(names.keyChar, std::uint32_t(c));
      combo_->HandleMessage(typed);
    }
  }
  void Key(std::uint32_t code) {
    CValMsg<std::uint32_t> key(CMessageNames::Get().keyDown, code);
    combo_->HandleMessage(key);
    EXPECT_TRUE(key.IsHandled()) << "the key stays with the combo";
  }

  CScroller scroller_{CObjID(), nullptr, CRect{0, 0, 300, 200},
                      kScroller_XBar | kScroller_YBar | kScroller_WellFrame};
  CZoomPane* pane_ = nullptr;
  CZoomProgressCombo* combo_ = nullptr;
};

TEST_F(ZoomControls, TheScrollerPlacesPaneBarsAndGapViewAndDoesSoAgainOnResize) {
  // Inside the 1-pixel well frame: the bar row is as high as the combo (18),
  // the vertical bar 14 wide.
  EXPECT_EQ(pane_->Frame(), (CRect{1, 1, 285, 181}));
  EXPECT_EQ(scroller_.XBar()->Frame(), (CRect{111, 181, 285, 199}));
  EXPECT_EQ(scroller_.YBar()->Frame(), (CRect{285, 1, 299, 181}));
  EXPECT_EQ(combo_->Frame(), (CRect{1, 181, 111, 199}));
  EXPECT_EQ(scroller_.ZoomPane(), pane_);
  EXPECT_EQ(combo_->ZoomPane(), pane_) << "found through the scroller";

  scroller_.SetFrame({0, 0, 500, 350});
  EXPECT_EQ(pane_->Frame(), (CRect{1, 1, 485, 331}));
  EXPECT_EQ(scroller_.XBar()->Frame(), (CRect{111, 331, 485, 349}));
  EXPECT_EQ(scroller_.YBar()->Frame(), (CRect{485, 1, 499, 331}));
  EXPECT_EQ(combo_->Frame(), (CRect{1, 331, 111, 349}));

  // With no bars the pane takes the whole inside.
  scroller_.SetGapView(nullptr);
  scroller_.SetAttributes(kScroller_WellFrame);
  EXPECT_EQ(scroller_.XBar(), nullptr);
  EXPECT_EQ(pane_->Frame(), (CRect{1, 1, 499, 349}));
}

TEST_F(ZoomControls, TheBarsMoveThePaneAndFollowItsZoom) {
  CScrollBar* bar = scroller_.YBar();
  // 800 picture rows in a 180-row frame.
  EXPECT_EQ(bar->Maximum(), 620);
  bar->ScrollToPosition(300);
  EXPECT_EQ(pane_->Image().top, 300);
  pane_->SetZoom(0.5);
  // 400 rows now; the centre row 390 of the picture (300 + 90) stays in
  // the middle: 195 - 90 = 105.
  EXPECT_EQ(bar->Maximum(), 220);
  EXPECT_EQ(bar->Position(), 105);
  EXPECT_EQ(pane_->Image().top, 105);
  pane_->SetZoom(0.125);
  EXPECT_EQ(bar->Maximum(), 0) << "the whole picture is in sight";
}

TEST_F(ZoomControls, TheComboShowsTheZoomAndStepsItWithinTheLimits) {
  EXPECT_EQ(combo_->Text(), "100%");
  pane_->ZoomOut();
  EXPECT_EQ(combo_->Text(), "66.7%") << "told by the scroller";
  pane_->ZoomOut();
  pane_->ZoomOut();
  EXPECT_EQ(combo_->Text(), "33.3%");
  pane_->SetZoom(16.0);
  EXPECT_EQ(combo_->Text(), "1600%");
  EXPECT_FALSE(combo_->CanStepIn());
  EXPECT_TRUE(combo_->CanStepOut());
  pane_->SetZoom(0.0);
  EXPECT_EQ(combo_->Text(), "0.1%") << "1/1000 is the limit for a 1000-pixel picture";
  EXPECT_FALSE(combo_->CanStepOut());

  EXPECT_EQ(CZoomProgressCombo::FormatZoom(0.0625), "6.3%");
  EXPECT_EQ(CZoomProgressCombo::FormatZoom(0.025), "2.5%");
  EXPECT_EQ(CZoomProgressCombo::FormatZoom(12.5), "1250%");
}

TEST_F(ZoomControls, TypingAPercentAndReturnSetsTheZoomKeptInTheLimits) {
  Type("200");
  EXPECT_EQ(combo_->Text(), "100%200") << "the caret was at the end";
  Key(kKey_Escape);
  EXPECT_EQ(combo_->Text(), "100%");
  Key(kKey_Backspace);
  Key(kKey_Backspace);
  Key(kKey_Backspace);
  Key(kKey_Backspace);
  Type("2x00");
  EXPECT_EQ(combo_->Text(), "200") << "only what makes a number is typed";
  Key(kKey_Return);
  EXPECT_DOUBLE_EQ(pane_->Zoom(), 2.0);
  EXPECT_EQ(combo_->Text(), "200%");
  for (int i = 0; i < 4; ++i) Key(kKey_Backspace);
  Type("5000%");
  Key(kKey_Return);
  EXPECT_DOUBLE_EQ(pane_->Zoom(), 16.0) << "beyond the range: the nearest limit";
  for (int i = 0; i < 5; ++i) Key(kKey_Backspace);
  Type("%");
  EXPECT_FALSE(combo_->Commit()) << "no number";
  EXPECT_EQ(combo_->Text(), "1600%");
}

TEST_F(ZoomControls, ThePopupListsTheStepsInRangeAndCanBeReplaced) {
  pane_->SetZoomLimits(0.01, 8.0);
  auto items = combo_->PopupItems();
  // 0.01 to 8: fourteen ladder steps, then the fit.
  ASSERT_EQ(items.size(), 15u);
  EXPECT_EQ(items.front().label, "1%");
  EXPECT_EQ(items[13].label, "800%");
  EXPECT_EQ(items.back().label, "Fit on Screen");
  items.back().choose(*pane_);
  EXPECT_DOUBLE_EQ(pane_->Zoom(), pane_->FitZoom());
  EXPECT_DOUBLE_EQ(pane_->Zoom(), 174.0 / 800) << "(180 - 2 x 3) / 800 rows";
  items[5].choose(*pane_);
  EXPECT_DOUBLE_EQ(pane_->Zoom(), 1.0 / 3);

  combo_->SetPopup([](const CZoomPane&) {
    return std::vector<CZoomProgressCombo::Item>{{"Half", [](CZoomPane& p) { p.SetZoom(0.5); }}};
  });
  items = combo_->PopupItems();
  ASSERT_EQ(items.size(), 1u);
  items[0].choose(*pane_);
  EXPECT_EQ(combo_->Text(), "50%");
}

TEST_F(ZoomControls, ProgressTakesTheCombosPlaceUntilTheWorkIsDone) {
  combo_->SetProgress(3, 10);
  EXPECT_TRUE(combo_->InProgress());
  EXPECT_TRUE(combo_->Progress().IsShown());
  EXPECT_DOUBLE_EQ(combo_->Progress().Value(), 0.3);
  EXPECT_EQ(combo_->Progress().Frame(), combo_->Image()) << "in the same place";
  Type("5");
  EXPECT_EQ(combo_->Text(), "100%") << "no typing meanwhile";
  combo_->SetProgress(7, 10);
  EXPECT_DOUBLE_EQ(combo_->Progress().Value(), 0.7);
  pane_->ZoomIn();
  combo_->SetProgress(10, 10);
  EXPECT_FALSE(combo_->InProgress());
  EXPECT_FALSE(combo_->Progress().IsShown());
  EXPECT_EQ(combo_->Text(), "200%");
}

}  // namespace
}  // namespace Tarsa
