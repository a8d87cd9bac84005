#include "framework/process/CReporter.h"

#include <stdexcept>
#include <string>
#include <vector>

#include <gtest/gtest.h>

#include "framework/core/CException.h"
#include "tests/framework/process/RecordingPresenter.h"

namespace Tarsa {
namespace {

using Texts = std::vector<std::string>;
constexpr const char* kDefault = "The operation could not be completed.";

TEST(CReporter, AlertTakesErrorTextThenTaskTextThenTheDefault) {
  ScopedRecorder shown;
  CReporter::Report(
      CError("$$$/Test/Reporter/Full=Disk is full.", "$$$/Test/Reporter/Task=Saving"));
  CReporter::Report(CError("", "$$$/Test/Reporter/Task=Saving"));
  CReporter::Report(CError("$$$/Test/Reporter/Empty=", ""));  // resolves to nothing
  CReporter::Report(CException());
  EXPECT_EQ(shown.texts, (Texts{"Disk is full.", "Saving", kDefault, kDefault}));
  EXPECT_EQ(shown.titles, Texts(4, "Error"));
  EXPECT_EQ(shown.beeps, 0);
}

TEST(CReporter, SilentShowsNothingAndNonAlertableBeeps) {
  ScopedRecorder shown;
  CReporter::Report(CAbort());  // a user's cancel
  CError silent("$$$/Test/Reporter/Hidden=Hidden");
  silent.SetSilent(true);
  CReporter::Report(silent);
  EXPECT_EQ(shown.beeps, 0);
  CReporter::Report(CError("$$$/Test/Reporter/Quiet=Not shown", "", false));
  EXPECT_EQ(shown.beeps, 1);
  EXPECT_TRUE(shown.texts.empty());
}

TEST(CReporter, ReportCurrentWordsForeignExceptionsWithTheDefault) {
  ScopedRecorder shown;
  auto reportThrown = [](auto thrown) {
    try {
      throw thrown;
    } catch (...) {
      CReporter::ReportCurrent();
    }
  };
  reportThrown(std::runtime_error("internal detail, not for users"));
  reportThrown(42);
  reportThrown(CError("$$$/Test/Reporter/Own=Own words."));
  CReporter::ReportCurrent();  // outside a handler: nothing to report
  EXPECT_EQ(shown.texts, (Texts{kDefault, kDefault, "Own words."}));
}

}  // namespace
}  // namespace Tarsa
