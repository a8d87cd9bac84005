#include "framework/process/CProcess.h"

#include <functional>
#include <memory>
#include <stdexcept>
#include <string>
#include <thread>
#include <vector>

#include <gtest/gtest.h>

#include "framework/core/CException.h"
#include "framework/process/CIdler.h"
#include "framework/process/CMemoryEventSource.h"
#include "framework/process/CMessageEvent.h"
#include "framework/process/CMessageNames.h"
#include "framework/process/CValMsg.h"
#include "tests/support/RecordingPresenter.h"

namespace Tarsa {
namespace {

using Log = std::vector<std::string>;
using Kinds = std::vector<ENativeKind>;
constexpr std::uint32_t kNoWaitNoIdle = CProcess::kDoEvent_NoWait | CProcess::kDoEvent_NoIdle;
constexpr std::uint32_t kOnePass = kNoWaitNoIdle | CProcess::kDoEvent_NoMouseMoved;

CNativeEvent Native(ENativeKind kind, double time = 0.0, CNativePoint where = {},
                    std::uint32_t code = 0) {
  CNativeEvent event;
  event.kind = kind;
  event.time = time;
  event.where = where;
  event.code = code;
  return event;
}

struct FakeUndoStack : CUndoStack {
  bool canUndo = true, canRedo = false;
  Log calls;
  bool CanUndo() const override { return canUndo; }
  bool CanRedo() const override { return canRedo; }
  void Undo() override { calls.push_back("undo"); }
  void Redo() override { calls.push_back("redo"); }
  void UndoRedo() override { calls.push_back("undoRedo"); }
};

// Records what the pass hands on to the window layer.
class TestProcess : public CProcess {
 public:
  using CProcess::CProcess;
  std::vector<std::pair<double, CNativePoint>> moved;
  Kinds dispatched;
  std::function<void()> onDispatch;

 protected:
  void MouseMoved(const CMessage& message, CNativePoint where) override {
    EXPECT_EQ(message.name, CMessageNames::Get().mouseMoved);
    moved.emplace_back(message.time, where);
  }
  void DispatchNative(const CNativeEvent& event) override {
    dispatched.push_back(event.kind);
    if (onDispatch) onDispatch();
    CProcess::DispatchNative(event);
  }
  std::unique_ptr<CUndoStack> MakeUndoStack() override { return std::make_unique<FakeUndoStack>(); }
};

// Logs and takes the messages sent to it; with keysOnly, only key 99.
struct Sink : CExecutable {
  Sink(CExecutable* parent, const char* id, Log* log)
      : CExecutable(parent, CObjID::Intern(id)), log(log) {}
  void HandleMessage(CMessage& message) override {
    auto* key = dynamic_cast<CValMsg<std::uint32_t>*>(&message);
    if (keysOnly && (key == nullptr || key->value != 99)) return;
    log->push_back(GetId().Text() + " " + message.name.Text());
    message.SetHandled();
  }
  Log* log;
  bool keysOnly = false;
};

class ProcessTest : public ::testing::Test {
 protected:
  ProcessTest() {
    auto source = std::make_unique<CMemoryEventSource>();
    source_ = source.get();
    process_ = std::make_unique<TestProcess>(std::move(source));
  }
  void Post(double due, std::string tag, std::int32_t priority = 0) {
    process_->PostEvent(std::make_unique<CProcessEvent>(
        priority, due, [this, tag = std::move(tag)] { ran_.push_back(tag); }));
  }
  bool Send(CObjID command) {
    CMessage message(command);
    return CMessenger::SendCommand(message);
  }

