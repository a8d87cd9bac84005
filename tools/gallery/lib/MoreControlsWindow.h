#pragma once

#include <functional>
#include <string>

#include "framework/view/CWindow.h"

namespace Gallery {

// The gallery's second window: the controls that choose among items, show
// lists and pages, scroll, frame and report progress, on two tabs. It logs
// every value a control sends as the first window does, "<id> <value>
// <change>"; OK and Cancel end it.
class MoreControlsWindow : public Tarsa::CWindow {
 public:
  using Log = std::function<void(const std::string& line)>;

  explicit MoreControlsWindow(Log log);

  static constexpr const char* kOk = "Gallery2/OK";
  static constexpr const char* kCancel = "Gallery2/Cancel";
  static constexpr const char* kTabs = "Gallery2/Tabs";
  static constexpr const char* kProjection = "Gallery2/Projection";
  static constexpr const char* kLens = "Gallery2/Lens";
  static constexpr const char* kZoom = "Gallery2/Zoom";
  static constexpr const char* kFiles = "Gallery2/Files";
  static constexpr const char* kFocal = "Gallery2/FocalLength";
  static constexpr const char* kScale = "Gallery2/Scale";
  static constexpr const char* kCanvas = "Gallery2/Canvas";
  static constexpr const char* kVBar = "Gallery2/VerticalBar";
  static constexpr const char* kHBar = "Gallery2/HorizontalBar";
  static constexpr const char* kProgress = "Gallery2/Progress";
  static constexpr const char* kBusy = "Gallery2/Busy";
  static constexpr const char* kRunWork = "Gallery2/RunWork";

  Tarsa::CView* Find(const char* id) { return FindView(Tarsa::CObjID::Intern(id)); }

  void HandleMessage(Tarsa::CMessage& message) override;

 private:
  // 200 steps of 20 ms under a progress dialog; logs how far it came.
  void RunWork();

  Log log_;
};

}  // namespace Gallery
