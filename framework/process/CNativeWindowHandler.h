#pragma once

#include "framework/process/CNativeEventSource.h"

namespace Tarsa {

// What the process hands a native window's events to: the framework's
// window object for that native window. Registered with the process while
// the window lives.
class CNativeWindowHandler {
 public:
  virtual ~CNativeWindowHandler() = default;
  virtual void HandleNative(const CNativeEvent& event) = 0;
};

// A mouse drag followed by the process: the button it follows, each move
// (and the last position at the release), and the end. Trackers of the tool
// protocol build on it; controls use it for their own drags.
class CMouseTracking {
 public:
  virtual ~CMouseTracking() = default;
  virtual std::uint32_t Button() const = 0;
  // A pointer position during the drag, in the coordinates of event.window.
  virtual void Track(const CNativeEvent& event) = 0;
  // The button went up at event.where (or its release was seen in the state).
  virtual void OnEnd(const CNativeEvent& event) = 0;
};

// A tracker as the process's pump sees it, one round at a time: the button
// it follows, where the pointer is (OnMouse, true when that changed
// anything), keys when it takes them, idle time, and its end.
class CTrackerRound {
 public:
  virtual ~CTrackerRound() = default;
  // 1 left, 2 middle, 3 right; 0 for a button that cannot be followed.
  virtual std::uint32_t NativeButton() const = 0;
  virtual CNativeWindowId TrackedWindow() const = 0;
  virtual bool ReceivesKeys() const = 0;
  virtual bool WantsIdle() const = 0;
  virtual bool OnMouse(const CNativeEvent& event) = 0;
  // A key down or up (by the event's kind) while the tracker runs.
  virtual void OnKey(const CNativeEvent& event) = 0;
  virtual void OnIdle(const CNativeEvent& event) = 0;
  virtual void Stop() = 0;
};

}  // namespace Tarsa
