#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "framework/process/CMessageNames.h"
#include "framework/view/CView.h"

namespace Tarsa {
namespace {

CView* Child(CView& parent, const CRect& frame, std::uint32_t binding,
             std::uint32_t options = kView_NoOptions) {
  return new CView(CObjID(), &parent, frame, options, binding);
}

// Each binding follows a parent grown by (100, 60), worked out by hand.
TEST(ViewTree, ChildrenFollowTheirParentsSizeByTheirBindings) {
  CView root(CObjID(), nullptr, CRect{0, 0, 400, 300});
  CView* topLeft = Child(root, {10, 10, 60, 30}, kBind_FixedTopLeft);
  CView* fixed = Child(root, {10, 40, 60, 60}, kBind_Fixed);
  CView* bottomRight = Child(root, {300, 250, 390, 290}, kBind_FixedBottomRight);
  CView* wide = Child(root, {10, 70, 390, 90}, kBind_SizeLeft);
  CView* middle = Child(root, {150, 100, 250, 200}, kBind_FixedMiddle);
  CView* all = Child(root, {5, 5, 395, 295}, kBind_Sizeable);
  CView* grandchild = Child(*all, {300, 100, 380, 120}, kBind_FixedRight);

  root.SetFrame(CRect{0, 0, 500, 360});

  EXPECT_EQ(topLeft->Frame(), (CRect{10, 10, 60, 30}));
  EXPECT_EQ(fixed->Frame(), (CRect{10, 40, 60, 60}));
  EXPECT_EQ(bottomRight->Frame(), (CRect{400, 310, 490, 350}));
  EXPECT_EQ(wide->Frame(), (CRect{10, 70, 490, 90}));
  EXPECT_EQ(middle->Frame(), (CRect{200, 130, 300, 230}));
  EXPECT_EQ(all->Frame(), (CRect{5, 5, 495, 355}));
  EXPECT_EQ(grandchild->Frame(), (CRect{400, 100, 480, 120})) << "follows its own parent's growth";

  // Shrinking back restores every frame.
  root.SetFrame(CRect{0, 0, 400, 300});
  EXPECT_EQ(bottomRight->Frame(), (CRect{300, 250, 390, 290}));
  EXPECT_EQ(middle->Frame(), (CRect{150, 100, 250, 200}));
  EXPECT_EQ(grandchild->Frame(), (CRect{300, 100, 380, 120}));
}

TEST(ViewTree, ScrollLimitsKeepASmallContentWhereItsBindingSays) {
  // A frame 100 wide over a content 61 wide: centred, rounding toward zero.
  CView centred(CObjID(), nullptr, CRect{0, 0, 100, 50}, kView_NoOptions, kBind_Scrollable, 61, 50);
  EXPECT_EQ(centred.Limits().left, -19);
  EXPECT_EQ(centred.Limits().right, 81);
  EXPECT_EQ(centred.Image().left, -19) << "the image is brought inside the limits";

  CView left(CObjID(), nullptr, CRect{0, 0, 100, 50}, kView_NoOptions,
             kBind_Scrollable | kBind_LimitLeft, 61, 50);
  EXPECT_EQ(left.Limits(), (CRect{0, 0, 100, 50}));
  CView right(CObjID(), nullptr, CRect{0, 0, 100, 50}, kView_NoOptions,
              kBind_Scrollable | kBind_LimitRight, 61, 50);
  EXPECT_EQ(right.Limits().left, -39);
  EXPECT_EQ(right.Limits().right, 61);

  // Without the scroll bits the limits and the content are the image.
  CView still(CObjID(), nullptr, CRect{0, 0, 100, 50}, kView_NoOptions, kBind_Fixed, 300, 300);
  EXPECT_EQ(still.Content(), still.Image());

  // A large content scrolls within it, and no further.
  CView big(CObjID(), nullptr, CRect{0, 0, 100, 50}, kView_NoOptions, kBind_Scrollable, 300, 200);
  big.ScrollTo({250, -10});
  EXPECT_EQ(big.Image(), (CRect{200, 0, 300, 50}));
  big.ScrollBy(-30, 170);
  EXPECT_EQ(big.Image(), (CRect{170, 150, 270, 200}));
}

TEST(ViewTree, OptionWordsSetTheirFlagsAndTheStepsBelowThem) {
  EXPECT_EQ(ViewFlagsOf(kView_NoOptions), kViewFlag_Visible | kViewFlag_Enabled);
  EXPECT_EQ(
      ViewFlagsOf(kView_TabStop) & (kViewFlag_Target | kViewFlag_Bullseye | kViewFlag_TabStop),
      kViewFlag_Target | kViewFlag_Bullseye | kViewFlag_TabStop);
  EXPECT_EQ(ViewFlagsOf(kView_Bullseye) & kViewFlag_TabStop, 0u);
  EXPECT_EQ(ViewFlagsOf(kView_Invisible | kView_Disabled) & (kViewFlag_Visible | kViewFlag_Enabled),
            0u);
  EXPECT_EQ(ViewFlagsOf(kView_SupressSurrenders),
            kViewFlag_Visible | kViewFlag_Enabled | 0x400000u);
  EXPECT_EQ(kBind_FixedTopLeft, 48u);
  EXPECT_EQ(kBind_LimitTopMiddle, kBind_LimitTop);
  EXPECT_EQ(kBind_ScrollBottomRight, 13056u);
}

// A view that records the mouse-downs it takes.
class Recorder : public CView {
 public:
  Recorder(CView* parent, const CRect& frame, std::vector<std::string>& log, std::string name)
      : CView(CObjID(), parent, frame), log_(log), name_(std::move(name)) {}
  void MouseDown(CMouseMessage& message) override {
    log_.push_back(name_ + "@" + std::to_string(message.where.x) + "," +
                   std::to_string(message.where.y));
    message.SetHandled();
  }

 private:
  std::vector<std::string>& log_;
  std::string name_;
};

TEST(ViewTree, TheMouseGoesToTheFrontmostLiveViewUnderIt) {
  std::vector<std::string> log;
  Recorder root(nullptr, CRect{0, 0, 200, 200}, log, "root");
  auto* back = new Recorder(&root, CRect{10, 10, 110, 110}, log, "back");
  auto* front = new Recorder(&root, CRect{60, 60, 160, 160}, log, "front");
  // A scrolled child: its own space starts at 40 under its frame's edge.
  auto* scrolled = new CView(CObjID(), &root, CRect{0, 170, 200, 200}, kView_NoOptions,
                             kBind_Scrollable, 400, 30);
  scrolled->ScrollTo({40, 0});
  new Recorder(scrolled, CRect{50, 0, 70, 30}, log, "inner");

  const auto click = [&](std::int32_t x, std::int32_t y) {
    CMouseMessage message(CMessageNames::Get().mouseDown, CPoint{x, y}, 1, 0.0, 0);
    root.DispatchMouse(message);
  };
  click(80, 80);   // both; the later one is in front
  click(20, 20);   // only the back one
  click(180, 20);  // no child
  click(15, 175);  // 15 + 40 = 55 in the scrolled space: the inner view
  front->SetEnabled(false);
  click(80, 80);  // a disabled view lets the one behind it have the mouse
  EXPECT_EQ(log, (std::vector<std::string>{"front@20,20", "back@10,10", "root@180,20", "inner@5,5",
                                           "back@70,70"}));
  EXPECT_EQ(back->LocalToWindow(CPoint{0, 0}), (CPoint{10, 10}));
  EXPECT_EQ(scrolled->WindowToLocal(CPoint{15, 175}), (CPoint{55, 5}));
}

}  // namespace
}  // namespace Tarsa
