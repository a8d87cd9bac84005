#include "framework/process/CReporter.h"

#include <string>
#include <vector>

#include <gtest/gtest.h>

#include "framework/core/CException.h"
#include "tests/support/RecordingPresenter.h"

namespace Tarsa {
namespace {

using Texts = std::vector<std::string>;
constexpr const char* kDefault = "The operation could not be completed.";

TEST(CReporter, AlertTakesErrorTextThenTaskTextThenTheDefault) {
  testing::ScopedRecorder shown;
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
  testing::ScopedRecorder shown;
  CReporter::Report(CAbort());  // a user's cancel
  CError silent("$$$/Test/Reporter/Hidden=Hidden");
  silent.SetSilent(true);
  CReporter::Report(silent);
  EXPECT_EQ(shown.beeps, 0);
  CReporter::Report(CError("$$$/Test/Reporter/Quiet=Not shown", "", false));
  EXPECT_EQ(shown.beeps, 1);
  // Foreign exceptions are worded by the default (the module's entry and the
  // process loop show it); outside a handler there is nothing to report.
  CReporter::ReportCurrent();
  EXPECT_TRUE(shown.texts.empty());
}

}  // namespace
}  // namespace Tarsa
