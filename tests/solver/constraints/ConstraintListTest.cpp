#include "solver/constraints/ConstraintList.h"

#include <gtest/gtest.h>

#include <algorithm>

#include "solver/constraints/ConstraintBlobAdapter.h"
#include "solver/constraints/LineConstraint.h"
#include "solver/constraints/PlaneConstraint.h"
#include "solver/constraints/TraceConstraint.h"
#include "tests/solver/constraints/ConstraintScene.h"

namespace Project {
namespace {

LineConstraint& AddLine(ConstraintList& list, Point2f a, Point2f b) {
  auto owned = std::make_unique<LineConstraint>(a, b);
  LineConstraint& line = *owned;
  list.Add(std::move(owned));
  return line;
}

std::vector<std::int32_t> Ids(const ConstraintList& list) {
  std::vector<std::int32_t> ids;
  for (const auto& item : list.Items()) ids.push_back(item->GetId());
  return ids;
}

std::vector<std::int32_t> RecordIds(Solver& solver) {
  std::vector<std::int32_t> ids;
  for (const LineRecord& record : solver.GetLines()->GetLines()) ids.push_back(record.id);
  return ids;
}

// Ids come from a counter that never goes back: not after a removal, not
// after removing everything; the records follow the items by id, and an
// undo's clone or replacement keeps the id it had.
TEST(ConstraintList, IdsAreNeverReused) {
  ConstraintScene scene;
  ConstraintList& list = scene.list;
  AddLine(list, {100, 100}, {500, 120});
  LineConstraint& middle = AddLine(list, {100, 205}, {500, 225});
  AddLine(list, {100, 300}, {500, 320});
  const auto held = middle.CloneLine();
  list.Select(middle.GetId());
  list.Remove(middle);
  EXPECT_EQ(Ids(list), (std::vector<std::int32_t>{0, 2}));
  EXPECT_EQ(RecordIds(scene.solver()), (std::vector<std::int32_t>{0, 2}));
  EXPECT_TRUE(list.Selected().empty());
  EXPECT_EQ(AddLine(list, {100, 250}, {500, 250}).GetId(), 3);

  // The undo of the removal puts the same id back.
  EXPECT_TRUE(list.AddClone(*held));
  EXPECT_EQ(Ids(list), (std::vector<std::int32_t>{0, 2, 3, 1}));
  EXPECT_EQ(RecordIds(scene.solver()), (std::vector<std::int32_t>{0, 2, 3, 1}));

  // A replacement takes the place and id of the old item, which comes back.
  Constraint& first = *list.Items().front();
  auto old =
      list.ReplaceItem(first, std::make_unique<LineConstraint>(Point2f{50, 50}, Point2f{550, 60}));
  ASSERT_EQ(old.get(), &first);
  EXPECT_EQ(Ids(list), (std::vector<std::int32_t>{0, 2, 3, 1}));
  EXPECT_EQ(RecordIds(scene.solver()), (std::vector<std::int32_t>{0, 2, 3, 1}));

  list.RemoveAll();
  EXPECT_TRUE(scene.solver().GetLines()->GetLines().empty());
  EXPECT_EQ(AddLine(list, {100, 100}, {500, 120}).GetId(), 4);
}

// Two lines with the same ends, each with its own id and record: the first
// in the list wins a click, unless the other is selected.
TEST(ConstraintList, FindAtPrefersTheSelected) {
  ConstraintScene scene;
  ConstraintList& list = scene.list;
  LineConstraint& under = AddLine(list, {100, 100}, {500, 300});
  LineConstraint& over = AddLine(list, {100, 100}, {500, 300});
  LineConstraint& apart = AddLine(list, {100, 350}, {500, 350});
  scene.UpdateAll();
  EXPECT_EQ(RecordIds(scene.solver()), (std::vector<std::int32_t>{0, 1, 2}));
  const Point2f onBoth{300, 201};
  EXPECT_EQ(list.FindAt(onBoth, false, 3.0f), &under);
  list.SelectOnly(over);
  EXPECT_EQ(list.FindAt(onBoth, false, 3.0f), &over);
  // A selection that is not hit gives way to the list order.
  list.SelectOnly(apart);
  EXPECT_EQ(list.FindAt(onBoth, false, 3.0f), &under);
  EXPECT_EQ(list.FindAt({300, 100}, false, 3.0f), nullptr);
}

// The rotation grips of a selected line through the middle of the photo,
// from M = (300, 203) and A = (200, 203): 0.6 L out along the line's angle,
// L = 100, or 120 / zoom when L * zoom is 60 or less.
TEST(ConstraintList, PickRotationHandle) {
  ConstraintScene scene;
  ConstraintList& list = scene.list;
  LineConstraint& line = AddLine(list, {200, 203}, {400, 203});
  line.SetOrientation(scene.solver(), LineConstraint::kHorizontal, 0);
  scene.UpdateAll();
  std::int32_t cursor = 0;
  EXPECT_EQ(list.PickRotationHandle({360, 204}, 3.0f, 1.0f, cursor), nullptr);  // not selected
  list.Select(line.GetId());
  // M is read off the traced curve: the trace's half pixel, within 3.
  EXPECT_EQ(list.PickRotationHandle({360, 204}, 3.0f, 1.0f, cursor), &line);
  EXPECT_EQ(cursor, 26059);
  EXPECT_EQ(list.PickRotationHandle({240, 202}, 3.0f, 1.0f, cursor), &line);
  EXPECT_EQ(cursor, 26057);
  EXPECT_EQ(list.PickRotationHandle({300, 203}, 3.0f, 1.0f, cursor), nullptr);
  // Zoomed out to 0.5, L = 240.
  EXPECT_EQ(list.PickRotationHandle({444, 203}, 3.0f, 0.5f, cursor), &line);
  EXPECT_EQ(list.PickRotationHandle({360, 203}, 3.0f, 0.5f, cursor), nullptr);
  line.SetOrientation(scene.solver(), LineConstraint::kVertical, 0);
  EXPECT_EQ(list.PickRotationHandle({300, 262}, 3.0f, 1.0f, cursor), &line);
  EXPECT_EQ(cursor, 26058);

  FindLineRecord(scene.solver(), line.GetId())->active = false;
  EXPECT_EQ(list.PickRotationHandle({300, 262}, 3.0f, 1.0f, cursor), nullptr);
}

// List to blob to another list: the same ends, kinds, angles and corners,
// with fresh ids from the reading list's counter, traced by the warp build.
TEST(ConstraintList, BlobRoundTrip) {
  SceneContext context(PSettings::kModelPerspective, ConstraintScene::kFocal);
  ConstraintList source(context);
  const std::int32_t kinds[] = {1, 2, 3, 4};
  for (int k = 0; k < 4; ++k) {
    auto line = std::make_unique<LineConstraint>(Point2f{10.5f + k, 20}, Point2f{300, 40.25f * k});
    line->StoreOrientation(kinds[k], k == 3 ? 30.0f : 0.0f);
    source.Append(std::move(line));
  }
  auto polygon = std::make_unique<PlaneConstraint>();
  polygon->AddCorner({200, 120}, 2);
  polygon->AddCorner({400, 130}, 1);
  polygon->AddCorner({310, 280}, 3);
  source.Append(std::move(polygon));
  const std::vector<std::uint8_t> blob = ConstraintBlobAdapter::WriteBlob(source);
  EXPECT_EQ(blob.size(), source.TotalSerializedSize());
  EXPECT_EQ(blob.size(), 4u * 28u + 8u + 3u * 12u);

  ConstraintList target(context);
  target.Append(std::make_unique<LineConstraint>());
  ConstraintBlobAdapter::ReadBlob(target, blob.data(), blob.size());
  ASSERT_EQ(target.Items().size(), 5u);
  EXPECT_EQ(Ids(target), (std::vector<std::int32_t>{1, 2, 3, 4, 5}));
  for (int k = 0; k < 4; ++k) {
    const auto& from = static_cast<const LineConstraint&>(*source.Items()[k]);
    const auto* to = dynamic_cast<const LineConstraint*>(target.Items()[k].get());
    ASSERT_NE(to, nullptr);
    EXPECT_EQ(to->GetStart(), from.GetStart());
    EXPECT_EQ(to->GetEnd(), from.GetEnd());
    float fromAngle, toAngle;
    EXPECT_EQ(to->GetOrientation(&toAngle), from.GetOrientation(&fromAngle));
    EXPECT_EQ(toAngle, fromAngle) << k;
  }
  const auto* plane = dynamic_cast<const PlaneConstraint*>(target.Items()[4].get());
  ASSERT_NE(plane, nullptr);
  const auto& corners = plane->GetCorners();
  ASSERT_EQ(corners.size(), 3u);
  EXPECT_EQ(corners[1].x, 400.0f);
  EXPECT_EQ(corners[1].y, 130.0f);
  EXPECT_EQ(plane->GetEdgeOrientation(0), 2);
  EXPECT_EQ(plane->GetEdgeOrientation(2), 3);

  // A scripted run traces what the blob brought when it builds its warp.
  Solver& solver = target.GetSolver();
  solver.RebuildGrid(false);
  EXPECT_EQ(RecordIds(solver), (std::vector<std::int32_t>{1, 2, 3, 4}));
  EXPECT_EQ(FindLineRecord(solver, 3)->fixedNormal, (std::array<float, 2>{1, 0}));
  ASSERT_EQ(solver.GetLines()->GetPlanes().size(), 1u);
  EXPECT_EQ(solver.GetLines()->GetPlanes()[0].id, 5);
}

}  // namespace
}  // namespace Project
