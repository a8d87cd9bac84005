#include "framework/process/CProcess.h"

#include <algorithm>
#include <exception>
#include <utility>

#include "framework/core/CException.h"
#include "framework/process/CIdler.h"
#include "framework/process/CMemoryEventSource.h"
#include "framework/process/CMessageNames.h"
#include "framework/process/CReporter.h"
#include "framework/process/CValMsg.h"

namespace Tarsa {

namespace {
CProcess* gProcess = nullptr;
}  // namespace

CExecutable* CProcess::NoParentWhenFirst() {
  // Checked before the string source registers, so that a refused second
  // process leaves the first one in place.
  if (gProcess != nullptr) throw CError("");
  return nullptr;
}

CProcess::CProcess(std::unique_ptr<CNativeEventSource> source)
    : CExecutable(NoParentWhenFirst(), CObjID(), true, true, false, false),
      source_(source != nullptr ? std::move(source) : std::make_unique<CMemoryEventSource>()) {
  gProcess = this;
  CMessageNames::Get();
  SetRunning(true);
  SetTarget(true);
  idleTimer_ = std::make_unique<CTimer>(kIdlePeriod);
  idleTimer_->SetCallback(&CProcess::OnIdleTimer, reinterpret_cast<std::uintptr_t>(this));
  idleTimer_->Start();
}

CProcess::~CProcess() {
  idleTimer_.reset();
  {
    std::lock_guard<std::mutex> lock(queueLock_);
    eventQueue_.clear();
  }
  undoStack_.reset();
  gProcess = nullptr;
}

CProcess* CProcess::Current() { return gProcess; }

void CProcess::OnIdleTimer(CTimer& timer, std::uintptr_t process) {
  reinterpret_cast<CProcess*>(process)->IdleTick(timer.LastFired());
}

void CProcess::IdleTick(double /*now*/) {}

// ---- The loop -------------------------------------------------------------

void CProcess::DoEvent(std::uint32_t flags) {
  Pass(flags, std::numeric_limits<double>::infinity());
}

void CProcess::DoEvents(double until) {
  while (IsRunning() && Now() < until) Pass(0, until);
}

void CProcess::DeliverMouseMoved(double time, std::uint32_t modifiers, CNativePoint where) {
  lastMouse_ = where;
  CMessage message(CMessageNames::Get().mouseMoved, time, modifiers);
  MouseMoved(message, where);
}

void CProcess::Pass(std::uint32_t flags, double deadline) {
  CNativeEvent pending;
  const bool havePending = source_->Peek(pending);
  if (havePending) currentEvent_ = pending;

  if ((flags & kDoEvent_NoMouseMoved) == 0) {
    if (!havePending) {
      DeliverMouseMoved(Now(), source_->Modifiers(), source_->Pointer());
    } else if (trackMouse_) {
      DeliverMouseMoved(pending.time, pending.modifiers, pending.where);
    }
  } else {
    cursorWorkPending_ = false;
  }

  if (const CProcessEvent* next = PeekEvent();
      next != nullptr && (!havePending || next->Due() <= pending.time)) {
    PopEvent();
    return;
  }

  CNativeEvent event;
  bool fetched = false;
  if ((flags & kDoEvent_NoWait) == 0 && !CIdler::AnyRunning()) {
    // Native timers wake a blocked loop elsewhere; here the framework fires
    // its own, so the wait ends when the next one is due.
    fetched = source_->Wait(std::min(deadline, CTimer::NextDue()), event);
  } else {
    fetched = source_->Take(event);
  }

  if (fetched) {
    currentEvent_ = event;
    if (trackMouse_ && event.kind != ENativeKind::kWake) lastMouse_ = event.where;
    try {
      if (!AcceptNative(event)) return;
      if (TranslateAccelerator(event)) return;
      if (PreHandleKey(event)) return;
      DispatchNative(event);
    } catch (...) {
      // A handler's failure is shown, and the loop goes on with the next
      // event: the dialog stays usable.
      CReporter::ReportCurrent();
      return;
    }
    if (event.kind != ENativeKind::kTimer && event.kind != ENativeKind::kPaint) return;
  }

  if ((flags & kDoEvent_NoIdle) == 0) CIdler::IdleOnce();
  CTimer::FireDue(Now());
}

void CProcess::MouseMoved(const CMessage& /*message*/, CNativePoint /*where*/) {
  cursorWorkPending_ = false;
}

bool CProcess::AcceptNative(const CNativeEvent& /*event*/) { return true; }

bool CProcess::TranslateAccelerator(const CNativeEvent& /*event*/) { return false; }

bool CProcess::PreHandleKey(const CNativeEvent& event) {
  const CMessageNames& names = CMessageNames::Get();
  CObjID name;
  if (event.kind == ENativeKind::kKeyDown) {
    name = names.keyDown;
  } else if (event.kind == ENativeKind::kSysKeyDown) {
    name = names.sysKeyDown;
  } else {
    return false;
  }
  CValMsg<std::uint32_t> message(name, event.code, CValueMessage::kChange_Set, event.time,
                                 event.modifiers);
  CMessenger* to = Target() != nullptr ? Target() : this;
  to->HandleMessage(message);
  return message.IsHandled();
}

void CProcess::DispatchNative(const CNativeEvent& event) {
  if (event.kind == ENativeKind::kQuit) {
    CMessage quit(CMessageNames::Get().cmdQuit, event.time, event.modifiers);
    SendCommand(quit);
    return;
  }
  if (event.kind == ENativeKind::kKeyChar || event.kind == ENativeKind::kSysKeyChar ||
      event.kind == ENativeKind::kKeyUp || event.kind == ENativeKind::kSysKeyUp) {
    const CMessageNames& names = CMessageNames::Get();
    const CObjID name = event.kind == ENativeKind::kKeyChar      ? names.keyChar
                        : event.kind == ENativeKind::kSysKeyChar ? names.sysKeyChar
                        : event.kind == ENativeKind::kKeyUp      ? names.keyUp
                                                                 : names.sysKeyUp;
    CValMsg<std::uint32_t> message(name, event.code, CValueMessage::kChange_Set, event.time,
                                   event.modifiers);
    CMessenger* to = Target() != nullptr ? Target() : this;
    to->HandleMessage(message);
    return;
  }
  if (CNativeWindowHandler* window = FindWindow(event.window)) window->HandleNative(event);
}

void CProcess::RegisterWindow(CNativeWindowId id, CNativeWindowHandler* handler) {
  windows_[id] = handler;
}

void CProcess::UnregisterWindow(CNativeWindowId id) { windows_.erase(id); }

CNativeWindowHandler* CProcess::FindWindow(CNativeWindowId id) const {
  const auto found = windows_.find(id);
  return found == windows_.end() ? nullptr : found->second;
}

CNativeEvent CProcess::PresentPointer(CNativeWindowId window) const {
  CNativeEvent event;
  event.kind = ENativeKind::kMouseMove;
  event.window = window;
  event.time = source_->Now();
  event.where = source_->Pointer();
  event.modifiers = source_->Modifiers();
  return event;
}

bool CProcess::HandleInRound(CTrackerRound& tracker, const CNativeEvent& event) {
  currentEvent_ = event;
  switch (event.kind) {
    case ENativeKind::kMouseUp:
      if (event.code != tracker.NativeButton()) return true;
      tracker.OnMouse(event);
      tracker.Stop();
      return false;
    case ENativeKind::kMouseMove:
      lastMouse_ = event.where;
      if (!tracker.OnMouse(event) && tracker.WantsIdle()) tracker.OnIdle(event);
      return true;
    case ENativeKind::kMouseDown:
    case ENativeKind::kMouseWheel:
      return true;  // other buttons wait until the drag is over
    case ENativeKind::kKeyDown:
    case ENativeKind::kSysKeyDown:
    case ENativeKind::kKeyUp:
    case ENativeKind::kSysKeyUp:
      if (tracker.ReceivesKeys()) {
        tracker.OnKey(event);
        return true;
      }
      [[fallthrough]];
    default:
      try {
        if (!PreHandleKey(event)) DispatchNative(event);
      } catch (...) {
        CReporter::ReportCurrent();
      }
      return true;
  }
}

void CProcess::TrackRound(CTrackerRound& tracker) {
  const std::uint32_t button = tracker.NativeButton();
  if (button == 0) {
    tracker.Stop();
    return;
  }
  CNativeEvent event;
  if (source_->Take(event)) {
    HandleInRound(tracker, event);
  } else {
    const CNativeEvent present = PresentPointer(tracker.TrackedWindow());
    const bool held = (source_->Buttons() & (1u << (button - 1))) != 0;
    if (!tracker.OnMouse(present) && held && tracker.WantsIdle()) tracker.OnIdle(present);
    if (!held) {
      tracker.Stop();
      return;
    }
    CIdler::IdleOnce();
    CTimer::FireDue(Now());
    if (source_->Wait(std::min(Now() + 0.01, CTimer::NextDue()), event) &&
        !HandleInRound(tracker, event)) {
      return;
    }
  }
  CTimer::FireDue(Now());
}

bool CProcess::RunModal(const std::function<bool()>& done) {
  while (!done()) {
    if (!IsRunning()) return false;
    Pass(0, std::numeric_limits<double>::infinity());
  }
  return true;
}

void CProcess::PumpWhileTracking(CMouseTracking& tracker) {
  // The drag runs on a tracker's rounds: each new position goes to Track,
  // and the last one, the release's, to OnEnd.
  class Drag : public CTrackerRound {
   public:
    explicit Drag(CMouseTracking& tracking) : tracking_(tracking) {}
    std::uint32_t NativeButton() const override { return tracking_.Button(); }
    CNativeWindowId TrackedWindow() const override { return last_.window; }
    bool ReceivesKeys() const override { return false; }
    bool WantsIdle() const override { return false; }
    bool OnMouse(const CNativeEvent& event) override {
      const bool moved = !seen_ || !(event.where == last_.where);
      const CNativeWindowId window = last_.window;
      last_ = event;
      if (event.window == 0) last_.window = window;
      seen_ = true;
      if (moved) tracking_.Track(last_);
      return moved;
    }
    void OnKey(const CNativeEvent& /*event*/) override {}
    void OnIdle(const CNativeEvent& /*event*/) override {}
    void Stop() override { running_ = false; }
    bool Running() const { return running_; }
    const CNativeEvent& Last() const { return last_; }

   private:
    CMouseTracking& tracking_;
    CNativeEvent last_;
    bool seen_ = false;
    bool running_ = true;
  } drag(tracker);

  source_->CaptureMouse(true);
  // The capture never outlives the drag, whatever a handler does.
  struct Release {
    CNativeEventSource& source;
    ~Release() { source.CaptureMouse(false); }
  } release{*source_};
  while (drag.Running()) TrackRound(drag);
  CNativeEvent end = drag.Last();
  end.kind = ENativeKind::kMouseUp;
  end.code = tracker.Button();
  tracker.OnEnd(end);
}

// ---- Deferred events --------------------------------------------------------

void CProcess::PostEvent(std::unique_ptr<CProcessEvent> event) {
  if (event == nullptr) return;
  {
    std::lock_guard<std::mutex> lock(queueLock_);
    auto at = std::find_if(eventQueue_.begin(), eventQueue_.end(),
                           [&](const auto& e) { return e->Priority() >= event->Priority(); });
    eventQueue_.insert(at, std::move(event));
  }
  source_->Wake();
}

void CProcess::PostAction(std::function<void()> action, std::int32_t priority) {
  PostEvent(std::make_unique<CProcessEvent>(priority, Now(), std::move(action)));
}

bool CProcess::PopEvent() {
  std::unique_ptr<CProcessEvent> event;
  {
    std::lock_guard<std::mutex> lock(queueLock_);
    if (eventQueue_.empty()) return false;
    event = std::move(eventQueue_.back());
    eventQueue_.pop_back();
  }
  try {
    event->Run();
  } catch (CException& e) {
    CReporter::Report(e);
    e.SetSilent(true);
    throw;
  } catch (...) {
    CReporter::ReportCurrent();
    CError passed("");
    passed.SetSilent(true);
    throw passed;
  }
  return true;
}

const CProcessEvent* CProcess::PeekEvent() const {
  std::lock_guard<std::mutex> lock(queueLock_);
  return eventQueue_.empty() ? nullptr : eventQueue_.back().get();
}

void CProcess::Sweep(std::uintptr_t value) {
  std::vector<std::unique_ptr<CProcessEvent>> done;
  {
    std::lock_guard<std::mutex> lock(queueLock_);
    for (auto it = eventQueue_.end(); it != eventQueue_.begin();) {
      --it;
      if ((*it)->Sweep(value)) {
        done.push_back(std::move(*it));
        it = eventQueue_.erase(it);
      }
    }
  }
  // Deleted outside the lock: a destructor may post.
}

std::size_t CProcess::QueuedEventCount() const {
  std::lock_guard<std::mutex> lock(queueLock_);
  return eventQueue_.size();
}

void CProcess::Forget(const CMessenger* messenger) {
  Sweep(reinterpret_cast<std::uintptr_t>(messenger));
}

// ---- Commands ---------------------------------------------------------------

CUndoStack* CProcess::UndoStack() {
  if (undoStack_ == nullptr) undoStack_ = MakeUndoStack();
  return undoStack_.get();
}

void CProcess::HandleCommand(CMessage& command) {
  const CMessageNames& names = CMessageNames::Get();
  const CObjID name = command.name;
  if (name == names.cmdQuit) {
    if (!CloseCurrentWindow()) Quit();
    command.SetHandled();
    return;
  }
  if (name == names.cmdUndo || name == names.cmdRedo || name == names.cmdUndoRedo ||
      name == names.cmdStepBackward || name == names.cmdStepForward) {
    if (CUndoStack* stack = UndoStack()) {
      const bool back = name == names.cmdUndo || name == names.cmdStepBackward;
      const bool forward = name == names.cmdRedo || name == names.cmdStepForward;
      if (back && stack->CanUndo()) {
        stack->Undo();
        command.SetHandled();
        return;
      }
      if (forward && stack->CanRedo()) {
        stack->Redo();
        command.SetHandled();
        return;
      }
      if (name == names.cmdUndoRedo && (stack->CanUndo() || stack->CanRedo())) {
        stack->UndoRedo();
        command.SetHandled();
        return;
      }
    }
  }
  CExecutable::HandleCommand(command);
}

void CProcess::Quit() {
  if (quitting_) return;
  quitting_ = true;
  SetRunning(false);
  Stop();
  std::vector<std::function<void()>> hooks;
  hooks.swap(shutdownHooks_);
  for (auto it = hooks.rbegin(); it != hooks.rend(); ++it) (*it)();
}

void CProcess::AddShutdownHook(std::function<void()> hook) {
  if (hook) shutdownHooks_.push_back(std::move(hook));
}

}  // namespace Tarsa
