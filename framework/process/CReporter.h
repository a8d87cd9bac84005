#pragma once

#include <memory>

#include "framework/core/CException.h"
#include "framework/process/CAlertPresenter.h"
#include "framework/strings/CString.h"

namespace Tarsa {

// The reporting service: shows a failure that reached a boundary (an idler,
// a deferred event, a selector) the way the exception asks. A silent one
// shows nothing; an alertable one shows its error text, else its task text,
// else a default text, in an error alert; any other sounds the beep. The
// service owns one presenter; the default one shows the system's alert box,
// or with no display writes "title: text" to standard error. Reporting never
// throws.
class CReporter {
 public:
  CReporter() = delete;

  static void Report(const CException& exception);
  // Reports the exception being handled; call only inside a catch block.
  // Framework exceptions go as they are, standard ones as a CError with no
  // texts, anything else as a plain CException.
  static void ReportCurrent();

  // Shows an error alert that comes from no exception (a refusal, a warning):
  // both keyed strings are resolved first. Never throws.
  static void ShowAlert(const CString& title, const CString& text);

  // The text an alertable exception shows, resolved.
  static CString AlertText(const CException& exception);
  static CString AlertTitle();

  // Installs presenter (null: the default one) and returns the previous one.
  static std::unique_ptr<CAlertPresenter> SetPresenter(std::unique_ptr<CAlertPresenter> presenter);
};

}  // namespace Tarsa
