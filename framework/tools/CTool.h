#pragma once

#include <string>
#include <vector>

#include "framework/process/CObjID.h"
#include "framework/tools/CMouseEvent.h"

namespace Tarsa {

class CToolGroup;
class CToolSet;
class CView;

// A mode of the mouse. A pane hands each mouse event to the current tool
// through the public entry points; each asks GetOverrideTool first (with a
// copy of the event, whose modifiers it may change) and passes the copy on
// to an override, which may override in turn, or else runs its own Do step.
// A tool registers with its group when made and leaves it when destroyed.
class CTool {
 public:
  CTool(CToolGroup* group, CObjID id, std::string name);
  virtual ~CTool();
  CTool(const CTool&) = delete;
  CTool& operator=(const CTool&) = delete;

  void DetachGroup(const CToolGroup* group) {
    if (group_ == group) group_ = nullptr;
  }
  CToolGroup* Group() const { return group_; }
  void SetId(CObjID id) { id_ = id; }
  CObjID GetId() const { return id_; }
  const std::string& GetName() const { return name_; }

  // The tool that should take this event instead; null for none.
  virtual CTool* GetOverrideTool(CMouseEvent& /*event*/) { return nullptr; }
  virtual void MouseEntered(const CMouseEvent& /*event*/) {}
  virtual void MouseHover(const CMouseEvent& /*event*/) {}

  // The public entry points.
  void AdjustCursor(CView& view, const CMouseEvent& event);
  void AdjustCursorOutside(CView& view, const CMouseEvent& event);
  void MouseDown(CView& view, const CMouseEvent& event);
  bool MultiClick(CView& view, const CMouseEvent& event, std::int32_t count);

  // The tool's own button was clicked (count 2: double-clicked); true when
  // the tool did something with it.
  virtual bool ToolButtonClicked(std::int32_t /*clicks*/) { return false; }

 protected:
  // The cursor number the view should show; the arrow by default.
  virtual std::int32_t DoAdjustCursor(CView& view, const CMouseEvent& event);
  virtual std::int32_t DoAdjustCursorOutside(CView& /*view*/, const CMouseEvent& /*event*/) {
    return kArrowCursor;
  }
  virtual void DoMouseDown(CView& /*view*/, const CMouseEvent& /*event*/) {}
  virtual bool DoMultiClick(CView& /*view*/, const CMouseEvent& /*event*/, std::int32_t /*count*/) {
    return false;
  }

 public:
  static constexpr std::int32_t kArrowCursor = 26000;
  // The cursor the last AdjustCursor chose.
  std::int32_t Cursor() const { return cursor_; }

 private:
  // Each entry asks for an override with a copy of the event; an override
  // gets the copy at the same entry, so overrides chain, and the tool
  // itself gets the original.
  template <class ToOther, class ToSelf>
  auto Route(const CMouseEvent& event, ToOther toOther, ToSelf toSelf) {
    CMouseEvent copy = event;
    CTool* other = GetOverrideTool(copy);
    if (other != nullptr && other != this) return toOther(*other, copy);
    return toSelf();
  }

  CToolGroup* group_;
  CObjID id_;
  std::string name_;
  std::int32_t cursor_ = kArrowCursor;
};

// Tools of which one is current: a group in a tool set.
class CToolGroup {
 public:
  CToolGroup(CToolSet* owner, CObjID id);
  virtual ~CToolGroup();
  CToolGroup(const CToolGroup&) = delete;
  CToolGroup& operator=(const CToolGroup&) = delete;

  CObjID GetId() const { return id_; }
  CToolSet* Owner() const { return owner_; }
  const std::vector<CTool*>& Tools() const { return tools_; }
  CTool* Current() const { return current_; }
  CTool* FindTool(CObjID id) const;
  // Makes the tool current; nothing for null or the current one.
  void Select(CTool* tool);
  void DetachOwner(const CToolSet* owner) {
    if (owner_ == owner) owner_ = nullptr;
  }

 protected:
  // The current tool changed.
  virtual void Selected(CTool* /*now*/, CTool* /*before*/) {}

 private:
  friend class CTool;
  void Add(CTool* tool);
  void Remove(CTool* tool);

  CToolSet* owner_;
  CObjID id_;
  std::vector<CTool*> tools_;  // not owned
  CTool* current_ = nullptr;
};

// The tool groups of a window, one of them current. Every set is found by
// id in one process-wide list, as tool buttons of a layout find theirs.
class CToolSet {
 public:
  explicit CToolSet(CObjID id);
  virtual ~CToolSet();
  CToolSet(const CToolSet&) = delete;
  CToolSet& operator=(const CToolSet&) = delete;

  static CToolSet* FindSet(CObjID id);

  void AddGroup(CToolGroup* group);
  void RemoveGroup(CToolGroup* group);
  CObjID GetId() const { return id_; }
  // By a group's id (that group and its current tool), else by a tool's.
  bool Find(CObjID id, CToolGroup** group, CTool** tool) const;
  CToolGroup* FindGroup(CObjID id) const;
  CTool* FindTool(CObjID id) const;
  CToolGroup* GetCurrentGroup() const { return currentGroup_; }
  CTool* GetCurrentTool() const;
  void SetCurrentTool(CTool* tool);
  void SetCurrentTool(CObjID id);
  // How many times the buttons were told to redraw.
  std::int32_t ButtonUpdates() const { return buttonUpdates_; }

 protected:
  virtual void UpdateButtons() { ++buttonUpdates_; }
  virtual void ToolChanged(CTool* /*now*/, CToolGroup* /*oldGroup*/, CTool* /*oldTool*/) {}

 private:
  CObjID id_;
  std::vector<CToolGroup*> groups_;  // not owned
  CToolGroup* currentGroup_ = nullptr;
  std::int32_t buttonUpdates_ = 0;
};

}  // namespace Tarsa
