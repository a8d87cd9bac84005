#pragma once

#include <cstddef>
#include <cstdint>
#include <functional>
#include <limits>
#include <list>
#include <map>
#include <memory>
#include <mutex>
#include <vector>

#include "framework/process/CExecutable.h"
#include "framework/process/CMessage.h"
#include "framework/process/CNativeEventSource.h"
#include "framework/process/CNativeWindowHandler.h"
#include "framework/process/CProcessEvent.h"
#include "framework/process/CTimer.h"
#include "framework/process/CUndoStack.h"
#include "framework/strings/CStringSource.h"

namespace Tarsa {

// The run loop of the main thread, and the root of the messenger tree. There
// is at most one process, reached through one global pointer; it is the
// string source and the first target. It owns the native event source it
// pumps, the deferred event queue (the one structure other threads may
// touch, behind a lock), its idle timer and, once made, the undo stack. A
// pass of DoEvent() turns at most one native event into calls, or runs one
// deferred event, then gives time to idlers and timers.
class CProcess : public CExecutable, public CStringSource {
 public:
  // DoEvent flags, each a "do not".
  static constexpr std::uint32_t kDoEvent_NoWait = 1u << 0;
  static constexpr std::uint32_t kDoEvent_NoIdle = 1u << 1;
  static constexpr std::uint32_t kDoEvent_NoMouseMoved = 1u << 2;

  static constexpr double kIdlePeriod = 0.1;  // seconds

  // Throws when a process exists already. Without a source the process plays
  // an empty in-memory script, for runs with no window system.
  explicit CProcess(std::unique_ptr<CNativeEventSource> source = nullptr);
  ~CProcess() override;

  static CProcess* Current();

  CNativeEventSource& EventSource() { return *source_; }
  // A process made before it knew it would show windows (a plug-in's, made
  // at the host's first call) takes the window system's events from here
  // on. Only before any timer runs: a running one stays with the old source.
  void UseEventSource(std::unique_ptr<CNativeEventSource> source) { source_ = std::move(source); }
  double Now() const { return source_->Now(); }

  // One pass of the loop.
  void DoEvent(std::uint32_t flags);
  // Passes, waiting when there is nothing to do, until the clock reaches
  // until or the process quits.
  void DoEvents(double until);
  // Passes until done() says so or the process quits: the loop of a modal
  // window. Returns false when the process quit first.
  bool RunModal(const std::function<bool()>& done);
  // Follows a drag until its button goes up: moves go to the tracker in
  // order, keys, paints, timers and window events go on as usual, so the
  // windows keep drawing. The mouse is captured meanwhile.
  void PumpWhileTracking(CMouseTracking& tracker);
  // One round of a tracker's loop: the release of its button (seen in the
  // queue, or in the button state when nothing is queued) stops it; keys,
  // paints, timers and window events are handled in the order they came,
  // keys going to the tracker when it takes them; the pointer's position,
  // queued or present, goes to OnMouse, and idle time to OnIdle when that
  // changed nothing. With nothing queued the round waits up to 10 ms, so
  // a tracker that scrolls by itself gets rounds without any input.
  void TrackRound(CTrackerRound& tracker);

  // The windows whose events the process hands on, by native id.
  void RegisterWindow(CNativeWindowId id, CNativeWindowHandler* handler);
  void UnregisterWindow(CNativeWindowId id);
  CNativeWindowHandler* FindWindow(CNativeWindowId id) const;

  // Queues event; any thread.
  void PostEvent(std::unique_ptr<CProcessEvent> event);
  // Queues an action due now; any thread.
  void PostAction(std::function<void()> action, std::int32_t priority = 0);
  // Runs the first queued event and deletes it; false when there is none. A
  // failure is reported, then passed on, silent, so that it is shown once.
  bool PopEvent();
  // The first queued event, or null; valid until the next PopEvent or Sweep.
  const CProcessEvent* PeekEvent() const;
  // Offers value to every queued event, deleting those that are done.
  void Sweep(std::uintptr_t value);
  std::size_t QueuedEventCount() const;
  // A messenger is going away: events meant for it go too.
  void Forget(const CMessenger* messenger);

  // The Edit commands against the undo stack, and quit; the rest goes on.
  void HandleCommand(CMessage& command) override;
  // The undo stack, made on first use by MakeUndoStack(); null when none.
  CUndoStack* UndoStack();

  // Clears the running bit, stops everything, then runs the shutdown hooks,
  // last added first. Later calls do nothing.
  void Quit();
  void AddShutdownHook(std::function<void()> hook);

  const CNativeEvent& CurrentEvent() const { return currentEvent_; }
  CNativePoint LastMouse() const { return lastMouse_; }
  bool TrackMouse() const { return trackMouse_; }
  void SetTrackMouse(bool track) { trackMouse_ = track; }
  // Cursor work (shape, hover) waits for the next mouse-moved delivery; a
  // pass that generates none drops it.
  void RequestCursorWork() { cursorWorkPending_ = true; }
  bool CursorWorkPending() const { return cursorWorkPending_; }

 protected:
  virtual std::unique_ptr<CUndoStack> MakeUndoStack() { return nullptr; }
  // Closes the current window; false when there is none.
  virtual bool CloseCurrentWindow() { return false; }
  // The mouse-moved operation: a mouse-moved message and where the pointer is.
  virtual void MouseMoved(const CMessage& message, CNativePoint where);
  // The message filter: false drops the native event.
  virtual bool AcceptNative(const CNativeEvent& event);
  // Menu shortcuts; true when the event became a command.
  virtual bool TranslateAccelerator(const CNativeEvent& event);
  // Key-down events become key messages sent to the target; true when taken.
  virtual bool PreHandleKey(const CNativeEvent& event);
  // What the window layer does with an event: quit becomes the quit
  // command, typed characters go to the target, the rest to its window.
  virtual void DispatchNative(const CNativeEvent& event);
  // Every kIdlePeriod, from the idle timer.
  virtual void IdleTick(double now);

 private:
  static CExecutable* NoParentWhenFirst();
  static void OnIdleTimer(CTimer& timer, std::uintptr_t process);
  void Pass(std::uint32_t flags, double deadline);
  void DeliverMouseMoved(double time, std::uint32_t modifiers, CNativePoint where);
  // The pointer now, as an event of the window.
  CNativeEvent PresentPointer(CNativeWindowId window) const;
  // Handles one event taken in a tracker's round; false when it ended it.
  bool HandleInRound(CTrackerRound& tracker, const CNativeEvent& event);

  std::unique_ptr<CNativeEventSource> source_;
  mutable std::mutex queueLock_;
  std::list<std::unique_ptr<CProcessEvent>> eventQueue_;  // rising priority
  CNativeEvent currentEvent_;
  CNativePoint lastMouse_;
  bool trackMouse_ = true;
  bool cursorWorkPending_ = false;
  bool quitting_ = false;
  std::unique_ptr<CTimer> idleTimer_;
  std::unique_ptr<CUndoStack> undoStack_;
  std::vector<std::function<void()>> shutdownHooks_;
  std::map<CNativeWindowId, CNativeWindowHandler*> windows_;
};

}  // namespace Tarsa
