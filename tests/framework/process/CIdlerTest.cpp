#include "framework/process/CIdler.h"

#include <string>
#include <vector>

#include <gtest/gtest.h>

#include "framework/core/CException.h"
#include "tests/support/RecordingPresenter.h"

namespace Tarsa {
namespace {

// Appends its letter on each step and stops after a number of steps.
class Letter : public CIdler {
 public:
  Letter(std::int16_t priority, char letter, std::string* trace, int steps = 1000)
      : CIdler(priority), letter_(letter), trace_(trace), steps_(steps) {}
  bool failNext = false;
  bool Idle() override {
    *trace_ += letter_;
    if (failNext) {
      failNext = false;
      throw CError("$$$/Test/Idler/Step=Idle step failed.");
    }
    return --steps_ > 0;
  }

 private:
  char letter_;
  std::string* trace_;
  int steps_;
};

void Passes(int count) {
  for (int i = 0; i < count; ++i) CIdler::IdleOnce();
}

TEST(CIdler, EqualPrioritiesTakeTurnsAndAFailureIsReportedNotFatal) {
  testing::ScopedRecorder shown;
  std::string trace;
  Letter a(0, 'a', &trace), b(0, 'b', &trace), c(0, 'c', &trace);
  a.Start();
  b.Start();
  c.Start();
  b.failNext = true;
  Passes(7);
  EXPECT_EQ(trace, "abcabca");
  EXPECT_TRUE(b.IsRunning());
  EXPECT_EQ(shown.texts, std::vector<std::string>{"Idle step failed."});
}

TEST(CIdler, HigherPrioritiesRunFirstUntilTheyStop) {
  std::string trace;
  Letter low(0, 'l', &trace);
  Letter high(5, 'H', &trace, 3);
  Letter high2(5, 'h', &trace, 2);
  low.Start();
  high.Start();   // goes ahead of the lower one
  high2.Start();  // and behind its equal
  {
    Letter gone(9, 'x', &trace);
    gone.Start();  // destroyed while running: leaves the list
  }
  Passes(7);
  EXPECT_EQ(trace, "HhHhHll");
  EXPECT_FALSE(high.IsRunning());
  low.Stop();
  EXPECT_FALSE(CIdler::AnyRunning());
  EXPECT_FALSE(CIdler::IdleOnce());
}

}  // namespace
}  // namespace Tarsa
