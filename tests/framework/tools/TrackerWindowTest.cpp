#include <gtest/gtest.h>

#include <functional>
#include <memory>
#include <string>
#include <vector>

#include "framework/native/NativeDisplay.h"
#include "framework/process/CKeyCodes.h"
#include "framework/tools/CViewTracker.h"
#include "framework/view/CWindow.h"
#include "tests/framework/controls/Desktop.h"

namespace Tarsa::testing {
namespace {

// A view over a large content whose mouse-down runs the tracker a test
// gives it.
class Canvas : public CView {
 public:
  Canvas(CView* parent, const CRect& frame)
      : CView(CObjID(), parent, frame, kView_NoOptions, kBind_Scrollable, 1000, 1000) {}
  std::function<void(const CMouseEvent&)> onDown;
  void MouseDown(CMouseMessage& message) override {
    CMouseEvent event;
    event.x = message.where.x;
    event.y = message.where.y;
    event.time = message.time;
    event.modifiers = message.modifiers;
    event.button = CMouseEvent::ButtonOf(message.button);
    if (onDown) onDown(event);
    message.SetHandled();
  }
  void Draw(CPort& port) override {
    for (std::int32_t y = 0; y < 1000; y += 50) {
      for (std::int32_t x = 0; x < 1000; x += 50) {
        port.FillRect(CRect{x, y, x + 50, y + 50}, ((x + y) / 50) % 2 ? 0xFFB0C4DE : 0xFFFFFFFF);
      }
    }
  }
};

// Counts its steps and keeps what it was given.
class Recorder : public CTracker {
 public:
  Recorder(CView* view, std::uint32_t flags) : CTracker(view, flags) {}
  std::vector<CMouseEvent> tracked;
  int begun = 0, ended = 0, finished = 0, keys = 0;
  bool endedAborted = false;
  bool abortOnKey = false;

 protected:
  bool Begin() override { return ++begun > 0; }
  bool Track(bool, bool) override {
    tracked.push_back(CurrentEvent());
    return true;
  }
  bool KeyEvent(const CNativeEvent& event) override {
    ++keys;
    if (abortOnKey && event.code == kKey_Escape) Abort();
    return true;
  }
  void End(bool aborted) override {
    ++ended;
    endedAborted = aborted;
  }
  void Finish() override { ++finished; }
};

class Trackers : public ::testing::Test {
 protected:
  void SetUp() override {
    if (!Native::HasDisplay()) GTEST_SKIP() << "no display; these tests run under xvfb-run";
    desktop_ = std::make_unique<Desktop>();
    window_ = std::make_unique<CWindow>(CObjID::Intern("Test/Trackers"), EWindowKind::kDocument,
                                        "Trackers", CSize{400, 300});
    canvas_ = new Canvas(window_.get(), CRect{20, 20, 220, 220});
    window_->Show();
    desktop_->Pump(0.3);
    xid_ = std::to_string(window_->Native().SystemHandle());
  }
  void TearDown() override {
    window_.reset();
    desktop_.reset();
  }
  std::vector<std::string> Move(std::int32_t x, std::int32_t y) {
    return {"mousemove", "--window", xid_, std::to_string(x), std::to_string(y)};
  }
  int Xdo(std::vector<std::vector<std::string>> steps) {
    std::vector<std::string> all;
    for (auto& step : steps) all.insert(all.end(), step.begin(), step.end());
    return desktop_->Xdo(all);
  }

