#include "framework/controls/CProgressDialog.h"

#include "framework/controls/CControl.h"
#include "framework/controls/CProgressBar.h"
#include "framework/controls/CPushButton.h"
#include "framework/controls/CStaticText.h"
#include "framework/core/CException.h"
#include "framework/process/CProcess.h"

namespace Tarsa {

namespace {

CObjID CancelId() {
  static const CObjID id = CObjID::Intern(CProgressDialog::kCancelId);
  return id;
}

}  // namespace

CProgressDialog::CProgressDialog(const std::string& title, const std::string& message,
                                 const CWindow* parent)
    : CWindow(CObjID::Intern("Tarsa/ProgressDialog"), EWindowKind::kFloating, ShownText(title),
              CSize{400, 132}, parent) {
  message_ =
      new CStaticText(CObjID(), this, CRect{20, 16, 380, 40}, ShownText(message), kBind_SizeLeft);
  bar_ = new CProgressBar(CObjID(), this, CRect{20, 48, 380, 64}, kBind_SizeLeft);
  new CPushButton(CancelId(), this, CRect{280, 90, 380, 116}, "$$$/Tarsa/Alert/Cancel=Cancel",
                  kView_TabStop, kBind_FixedBottomRight);
  SetCancelView(CancelId());
}

CProgressDialog::~CProgressDialog() = default;

void CProgressDialog::SetMessage(const std::string& message) {
  message_->SetText(ShownText(message));
}

void CProgressDialog::Update(double fraction, double pump) {
  if (!IsOpen()) Show();
  bar_->SetIndeterminate(fraction < 0.0);
  if (fraction >= 0.0) bar_->SetValue(fraction);
  CProcess* process = CProcess::Current();
  if (process == nullptr) return;
  // Short passes that never wait: the work goes on as soon as the events
  // that were waiting are handled.
  const double until = process->Now() + pump;
  do {
    process->DoEvent(CProcess::kDoEvent_NoWait);
  } while (!cancelled_ && process->Now() < until);
}

void CProgressDialog::ThrowIfCancelled() const {
  if (cancelled_) throw CAbort();
}

void CProgressDialog::HandleMessage(CMessage& message) {
  if (message.name == CancelId() && dynamic_cast<const CValueMessage*>(&message) != nullptr) {
    cancelled_ = true;
    message.SetHandled();
    return;
  }
  CWindow::HandleMessage(message);
}

void CProgressDialog::CloseRequested() { cancelled_ = true; }

}  // namespace Tarsa
