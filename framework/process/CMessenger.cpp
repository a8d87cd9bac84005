#include "framework/process/CMessenger.h"

#include "framework/process/CProcess.h"

namespace Tarsa {

namespace {
CMessenger* gTarget = nullptr;
}  // namespace

CMessenger::~CMessenger() {
  if (gTarget == this) gTarget = nullptr;
  if (supervisor_ != nullptr && supervisor_->subTarget_ == this) supervisor_->subTarget_ = nullptr;
  if (CProcess* process = CProcess::Current()) process->Forget(this);
}

CMessenger* CMessenger::Target() { return gTarget; }

bool CMessenger::SendCommand(CMessage& command) {
  CMessenger* to = gTarget;
  if (to == nullptr) to = CProcess::Current();
  if (to == nullptr) return false;
  to->HandleCommand(command);
  return command.IsHandled();
}

void CMessenger::SetSupervisor(CMessenger* supervisor) {
  if (supervisor_ == supervisor) return;
  if (supervisor_ != nullptr && supervisor_->subTarget_ == this) supervisor_->subTarget_ = nullptr;
  supervisor_ = supervisor;
}

CMessenger* CMessenger::FindById(CObjID id) { return id == id_ ? this : FindDeep(id); }

CMessenger* CMessenger::FindDeep(CObjID /*id*/) { return nullptr; }

bool CMessenger::IsLive() const {
  constexpr std::uint32_t kLive = kState_Shown | kState_Enabled;
  return (state_ & kLive) == kLive;
}

void CMessenger::SetShown(bool shown) {
  if (shown == IsShown()) return;
  if (shown) {
    state_ |= kState_Shown;
    OnShown();
    if (IsEnabled()) OnLive();
  } else {
    state_ &= ~kState_Shown;
    ResignFocus(true);
    if (IsEnabled()) OnDead();
    OnHidden();
  }
}

void CMessenger::SetEnabled(bool enabled) {
  if (enabled == IsEnabled()) return;
  if (enabled) {
    state_ |= kState_Enabled;
    if (IsShown()) OnLive();
  } else {
    state_ &= ~kState_Enabled;
    ResignFocus(true);
    if (IsShown()) OnDead();
  }
}

CMessenger* CMessenger::DeepestLiveTarget() {
  CMessenger* deepest = nullptr;
  for (CMessenger* m = subTarget_; m != nullptr; m = m->subTarget_) {
    if (m->IsLive()) deepest = m;
  }
  return deepest != nullptr ? deepest : SelfIfLive();
}

CMessenger* CMessenger::SelfIfLive() { return IsLive() ? this : nullptr; }

CMessenger* CMessenger::UpLive() {
  if (IsLive()) return this;
  return supervisor_ != nullptr ? supervisor_->UpLive() : nullptr;
}

CMessenger* CMessenger::UpTarget() {
  if (IsOnChain()) return this;
  return supervisor_ != nullptr ? supervisor_->UpTarget() : nullptr;
}

bool CMessenger::RequestFocus() {
  if (!BecomeTarget(false)) return false;
  CProcess* process = CProcess::Current();
  const CNativeWindowId window = NativeWindow();
  if (process != nullptr && window != 0) {
    CNativeEventSource& source = process->EventSource();
    if (source.GetFocus() != window) source.SetFocus(window);
  }
  return true;
}

bool CMessenger::BecomeTarget(bool quiet) {
  if (!IsLive()) {
    CMessenger* up = UpLive();
    return up != nullptr && up->BecomeTarget(quiet);
  }
  if (IsTarget()) return true;
  if (subTarget_ != nullptr && !subTarget_->Resign(quiet)) return false;
  if (supervisor_ != nullptr && !supervisor_->SetSubTarget(this, quiet)) return false;
  SetTarget(true);
  return true;
}

bool CMessenger::ClaimTarget() {
  CMessenger* deepest = DeepestLiveTarget();
  return deepest != nullptr ? deepest->BecomeTarget(false) : BecomeTarget(false);
}

bool CMessenger::ResignFocus(bool quiet) {
  if (!IsOnChain()) return true;
  if (!Resign(quiet)) return false;
  // The chain above is still there; its nearest live member takes over.
  CMessenger* up = supervisor_ != nullptr ? supervisor_->UpLive() : nullptr;
  if (up != nullptr) up->BecomeTarget(true);
  return true;
}

bool CMessenger::CanResign(bool /*quiet*/) { return true; }

void CMessenger::HandleCommand(CMessage& command) {
  if (supervisor_ != nullptr) supervisor_->HandleCommand(command);
}

void CMessenger::HandleMessage(CMessage& message) {
  if (supervisor_ != nullptr) supervisor_->HandleMessage(message);
}

CNativeWindowId CMessenger::NativeWindow() const {
  return supervisor_ != nullptr ? supervisor_->NativeWindow() : 0;
}

void CMessenger::SetOnChain(bool onChain) {
  if (onChain == IsOnChain()) return;
  if (onChain) {
    state_ |= kState_OnChain;
    OnChainEnter();
  } else {
    SetTarget(false);
    state_ &= ~kState_OnChain;
    OnChainLeave();
  }
}

void CMessenger::SetTarget(bool target) {
  if (target == IsTarget()) return;
  if (target) {
    // One target at a time, even when called directly rather than through
    // BecomeTarget; and the target is a leaf.
    if (gTarget != nullptr && gTarget != this) gTarget->SetTarget(false);
    if (subTarget_ != nullptr) subTarget_->Resign(true);
    subTarget_ = nullptr;
    SetOnChain(true);
    state_ |= kState_Target;
    gTarget = this;
    OnBecameTarget();
  } else {
    state_ &= ~kState_Target;
    if (gTarget == this) gTarget = nullptr;
    OnLostTarget();
  }
}

bool CMessenger::Resign(bool quiet) {
  if (!IsOnChain()) return true;
  if (!CanResign(quiet) && !quiet) return false;
  if (subTarget_ != nullptr && !subTarget_->Resign(quiet)) return false;
  SetOnChain(false);
  return true;
}

bool CMessenger::SetSubTarget(CMessenger* child, bool quiet) {
  if (child != nullptr && child->supervisor_ != this) return false;
  // Those above first: that resigns any other branch of the chain before
  // this one changes.
  if (supervisor_ != nullptr && !supervisor_->SetSubTarget(this, quiet)) return false;
  if (subTarget_ != child) {
    if (subTarget_ != nullptr && !subTarget_->Resign(quiet)) return false;
    subTarget_ = child;
  }
  if (child != nullptr) SetTarget(false);
  SetOnChain(true);
  return true;
}

}  // namespace Tarsa
