#pragma once

#include <cstdint>

#include "framework/process/CNativeWindowHandler.h"
#include "framework/tools/CMouseEvent.h"

namespace Tarsa {

class CPort;
class CView;
class CWindow;

// A tracker follows one mouse gesture, from the press to the release: Run()
// takes over the loop (a round of the process's pump at a time) and calls
// the tracker's steps: Prepare and Begin, Track for each change of position
// or modifiers, KeyEvent for keys when it takes them, Idle when nothing
// changed and it asked for idle time, then End and Finish, once each, also
// after an Abort. With auto-scroll on, a pointer beyond the view's visible
// area scrolls it a step or more each round, moving or not; with clamping
// on, positions are kept inside the view.
//
// Made on the stack for one gesture, with the view it tracks (which must
// outlive it) or a window alone. Positions are in the view's coordinates
// (the window's with no view). One tracker runs at a time; the process-wide
// pointer to it and the window's are set while it runs.
class CTracker : public CTrackerRound {
 public:
  // The constructor's flag word.
  static constexpr std::uint32_t kTrack_ScrollX = 1;
  static constexpr std::uint32_t kTrack_ScrollY = 2;
  static constexpr std::uint32_t kTrack_Keys = 4;
  static constexpr std::uint32_t kTrack_Option8 = 8;
  static constexpr std::uint32_t kTrack_Idle = 16;
  static constexpr std::uint32_t kTrack_Clamp = 32;
  static constexpr std::uint32_t kTrack_Option64 = 64;

  // The tracker's own state word.
  static constexpr std::uint32_t kRunning = 1;
  static constexpr std::uint32_t kBegunPrepare = 2;
  static constexpr std::uint32_t kBegunBegin = 4;
  static constexpr std::uint32_t kCaptured = 8;
  static constexpr std::uint32_t kClamp = 16;
  static constexpr std::uint32_t kScrollX = 32;
  static constexpr std::uint32_t kScrollY = 64;
  static constexpr std::uint32_t kScroll = 128;
  static constexpr std::uint32_t kKeys = 256;
  static constexpr std::uint32_t kOption512 = 512;
  static constexpr std::uint32_t kIdle = 1024;
  static constexpr std::uint32_t kGoOn = 2048;
  static constexpr std::uint32_t kAborted = 4096;
  static constexpr std::uint32_t kOption8192 = 8192;

  CTracker(CView* view, std::uint32_t trackFlags);
  explicit CTracker(CWindow* window, std::uint32_t trackFlags = 0);
  ~CTracker() override;
  CTracker(const CTracker&) = delete;
  CTracker& operator=(const CTracker&) = delete;

  // Runs the gesture that event began; returns when it has ended.
  void Run(const CMouseEvent& event);
  // Ends the loop at its next test.
  void Stop() override;
  // Ends the gesture now: End(true) and Finish, then the loop falls through.
  void Abort();

  // The running tracker, or null.
  static CTracker* Running();

  std::uint32_t Flags() const { return flags_; }
  bool Aborted() const { return (flags_ & kAborted) != 0; }
  CView* View() const { return view_; }
  const CMouseEvent& StartEvent() const { return startEvent_; }
  const CMouseEvent& LastEvent() const { return lastEvent_; }
  const CMouseEvent& CurrentEvent() const { return currentEvent_; }
  double EndTime() const { return endTime_; }
  void SetScrollStep(std::int32_t x, std::int32_t y) {
    scrollStepX_ = x;
    scrollStepY_ = y;
  }

  // What the tracker draws over its view while it runs (a rubber band), in
  // the view's coordinates, as the last part of the window's paint.
  virtual void DrawFeedback(CPort& /*port*/) const {}

  // Whether a point (view coordinates) lies in the view.
  virtual bool ContainsPoint(double x, double y) const;
  // The scroll a point calls for, (0, 0) when none.
  virtual void AutoScrollNeeded(double x, double y, std::int32_t& dx, std::int32_t& dy) const;

  // The pump's side.
  std::uint32_t NativeButton() const override;
  CNativeWindowId TrackedWindow() const override;
  bool ReceivesKeys() const override { return (flags_ & kKeys) != 0; }
  bool WantsIdle() const override { return (flags_ & kIdle) != 0; }
  bool OnMouse(const CNativeEvent& event) override;
  void OnKey(const CNativeEvent& event) override;
  void OnIdle(const CNativeEvent& event) override;

 protected:
  virtual void Moved(std::int32_t /*dx*/, std::int32_t /*dy*/) {}
  virtual void Scrolled(std::int32_t /*dx*/, std::int32_t /*dy*/) {}
  virtual void Prepare() {}
  // False ends the gesture at once.
  virtual bool Begin() { return true; }
  // False stops the gesture.
  virtual bool Track(bool /*moved*/, bool /*modifiersChanged*/) { return true; }
  virtual bool KeyEvent(const CNativeEvent& /*event*/) { return true; }
  virtual void KeyUpEvent(const CNativeEvent& /*event*/) {}
  virtual void Idle(const CMouseEvent& /*event*/) {}
  virtual void End(bool /*aborted*/) {}
  virtual void Finish() {}

  // An event of the window turned into one of the view.
  CMouseEvent ToView(const CNativeEvent& event) const;
  // A point kept inside the view's visible area.
  void Clamp(CMouseEvent& event) const;

 private:
  void Close(bool aborted);

  CView* view_ = nullptr;
  CWindow* window_ = nullptr;
  std::uint32_t flags_ = 0;
  std::int32_t scrollStepX_ = 8;
  std::int32_t scrollStepY_ = 8;
  CMouseEvent startEvent_;
  CMouseEvent lastEvent_;
  CMouseEvent currentEvent_;
  double endTime_ = 0.0;
};

}  // namespace Tarsa
