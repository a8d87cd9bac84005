#pragma once

#include <memory>
#include <string>
#include <utility>
#include <vector>

#include "framework/process/CAlertPresenter.h"
#include "framework/process/CReporter.h"

namespace Tarsa::testing {

// Records the alert texts and beeps the reporter gives while it is in scope,
// then puts the previous presenter back.
class ScopedRecorder {
 public:
  ScopedRecorder() : previous_(CReporter::SetPresenter(std::make_unique<Recorder>(this))) {}
  ~ScopedRecorder() { CReporter::SetPresenter(std::move(previous_)); }

  std::vector<std::string> texts;
  std::vector<std::string> titles;
  int beeps = 0;

 private:
  struct Recorder : CAlertPresenter {
    explicit Recorder(ScopedRecorder* to) : to(to) {}
    void ShowAlert(const CString& title, const CString& text) override {
      to->titles.push_back(title.Str());
      to->texts.push_back(text.Str());
    }
    void Beep() override { ++to->beeps; }
    ScopedRecorder* to;
  };
  std::unique_ptr<CAlertPresenter> previous_;
};

}  // namespace Tarsa::testing
