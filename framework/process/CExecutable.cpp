#include "framework/process/CExecutable.h"

#include <algorithm>

namespace Tarsa {

CExecutable::CExecutable(CExecutable* parent, CObjID id, bool shown, bool enabled,
                         bool startWithParent, bool stopWithParent)
    : parent_(parent) {
  if (startWithParent) flags_ |= kExec_StartWithParent;
  if (stopWithParent) flags_ |= kExec_StopWithParent;
  SetId(id);
  SetShown(shown);
  SetEnabled(enabled);
  if (parent_ != nullptr) {
    SetSupervisor(parent_);
    parent_->children_.push_back(this);
  }
}

CExecutable::~CExecutable() {
  // Last made first, as Stop goes. A child's destructor takes it off the
  // list, so each one is taken off before it is deleted or let go.
  while (!children_.empty()) {
    CExecutable* child = children_.back();
    children_.pop_back();
    if ((child->flags_ & kExec_DeleteWhenStopped) != 0) {
      child->parent_ = nullptr;
      delete child;
    } else {
      child->parent_ = nullptr;
      child->SetSupervisor(nullptr);
    }
  }
  if (parent_ != nullptr) {
    auto& siblings = parent_->children_;
    siblings.erase(std::remove(siblings.begin(), siblings.end(), this), siblings.end());
  }
}

void CExecutable::SetDeleteWhenStopped(bool deleteWhenStopped) {
  if (deleteWhenStopped) {
    flags_ |= kExec_DeleteWhenStopped;
  } else {
    flags_ &= ~kExec_DeleteWhenStopped;
  }
}

void CExecutable::SetRunning(bool running) {
  if (running) {
    flags_ |= kExec_Running;
  } else {
    flags_ &= ~kExec_Running;
  }
}

bool CExecutable::HasChild(const CExecutable* child) const {
  return std::find(children_.begin(), children_.end(), child) != children_.end();
}

// Both walks go over a snapshot, since a child may make or delete children
// while it starts or stops; one that has gone meanwhile is skipped.
void CExecutable::Start() {
  SetRunning(true);
  const std::vector<CExecutable*> snapshot = children_;
  for (CExecutable* child : snapshot) {
    if (HasChild(child) && (child->flags_ & kExec_StartWithParent) != 0) child->Start();
  }
}

void CExecutable::Stop() {
  const std::vector<CExecutable*> snapshot = children_;
  for (auto it = snapshot.rbegin(); it != snapshot.rend(); ++it) {
    CExecutable* child = *it;
    if (!HasChild(child) || (child->flags_ & kExec_StopWithParent) == 0) continue;
    child->Stop();
    if (HasChild(child) && (child->flags_ & kExec_DeleteWhenStopped) != 0) delete child;
  }
  SetRunning(false);
}

CMessenger* CExecutable::FindDeep(CObjID id) {
  for (CExecutable* child : children_) {
    if (CMessenger* found = child->FindById(id)) return found;
  }
  return nullptr;
}

}  // namespace Tarsa
