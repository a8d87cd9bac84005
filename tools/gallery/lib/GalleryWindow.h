#pragma once

#include <functional>
#include <string>

#include "framework/view/CWindow.h"

namespace Tarsa {
class CEditNumber;
class CSlider;
class CCheckButton;
class CStaticText;
}  // namespace Tarsa

namespace Gallery {

// The log line of a control's value message, "<id> <value> <change>"; empty
// for any other message.
std::string ValueLine(const Tarsa::CMessage& message);

// The gallery: a dialog-like window with one of every framework control,
// laid out by hand. Every value a control sends is written to the log as a
// line "<id> <value> <change>", so a test or a person at the terminal reads
// what the program read. OK and Cancel end it; the window owns its views.
class GalleryWindow : public Tarsa::CWindow {
 public:
  using Log = std::function<void(const std::string& line)>;

  explicit GalleryWindow(Log log);

  // Ids of the controls, as the log names them.
  static constexpr const char* kOk = "Gallery/OK";
  static constexpr const char* kCancel = "Gallery/Cancel";
  static constexpr const char* kMesh = "Gallery/ShowMesh";
  static constexpr const char* kIterations = "Gallery/Iterations";
  static constexpr const char* kWeight = "Gallery/LineWeight";
  static constexpr const char* kScale = "Gallery/Scale";
  static constexpr const char* kAlert = "Gallery/ShowAlert";
  static constexpr const char* kDisabled = "Gallery/Disabled";

  Tarsa::CView* Find(const char* id) { return FindView(Tarsa::CObjID::Intern(id)); }

  void HandleMessage(Tarsa::CMessage& message) override;

 private:
  Log log_;
  Tarsa::CSlider* scale_ = nullptr;
  Tarsa::CStaticText* scaleText_ = nullptr;
};

}  // namespace Gallery
