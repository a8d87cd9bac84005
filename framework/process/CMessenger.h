#pragma once

#include <cstdint>

#include "framework/process/CMessage.h"
#include "framework/process/CNativeEventSource.h"
#include "framework/process/CObjID.h"

namespace Tarsa {

// Anything that reacts: the virtual base of the framework's views, tools,
// dialogs and the process, so that one object has one place in the chain
// however many classes it mixes. Each messenger has a supervisor (the next
// one up) and, while on the target chain, a sub-target (the next one down).
// Only the leaf of the chain is the target, and one global pointer names it.
// The chain links are not owning; a messenger's supervisor must outlive it
// (executables detach their children when they die). The destructor clears
// the global target and the supervisor's sub-target when they name this
// object and tells the process, which forgets it.
class CMessenger {
 public:
  static constexpr std::uint32_t kState_Shown = 1u << 0;
  static constexpr std::uint32_t kState_Enabled = 1u << 1;
  static constexpr std::uint32_t kState_OnChain = 1u << 2;
  static constexpr std::uint32_t kState_Target = 1u << 3;

  CMessenger() = default;
  virtual ~CMessenger();
  CMessenger(const CMessenger&) = delete;
  CMessenger& operator=(const CMessenger&) = delete;

  // The current target, or null.
  static CMessenger* Target();
  // Offers command to the current target, or to the process when there is
  // none; from there it travels up by supervisor. True when it was handled.
  static bool SendCommand(CMessage& command);

  CMessenger* Supervisor() const { return supervisor_; }
  // Moves this messenger under another supervisor; the old one forgets it
  // as its sub-target.
  void SetSupervisor(CMessenger* supervisor);
  CMessenger* SubTarget() const { return subTarget_; }
  std::uint32_t State() const { return state_; }
  bool IsEnabled() const { return (state_ & kState_Enabled) != 0; }

  virtual void SetId(CObjID id) { id_ = id; }
  virtual CObjID GetId() const { return id_; }
  // This messenger when id is its own, else FindDeep(id).
  virtual CMessenger* FindById(CObjID id);
  // A messenger below this one with id; the base has none below it.
  virtual CMessenger* FindDeep(CObjID id);
  virtual bool IsShown() const { return (state_ & kState_Shown) != 0; }
  // Shown and enabled.
  virtual bool IsLive() const;
  virtual bool IsOnChain() const { return (state_ & kState_OnChain) != 0; }
  virtual bool IsTarget() const { return (state_ & kState_Target) != 0; }
  virtual void SetShown(bool shown);
  virtual void SetEnabled(bool enabled);
  // Down the sub-targets, the last live one; else SelfIfLive().
  virtual CMessenger* DeepestLiveTarget();
  virtual CMessenger* SelfIfLive();
  // This messenger if live, else the nearest live one above it, else null.
  virtual CMessenger* UpLive();
  // This messenger if on the chain, else the nearest one above it that is.
  virtual CMessenger* UpTarget();
  // BecomeTarget, then the native focus to this messenger's window.
  virtual bool RequestFocus();
  virtual bool BecomeTarget(bool quiet);
  // Gives the target back to the deepest live messenger of the chain last
  // held below this one (this one when there is none).
  virtual bool ClaimTarget();
  // Leaves the chain, and the target goes to the nearest live messenger
  // above. Quiet means the messengers below may not refuse.
  virtual bool ResignFocus(bool quiet);
  // Whether this messenger lets the target go; asked by Resign.
  virtual bool CanResign(bool quiet);
  virtual void Activate() {}
  virtual void Deactivate() {}

  // Commands and messages: a handler that takes one marks it handled; what
  // is not taken goes on to the supervisor.
  virtual void HandleCommand(CMessage& command);
  virtual void HandleMessage(CMessage& message);
  // The native window this messenger lives in: the supervisor's by default.
  virtual CNativeWindowId NativeWindow() const;

  virtual void SetOnChain(bool onChain);
  virtual void SetTarget(bool target);
  // Leaves the chain, with everything below; false when refused.
  virtual bool Resign(bool quiet);
  // Makes child (whose supervisor is this) the next one down the chain,
  // bringing this messenger and those above onto the chain; false when a
  // messenger of the chain it replaces refuses to resign.
  virtual bool SetSubTarget(CMessenger* child, bool quiet);

 protected:
  virtual void OnShown() {}
  virtual void OnHidden() {}
  virtual void OnLive() {}
  virtual void OnDead() {}
  virtual void OnChainEnter() {}
  virtual void OnChainLeave() {}
  virtual void OnBecameTarget() {}
  virtual void OnLostTarget() {}

 private:
  CMessenger* supervisor_ = nullptr;
  CMessenger* subTarget_ = nullptr;
  CObjID id_;
  std::uint32_t state_ = 0;
};

}  // namespace Tarsa
