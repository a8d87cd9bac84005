#pragma once

#include <string>

#include "framework/view/CWindow.h"

namespace Tarsa {

class CProgressBar;
class CStaticText;

// A window that shows long work going on: a message, a progress bar and a
// Cancel button. It does not run a loop of its own: the work, on the main
// thread, calls Update() from its own loop, which shows the fraction and
// lets the process handle what is waiting (paints, the Cancel button, Escape
// or closing the window, which cancel too) for a moment. The work then asks
// Cancelled(), or calls ThrowIfCancelled() to stop with a silent CAbort.
class CProgressDialog : public CWindow {
 public:
  static constexpr const char* kCancelId = "Tarsa/ProgressDialog/Cancel";

  CProgressDialog(const std::string& title, const std::string& message,
                  const CWindow* parent = nullptr);
  ~CProgressDialog() override;

  void SetMessage(const std::string& message);
  // Shows the fraction done (0 to 1; below 0 the indeterminate look) and
  // handles the process's waiting events for up to `pump` seconds. Shows the
  // window on the first call.
  void Update(double fraction, double pump = 0.005);
  bool Cancelled() const { return cancelled_; }
  void ThrowIfCancelled() const;
  CProgressBar& Bar() const { return *bar_; }

  void HandleMessage(CMessage& message) override;

 protected:
  void CloseRequested() override;

 private:
  CStaticText* message_ = nullptr;
  CProgressBar* bar_ = nullptr;
  bool cancelled_ = false;
};

}  // namespace Tarsa
