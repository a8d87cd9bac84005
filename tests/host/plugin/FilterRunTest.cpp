#include <gtest/gtest.h>

#include "framework/plugin/HostSuites.h"
#include "host/plugin/FilterRun.h"
#include "host/plugin/PluginModule.h"
#include "tests/support/TestImages.h"

namespace Host {
namespace {

using Tarsa::FourCC;

class CountingObserver : public RunObserver {
 public:
  bool AbortRequested() override { return false; }
  void Progress(int32_t done, int32_t total) override {
    lastDone = done;
    lastTotal = total;
  }
  int32_t lastDone = 0;
  int32_t lastTotal = 0;
};

// The whole record in this process, so the sanitizers watch every callback:
// the fake module reads the planes, writes them inverted in two blocks and
// leaves a descriptor.
TEST(FilterRunTest, ServesTheRecordToAModuleInProcess) {
  auto module = PluginModule::Inspect(ARCHWAY_FAKE_MODULE);
  module->Load();
  auto document = testing::RandomDocument(11, 7, ImageMode::kRgb48, true, 21);
  const auto original = testing::RandomDocument(11, 7, ImageMode::kRgb48, true, 21);

  FilterRun::Options options;
  options.host.title = "hall.tif";
  options.memoryOffer = 64u << 20;
  Descriptor action;
  action.PutInteger(FourCC("runs"), 4);
  options.action = action;
  CountingObserver observer;
  const FilterRun::Outcome outcome = FilterRun::Run(module->Entry(), *document, options, observer);
  ASSERT_EQ(outcome.status, FilterRun::Outcome::Status::kDone) << outcome.failure;
  EXPECT_EQ(observer.lastDone, 1);
  EXPECT_EQ(observer.lastTotal, 1);

  for (int p = 0; p < 4; ++p) {
    for (int y = 0; y < 7; ++y) {
      for (int x = 0; x < 11; ++x) {
        const int v = original->Sample(p, x, y);
        ASSERT_EQ(document->Sample(p, x, y), p < 3 ? 32768 - v : v) << p << " " << x << " " << y;
      }
    }
  }
  ASSERT_TRUE(outcome.descriptor.has_value());
  EXPECT_EQ(outcome.descriptor->Find(FourCC("runs"))->integer, 5);
  EXPECT_EQ(outcome.descriptor->Find(FourCC("plip"))->integer, 1);
  EXPECT_EQ(outcome.descriptor->Find(FourCC("titl"))->data.size(),
            2 * std::string("hall.tif").size());

  // A refusal at start ends the run there, with the selector named.
  options.host.majorVersion = 19;
  const FilterRun::Outcome refused = FilterRun::Run(module->Entry(), *document, options, observer);
  EXPECT_EQ(refused.status, FilterRun::Outcome::Status::kFailed);
  EXPECT_EQ(refused.failure, "the module stopped at start (code 1)");
}

}  // namespace
}  // namespace Host
