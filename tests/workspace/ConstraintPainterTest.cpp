#include "workspace/ConstraintPainter.h"

#include <gtest/gtest.h>

#include <cmath>
#include <set>

#include "solver/constraints/LineConstraint.h"
#include "solver/constraints/PlaneConstraint.h"
#include "solver/constraints/TraceConstraint.h"
#include "tests/solver/constraints/ConstraintScene.h"
#include "tests/workspace/DrawnImage.h"
#include "workspace/MeshPainter.h"

namespace Project {
namespace {

using testing::DrawnImage;
using testing::ExpectColour;

LineConstraint& AddLine(ConstraintScene& scene, Point2f a, Point2f b,
                        std::int32_t orientation = LineConstraint::kUnfixed, float angle = 0) {
  auto owned = std::make_unique<LineConstraint>(a, b);
  LineConstraint& line = *owned;
  scene.list.Add(std::move(owned));
  line.SetOrientation(scene.solver(), orientation, angle);
  return line;
}

// The preview is 600 x 400 and the source is shown: view points are window
// pixels at the identity transform.
DrawnImage DrawList(ConstraintScene& scene, bool bandActive = false) {
  scene.UpdateAll();
  DrawnImage image(600, 400);
  ConstraintPainter(scene.list, {}).Draw(image.Port(), bandActive);
  image.Read();
  return image;
}

DrawnImage::Pixel Strongest(const DrawnImage& image, Point2f p, int reach = 2) {
  return image.Strongest(p.x, p.y, reach);
}

Point2f Lerp(Point2f a, Point2f b, float t) {
  return {a.x + (b.x - a.x) * t, a.y + (b.y - a.y) * t};
}

// A pinhole photo shows each traced line on its chord (within the trace's
// half pixel): along it, each line shows the colour of its orientation.
TEST(ConstraintPainter, CurvesTakeTheirOrientationsColour) {
  ConstraintScene scene;
  const PSettings& colours = scene.context.settings;
  struct Case {
    Point2f a, b;
    std::int32_t orientation;
    std::uint32_t colour;
  };
  const Case cases[] = {
      {{100, 100}, {250, 100}, LineConstraint::kHorizontal, colours.colorHorizontal},
      {{450, 60}, {450, 180}, LineConstraint::kVertical, colours.colorVertical},
      {{100, 250}, {250, 330}, LineConstraint::kUnfixed, colours.colorUnfixed},
      {{350, 250}, {500, 330}, LineConstraint::kArbitrary, colours.colorFixed},
  };
  for (const Case& c : cases) AddLine(scene, c.a, c.b, c.orientation, 28.0f);
  const DrawnImage image = DrawList(scene);
  for (const Case& c : cases) {
    for (const float t : {0.1f, 0.5f, 0.9f}) {
      SCOPED_TRACE(::testing::Message() << "orientation " << c.orientation << " at " << t);
      ExpectColour(Strongest(image, Lerp(c.a, c.b, t)), c.colour);
    }
  }
  // Away from every line nothing is drawn.
  EXPECT_EQ(Strongest(image, {175, 180}, 5).a, 0);
}

// A failed trace is the straight segment between the ends in the invalid
// colour, dashed 4 on and 2 off from the first end; on a pixel row's centre
// and with the dashes on whole pixels, coverage is exact.
TEST(ConstraintPainter, AFailedLineIsDashedInTheInvalidColour) {
  ConstraintScene scene;
  LineConstraint& line = AddLine(scene, {100, 330.5f}, {160, 330.5f});
  scene.UpdateAll();
  FindLineRecord(scene.solver(), line.GetId())->active = false;
  DrawnImage image(600, 400);
  ConstraintPainter(scene.list, {}).Draw(image.Port(), false);
  image.Read();
  for (int x = 100; x < 160; ++x) {
    const DrawnImage::Pixel p = image.At(x, 330);
    if ((x - 100) % 6 < 4) {
      EXPECT_EQ(p.a, 255) << x;
      EXPECT_EQ(p.Rgb(), scene.context.settings.colorInvalid & 0xFFFFFF) << x;
    } else {
      EXPECT_EQ(p.a, 0) << x;
    }
    EXPECT_EQ(image.At(x, 329).a, 0) << x;
  }
}

// End handles: an 8-pixel square about each end, a black ring round white,
// opaque for the selected line and half for the hovered one; the selected
// line alone shows its gadget (a grey circle of 0.6 L = 60 about the middle,
// round grips on it).
TEST(ConstraintPainter, HandlesAreWhiteWithABlackOutline) {
  ConstraintScene scene;
  LineConstraint& selected = AddLine(scene, {200, 150}, {400, 150}, LineConstraint::kHorizontal);
  LineConstraint& hovered = AddLine(scene, {200, 320}, {400, 320}, LineConstraint::kHorizontal);
  scene.list.SelectOnly(selected);
  scene.list.SetHoverId(hovered.GetId());
  const DrawnImage image = DrawList(scene);

  for (const auto& [x, y] : {std::pair{196, 150}, {203, 150}, {200, 146}, {200, 153}}) {
    EXPECT_EQ(image.At(x, y).a, 255) << x << "," << y;
    EXPECT_EQ(image.At(x, y).Rgb(), 0u) << x << "," << y;
  }
  for (const auto& [x, y] : {std::pair{197, 147}, {200, 150}, {202, 152}}) {
    EXPECT_EQ(image.At(x, y).a, 255) << x << "," << y;
    EXPECT_EQ(image.At(x, y).Rgb(), 0xFFFFFFu) << x << "," << y;
  }
  EXPECT_EQ(image.At(195, 150).a, 0);
  EXPECT_EQ(image.At(200, 145).a, 0);
  // Half opacity: 0.5 of 255, rounded.
  EXPECT_EQ(image.At(198, 317).a, 128);
  EXPECT_EQ(image.At(198, 317).Rgb(), 0xFFFFFFu);
  EXPECT_EQ(image.At(196, 322).a, 128);
  EXPECT_EQ(image.At(196, 317).a, 128);
  EXPECT_EQ(image.At(196, 317).Rgb(), 0u);

  // The gadget: the circle's top, a grip at M + 60 along the line.
  ExpectColour(Strongest(image, {300, 90}, 1), 0x808080);
  EXPECT_EQ(image.At(360, 150).Rgb(), 0xFFFFFFu);
  EXPECT_EQ(Strongest(image, {300, 260}, 2).a, 0);  // none for the hovered line
}

// The selected line's box, worked by hand from the line (200, 150) to
// (400, 150): end handles 3.5 across and the gadget's circle of radius 60
// up and down, each with half its 1-pixel pen; M comes off the traced
// curve, within the trace's half pixel. A transform moves the line but not
// the handles' sizes; the circle grows with L.
TEST(ConstraintPainter, TheSelectionsBoxByHand) {
  ConstraintScene scene;
  LineConstraint& line = AddLine(scene, {200, 150}, {400, 150}, LineConstraint::kHorizontal);
  AddLine(scene, {100, 300}, {500, 320});
  scene.UpdateAll();
  EXPECT_TRUE(ConstraintPainter(scene.list, {}).Measure(true, false).IsEmpty());
  scene.list.SelectOnly(line);

  const ScreenBounds plain = ConstraintPainter(scene.list, {}).Measure(true, false);
  EXPECT_NEAR(plain.left, 196.0f, 0.5f);
  EXPECT_NEAR(plain.right, 404.0f, 0.5f);
  EXPECT_NEAR(plain.top, 89.5f, 0.5f);
  EXPECT_NEAR(plain.bottom, 210.5f, 0.5f);

  // Window = view * 2 + (10, 20) - (5, 5): the line runs from (405, 315) to
  // (805, 315), L = 200, the circle's radius 120.
  const ScreenTransform screen{2.0f, 10.0f, 20.0f, 5.0f, 5.0f};
  const ScreenBounds moved = ConstraintPainter(scene.list, screen).Measure(true, false);
  EXPECT_NEAR(moved.left, 401.0f, 1.0f);  // the trace's half pixel, doubled
  EXPECT_NEAR(moved.right, 809.0f, 1.0f);
  EXPECT_NEAR(moved.top, 194.5f, 1.0f);
  EXPECT_NEAR(moved.bottom, 435.5f, 1.0f);

  // The whole list reaches the other line's ends too.
  const ScreenBounds all = ConstraintPainter(scene.list, {}).Measure(false, false);
  EXPECT_NEAR(all.left, 99.5f, 0.5f);
  EXPECT_NEAR(all.bottom, 320.5f, 0.5f);
}

// Measuring runs the drawing's own geometry: in every scene below the
// measured box holds every pixel drawn, and each of its sides has drawn
// pixels within a pixel of it.
void ExpectTight(const ScreenBounds& measured, const DrawnImage& image) {
  const DrawnImage::Box drawn = image.DrawnBox();
  ASSERT_FALSE(drawn.empty);
  ASSERT_FALSE(measured.IsEmpty());
  EXPECT_LE(std::floor(measured.left), drawn.left);
  EXPECT_LE(std::floor(measured.top), drawn.top);
  EXPECT_GE(std::ceil(measured.right), drawn.right);
  EXPECT_GE(std::ceil(measured.bottom), drawn.bottom);
  // A pen's outermost sliver can cover too little of a pixel to show.
  EXPECT_LE(drawn.left, measured.left + 1.0f);
  EXPECT_LE(drawn.top, measured.top + 1.0f);
  EXPECT_GE(drawn.right, measured.right - 1.0f);
  EXPECT_GE(drawn.bottom, measured.bottom - 1.0f);
}

TEST(ConstraintPainter, TheMeasuredBoxIsTheDrawnBox) {
  const ScreenTransform screen{0.75f, 30.0f, 12.0f, 4.0f, 0.0f};
  const auto check = [&](ConstraintScene& scene, bool bandActive) {
    scene.UpdateAll();
    DrawnImage image(600, 400);
    ConstraintPainter painter(scene.list, screen);
    painter.Draw(image.Port(), bandActive);
    image.Read();
    ExpectTight(painter.Measure(false, bandActive), image);
  };
  {
    SCOPED_TRACE("a rotated short line, selected");
    ConstraintScene scene;
    LineConstraint& line = AddLine(scene, {220, 230}, {250, 250}, LineConstraint::kArbitrary, 30);
    scene.list.SelectOnly(line);
    scene.list.SetLiveRotation(75.0f);
    check(scene, false);
  }
  {
    SCOPED_TRACE("a hovered polygon and a failed one, selected");
    ConstraintScene scene;
    PlaneConstraint& plane = scene.AddRectangle();
    scene.list.SetHoverId(plane.GetId());
    auto failed = std::make_unique<PlaneConstraint>();
    failed->AddCorner({450, 60}, 1);
    failed->AddCorner({560, 90}, 1);
    failed->AddCorner({480, 150}, 1);
    PlaneConstraint& invalid = *failed;
    scene.list.Add(std::move(failed));
    invalid.SetCorner(scene.solver(), 1, {560, 90}, false);
    scene.list.SelectOnly(invalid);
    check(scene, false);
  }
  {
    SCOPED_TRACE("a fisheye line with its focal handle being dragged");
    ConstraintScene scene(PSettings::kModelFisheye);
    LineConstraint& line = AddLine(scene, {200, 150}, {400, 150});
    scene.list.SelectOnly(line);
    scene.list.SetLiveFocalHandle({310, 262}, false);
    check(scene, false);
  }
  {
    SCOPED_TRACE("a tool's line, out of the list, hovered");
    ConstraintScene scene;
    LineConstraint pending({150, 60}, {420, 110});
    DrawnImage image(600, 400);
    const ScreenBounds measured =
        ConstraintPainter(scene.list, screen).DrawOne(pending, {false, true}, &image.Port());
    image.Read();
    ExpectTight(measured, image);
  }
  {
    SCOPED_TRACE("the polygon being drawn");
    ConstraintScene scene;
    scene.AddDraftPoints({{120, 330}, {260, 370}});
    check(scene, true);
  }
}

// The focal tool's live handle: the arc through the first end, the handle
// and the second end (centre (300, 150), radius 100, by hand), and the
// dashed joint from the middle to the handle in white and black.
TEST(ConstraintPainter, TheLiveFocalHandleShowsItsArcAndJoint) {
  ConstraintScene scene(PSettings::kModelFisheye);
  LineConstraint& line = AddLine(scene, {200, 150}, {400, 150});
  scene.list.SelectOnly(line);
  scene.list.SetLiveFocalHandle({300, 250}, false);
  const DrawnImage image = DrawList(scene);
  const float r = 100.0f / std::sqrt(2.0f);
  for (const Point2f p : {Point2f{300 + r, 150 + r}, Point2f{300 - r, 150 + r}}) {
    ExpectColour(Strongest(image, p, 1), scene.context.settings.colorUnfixed);
  }
  const Point2f middle = line.GetPointAlong(scene.list.Env(), 0.5f);
  std::set<std::uint32_t> joint;
  for (float t = 0.2f; t < 0.8f; t += 0.02f) {
    const DrawnImage::Pixel q = Strongest(image, Lerp(middle, {300, 250}, t), 1);
    if (q.a > 100) joint.insert(q.Rgb() > 0x808080 ? 0xFFFFFFu : 0u);
  }
  EXPECT_EQ(joint, (std::set<std::uint32_t>{0u, 0xFFFFFFu}));
  // The handle is drawn last, on top.
  EXPECT_EQ(image.At(300, 250).Rgb(), 0xFFFFFFu);
  EXPECT_EQ(image.At(296, 250).Rgb(), 0u);
}

// A polygon's edges in their own colours; a selected polygon shows a handle
// at each corner. Once a corner is unusable it is drawn dashed in the
// invalid colour, handles still on.
TEST(ConstraintPainter, PolygonEdgesAndCorners) {
  ConstraintScene scene;
  PlaneConstraint& plane = scene.AddRectangle();
  scene.list.SelectOnly(plane);
  const PSettings& colours = scene.context.settings;
  {
    const DrawnImage image = DrawList(scene);
    ExpectColour(Strongest(image, {250, 120}), colours.colorHorizontal);
    ExpectColour(Strongest(image, {400, 250}), colours.colorUnfixed);
    for (const auto& [x, y] : {std::pair{200, 120}, {400, 120}, {400, 280}, {200, 280}}) {
      EXPECT_EQ(image.At(x, y).Rgb(), 0xFFFFFFu);
      EXPECT_EQ(image.At(x - 4, y).Rgb(), 0u);
    }
  }
  plane.SetCorner(scene.solver(), 2, {400, 280}, false);
  const DrawnImage image = DrawList(scene);
  // The right edge, dashed from (400, 120) down: drawn at 2 below the
  // handle's ring (y = 126 is 6 along, a new dash), skipped at 4 and 5
  // along (y = 124, 125).
  ExpectColour(Strongest(image, {250, 120}), colours.colorInvalid);
  EXPECT_GT(image.At(400, 126).a, 0);
  EXPECT_EQ(image.At(400, 124).a, 0);
  EXPECT_EQ(image.At(400, 125).a, 0);
  EXPECT_EQ(image.At(400, 280).Rgb(), 0xFFFFFFu);
}

// The preview's overlays as the pane stacks them, on a dark picture: the
// mesh, then every kind of constraint; the scene is saved for a look. The
// constraints lie over the mesh: a handle stays white.
TEST(ConstraintPainter, ASceneOverTheMesh) {
  ConstraintScene scene(PSettings::kModelFisheye);
  LineConstraint& selected = AddLine(scene, {120, 60}, {420, 90}, LineConstraint::kHorizontal);
  LineConstraint& hovered = AddLine(scene, {520, 60}, {540, 330}, LineConstraint::kVertical);
  AddLine(scene, {80, 340}, {260, 370});
  LineConstraint& failed = AddLine(scene, {300, 360}, {460, 330});
  scene.AddRectangle();
  scene.UpdateAll();
  FindLineRecord(scene.solver(), failed.GetId())->active = false;
  scene.list.SelectOnly(selected);
  scene.list.SetHoverId(hovered.GetId());
  scene.list.SetLiveRotation(20.0f);

  DrawnImage image(600, 400);
  image.Port().FillRect({0, 0, 600, 400}, 0xFF303030);
  DrawMesh(scene.list.Env(), image.Port(), {}, scene.context.settings.colorMesh);
  ConstraintPainter(scene.list, {}).Draw(image.Port(), false);
  image.Read();
  EXPECT_EQ(image.At(120, 60).Rgb(), 0xFFFFFFu);
  EXPECT_TRUE(image.SaveArtefact("workspace_constraints.png"));
}

// The band is drawn only while a tool shows it.
TEST(ConstraintPainter, TheBandOnlyWhileActive) {
  ConstraintScene scene;
  scene.AddDraftPoints({{120, 330}, {260, 330}});
  EXPECT_EQ(Strongest(DrawList(scene, false), {190, 330}).a, 0);
  ExpectColour(Strongest(DrawList(scene, true), {190, 330}), scene.context.settings.colorUnfixed);
}

}  // namespace
}  // namespace Project
