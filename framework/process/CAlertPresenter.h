#pragma once

#include "framework/strings/CString.h"

namespace Tarsa {

// How the reporter shows a failure to the user: an error alert with a title
// and a text, both already resolved, or the system beep. The window layer
// gives the real alert; tests record what would have been shown.
class CAlertPresenter {
 public:
  virtual ~CAlertPresenter() = default;
  virtual void ShowAlert(const CString& title, const CString& text) = 0;
  virtual void Beep() = 0;
};

}  // namespace Tarsa
