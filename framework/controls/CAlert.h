#pragma once

#include <string>
#include <vector>

#include "framework/view/CWindow.h"

namespace Tarsa {

class CCheckButton;

// A message alert: a modal window with a sign for its kind, a main text, a
// detail, up to four buttons from right to left as given, and optionally a
// check box ("Don't show again"). Return presses the default button, Escape
// and closing the window the cancel button. Texts may be keyed strings.
class CAlert : public CWindow {
 public:
  enum class EKind { kNote, kCaution, kStop };

  CAlert(EKind kind, const std::string& message, const std::string& detail,
         const std::vector<std::string>& buttons, int defaultButton, int cancelButton,
         const CWindow* parent = nullptr, const std::string& checkBox = "");
  ~CAlert() override;

  // Runs the alert; the index of the button pressed.
  int Run();
  bool CheckBoxChecked() const;

  // Makes, runs and closes an alert in one call.
  static int Ask(EKind kind, const std::string& message, const std::string& detail,
                 const std::vector<std::string>& buttons, int defaultButton, int cancelButton,
                 const CWindow* parent = nullptr);

  // The id of button index, as the alert's buttons carry it.
  static CObjID ButtonId(int index);

  void Draw(CPort& port) override;

 private:
  EKind kind_;
  int buttonCount_;
  int cancelButton_;
  CCheckButton* checkBox_ = nullptr;
};

}  // namespace Tarsa
