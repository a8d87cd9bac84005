#include "framework/process/CReporter.h"

#include <exception>
#include <iostream>
#include <utility>

#include "framework/native/NativeDisplay.h"

namespace Tarsa {

namespace {

constexpr const char* kDefaultText =
    "$$$/Tarsa/Reporter/Default=The operation could not be completed.";
constexpr const char* kTitle = "$$$/Tarsa/Reporter/Title=Error";

// The system's alert box when there is a display; otherwise the text goes to
// standard error, so that a scripted run on a server still says why.
class CConsolePresenter : public CAlertPresenter {
 public:
  void ShowAlert(const CString& title, const CString& text) override {
    if (Native::ShowAlertBox(title.Str(), text.Str())) return;
    std::cerr << title.Str() << ": " << text.Str() << std::endl;
  }
  void Beep() override { std::cerr << '\a' << std::flush; }
};

std::unique_ptr<CAlertPresenter>& Presenter() {
  static auto* presenter = new std::unique_ptr<CAlertPresenter>(new CConsolePresenter);
  return *presenter;
}

}  // namespace

CString CReporter::AlertText(const CException& exception) {
  CString text = ResolveText(exception.ErrorText());
  if (text.IsEmpty()) text = ResolveText(exception.TaskText());
  if (text.IsEmpty()) text = ResolveText(kDefaultText);
  return text;
}

CString CReporter::AlertTitle() { return ResolveText(kTitle); }

void CReporter::Report(const CException& exception) {
  if (exception.IsSilent()) return;
  try {
    if (exception.IsAlertable()) {
      Presenter()->ShowAlert(AlertTitle(), AlertText(exception));
    } else {
      Presenter()->Beep();
    }
  } catch (...) {
    // Nothing is left to tell the user with; the failure was already
    // handled where it was caught.
  }
}

void CReporter::ShowAlert(const CString& title, const CString& text) {
  try {
    CString shownTitle = title;
    CString shownText = text;
    shownTitle.Resolve();
    shownText.Resolve();
    Presenter()->ShowAlert(shownTitle, shownText);
  } catch (...) {
    // As in Report: an alert that cannot be shown is not a new failure.
  }
}

void CReporter::ReportCurrent() {
  if (!std::current_exception()) return;
  try {
    throw;
  } catch (const CException& e) {
    Report(e);
  } catch (const std::exception&) {
    Report(CError(""));
  } catch (...) {
    Report(CException());
  }
}

std::unique_ptr<CAlertPresenter> CReporter::SetPresenter(
    std::unique_ptr<CAlertPresenter> presenter) {
  if (presenter == nullptr) presenter = std::make_unique<CConsolePresenter>();
  std::swap(Presenter(), presenter);
  return presenter;
}

}  // namespace Tarsa
