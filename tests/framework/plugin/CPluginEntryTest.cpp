#include "framework/plugin/CPluginEntry.h"

#include <stdexcept>
#include <string>
#include <vector>

#include <gtest/gtest.h>

#include "framework/plugin/CFrameworkServices.h"
#include "framework/plugin/CQuillmarkError.h"
#include "framework/strings/CStringTable.h"
#include "tests/framework/plugin/ProbeFilter.h"
#include "tests/support/RealHost.h"
#include "tests/support/RecordingPresenter.h"

namespace Tarsa::testing {
namespace {

using Texts = std::vector<std::string>;

class PluginEntry : public PluginRunTest {
 protected:
  void SetUp() override {
    PluginRunTest::SetUp();
    ProbeFilter::Plan() = ProbeFilter::Script{};
  }

  static bool Exists() { return CQuillmarkFilter::Current() != nullptr; }
  static int Made() { return ProbeFilter::Plan().made; }
  static int Destroyed() { return ProbeFilter::Plan().destroyed; }

  RealHost host;
};

TEST_F(PluginEntry, SelectorsOutsideTheTableOrWithoutAnObjectAnswerZero) {
  for (std::int16_t selector : {std::int16_t(-1), std::int16_t(-32768), std::int16_t(6),
                                std::int16_t(300), std::int16_t(kSelectorContinue)}) {
    EXPECT_EQ(ProbeFilter::Call(selector, host.Record()), 0) << selector;
  }
  EXPECT_EQ(Made(), 0);
  EXPECT_FALSE(CFrameworkServices::IsStarted());
  CFrameworkServices::Start();
  EXPECT_EQ(ProbeFilter::Call(kSelectorFinish, nullptr), 0);
  EXPECT_EQ(Made(), 0);
  EXPECT_FALSE(CFrameworkServices::IsStarted()) << "finish shuts the framework down regardless";

  // With an object alive they leave it as it is.
  ASSERT_EQ(ProbeFilter::Call(kSelectorParameters, host.Record()), 0);
  EXPECT_EQ(ProbeFilter::Call(9, host.Record()), 0);
  EXPECT_TRUE(Exists());
  EXPECT_EQ(Destroyed(), 0);
}

TEST_F(PluginEntry, ARunKeepsOneObjectFromItsFirstSelectorToFinish) {
  // Interactive: from parameters; scripted: from prepare, not interactive.
  for (const bool interactive : {true, false}) {
    SCOPED_TRACE(interactive ? "interactive" : "scripted");
    ProbeFilter::Plan() = ProbeFilter::Script{};
    if (interactive) {
      EXPECT_EQ(ProbeFilter::Call(kSelectorParameters, host.Record()), 0);
    }
    EXPECT_EQ(ProbeFilter::Call(kSelectorPrepare, host.Record()), 0);
    ASSERT_TRUE(Exists());
    EXPECT_TRUE(CFrameworkServices::IsMainThread());
    EXPECT_EQ(CQuillmarkFilter::Current()->IsInteractive(), interactive);
    EXPECT_EQ(ProbeFilter::Call(kSelectorStart, host.Record()), 0);
    ProbeFilter::Plan().proceed = false;
    EXPECT_EQ(ProbeFilter::Call(kSelectorContinue, host.Record()), 1);
    EXPECT_TRUE(Exists()) << "continue keeps the object whatever it answers";
    EXPECT_EQ(ProbeFilter::Call(kSelectorFinish, host.Record()), 0);
    EXPECT_FALSE(Exists());
    EXPECT_EQ(Made(), 1);
    EXPECT_EQ(Destroyed(), 1);
    EXPECT_EQ(ProbeFilter::Plan().finished, 1);
    EXPECT_FALSE(CFrameworkServices::IsStarted());
  }
}

TEST_F(PluginEntry, AFailingAnswerOrAboutTearsTheObjectDown) {
  ProbeFilter::Plan().parameters = false;
  EXPECT_EQ(ProbeFilter::Call(kSelectorParameters, host.Record()), 1);
  EXPECT_FALSE(Exists());
  ProbeFilter::Plan().prepare = false;
  EXPECT_EQ(ProbeFilter::Call(kSelectorPrepare, host.Record()), 1);
  EXPECT_FALSE(Exists());
  ProbeFilter::Plan().start = false;  // a cancelled run answers 1
  EXPECT_EQ(ProbeFilter::Call(kSelectorStart, host.Record()), 1);
  EXPECT_FALSE(Exists());
  EXPECT_EQ(Made(), 3);
  EXPECT_EQ(Destroyed(), 3);

  // About makes its own object and never keeps it, nor the one before.
  ProbeFilter::Plan().parameters = true;
  ASSERT_EQ(ProbeFilter::Call(kSelectorParameters, host.Record()), 0);
  EXPECT_EQ(ProbeFilter::Call(kSelectorAbout, host.Record()), 0);
  EXPECT_FALSE(Exists());
  EXPECT_EQ(Made(), 5);
  EXPECT_EQ(Destroyed(), 5);
}

TEST_F(PluginEntry, ThrownFailuresBecomeTheAnswerAndTearDown) {
  struct Case {
    std::function<void()> thrower;
    std::int16_t answer;
    Texts shown;
  };
  const std::string kDefault = "The operation could not be completed.";
  const std::vector<Case> cases = {
      // The host's own error is its answer, and the host tells the user.
      {[] { throw CQuillmarkError(-108); }, -108, {}},
      {[] { throw CQuillmarkError(-34); }, -34, {}},
      // A cancel is silent.
      {[] { throw CAbort(); }, 1, {}},
      {[] { throw CError("$$$/Test/Entry/Own=Own words."); }, 1, {"Own words."}},
      // Foreign failures are worded by the framework, never by their text.
      {[] { throw std::runtime_error("internal detail"); }, 1, {kDefault}},
      {[] { throw 42; }, 1, {kDefault}},
  };
  for (const Case& c : cases) {
    ScopedRecorder shown;
    ProbeFilter::Plan().onStart = c.thrower;
    EXPECT_EQ(ProbeFilter::Call(kSelectorStart, host.Record()), c.answer);
    EXPECT_EQ(shown.texts, c.shown);
    EXPECT_EQ(shown.beeps, 0);
    EXPECT_FALSE(Exists());
  }
  EXPECT_EQ(Destroyed(), int(cases.size()));
}

TEST_F(PluginEntry, ShutdownDropsTheStringTable) {
  ASSERT_EQ(ProbeFilter::Call(kSelectorParameters, host.Record()), 0);
  EXPECT_NE(CStringTable::Get(false), nullptr);
  EXPECT_EQ(ProbeFilter::Call(kSelectorFinish, host.Record()), 0);
  EXPECT_EQ(CStringTable::Get(false), nullptr);
}

}  // namespace
}  // namespace Tarsa::testing
