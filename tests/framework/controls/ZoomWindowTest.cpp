// A scroller with a zoom pane and its combo, built from a layout text, in a
// window on the display, driven with real X input.
#include <gtest/gtest.h>

#include <cmath>
#include <memory>
#include <string>
#include <vector>

#include "framework/controls/CScrollBar.h"
#include "framework/controls/CZoomProgressCombo.h"
#include "framework/layout/CZilGenerator.h"
#include "framework/layout/ZoomBuilders.h"
#include "framework/native/NativeDisplay.h"
#include "framework/view/CWindow.h"
#include "tests/framework/controls/Desktop.h"

namespace Tarsa::testing {
namespace {

// A picture of 100-pixel squares in two colours, drawn through the pane's
// mapping, with a dark frame around the picture.
class CheckerPane : public CZoomPane {
 public:
  using CZoomPane::CZoomPane;
  void Draw(CPort& port) override {
    CZoomPane::Draw(port);
    const CRect shown = VisiblePictureRect();
    if (shown.IsEmpty()) return;
    const CPointF from = ViewToImage({double(shown.left), double(shown.top)});
    const CPointF to = ViewToImage({double(shown.right), double(shown.bottom)});
    for (int y = int(from.y) / 100; y * 100 < to.y; ++y) {
      for (int x = int(from.x) / 100; x * 100 < to.x; ++x) {
        const CPointF a = ImageToView({x * 100.0, y * 100.0});
        const CPointF b = ImageToView({x * 100.0 + 100.0, y * 100.0 + 100.0});
        const CRect cell{std::int32_t(std::floor(a.x)), std::int32_t(std::floor(a.y)),
                         std::int32_t(std::ceil(b.x)), std::int32_t(std::ceil(b.y))};
        port.FillRect(cell.Intersect(shown), (x + y) % 2 != 0 ? 0xFF3A78C2 : 0xFFF2E6C9);
      }
    }
    port.FrameRect(PictureRect(), 0xFF202020);
  }
};

// A scroller class that only gives the layout a name, as a workspace does.
class NamedScroller : public CScroller {
 public:
  using CScroller::CScroller;
};

constexpr const char* kLayout =
    "Window(view_id: 'Test/ZoomWindow', window_title: 'Zoom', margin: 10) {\n"
    "  TestScroller(view_id: 'Test/Scroller', view_binding: kBind_Sizeable,\n"
    "      scroller_attributes: kScroller_XBar + kScroller_YBar + kScroller_WellFrame,\n"
    "      scroller_gap_left: kZoomCombo_DefaultWidth, margin: 1, spacing: 1,\n"
    "      child_horizontal: align_fill) {\n"
    "    TestCheckerPane(view_id: 'Test/Pane', width: 480, height: 320, vertical: align_fill,\n"
    "        zoom_min: '0.01', zoom_max: '8.000', fit_in_view_cushion: 5,\n"
    "        view_binding: kBind_Sizeable);\n"
    "    CZoomProgressCombo(view_id: 'Test/Combo', horizontal: align_left,\n"
    "        vertical: align_bottom, width: kZoomCombo_DefaultWidth, height: 18,\n"
    "        frame_interior: kInterior_ScrollerGapLeft, view_binding: kBind_FixedBottomLeft);\n"
    "  }\n"
    "}";

class ZoomWindow : public ::testing::Test {
 protected:
  void SetUp() override {
    if (!Native::HasDisplay()) GTEST_SKIP() << "no display; these tests run under xvfb-run";
    desktop_ = std::make_unique<Desktop>();
    CViewBuilder::Register("TestScroller", MakeScrollerBuilder<NamedScroller>());
    CViewBuilder::Register("TestCheckerPane", MakeZoomPaneBuilder<CheckerPane>());
    CZilGenerator generator;
    window_ = generator.Generate(kLayout, nullptr);
    scroller_ = dynamic_cast<CScroller*>(window_->FindView(CObjID::Intern("Test/Scroller")));
    pane_ = dynamic_cast<CheckerPane*>(window_->FindView(CObjID::Intern("Test/Pane")));
    combo_ = dynamic_cast<CZoomProgressCombo*>(window_->FindView(CObjID::Intern("Test/Combo")));
    ASSERT_NE(scroller_, nullptr);
    ASSERT_NE(pane_, nullptr);
    ASSERT_NE(combo_, nullptr);
    window_->Show();
    desktop_->Pump(0.3);
    xid_ = std::to_string(window_->Native().SystemHandle());
  }
  void TearDown() override {
    window_.reset();
    desktop_.reset();
  }
  // The pointer moved to a point of a view's space, then the rest.
  int At(const CView* view, CPoint local, std::vector<std::string> then) {
    const CPoint p = view->LocalToWindow(local);
    std::vector<std::string> arguments = {"mousemove", "--window", xid_, std::to_string(p.x),
                                          std::to_string(p.y)};
    arguments.insert(arguments.end(), then.begin(), then.end());
    return desktop_->Xdo(arguments);
  }
  void Screenshot(const std::string& name) {
    window_->PaintNow();
    EXPECT_TRUE(window_->SaveImage(Desktop::Artefact(name)));
  }

