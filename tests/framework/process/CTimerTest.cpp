#include "framework/process/CTimer.h"

#include <functional>
#include <memory>
#include <utility>
#include <vector>

#include <gtest/gtest.h>

#include "framework/core/CException.h"
#include "framework/process/CMemoryEventSource.h"
#include "framework/process/CProcess.h"
#include "tests/support/RecordingPresenter.h"

namespace Tarsa {
namespace {

using Firings = std::vector<std::pair<double, double>>;  // time, elapsed

class RecordingTimer : public CTimer {
 public:
  using CTimer::CTimer;
  Firings fired;
  std::function<void()> onFire;
  void Fire(double time, double elapsed) override {
    fired.emplace_back(time, elapsed);
    if (onFire) onFire();
  }
};

class TimerTest : public ::testing::Test {
 protected:
  TimerTest() {
    auto source = std::make_unique<CMemoryEventSource>();
    source_ = source.get();
    process_ = std::make_unique<CProcess>(std::move(source));
  }
  void PassAt(double now) {
    source_->SetNow(now);
    process_->DoEvent(CProcess::kDoEvent_NoWait | CProcess::kDoEvent_NoIdle |
                      CProcess::kDoEvent_NoMouseMoved);
  }
  CMemoryEventSource* source_;
  std::unique_ptr<CProcess> process_;
};

TEST_F(TimerTest, FiresAtMostOncePerPassHoweverShortThePeriod) {
  RecordingTimer tiny(1e-12);  // far below the clock's resolution
  tiny.Start();
  PassAt(0.5);
  PassAt(0.5);  // no time has passed
  PassAt(2.0);
  EXPECT_EQ(tiny.fired, (Firings{{0.5, 0.5}, {2.0, 1.5}}));

  RecordingTimer slow(0.5);
  slow.Start();  // at 2.0
  PassAt(2.375);
  EXPECT_TRUE(slow.fired.empty());
  PassAt(2.5);
  slow.Stop();
  PassAt(10.0);
  EXPECT_EQ(slow.fired, (Firings{{2.5, 0.5}}));
}

TEST_F(TimerTest, WindowTimersTickFromTheNativeLayerNotFromThePass) {
  RecordingTimer bound(0.25, 42);
  bound.Start();
  EXPECT_EQ(bound.State(), CTimer::kState_Running | CTimer::kState_WindowBound);
  PassAt(1.0);
  EXPECT_TRUE(bound.fired.empty());
  EXPECT_EQ(source_->TickTimers(1.5), 1);
  EXPECT_EQ(bound.fired, (Firings{{1.5, 1.5}}));
  bound.Stop();
  EXPECT_EQ(source_->TimerCount(), 0u);

  source_->SetTimersFail(true);
  EXPECT_THROW(bound.Start(), CException);
  EXPECT_FALSE(bound.IsRunning());
}

TEST_F(TimerTest, FailuresAreReportedAndTimersMayDeleteEachOther) {
  testing::ScopedRecorder shown;
  CTimer failing(0.25);
  failing.SetCallback(
      [](CTimer&, std::uintptr_t data) {
        if (data == 77) throw CError("$$$/Test/Timer/Failed=Timer failed.");
      },
      77);
  auto victim = std::make_unique<RecordingTimer>(0.25);
  RecordingTimer killer(0.25);
  killer.onFire = [&victim] { victim.reset(); };
  failing.Start();
  killer.Start();
  victim->Start();  // due in the same pass as the killer, after it
  PassAt(1.0);
  EXPECT_EQ(victim, nullptr);
  EXPECT_EQ(killer.fired.size(), 1u);
  EXPECT_EQ(shown.texts, std::vector<std::string>{"Timer failed."});
}

}  // namespace
}  // namespace Tarsa