  CMemoryEventSource* source_;
  std::unique_ptr<TestProcess> process_;
  Log ran_;
};

TEST(CProcessSingleton, OneAtATimeAndItIsTheStringSourceAndFirstTarget) {
  {
    CProcess first;
    EXPECT_EQ(CProcess::Current(), &first);
    EXPECT_EQ(CMessenger::Target(), &first);
    EXPECT_THROW({ CProcess second; }, CException);
    EXPECT_EQ(CProcess::Current(), &first);
    EXPECT_EQ(CStringSource::Current(), static_cast<CStringSource*>(&first));
  }
  EXPECT_EQ(CProcess::Current(), nullptr);
  EXPECT_EQ(CStringSource::Current(), nullptr);
  EXPECT_EQ(CMessenger::Target(), nullptr);
}

TEST_F(ProcessTest, DeferredEventsRunByPriorityThenInPostedOrder) {
  Post(0.0, "a", 1);
  Post(0.0, "b", 5);
  Post(0.0, "c", 1);
  Post(0.0, "d", 5);
  Post(0.0, "e", -2);
  EXPECT_EQ(process_->PeekEvent()->Priority(), 5);
  while (process_->PopEvent()) {
  }
  EXPECT_EQ(ran_, (Log{"b", "d", "a", "c", "e"}));

  int count = 0;
  std::thread poster([&] {
    for (int i = 0; i < 100; ++i) process_->PostAction([&count] { ++count; });
  });
  poster.join();
  while (process_->PopEvent()) {
  }
  EXPECT_EQ(count, 100);
}

TEST_F(ProcessTest, DeferredEventsWaitForEarlierNativeEvents) {
  process_->onDispatch = [this] { ran_.push_back("native"); };
  source_->SetNow(10.0);
  source_->Post(Native(ENativeKind::kWindow, 5.0));
  Post(3.0, "event@3");
  Post(7.0, "event@7");
  for (int pass = 0; pass < 3; ++pass) process_->DoEvent(kOnePass);
  EXPECT_EQ(ran_, (Log{"event@3", "native", "event@7"}));
  // Due at the native event's own time: the deferred event goes first.
  source_->Post(Native(ENativeKind::kWindow, 8.0));
  Post(8.0, "event@8");
  process_->DoEvent(kOnePass);
  EXPECT_EQ(ran_.back(), "event@8");
}

TEST_F(ProcessTest, FailuresAreReportedOnceAtTheirBoundary) {
  testing::ScopedRecorder shown;
  process_->PostAction([] { throw CError("$$$/Test/Process/Event=Event failed."); });
  try {
    process_->DoEvent(kOnePass);
    ADD_FAILURE() << "an event's failure is passed on";
  } catch (const CException& e) {
    EXPECT_EQ(e.ErrorText(), "$$$/Test/Process/Event=Event failed.");
    CReporter::Report(e);  // the outer boundary reports it again: nothing more shows
  }
  process_->PostAction([] { throw std::runtime_error("detail"); });
  EXPECT_THROW(process_->DoEvent(kOnePass), CException);
  EXPECT_EQ(process_->QueuedEventCount(), 0u);

  // A native handler's failure is shown, and the loop goes on.
  process_->onDispatch = [] { throw CError("$$$/Test/Process/Native=Handler failed."); };
  source_->Post(Native(ENativeKind::kWindow));
  EXPECT_NO_THROW(process_->DoEvent(kOnePass));
  EXPECT_EQ(shown.texts,
            (Log{"Event failed.", "The operation could not be completed.", "Handler failed."}));
}

TEST_F(ProcessTest, EventsForADeletedMessengerAreSweptAway) {
  Log got;
  Sink kept(process_.get(), "Kept", &got);
  auto gone = std::make_unique<Sink>(process_.get(), "Gone", &got);
  for (CMessenger* to : {static_cast<CMessenger*>(gone.get()), static_cast<CMessenger*>(&kept)}) {
    process_->PostEvent(std::make_unique<CMessageEvent>(
        std::make_unique<CMessage>(CObjID::Intern("Test/Deferred")), to));
  }
  gone.reset();
  EXPECT_EQ(process_->QueuedEventCount(), 1u);
  EXPECT_TRUE(process_->PopEvent());
  EXPECT_EQ(got, (Log{"Kept Test/Deferred"}));
}

TEST_F(ProcessTest, MouseMovedIsGeneratedEachPassUnlessFlagBit2IsSet) {
  source_->SetPointer({3, 4});
  source_->SetNow(1.5);
  process_->DoEvent(kNoWaitNoIdle);
  ASSERT_EQ(process_->moved.size(), 1u);
  EXPECT_EQ(process_->moved[0], std::make_pair(1.5, CNativePoint{3, 4}));

  process_->RequestCursorWork();
  source_->Post(Native(ENativeKind::kMouseDown, 1.5, {30, 40}));
  for (int pass = 0; pass < 3; ++pass) process_->DoEvent(kOnePass);
  EXPECT_EQ(process_->moved.size(), 1u);
  EXPECT_FALSE(process_->CursorWorkPending());

  // With an event pending, the event's own time and place are used.
  source_->Post(Native(ENativeKind::kMouseDown, 1.25, {9, 8}));
  process_->DoEvent(kNoWaitNoIdle);
  ASSERT_EQ(process_->moved.size(), 2u);
  EXPECT_EQ(process_->moved[1], std::make_pair(1.25, CNativePoint{9, 8}));
  EXPECT_EQ(process_->LastMouse(), (CNativePoint{9, 8}));
}

TEST_F(ProcessTest, WaitsUntilTheNextTimerOrEventUnlessAnIdlerRuns) {
  constexpr auto kNoMouse = CProcess::kDoEvent_NoMouseMoved;
  process_->DoEvent(kNoMouse);
  EXPECT_EQ(source_->WaitCount(), 1);
  EXPECT_EQ(source_->Now(), CProcess::kIdlePeriod);  // the idle timer was next
  source_->Post(Native(ENativeKind::kWindow, 0.125));
  process_->DoEvent(kNoMouse);
  EXPECT_EQ(source_->Now(), 0.125);
  EXPECT_EQ(process_->dispatched, Kinds{ENativeKind::kWindow});

  struct Counting : CIdler {
    int calls = 0;
    bool Idle() override { return ++calls > 0; }
  } idler;
  idler.Start();
  process_->DoEvent(kNoMouse);
  process_->DoEvent(kNoMouse | CProcess::kDoEvent_NoIdle);
  EXPECT_EQ(source_->WaitCount(), 2);
  EXPECT_EQ(source_->Now(), 0.125);
  EXPECT_EQ(idler.calls, 1);
}

TEST_F(ProcessTest, DoEventsRunsTheClockToTheDeadlineFiringTimers) {
  int fired = 0;
  CTimer timer(0.25);
  timer.SetCallback([](CTimer&, std::uintptr_t count) { ++*reinterpret_cast<int*>(count); },
                    reinterpret_cast<std::uintptr_t>(&fired));
  timer.Start();
  process_->DoEvents(1.0);
  EXPECT_EQ(source_->Now(), 1.0);
  EXPECT_EQ(fired, 4);  // at 0.25, 0.5, 0.75 and 1.0
}

TEST_F(ProcessTest, KeyDownsGoToTheTargetBeforeTheWindowLayer) {
  Log got;
  Sink field(process_.get(), "Field", &got);
  field.keysOnly = true;
  ASSERT_TRUE(field.BecomeTarget(false));
  source_->Post(Native(ENativeKind::kKeyDown, 0.0, {}, 99));
  source_->Post(Native(ENativeKind::kSysKeyDown, 0.0, {}, 99));
  source_->Post(Native(ENativeKind::kKeyDown, 0.0, {}, 5));
  for (int pass = 0; pass < 3; ++pass) process_->DoEvent(kOnePass);
  EXPECT_EQ(got, (Log{"Field Tarsa/Message/KeyDown", "Field Tarsa/Message/SysKeyDown"}));
  EXPECT_EQ(process_->dispatched, Kinds{ENativeKind::kKeyDown});
}

TEST_F(ProcessTest, EditCommandsAskTheUndoStackFirst) {
  const CMessageNames& n = CMessageNames::Get();
  auto* stack = dynamic_cast<FakeUndoStack*>(process_->UndoStack());
  ASSERT_NE(stack, nullptr);
  EXPECT_TRUE(Send(n.cmdUndo));
  EXPECT_TRUE(Send(n.cmdStepBackward));
  EXPECT_FALSE(Send(n.cmdRedo));
  EXPECT_FALSE(Send(n.cmdStepForward));
  EXPECT_TRUE(Send(n.cmdUndoRedo));
  stack->canUndo = false;
  EXPECT_FALSE(Send(n.cmdUndoRedo));
  stack->canRedo = true;
  EXPECT_TRUE(Send(n.cmdStepForward));
  EXPECT_EQ(stack->calls, (Log{"undo", "undo", "undoRedo", "redo"}));
}

TEST_F(ProcessTest, QuitStopsEverythingThenRunsShutdownHooksOnce) {
  CExecutable child(process_.get(), CObjID::Intern("Child"));
  process_->Start();
  process_->AddShutdownHook([this] { ran_.push_back("first added"); });
  process_->AddShutdownHook([this] { ran_.push_back("last added"); });
  source_->Post(Native(ENativeKind::kQuit));
  process_->DoEvent(kOnePass);
  EXPECT_FALSE(process_->IsRunning());
  EXPECT_FALSE(child.IsRunning());
  EXPECT_TRUE(Send(CMessageNames::Get().cmdQuit));
  EXPECT_EQ(ran_, (Log{"last added", "first added"}));
  process_->DoEvents(5.0);  // returns at once: the loop has ended
  EXPECT_EQ(source_->Now(), 0.0);
}

}  // namespace
}  // namespace Tarsa
