#include <gtest/gtest.h>

#include <string>

#include "framework/layout/CViewProxy.h"
#include "framework/layout/CZilGenerator.h"

// Layouts of classes with no builder (their own content needs no room), so
// every size comes from the file and each rectangle below is worked out by
// hand from the measuring and placing rules.
namespace Tarsa {
namespace {

std::unique_ptr<CViewProxy> Layout(const std::string& text) {
  CZilGenerator generator;
  return generator.Layout(text);
}

void ExpectFrame(const CViewProxy& proxy, CRect expected) {
  EXPECT_EQ(proxy.frame.left, expected.left) << proxy.ClassName();
  EXPECT_EQ(proxy.frame.top, expected.top) << proxy.ClassName();
  EXPECT_EQ(proxy.frame.right, expected.right) << proxy.ClassName();
  EXPECT_EQ(proxy.frame.bottom, expected.bottom) << proxy.ClassName();
}

TEST(ZilLayout, ColumnWithMarginsSpacingAndAcrossAlignment) {
  const auto root = Layout(
      "W(margin: 10, spacing: 5) {\n"
      "  A(width: 100, height: 20);\n"
      "  B(width: 60, height: 30);\n"
      "  C(width: 40, height: 10, horizontal: align_right);\n"
      "  D(width: 40, height: 10, horizontal: align_center);\n"
      "  E(width: 40, height: 10, horizontal: align_fill, left_offset: 3);\n"
      "  F(width: 40, height: 10, left_offset: 3);\n"
      "}");
  // Inner: 100 wide; 20 + 30 + 4 x 10 + 5 x 5 = 115 high.
  EXPECT_EQ(root->measuredWidth, 120);
  EXPECT_EQ(root->measuredHeight, 135);
  ExpectFrame(*root, {0, 0, 120, 135});
  ExpectFrame(*root->children[0], {10, 10, 110, 30});
  ExpectFrame(*root->children[1], {10, 35, 70, 65});
  ExpectFrame(*root->children[2], {70, 70, 110, 80});
  ExpectFrame(*root->children[3], {40, 85, 80, 95});
  ExpectFrame(*root->children[4], {10, 100, 110, 110});
  ExpectFrame(*root->children[5], {13, 115, 53, 125});
}

TEST(ZilLayout, ColumnSharesExtraHeightAndKeepsBottomViewsDown) {
  const auto root = Layout(
      "W(height: 100) {\n"
      "  A(width: 50, height: 20, vertical: align_fill);\n"
      "  B(width: 50, height: 20);\n"
      "  C(width: 50, height: 10, vertical: align_bottom);\n"
      "}");
  // Free 100 - 50 = 50 between A (fill) and B (centre, the default): 25
  // each. C stands on the bottom.
  ExpectFrame(*root->children[0], {0, 0, 50, 45});
  ExpectFrame(*root->children[1], {0, 57, 50, 77});
  ExpectFrame(*root->children[2], {0, 90, 50, 100});
}

TEST(ZilLayout, RowMeetsInsetLinesAndKeepsSpacing) {
  const auto root = Layout(
      "W(placement: place_row, margin_width: 8, margin_height: 4, spacing: 6) {\n"
      "  A(width: 40, height: 20, top_inset: 15);\n"
      "  B(width: 30, height: 30, top_inset: 10);\n"
      "  C(width: 20, height: 10, vertical: align_bottom);\n"
      "}");
  // Width 40 + 30 + 20 + 2 x 6 + 2 x 8; the inset line 15 down, 20 below.
  EXPECT_EQ(root->measuredWidth, 118);
  EXPECT_EQ(root->measuredHeight, 43);
  ExpectFrame(*root->children[0], {8, 4, 48, 24});
  ExpectFrame(*root->children[1], {54, 9, 84, 39});
  ExpectFrame(*root->children[2], {90, 29, 110, 39});
}

TEST(ZilLayout, ColumnLinesUpLabelsAndRowsTakeTheirFirstLabel) {
  const auto root = Layout(
      "W() {\n"
      "  R(placement: place_row, margin_left: 5) {\n"
      "    L(label_width: 30, width: 30, height: 10);\n"
      "    F(width: 50, height: 10);\n"
      "  }\n"
      "  A(label_width: 50, width: 120, height: 10);\n"
      "  B(label_width: 80, width: 100, height: 10);\n"
      "  C(width: 90, height: 10);\n"
      "}");
  // Labels: 35 (the row's: margin 5 + 30), 50, 80; edge 80. Rests: 50, 70,
  // 20; the widest 70. Width 80 + 70 = 150.
  EXPECT_EQ(root->measuredWidth, 150);
  const CViewProxy& row = *root->children[0];
  ExpectFrame(row, {0, 0, 130, 10});
  EXPECT_EQ(row.finalLabelWidth, 80);
  // The row's first view widens by 45 to meet the edge.
  ExpectFrame(*row.children[0], {5, 0, 80, 10});
  EXPECT_EQ(row.children[0]->finalLabelWidth, 75);
  ExpectFrame(*row.children[1], {80, 0, 130, 10});
  ExpectFrame(*root->children[1], {0, 10, 150, 20});
  EXPECT_EQ(root->children[1]->finalLabelWidth, 80);
  ExpectFrame(*root->children[2], {0, 20, 100, 30});
  ExpectFrame(*root->children[3], {0, 30, 90, 40});
}

TEST(ZilLayout, ReverseTurnsTheChildrenRound) {
  const auto root = Layout(
      "W(placement: place_row, reverse: true) { A(width: 10, height: 5); B(width: 20, height: 5); "
      "}");
  EXPECT_EQ(root->children[0]->ClassName(), "B");
  ExpectFrame(*root->children[0], {0, 0, 20, 5});
  ExpectFrame(*root->children[1], {20, 0, 30, 5});
}

TEST(ZilLayout, SpacingDefaultsToGSpaceOfTheEnclosingBlocks) {
  const auto root = Layout(
      "gSpace = 7;\n"
      "W() {\n"
      "  A(width: 10, height: 10);\n"
      "  P() { gSpace = 2; B(width: 10, height: 10); C(width: 10, height: 10); }\n"
      "}");
  ExpectFrame(*root->children[1], {0, 17, 10, 39});
  ExpectFrame(*root->children[1]->children[1], {0, 12, 10, 22});
}

TEST(ZilLayout, OutsetsOverlapAndLimitsHold) {
  const auto root = Layout(
      "W() {\n"
      "  A(width: 20, height: 10, outset: 2);\n"
      "  B(width: 20, height: 10);\n"
      "  T(height: 50, max_height: 30, width: 5);\n"
      "}");
  // A counts as 16 x 6 in the sums and reaches 2 beyond its slot.
  ExpectFrame(*root->children[0], {-2, -2, 18, 8});
  ExpectFrame(*root->children[1], {0, 6, 20, 16});
  ExpectFrame(*root->children[2], {0, 16, 5, 46});
  EXPECT_EQ(root->measuredHeight, 46);
}

TEST(ZilLayout, OffscreenChildrenLieOnEachOther) {
  const auto root = Layout(
      "W(placement: place_offscreen, margin: 3) {\n"
      "  A(width: 40, height: 10);\n"
      "  B(width: 20, height: 30, horizontal: align_center, vertical: align_top);\n"
      "}");
  EXPECT_EQ(root->measuredWidth, 46);
  EXPECT_EQ(root->measuredHeight, 36);
  ExpectFrame(*root->children[0], {3, 3, 43, 33});
  ExpectFrame(*root->children[1], {13, 3, 33, 33});
}

TEST(ZilLayout, CushionAddsRoomAroundTheView) {
  const auto root = Layout("W() { A(width: 20, height: 10, cushion_x: 4, cushion_top: 1); }");
  ExpectFrame(*root->children[0], {0, 0, 28, 11});
  const CRect view = root->children[0]->ViewFrame();
  EXPECT_EQ(view.left, 4);
  EXPECT_EQ(view.top, 1);
  EXPECT_EQ(view.right, 24);
  EXPECT_EQ(view.bottom, 11);
}

}  // namespace
}  // namespace Tarsa
