#include <gtest/gtest.h>

#include <algorithm>
#include <cmath>
#include <vector>

#include "framework/process/CKeyCodes.h"
#include "framework/view/CZoomPane.h"

namespace Tarsa {
namespace {

// Zooms are sums of a few products of ladder values: a few ulps apart at most.
constexpr double kExact = 1e-12;

// A parent that keeps the names of the messages its children send up.
class Listener : public CView {
 public:
  Listener() : CView(CObjID(), nullptr, CRect{0, 0, 1000, 1000}) {}
  void HandleMessage(CMessage& message) override { heard.push_back(message.name); }
  int Count(CObjID name) const { return int(std::count(heard.begin(), heard.end(), name)); }
  std::vector<CObjID> heard;
};

// A pane that counts its hooks.
class CountingPane : public CZoomPane {
 public:
  using CZoomPane::CZoomPane;
  int zooms = 0, scrolls = 0;

 protected:
  void ZoomChanged() override { ++zooms; }
  void ScrollChanged() override { ++scrolls; }
};

// The zooms ZoomIn (or ZoomOut) walks through until it stops.
std::vector<double> Walk(CZoomPane& pane, bool in) {
  std::vector<double> zooms;
  while (in ? pane.ZoomIn() : pane.ZoomOut()) zooms.push_back(pane.Zoom());
  return zooms;
}

void ExpectZooms(const std::vector<double>& got, const std::vector<double>& want) {
  ASSERT_EQ(got.size(), want.size());
  for (std::size_t i = 0; i < got.size(); ++i) EXPECT_NEAR(got[i], want[i], kExact) << i;
}

TEST(ZoomPane, StepsWalkTheLadderAndStopAtLimitsSetByTheOnePixelPicture) {
  CZoomPane pane(CObjID(), nullptr, CRect{0, 0, 400, 300});
  pane.SetZoomLimits(0.001, 16.0);
  pane.SetDocumentSize({500, 400});
  // At 1/500 the 500-pixel side is one pixel: the bottom limit, above 0.001.
  EXPECT_DOUBLE_EQ(pane.ZoomMin(), 0.002);
  EXPECT_DOUBLE_EQ(pane.ZoomMax(), 16.0) << "1073741823 / 500 is far above the layout's 16";
  ExpectZooms(Walk(pane, false),
              {2.0 / 3, 0.5, 1.0 / 3, 0.25, 0.125, 0.0625, 0.025, 0.01, 0.005, 0.002});
  EXPECT_FALSE(pane.CanZoomOut());
  ExpectZooms(Walk(pane, true), {0.005, 0.01, 0.025, 0.0625, 0.125, 0.25, 1.0 / 3, 0.5, 2.0 / 3, 1,
                                 2, 3, 4, 6, 8, 10, 12, 16});
  EXPECT_FALSE(pane.CanZoomIn());

  // A layout maximum between two steps is a step of its own.
  pane.SetZoomLimits(0.001, 12.5);
  EXPECT_DOUBLE_EQ(pane.Zoom(), 12.5) << "the zoom is kept in the new limits";
  EXPECT_TRUE(pane.ZoomOut());
  EXPECT_DOUBLE_EQ(pane.Zoom(), 12.0);
  EXPECT_TRUE(pane.ZoomIn());
  EXPECT_DOUBLE_EQ(pane.Zoom(), 12.5);

  // A one-pixel picture cannot be made smaller.
  pane.SetDocumentSize({1, 1});
  EXPECT_DOUBLE_EQ(pane.ZoomMin(), 1.0);
}

TEST(ZoomPane, BigCoordinatesCapThePictureAt32000Pixels) {
  CZoomPane big(CObjID(), nullptr, CRect{0, 0, 400, 300}, kView_BigCoordinates);
  big.SetZoomLimits(0.001, 16.0);
  big.SetDocumentSize({4000, 3000});
  EXPECT_DOUBLE_EQ(big.ZoomMax(), 8.0) << "32000 / 4000";
  EXPECT_TRUE(big.SetZoom(6.0));
  ExpectZooms(Walk(big, true), {8.0});

  CZoomPane plain(CObjID(), nullptr, CRect{0, 0, 400, 300});
  plain.SetZoomLimits(0.001, 1e6);
  plain.SetDocumentSize({4000, 3000});
  EXPECT_DOUBLE_EQ(plain.ZoomMax(), 1073741823.0 / 4000);
  EXPECT_TRUE(plain.SetZoom(1e9));
  EXPECT_EQ(plain.PictureRect().Width(), 1073741823) << "the largest picture still fits";
}

TEST(ZoomPane, SetZoomKeepsTheGivenPointWhereItIsOnScreen) {
  Listener root;
  CZoomPane* pane = new CZoomPane(CObjID(), &root, CRect{50, 40, 450, 340});
  pane->SetDocumentSize({2000, 1500});
  pane->SetZoom(0.5);
  pane->ScrollTo({200, 100});
  ASSERT_EQ(pane->Image().left, 200);

  const CPointF at{pane->Image().left + 100.0, pane->Image().top + 80.0};
  const CPointF picturePoint = pane->ViewToImage(at);
  EXPECT_DOUBLE_EQ(picturePoint.x, 600.0) << "(200 + 100) / 0.5";
  const auto onScreen = [&] {
    const CPointF v = pane->ImageToView(picturePoint);
    return CPointF{v.x - pane->Image().left + pane->Frame().left,
                   v.y - pane->Image().top + pane->Frame().top};
  };
  const CPointF before = onScreen();
  EXPECT_TRUE(pane->SetZoom(2.0, &at));
  const CPointF after = onScreen();
  // The scroll position is whole pixels.
  EXPECT_NEAR(after.x, before.x, 0.5);
  EXPECT_NEAR(after.y, before.y, 0.5);
  EXPECT_EQ(pane->Image().left, 1100) << "600 x 2 - 100, by hand";
  EXPECT_EQ(pane->Image().top, 640) << "360 x 2 - 80";

  pane->SetZoom(1.0);
  EXPECT_FALSE(pane->SetZoom(1.0)) << "the same zoom is no change";
  pane->SetZoom(1000.0);
  EXPECT_DOUBLE_EQ(pane->Zoom(), 16.0);
  pane->SetZoom(0.0);
  EXPECT_DOUBLE_EQ(pane->Zoom(), 0.001) << "1/2000 is below the layout's minimum";
}

TEST(ZoomPane, FitInViewLeavesTheCushionAndCentresThePicture) {
  CZoomPane pane(CObjID(), nullptr, CRect{0, 0, 406, 306});
  pane.SetDocumentSize({1000, 500});
  // 400 / 1000 on x, 300 / 500 on y: x decides.
  EXPECT_DOUBLE_EQ(pane.FitZoom(), 0.4);
  EXPECT_TRUE(pane.FitInView());
  const CRect picture = pane.PictureRect();
  EXPECT_EQ(picture.Width(), 400);
  EXPECT_EQ(picture.Height(), 200);
  // In the frame: 3 at the sides, (306 - 200) / 2 above.
  EXPECT_EQ(picture.left - pane.Image().left, 3);
  EXPECT_EQ(picture.top - pane.Image().top, 53);
  EXPECT_EQ(pane.VisiblePictureRect(), picture);

  pane.SetFitCushion(0);
  EXPECT_DOUBLE_EQ(pane.FitZoom(), 0.406);
  EXPECT_TRUE(pane.ActualPixels());
  EXPECT_DOUBLE_EQ(pane.Zoom(), 1.0);
  // At 100% the centre of the frame shows the picture's centre.
  const CPointF middle = pane.ViewToImage({pane.Image().left + 203.0, pane.Image().top + 153.0});
  EXPECT_NEAR(middle.x, 500.0, 1.0) << "the integer scroll";
  EXPECT_NEAR(middle.y, 250.0, 1.0);
}

TEST(ZoomPane, TheWheelsTenthsGoTowardsTheNextStep) {
  const double lo = 0.001, hi = 16.0;
  // f = (round((z - b) / (a - b) x 10) + 1) / 10, by hand.
  EXPECT_NEAR(CZoomPane::WheelZoom(1.0, true, lo, hi), 1.1, kExact);
  EXPECT_NEAR(CZoomPane::WheelZoom(1.1, true, lo, hi), 1.2, kExact);
  EXPECT_NEAR(CZoomPane::WheelZoom(1.16, true, lo, hi), 1.3, kExact) << "round(1.6) is 2";
  EXPECT_NEAR(CZoomPane::WheelZoom(0.3, true, lo, hi), 0.25 + 0.7 / 12, kExact);
  // Down, measured from the upper step: 1 - 0.1 x (1 - 2/3).
  EXPECT_NEAR(CZoomPane::WheelZoom(1.0, false, lo, hi), 1.0 - 0.1 / 3, kExact);
  EXPECT_NEAR(CZoomPane::WheelZoom(16.0, true, lo, hi), 16.0, kExact) << "nothing above";

  Listener root;
  auto* pane = new CountingPane(CObjID(), &root, CRect{0, 0, 400, 300});
  pane->SetDocumentSize({800, 600});
  pane->zooms = 0;
  CMouseMessage wheel(CObjID(), {200, 150}, 0, 0.0, kModifier_Alt);
  wheel.wheel = 1;
  for (int i = 0; i < 10; ++i) pane->MouseWheel(wheel);
  EXPECT_NEAR(pane->Zoom(), 2.0, kExact) << "ten tenths make the step";
  EXPECT_EQ(pane->zooms, 10);
  EXPECT_TRUE(wheel.IsHandled());
  // The fine wheel takes whole steps.
  wheel.modifiers = kModifier_Alt | CZoomPane::kModifier_HighResolutionWheel;
  wheel.wheel = -1;
  pane->MouseWheel(wheel);
  EXPECT_DOUBLE_EQ(pane->Zoom(), 1.0);
  // A disabled pane does not zoom.
  pane->SetEnabled(false);
  pane->MouseWheel(wheel);
  EXPECT_DOUBLE_EQ(pane->Zoom(), 1.0);
}

TEST(ZoomPane, TheWheelWithoutAltScrollsAndEveryChangeIsReported) {
  Listener root;
  auto* pane = new CountingPane(CObjID(), &root, CRect{0, 0, 400, 300});
  pane->SetDocumentSize({800, 600});
  EXPECT_EQ(root.Count(CZoomPane::ZoomChangedName()), 0) << "1.0 is where it started";
  const CRect start = pane->Image();
  pane->scrolls = 0;
  root.heard.clear();

  CMouseMessage wheel(CObjID(), {200, 150}, 0, 0.0, 0);
  wheel.wheel = -2;  // towards the user: down
  pane->MouseWheel(wheel);
  EXPECT_EQ(pane->Image().top, start.top + 2 * CZoomPane::kWheelLine);
  EXPECT_EQ(pane->Image().left, start.left);
  wheel.modifiers = kModifier_Shift;
  pane->MouseWheel(wheel);
  EXPECT_EQ(pane->Image().left, start.left + 2 * CZoomPane::kWheelLine);
  EXPECT_DOUBLE_EQ(pane->Zoom(), 1.0);
  EXPECT_EQ(pane->scrolls, 2);
  EXPECT_EQ(root.Count(CZoomPane::ScrollChangedName()), 2);

  pane->ZoomOut();
  EXPECT_EQ(pane->zooms, 1);
  EXPECT_EQ(root.Count(CZoomPane::ZoomChangedName()), 1);
  pane->SetFrame({0, 0, 500, 300});
  EXPECT_EQ(pane->scrolls, 4) << "the zoom moved the view, then the resize";
  // A scroll that goes nowhere tells nobody.
  pane->SetZoom(pane->ZoomMin());
  const int scrolls = pane->scrolls;
  pane->ScrollBy(50, 50);
  EXPECT_EQ(pane->scrolls, scrolls);
}

}  // namespace
}  // namespace Tarsa