  std::unique_ptr<Desktop> desktop_;
  std::unique_ptr<CWindow> window_;
  CScroller* scroller_ = nullptr;
  CheckerPane* pane_ = nullptr;
  CZoomProgressCombo* combo_ = nullptr;
  std::string xid_;
};

TEST_F(ZoomWindow, TheLayoutBuildsAScrollerWhoseBarsComboAndWheelDriveThePane) {
  // The layout's limits and places.
  EXPECT_DOUBLE_EQ(pane_->ZoomMin(), 0.01);
  EXPECT_DOUBLE_EQ(pane_->ZoomMax(), 8.0);
  EXPECT_EQ(pane_->FitCushion(), 5);
  EXPECT_EQ(scroller_->GapView(), combo_);
  EXPECT_EQ(combo_->Frame().left, 1);
  EXPECT_EQ(combo_->Frame().Width(), kZoomCombo_DefaultWidth);
  EXPECT_EQ(combo_->Frame().bottom, scroller_->YBar()->Frame().bottom + 18);
  pane_->SetDocumentSize({1600, 1200});
  pane_->SetZoom(0.5);
  EXPECT_EQ(combo_->Text(), "50%");

  // Alt and the wheel zoom a tenth of the way to 2/3, about the pointer.
  const CPoint pointer{pane_->Image().left + 150, pane_->Image().top + 100};
  const CPointF under = pane_->ViewToImage({double(pointer.x), double(pointer.y)});
  ASSERT_EQ(At(pane_, pointer, {"keydown", "alt", "click", "4", "keyup", "alt"}), 0);
  EXPECT_NEAR(pane_->Zoom(), 0.5 + 0.1 * (2.0 / 3 - 0.5), 1e-12) << "one tenth, by hand";
  const CPointF now = pane_->ImageToView(under);
  EXPECT_NEAR(now.x - pane_->Image().left, 150.0, 0.5) << "the scroll is whole pixels";
  EXPECT_NEAR(now.y - pane_->Image().top, 100.0, 0.5);
  EXPECT_EQ(combo_->Text(), "51.7%");

  // The plain wheel scrolls three lines of 12 per notch.
  pane_->ScrollTo({pane_->Image().left, 0});
  ASSERT_EQ(At(pane_, pointer, {"click", "5"}), 0);
  EXPECT_EQ(pane_->Image().top, pane_->Limits().top + CZoomPane::kWheelLine);

  // Dragging the vertical thumb by n pixels scrolls by its share of the travel.
  pane_->ScrollTo({pane_->Image().left, pane_->Limits().top});
  CScrollBar* bar = scroller_->YBar();
  window_->PaintNow();
  const std::int32_t travel = bar->TrackEnd() - bar->TrackStart() - bar->ThumbLength();
  ASSERT_GT(travel, 40);
  const CPoint thumb{CScrollBar::kThickness / 2, bar->ThumbStart() + bar->ThumbLength() / 2};
  const CPoint thumbInWindow = bar->LocalToWindow(thumb);
  const std::int32_t n = 41;
  ASSERT_EQ(
      At(bar, thumb,
         {"mousedown", "1", "mousemove", "--window", xid_, std::to_string(thumbInWindow.x),
          std::to_string(thumbInWindow.y + 20), "mousemove", "--window", xid_,
          std::to_string(thumbInWindow.x), std::to_string(thumbInWindow.y + n), "mouseup", "1"}),
      0);
  const auto expected = std::int32_t(std::lround(double(n) * bar->Maximum() / travel));
  EXPECT_EQ(pane_->Image().top - pane_->Limits().top, expected);
  EXPECT_EQ(bar->Position(), expected);

  // Typing 200 and Return in the combo's field.
  const CRect field = combo_->FieldRect();
  ASSERT_EQ(At(combo_, {field.left + 20, field.top + 9}, {"click", "1"}), 0);
  ASSERT_EQ(desktop_->Xdo({"type", "--delay", "40", "200"}), 0);
  ASSERT_EQ(desktop_->Xdo({"key", "Return"}), 0);
  EXPECT_DOUBLE_EQ(pane_->Zoom(), 2.0);
  EXPECT_EQ(combo_->Text(), "200%");
  // The step buttons.
  const CRect in = combo_->InRect();
  ASSERT_EQ(At(combo_, {in.left + 8, in.top + 9}, {"click", "1"}), 0);
  EXPECT_DOUBLE_EQ(pane_->Zoom(), 3.0);
  const CRect out = combo_->OutRect();
  ASSERT_EQ(At(combo_, {out.left + 8, out.top + 9}, {"click", "1", "click", "1"}), 0);
  EXPECT_DOUBLE_EQ(pane_->Zoom(), 1.0);
  pane_->FitInView();
  Screenshot("zoom-pane-fit.png");
  pane_->SetZoom(2.0 / 3);
  pane_->ScrollTo({300, 200});
  Screenshot("zoom-pane.png");
  combo_->SetProgress(2, 5);
  Screenshot("zoom-pane-progress.png");
  combo_->SetProgress(5, 5);
  EXPECT_FALSE(combo_->InProgress());
}

}  // namespace
}  // namespace Tarsa::testing
