#include "framework/process/CMessenger.h"

#include <memory>
#include <string>
#include <vector>

#include <gtest/gtest.h>

#include "framework/process/CExecutable.h"
#include "framework/process/CMemoryEventSource.h"
#include "framework/process/CProcess.h"

namespace Tarsa {
namespace {

using Log = std::vector<std::string>;

// An executable that logs its hooks, can refuse to resign, takes one command
// and may name a native window.
class Node : public CExecutable {
 public:
  Node(CExecutable* parent, const char* id, Log* log, CNativeWindowId window = 0)
      : CExecutable(parent, CObjID::Intern(id)), log_(log), window_(window) {}
  ~Node() override { Note("deleted"); }

  bool refuse = false;
  CObjID handles;

  bool CanResign(bool /*quiet*/) override { return !refuse; }
  CNativeWindowId NativeWindow() const override {
    return window_ != 0 ? window_ : CExecutable::NativeWindow();
  }
  void HandleCommand(CMessage& command) override {
    if (command.name != handles) return CExecutable::HandleCommand(command);
    Note("command");
    command.SetHandled();
  }
  void Start() override {
    Note("start");
    CExecutable::Start();
  }
  void Stop() override {
    CExecutable::Stop();
    Note("stop");
  }

 protected:
  void OnHidden() override { Note("hidden"); }
  void OnDead() override { Note("dead"); }
  void OnChainEnter() override { Note("enter"); }
  void OnChainLeave() override { Note("leave"); }
  void OnBecameTarget() override { Note("target"); }
  void OnLostTarget() override { Note("lost"); }

