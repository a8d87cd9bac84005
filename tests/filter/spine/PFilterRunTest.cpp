// The module's entry and the run of PFilter, driven as the host drives them.

#include <algorithm>
#include <string>
#include <vector>

#include <gtest/gtest.h>

#include "filter/PFilter.h"
#include "framework/native/NativeDisplay.h"
#include "framework/plugin/CFrameworkServices.h"
#include "tests/support/FilterFixture.h"
#include "tests/support/MesaUnderSanitizers.h"
#include "tests/support/RecordingPresenter.h"
#include "workspace/EntryFI.h"

// The driver has no frame pointers, so only the slow unwinder reaches the
// EGL frame that the suppression names.
extern "C" const char* __asan_default_options() { return "fast_unwind_on_malloc=0"; }

namespace Project::testing {
namespace {

using Tarsa::FourCC;
using Tarsa::testing::ScopedRecorder;
using Texts = std::vector<std::string>;

class FilterRun : public FilterRunTest {
 protected:
  std::int16_t Call(std::int16_t selector) {
    std::int16_t result = 77;
    std::intptr_t slot = 0;
    EntryFI(selector, host.Record(), &slot, &result);
    return result;
  }

  Tarsa::testing::RealHost host;
};

TEST_F(FilterRun, EntryAnswersOutsideTheTableAndWithoutAnObject) {
  EXPECT_EQ(Call(-3), 0);
  EXPECT_EQ(Call(6), 0);
  EXPECT_EQ(Call(Tarsa::kSelectorContinue), 0);
  EXPECT_EQ(PFilter::Current(), nullptr);
  EXPECT_EQ(Call(Tarsa::kSelectorFinish), 0);
  EXPECT_FALSE(Tarsa::CFrameworkServices::IsStarted());

  EXPECT_EQ(Call(Tarsa::kSelectorParameters), 0);
  ASSERT_NE(PFilter::Current(), nullptr);
  EXPECT_EQ(host.Coords().enabled, 1u) << "parameters switches on 32-bit coordinates";
  EXPECT_EQ(Call(Tarsa::kSelectorFinish), 0);
  EXPECT_EQ(PFilter::Current(), nullptr);
}

TEST_F(FilterRun, MemoryOfferIsSplitEightyTwenty) {
  struct Case {
    std::uint32_t total, first, second;
  };
  // By hand: first = floor(0.8 total), second the rest; neither below the
  // floor min(total / 2, 0x80000), and first + second never above total.
  const Case cases[] = {
      {10000000, 8000000, 2000000},
      {1000000, 500000, 500000},  // second was 200,000, under the floor 500,000
      {100, 50, 50},
      {3, 2, 1},
      {0, 0, 0},
      {4294967295u, 3435973836u, 858993459u},
  };
  for (const Case& c : cases) {
    SCOPED_TRACE(c.total);
    // Without the buffer suite the host is told what the filter takes in all.
    {
      TestPFilter filter;
      filter.SetUseBufferSuite(false);
      host.Record()->memoryOffer = c.total;
      ASSERT_EQ(filter.HandlePrepare(host.Record(), nullptr), 0);
      EXPECT_EQ(host.Record()->memoryOffer, c.first + c.second);
      EXPECT_EQ(host.Record()->bufferShare, c.first);
    }
    Tarsa::CPluginEntry::TearDown();
    // With it (the default), the filter's share comes from the host's
    // buffers and the host keeps the second part.
    host.Record()->memoryOffer = c.total;
    ASSERT_EQ(Call(Tarsa::kSelectorPrepare), 0);
    EXPECT_EQ(host.Record()->memoryOffer, c.second);
    EXPECT_EQ(host.Record()->bufferShare, 0u);
    Call(Tarsa::kSelectorFinish);
  }
}

TEST_F(FilterRun, WrongHostVersionIsRefusedBeforeAnythingIsTouched) {
  for (std::intptr_t version :
       {std::intptr_t(17) << 16, std::intptr_t(19) << 16, std::intptr_t(18)}) {
    host.Properties().Override(FourCC("vers"), version);
    ScopedRecorder shown;
    ASSERT_EQ(Call(Tarsa::kSelectorPrepare), 0);
    EXPECT_EQ(Call(Tarsa::kSelectorStart), 1);
    EXPECT_EQ(shown.texts,
              Texts{"This feature is not supported by the current version of Quillmark."});
    EXPECT_EQ(shown.titles, Texts{"Error"});
    EXPECT_EQ(PFilter::Current(), nullptr) << "a refused start tears the object down";
  }
  // A host that does not say its version is refused the same way.
  host.Properties().Withhold(FourCC("vers"));
  ScopedRecorder shown;
  EXPECT_EQ(Call(Tarsa::kSelectorStart), 1);
  EXPECT_EQ(shown.texts.size(), 1u);
  EXPECT_TRUE(host.propertyWrites.empty()) << "the watch cursor was never touched";
  EXPECT_FALSE(config.HasPreferencesFile());
}

TEST_F(FilterRun, GraphicsProcessorSwitchedOffIsRefused) {
  host.Properties().Override(FourCC("GPUF"), 0x7F);  // every bit but 7
  ScopedRecorder shown;
  EXPECT_EQ(Call(Tarsa::kSelectorStart), 1);
  EXPECT_EQ(shown.titles, Texts{"Archway Error"});
  EXPECT_EQ(shown.texts, Texts{"This feature requires graphics processor acceleration. Please "
                               "check the Performance Preferences and verify that 'Use Graphics "
                               "Processor' is enabled."});
  EXPECT_EQ(PFilter::Current(), nullptr);
  EXPECT_TRUE(host.propertyWrites.empty());
  EXPECT_FALSE(config.HasPreferencesFile());
}

TEST_F(FilterRun, PreferencesStartFromDefaultsWhileCtrlAltShiftAreHeld) {
  {
    PPreferences saved(64);
    saved.settings.physicalFocal = 42;
    saved.Save();
  }
  ASSERT_TRUE(config.HasPreferencesFile());
  const std::uint32_t ctrl = Tarsa::Native::kModifierControl;
  const std::uint32_t alt = Tarsa::Native::kModifierAlt;
  const std::uint32_t shift = Tarsa::Native::kModifierShift;
  for (std::uint32_t held : {ctrl | alt | shift, ctrl | alt, 0u}) {
    TestPFilter filter;
    ASSERT_EQ(filter.HandleParameters(host.Record(), nullptr), 0);
    filter.heldKeys = held;
    const bool all = held == (ctrl | alt | shift);
    EXPECT_EQ(filter.Preferences().settings.physicalFocal, all ? 15.0f : 42.0f) << held;
  }
}

// The run with no display: through the host, GPU and OpenGL checks,
// preferences and settings and the solver's preparation (a real solve), to
// the workspace, which cannot open its window and throws. Needs a working
// OpenGL environment (a GPU or Mesa's software renderer); without one the
// run is refused at the OpenGL check instead.
TEST_F(FilterRun, InteractiveRunGoesUpToTheWorkspaceAndCleansUp) {
  Tarsa::testing::ScopedEnvironment noDisplay("DISPLAY", nullptr);
  static int prepared = 0;
  prepared = 0;
  const Tarsa::HostLensProfilesSuite lens{nullptr, nullptr, [] {
                                            ++prepared;
                                            return Tarsa::HostStatus(0);
                                          }};
  host.AddSuite(Tarsa::kLensProfilesSuite, 2, &lens);
  host.Record()->flagByte94 = 5;
  ScopedRecorder shown;
  ASSERT_EQ(Call(Tarsa::kSelectorParameters), 0);
  ASSERT_EQ(Call(Tarsa::kSelectorPrepare), 0);
  const std::int16_t result = Call(Tarsa::kSelectorStart);
  EXPECT_EQ(result, 1);
  ASSERT_EQ(shown.texts.size(), 1u);
  if (shown.texts[0].find("OpenGL") != std::string::npos) {
    GTEST_SKIP() << "no OpenGL here: " << shown.texts[0];
  }
  EXPECT_EQ(shown.texts[0], "The display cannot be opened.");
  EXPECT_EQ(host.propertyWrites.front(), std::make_pair(FourCC("wtch"), std::intptr_t(1)));
  EXPECT_EQ(host.Record()->flagByte94, 0);
  // Auto was forced, so the lens profiles were asked: the suite was taken,
  // prepared once, and let go by the clean-up.
  EXPECT_EQ(prepared, 1);
  const std::string lensKey = std::string(Tarsa::kLensProfilesSuite) + "#2";
  EXPECT_EQ(std::count(host.released.begin(), host.released.end(), lensKey), 1);
  // A run that threw saves no preferences.
  EXPECT_FALSE(config.HasPreferencesFile());
  EXPECT_EQ(PFilter::Current(), nullptr);
}

}  // namespace
}  // namespace Project::testing
