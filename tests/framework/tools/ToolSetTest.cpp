#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "framework/tools/CTool.h"
#include "framework/view/CView.h"

namespace Tarsa {
namespace {

// A tool that records what reached its own steps, and hands events with Space
// held to another tool (as a hand tool takes over while Space is down).
class Recording : public CTool {
 public:
  Recording(CToolGroup* group, const char* id, std::vector<std::string>& log, CTool* onSpace)
      : CTool(group, CObjID::Intern(id), id), log_(log), onSpace_(onSpace) {}
  CTool* GetOverrideTool(CMouseEvent& event) override {
    if (onSpace_ == nullptr || !event.Has(CMouseEvent::kSpace)) return nullptr;
    event.Set(CMouseEvent::kSpace, false);  // the override sees it without Space
    event.Set(CMouseEvent::kShift, true);
    return onSpace_;
  }

 protected:
  void DoMouseDown(CView& /*view*/, const CMouseEvent& event) override {
    log_.push_back(GetName() + " down " + std::to_string(event.modifiers));
  }
  std::int32_t DoAdjustCursor(CView& /*view*/, const CMouseEvent& /*event*/) override {
    return GetName() == "Hand" ? 26005 : 14000;
  }

 private:
  std::vector<std::string>& log_;
  CTool* onSpace_;
};

class CountingSet : public CToolSet {
 public:
  using CToolSet::CToolSet;
  std::vector<std::string> changes;

 protected:
  void ToolChanged(CTool* now, CToolGroup* /*oldGroup*/, CTool* oldTool) override {
    changes.push_back((oldTool ? oldTool->GetName() : "-") + ">" + now->GetName());
  }
};

TEST(Tools, OverridesTakeTheEventTheyChangedAndChain) {
  std::vector<std::string> log;
  CountingSet set(CObjID::Intern("test/tool/set"));
  CToolGroup hands(&set, CObjID::Intern("test/group/hands"));
  CToolGroup edits(&set, CObjID::Intern("test/group/edits"));
  Recording hand(&hands, "Hand", log, nullptr);
  Recording zoom(&hands, "Zoom", log, &hand);
  Recording line(&edits, "Line", log, &zoom);  // Space: zoom, which hands on to the hand
  CView view(CObjID(), nullptr, CRect{0, 0, 10, 10});

  CMouseEvent event;
  event.modifiers = CMouseEvent::kAlt;
  line.MouseDown(view, event);
  event.Set(CMouseEvent::kSpace, true);
  line.MouseDown(view, event);
  line.AdjustCursor(view, event);
  EXPECT_EQ(log, (std::vector<std::string>{"Line down 2", "Zoom down 10"}))
      << "the zoom tool got the copy its override changed; it had no Space left to hand on";
  EXPECT_EQ(line.Cursor(), 14000);
  event.modifiers = 0;
  line.AdjustCursor(view, event);
  EXPECT_EQ(line.Cursor(), 14000);
  hand.AdjustCursor(view, event);
  EXPECT_EQ(hand.Cursor(), 26005);

  // Choosing tools: a change updates the buttons and tells the set once.
  set.SetCurrentTool(&zoom);
  set.SetCurrentTool(&zoom);
  set.SetCurrentTool(CObjID::Intern("Line"));
  EXPECT_EQ(set.changes, (std::vector<std::string>{"->Zoom", "Zoom>Line"}));
  EXPECT_EQ(set.ButtonUpdates(), 2);
  EXPECT_EQ(set.GetCurrentGroup(), &edits);
  EXPECT_EQ(hands.Current(), &zoom) << "each group keeps its own current tool";

  // Found by a group's id (its current tool) or a tool's, and the set by id.
  CToolGroup* group = nullptr;
  CTool* tool = nullptr;
  ASSERT_TRUE(set.Find(CObjID::Intern("test/group/hands"), &group, &tool));
  EXPECT_EQ(group, &hands);
  EXPECT_EQ(tool, &zoom);
  ASSERT_TRUE(set.Find(CObjID::Intern("Hand"), &group, &tool));
  EXPECT_EQ(tool, &hand);
  EXPECT_EQ(CToolSet::FindSet(CObjID::Intern("test/tool/set")), &set);
}

TEST(Tools, DestructionUnlinksToolsGroupsAndSets) {
  std::vector<std::string> log;
  auto set = std::make_unique<CToolSet>(CObjID::Intern("test/tool/gone"));
  auto group = std::make_unique<CToolGroup>(set.get(), CObjID::Intern("test/group/gone"));
  auto tool = std::make_unique<Recording>(group.get(), "Gone", log, nullptr);
  set->SetCurrentTool(tool.get());
  tool.reset();
  EXPECT_EQ(group->Current(), nullptr);
  EXPECT_TRUE(group->Tools().empty());
  Recording orphan(group.get(), "Orphan", log, nullptr);
  group.reset();
  EXPECT_EQ(orphan.Group(), nullptr);
  set->SetCurrentTool(&orphan);  // a tool with no group is ignored
  EXPECT_EQ(set->GetCurrentTool(), nullptr);
  set.reset();
  EXPECT_EQ(CToolSet::FindSet(CObjID::Intern("test/tool/gone")), nullptr);
}

}  // namespace
}  // namespace Tarsa