 private:
  void Note(const char* what) { log_->push_back(GetId().Text() + " " + what); }
  Log* log_;
  CNativeWindowId window_;
};

class ChainTest : public ::testing::Test {
 protected:
  ChainTest() {
    auto source = std::make_unique<CMemoryEventSource>();
    source_ = source.get();
    process_ = std::make_unique<CProcess>(std::move(source));
  }
  CMemoryEventSource* source_;
  std::unique_ptr<CProcess> process_;
  Log log_;
};

TEST_F(ChainTest, OnlyTheLeafIsTargetAndAnotherBranchResigns) {
  EXPECT_EQ(CMessenger::Target(), process_.get());
  Node a(process_.get(), "A", &log_);
  Node b(&a, "B", &log_);
  Node c(process_.get(), "C", &log_);
  ASSERT_TRUE(b.BecomeTarget(false));
  EXPECT_EQ(CMessenger::Target(), &b);
  EXPECT_FALSE(a.IsTarget());
  EXPECT_FALSE(process_->IsTarget());
  EXPECT_TRUE(a.IsOnChain() && process_->IsOnChain());
  EXPECT_EQ(process_->SubTarget(), &a);
  EXPECT_EQ(a.SubTarget(), &b);

  log_.clear();
  ASSERT_TRUE(c.BecomeTarget(false));
  EXPECT_EQ(CMessenger::Target(), &c);
  EXPECT_EQ(process_->SubTarget(), &c);
  // The leaf gives up the target before leaving, and leaves before its ancestors.
  EXPECT_EQ(log_, (Log{"B lost", "B leave", "A leave", "C enter", "C target"}));

  a.handles = CObjID::Intern("Test/Command/A");
  ASSERT_TRUE(b.BecomeTarget(false));
  CMessage command(a.handles);
  EXPECT_TRUE(CMessenger::SendCommand(command));  // offered to B, taken by A
  EXPECT_EQ(log_.back(), "A command");
}

TEST_F(ChainTest, NotLiveMessengersPassTheTargetToTheNearestLiveAncestor) {
  Node a(process_.get(), "A", &log_);
  Node b(&a, "B", &log_);
  b.SetShown(false);
  ASSERT_TRUE(b.BecomeTarget(false));
  EXPECT_EQ(CMessenger::Target(), &a);
  a.SetEnabled(false);  // a disabled target hands the target up
  EXPECT_EQ(CMessenger::Target(), process_.get());
  ASSERT_TRUE(b.BecomeTarget(false));
  EXPECT_EQ(CMessenger::Target(), process_.get());

  a.SetEnabled(true);
  b.SetShown(true);
  ASSERT_TRUE(b.BecomeTarget(false));
  log_.clear();
  b.SetShown(false);
  EXPECT_EQ(CMessenger::Target(), &a);
  EXPECT_EQ(log_, (Log{"B lost", "B leave", "A target", "B dead", "B hidden"}));
}

TEST_F(ChainTest, ResigningIsRefusedUnlessQuiet) {
  Node a(process_.get(), "A", &log_);
  Node b(&a, "B", &log_);
  Node c(process_.get(), "C", &log_);
  ASSERT_TRUE(b.BecomeTarget(false));
  b.refuse = true;
  EXPECT_FALSE(c.BecomeTarget(false));
  EXPECT_EQ(CMessenger::Target(), &b);
  EXPECT_TRUE(a.IsOnChain());
  EXPECT_FALSE(c.IsOnChain());
  EXPECT_TRUE(c.BecomeTarget(true));
  EXPECT_EQ(CMessenger::Target(), &c);
  EXPECT_FALSE(b.IsOnChain());
}

TEST_F(ChainTest, DeletingTheTargetLeavesNoTargetUntilTheNextRequest) {
  Node a(process_.get(), "A", &log_);
  auto b = std::make_unique<Node>(&a, "B", &log_);
  ASSERT_TRUE(b->BecomeTarget(false));
  b.reset();
  EXPECT_EQ(CMessenger::Target(), nullptr);
  EXPECT_EQ(a.SubTarget(), nullptr);
  EXPECT_TRUE(a.Children().empty());
  ASSERT_TRUE(a.BecomeTarget(false));
  EXPECT_EQ(CMessenger::Target(), &a);
}

TEST_F(ChainTest, ClaimTargetRestoresTheChainLastHeldBelow) {
  Node a(process_.get(), "A", &log_);
  Node b(&a, "B", &log_);
  ASSERT_TRUE(b.BecomeTarget(false));
  ASSERT_TRUE(a.Resign(false));  // e.g. its window was deactivated
  EXPECT_EQ(CMessenger::Target(), nullptr);
  EXPECT_EQ(process_->DeepestLiveTarget(), &b);
  ASSERT_TRUE(process_->ClaimTarget());
  EXPECT_EQ(CMessenger::Target(), &b);
  EXPECT_EQ(process_->FindById(CObjID::Intern("B")), &b);
}

TEST_F(ChainTest, RequestFocusMovesNativeFocusOnlyWhenItDiffers) {
  Node window(process_.get(), "Window", &log_, 7);
  Node field(&window, "Field", &log_);
  ASSERT_TRUE(field.RequestFocus());
  ASSERT_TRUE(field.RequestFocus());
  EXPECT_EQ(source_->GetFocus(), 7u);
  EXPECT_EQ(source_->SetFocusCount(), 1);
  source_->SetFocus(3);  // the user clicked elsewhere
  ASSERT_TRUE(field.RequestFocus());
  EXPECT_EQ(source_->GetFocus(), 7u);
  EXPECT_EQ(source_->SetFocusCount(), 3);
}

TEST_F(ChainTest, ChildrenStartInOrderStopInReverseAndOwnedOnesAreDeleted) {
  Node a(process_.get(), "A", &log_);
  Node b(&a, "B", &log_);
  (new Node(&a, "Owned", &log_))->SetDeleteWhenStopped(true);
  CExecutable manual(&a, CObjID::Intern("Manual"), true, true, false, false);
  Node c(&a, "C", &log_);
  a.Start();
  EXPECT_FALSE(manual.IsRunning());
  a.Stop();
  EXPECT_EQ(log_, (Log{"A start", "B start", "Owned start", "C start", "C stop", "Owned stop",
                       "Owned deleted", "B stop", "A stop"}));
  EXPECT_EQ(a.Children(), (std::vector<CExecutable*>{&b, &manual, &c}));

  // A parent that dies first deletes what it owns and lets the rest go.
  auto parent = std::make_unique<Node>(process_.get(), "Parent", &log_);
  Node kept(parent.get(), "Kept", &log_);
  (new Node(parent.get(), "Owned2", &log_))->SetDeleteWhenStopped(true);
  ASSERT_TRUE(kept.BecomeTarget(false));
  log_.clear();
  parent.reset();
  EXPECT_EQ(log_, (Log{"Parent deleted", "Owned2 deleted"}));
  EXPECT_EQ(kept.Supervisor(), nullptr);
}

}  // namespace
}  // namespace Tarsa
