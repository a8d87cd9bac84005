#include "framework/tools/CTool.h"

#include <algorithm>

namespace Tarsa {

namespace {

// Every tool set, so that a tool button finds its set by id.
std::vector<CToolSet*>& AllSets() {
  static std::vector<CToolSet*> sets;
  return sets;
}

}  // namespace

// ---- CTool ------------------------------------------------------------------

CTool::CTool(CToolGroup* group, CObjID id, std::string name)
    : group_(group), id_(id), name_(std::move(name)) {
  if (group_ != nullptr) group_->Add(this);
}

CTool::~CTool() {
  if (group_ != nullptr) group_->Remove(this);
}

std::int32_t CTool::DoAdjustCursor(CView& /*view*/, const CMouseEvent& /*event*/) {
  return kArrowCursor;
}

void CTool::AdjustCursor(CView& view, const CMouseEvent& event) {
  cursor_ = Route(
      event,
      [&](CTool& other, const CMouseEvent& copy) {
        other.AdjustCursor(view, copy);
        return other.cursor_;
      },
      [&] { return DoAdjustCursor(view, event); });
}

void CTool::AdjustCursorOutside(CView& view, const CMouseEvent& event) {
  cursor_ = Route(
      event,
      [&](CTool& other, const CMouseEvent& copy) {
        other.AdjustCursorOutside(view, copy);
        return other.cursor_;
      },
      [&] { return DoAdjustCursorOutside(view, event); });
}

void CTool::MouseDown(CView& view, const CMouseEvent& event) {
  Route(
      event, [&](CTool& other, const CMouseEvent& copy) { other.MouseDown(view, copy); },
      [&] { DoMouseDown(view, event); });
}

bool CTool::MultiClick(CView& view, const CMouseEvent& event, std::int32_t count) {
  return Route(
      event,
      [&](CTool& other, const CMouseEvent& copy) { return other.MultiClick(view, copy, count); },
      [&] { return DoMultiClick(view, event, count); });
}

// ---- CToolGroup -------------------------------------------------------------

CToolGroup::CToolGroup(CToolSet* owner, CObjID id) : owner_(owner), id_(id) {
  if (owner_ != nullptr) owner_->AddGroup(this);
}

CToolGroup::~CToolGroup() {
  for (CTool* tool : tools_) tool->DetachGroup(this);
  if (owner_ != nullptr) owner_->RemoveGroup(this);
}

void CToolGroup::Add(CTool* tool) { tools_.push_back(tool); }

void CToolGroup::Remove(CTool* tool) {
  std::erase(tools_, tool);
  if (current_ == tool) current_ = nullptr;
}

CTool* CToolGroup::FindTool(CObjID id) const {
  const auto found =
      std::find_if(tools_.begin(), tools_.end(), [id](CTool* t) { return t->GetId() == id; });
  return found == tools_.end() ? nullptr : *found;
}

void CToolGroup::Select(CTool* tool) {
  if (tool == nullptr || tool == current_) return;
  CTool* before = current_;
  current_ = tool;
  Selected(tool, before);
}

// ---- CToolSet ---------------------------------------------------------------

CToolSet::CToolSet(CObjID id) : id_(id) { AllSets().push_back(this); }

CToolSet::~CToolSet() {
  std::erase(AllSets(), this);
  for (CToolGroup* group : groups_) group->DetachOwner(this);
}

CToolSet* CToolSet::FindSet(CObjID id) {
  for (CToolSet* set : AllSets()) {
    if (set->id_ == id) return set;
  }
  return nullptr;
}

void CToolSet::AddGroup(CToolGroup* group) {
  if (std::find(groups_.begin(), groups_.end(), group) == groups_.end()) groups_.push_back(group);
}

void CToolSet::RemoveGroup(CToolGroup* group) {
  std::erase(groups_, group);
  if (currentGroup_ == group) currentGroup_ = nullptr;
}

bool CToolSet::Find(CObjID id, CToolGroup** group, CTool** tool) const {
  for (CToolGroup* g : groups_) {
    if (g->GetId() == id) {
      if (group != nullptr) *group = g;
      if (tool != nullptr) *tool = g->Current();
      return true;
    }
    if (CTool* t = g->FindTool(id)) {
      if (group != nullptr) *group = g;
      if (tool != nullptr) *tool = t;
      return true;
    }
  }
  return false;
}

CToolGroup* CToolSet::FindGroup(CObjID id) const {
  for (CToolGroup* g : groups_) {
    if (g->GetId() == id) return g;
  }
  return nullptr;
}

CTool* CToolSet::FindTool(CObjID id) const {
  for (CToolGroup* g : groups_) {
    if (CTool* t = g->FindTool(id)) return t;
  }
  return nullptr;
}

CTool* CToolSet::GetCurrentTool() const {
  return currentGroup_ != nullptr ? currentGroup_->Current() : nullptr;
}

void CToolSet::SetCurrentTool(CTool* tool) {
  if (tool == nullptr || tool->Group() == nullptr) return;
  CToolGroup* oldGroup = currentGroup_;
  CTool* oldTool = GetCurrentTool();
  currentGroup_ = tool->Group();
  currentGroup_->Select(tool);
  if (currentGroup_ != oldGroup || tool != oldTool) {
    UpdateButtons();
    ToolChanged(tool, oldGroup, oldTool);
  }
}

void CToolSet::SetCurrentTool(CObjID id) { SetCurrentTool(FindTool(id)); }

}  // namespace Tarsa