  std::unique_ptr<Desktop> desktop_;
  std::unique_ptr<CWindow> window_;
  Canvas* canvas_ = nullptr;
  std::string xid_;
};

TEST_F(Trackers, ADragBeyondTheEdgeAutoScrollsAndPositionsStayClamped) {
  std::unique_ptr<Recorder> tracker;
  canvas_->onDown = [&](const CMouseEvent& event) {
    tracker =
        std::make_unique<Recorder>(canvas_, CTracker::kTrack_ScrollX | CTracker::kTrack_ScrollY |
                                                CTracker::kTrack_Keys | CTracker::kTrack_Clamp);
    tracker->Run(event);
  };
  // Press in the view, go 40 px past its right edge, and hold still there.
  ASSERT_EQ(
      Xdo({Move(100, 100), {"mousedown", "1"}, Move(260, 110), {"sleep", "0.6"}, {"mouseup", "1"}}),
      0);
  ASSERT_NE(tracker, nullptr);
  EXPECT_EQ(tracker->begun, 1);
  EXPECT_EQ(tracker->ended, 1);
  EXPECT_EQ(tracker->finished, 1);
  // Each round past the edge scrolls by the distance plus one (41), whether
  // the pointer moves or not: in 0.6 s it went far, and only on x.
  const CRect image = canvas_->Image();
  EXPECT_GE(image.left, 41 * 5);
  EXPECT_EQ(image.top, 0);
  EXPECT_LE(image.right, 1000) << "kept within the content";
  // The positions given to Track never left the view's visible area.
  ASSERT_FALSE(tracker->tracked.empty());
  for (const CMouseEvent& e : tracker->tracked) {
    EXPECT_LE(e.x, tracker->LastEvent().x);
    EXPECT_GE(e.y, 0);
  }
  EXPECT_EQ(tracker->LastEvent().x, image.right - 1) << "clamped to the right edge";
  EXPECT_EQ(tracker->LastEvent().y, 90);
}

TEST_F(Trackers, TheZoomRectangleRunsFromThePressToThePointerAndItsDashesRun) {
  std::unique_ptr<CZoomTracker> zoom;
  CRect seen;
  int phases = 0;
  canvas_->onDown = [&](const CMouseEvent& event) {
    zoom = std::make_unique<CZoomTracker>(canvas_);
    zoom->Run(event);
  };
  struct Watch : CTimer {
    Watch(std::function<void()> f) : CTimer(0.02), f(std::move(f)) {}
    void Fire(double, double) override { f(); }
    std::function<void()> f;
  };
  int lastPhase = -1;
  bool saved = false;
  // Watches the running tracker from a timer, which fires inside its loop.
  Watch watch([&] {
    if (zoom != nullptr && CTracker::Running() == zoom.get()) {
      seen = zoom->GetRectangle();
      if (zoom->Phase() != lastPhase) ++phases, lastPhase = zoom->Phase();
      if (phases == 3 && !saved) {
        window_->PaintNow();
        saved = window_->SaveImage(Desktop::Artefact("zoom-rectangle.png"));
      }
    }
  });
  watch.Start();
  // Pressed at (150, 120) of the window, (130, 100) of the view; dragged up
  // and left to (60, 40) of the window, held, released: one xdotool run,
  // since the tracker's loop holds the test's until the release.
  ASSERT_EQ(Xdo({Move(150, 120),
                 {"mousedown", "1"},
                 Move(100, 80),
                 Move(60, 40),
                 {"sleep", "0.5"},
                 {"mouseup", "1"}}),
            0);
  EXPECT_TRUE(saved);
  // Left and top are the smaller coordinates, right and bottom the larger
  // plus one.
  EXPECT_EQ(seen, (CRect{40, 20, 131, 101}));
  EXPECT_GE(phases, 4) << "the dashes step while the button is held still";
  EXPECT_EQ(zoom->GetRectangle(), CRect{}) << "erased at the end";
  EXPECT_EQ(CZoomTracker::PatternRow(0, 0), 0xF0);
  EXPECT_EQ(CZoomTracker::PatternRow(1, 0), 0xE1);
  EXPECT_EQ(CZoomTracker::PatternRow(2, 0), 0xC3);
  EXPECT_EQ(CZoomTracker::PatternRow(0, 1), 0xE1) << "a diagonal band";
}

TEST_F(Trackers, PanningWithShiftMovesOnTheAxisOfTheLargerMovement) {
  canvas_->ScrollTo({300, 300});
  canvas_->onDown = [&](const CMouseEvent& event) {
    CPanner panner(canvas_, CPanner::kAxisX | CPanner::kAxisY);
    panner.RunPan(event);
  };
  ASSERT_EQ(Xdo({Move(150, 150), {"mousedown", "1"}, Move(100, 130), {"mouseup", "1"}}), 0);
  EXPECT_EQ(canvas_->Image().left, 350) << "the picture follows the hand";
  EXPECT_EQ(canvas_->Image().top, 320);
  ASSERT_EQ(Xdo({Move(150, 150),
                 {"keydown", "shift", "mousedown", "1"},
                 Move(100, 130),
                 {"mouseup", "1", "keyup", "shift"}}),
            0);
  EXPECT_EQ(canvas_->Image().left, 400);
  EXPECT_EQ(canvas_->Image().top, 320) << "with Shift only the larger movement's axis moves";
}

TEST_F(Trackers, AQuickClickEndsTheLoopAndAbortInAKeyEndsOnce) {
  std::unique_ptr<Recorder> tracker;
  canvas_->onDown = [&](const CMouseEvent& event) {
    tracker = std::make_unique<Recorder>(canvas_, CTracker::kTrack_Keys);
    tracker->abortOnKey = true;
    tracker->Run(event);
  };
  ASSERT_EQ(Xdo({Move(100, 100), {"click", "1"}}), 0);
  ASSERT_NE(tracker, nullptr);
  EXPECT_EQ(tracker->ended, 1);
  EXPECT_EQ(CTracker::Running(), nullptr);

  ASSERT_EQ(Xdo({Move(100, 100),
                 {"mousedown", "1"},
                 Move(120, 100),
                 {"key", "Escape"},
                 {"sleep", "0.2"},
                 Move(140, 100),
                 {"mouseup", "1"}}),
            0);
  EXPECT_TRUE(tracker->Aborted());
  EXPECT_EQ(tracker->keys, 1);
  EXPECT_EQ(tracker->ended, 1);
  EXPECT_TRUE(tracker->endedAborted);
  EXPECT_EQ(tracker->finished, 1);
  EXPECT_EQ(CTracker::Running(), nullptr);
}

}  // namespace
}  // namespace Tarsa::testing
